// The octets of the messages in a corpus that generator/message_gen.py wrote,
// or in a plain file of hexadecimal messages, and of hexadecimal text.
#pragma once

#include <algorithm>
#include <cstdint>
#include <fstream>
#include <sstream>
#include <string>
#include <string_view>
#include <vector>

namespace rnsap::testing {

// Parsed without streams or the C library's number parsing, so that the
// Windows digest driver needs no locale of its C runtime.

inline int HexDigitValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

// True for a line of hex digits and blanks holding at least one digit.
inline bool IsHexLine(std::string_view line) {
  bool digits = false;
  for (char c : line) {
    if (c != ' ' && HexDigitValue(c) < 0) return false;
    digits = digits || c != ' ';
  }
  return digits;
}

// The octets of hexadecimal text, blanks between them or not.
inline std::vector<uint8_t> HexOctets(std::string_view hex) {
  std::vector<uint8_t> octets;
  int high = -1;
  for (char c : hex) {
    const int digit = HexDigitValue(c);
    if (digit < 0) continue;
    if (high < 0) {
      high = digit;
    } else {
      octets.push_back(static_cast<uint8_t>(high << 4 | digit));
      high = -1;
    }
  }
  return octets;
}

// The messages of `text`: the hex word of each line "message HEX ..." of a
// generated corpus, and each line of hex digits and blanks alone (comments,
// which start with '#', and blank lines are passed over).
inline std::vector<std::vector<uint8_t>> MessagesOfText(std::string_view text) {
  constexpr std::string_view kMessageKeyword = "message ";
  std::vector<std::vector<uint8_t>> messages;
  while (!text.empty()) {
    const size_t end = std::min(text.find('\n'), text.size());
    std::string_view line = text.substr(0, end);
    text.remove_prefix(std::min(end + 1, text.size()));
    if (line.ends_with('\r')) line.remove_suffix(1);
    if (IsHexLine(line)) {
      messages.push_back(HexOctets(line));
    } else if (line.starts_with(kMessageKeyword)) {
      line.remove_prefix(kMessageKeyword.size());
      messages.push_back(HexOctets(line.substr(0, line.find(' '))));
    }
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
