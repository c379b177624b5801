// Writes the capture shipped in samples/ from the sample hex messages:
//   make_sample_capture samples/messages.hex samples/messages.pcap
#include <fstream>
#include <iostream>
#include <string>

#include "cli/hex_input.h"
#include "tests/cli/capture_writer.h"

int main(int argc, char** argv) {
  if (argc != 3) {
    std::cerr << "usage: make_sample_capture MESSAGES.hex CAPTURE.pcap\n";
    return 2;
  }
  std::ifstream hex(argv[1]);
  rnsap::cli::InputBatch batch;
  rnsap::cli::ReadLines(hex, argv[1], batch);
  if (!hex.eof() || !batch.errors.empty() || batch.messages.empty()) {
    std::cerr << "make_sample_capture: cannot read the messages of " << argv[1] << '\n';
    return 1;
  }
  std::vector<rnsap::testing::Octets> messages;
  for (const auto& message : batch.messages) messages.push_back(message.octets);
  rnsap::testing::WriteFile(argv[2], rnsap::testing::SampleCapture(messages));
  return 0;
}
