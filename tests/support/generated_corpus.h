// The octets of the messages in a corpus that generator/message_gen.py wrote,
// and of hexadecimal text.
#pragma once

#include <cstdint>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace rnsap::testing {

// The octets of hexadecimal text, blanks between them or not.
inline std::vector<uint8_t> HexOctets(std::string hex) {
  std::erase(hex, ' ');
  std::vector<uint8_t> octets;
  for (size_t i = 0; i + 1 < hex.size(); i += 2)
    octets.push_back(static_cast<uint8_t>(std::stoul(hex.substr(i, 2), nullptr, 16)));
  return octets;
}

inline std::vector<std::vector<uint8_t>> ReadGeneratedMessages(const char* path) {
  std::vector<std::vector<uint8_t>> messages;
  std::ifstream in(path);
  std::string line, keyword, hex;
  while (std::getline(in, line)) {
    std::istringstream words(line);
    if (!(words >> keyword >> hex) || keyword != "message") continue;
    messages.push_back(HexOctets(hex));
  }
  return messages;
}

}  // namespace rnsap::testing
