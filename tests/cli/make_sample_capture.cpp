// Writes the capture shipped in samples/ from the sample hex messages:
//   make_sample_capture samples/messages.hex samples/messages.pcap
#include <cstdio>
#include <iostream>
#include <string>

#include "cli/hex_input.h"
#include "tests/cli/capture_writer.h"

int main(int argc, char** argv) {
  if (argc != 3) {
    std::cerr << "usage: make_sample_capture MESSAGES.hex CAPTURE.pcap\n";
    return 2;
  }
  std::vector<rnsap::testing::Octets> messages;
  bool bad = false;
  std::FILE* hex = std::fopen(argv[1], "rb");
  const bool read =
      hex != nullptr && rnsap::cli::ReadLines(hex, argv[1],
                                              {[&](const rnsap::cli::InputMessage& message) {
                                                 messages.push_back(message.octets);
                                               },
                                               [&](const rnsap::cli::InputError&) { bad = true; }});
  if (hex != nullptr) std::fclose(hex);
  if (!read || bad || messages.empty()) {
    std::cerr << "make_sample_capture: cannot read the messages of " << argv[1] << '\n';
    return 1;
  }
  rnsap::testing::WriteFile(argv[2], rnsap::testing::SampleCapture(messages));
  return 0;
}
