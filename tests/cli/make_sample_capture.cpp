// Writes the capture shipped in samples/ from the sample hex messages:
//   make_sample_capture samples/messages.hex samples/messages.pcap
// or, given a number of frames, a corpus of that many frames of them.
#include <fstream>
#include <iostream>
#include <string>

#include "tests/cli/capture_writer.h"

int main(int argc, char** argv) {
  if (argc != 3 && argc != 4) {
    std::cerr << "usage: make_sample_capture MESSAGES.hex CAPTURE.pcap [FRAMES]\n";
    return 2;
  }
  const std::vector<rnsap::testing::Octets> messages = rnsap::testing::HexMessages(argv[1]);
  if (messages.empty()) {
    std::cerr << "make_sample_capture: cannot read the messages of " << argv[1] << '\n';
    return 1;
  }
  std::ofstream(argv[2], std::ios::binary)
      << (argc == 4 ? rnsap::testing::CorpusCapture(messages, std::stoul(argv[3]))
                    : rnsap::testing::SampleCapture(messages));
  return 0;
}
