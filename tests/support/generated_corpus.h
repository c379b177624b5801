// The octets of the messages in a corpus that generator/message_gen.py wrote,
// or in a plain file of hexadecimal messages, and of hexadecimal text.
#pragma once

#include <cstdint>
#include <fstream>
#include <sstream>
#include <string>
#include <string_view>
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

// The messages of `text`: the hex word of each line "message HEX ..." of a
// generated corpus, and each line of hex digits and blanks alone (comments,
// which start with '#', and blank lines are passed over).
inline std::vector<std::vector<uint8_t>> MessagesOfText(std::string_view text) {
  std::vector<std::vector<uint8_t>> messages;
  std::istringstream lines{std::string(text)};
  std::string line, keyword, hex;
  while (std::getline(lines, line)) {
    if (!line.empty() && line.back() == '\r') line.pop_back();
    const bool plainHex = line.find_first_not_of("0123456789abcdefABCDEF ") == std::string::npos;
    if (plainHex && line.find_first_not_of(' ') != std::string::npos) {
      messages.push_back(HexOctets(line));
      continue;
    }
    std::istringstream words(line);
    if (words >> keyword >> hex && keyword == "message") messages.push_back(HexOctets(hex));
  }
  return messages;
}

inline std::vector<std::vector<uint8_t>> ReadGeneratedMessages(const char* path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return MessagesOfText(text.str());
}

}  // namespace rnsap::testing
