// Hex messages as a user types them: octets of two hex digits, with blanks or
// ':' allowed between octets, one message per argument or per line.
#pragma once

#include <cstdint>
#include <cstdio>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/options.h"

namespace rnsap::cli {

// One line read as a message.
struct HexLine {
  enum class Kind { kSkipped, kMessage, kBad };
  Kind kind = Kind::kSkipped;
  std::vector<uint8_t> octets;  // kMessage
  std::string error;            // kBad: what is wrong, with the column
};

// Empty lines and lines whose first non-blank character is '#' are skipped;
// any other line is read as a message.
HexLine ParseHexLine(std::string_view line);

// A message given on its own, as an argument is: nothing is skipped, and a
// text without hex digits is bad.
HexLine ParseHexMessage(std::string_view text);

struct InputMessage {
  std::string origin;  // "FILE:LINE", "<stdin>:LINE" or "argument N"
  std::vector<uint8_t> octets;
};

struct InputError {
  std::string origin;
  std::string reason;
};

// Takes each message, or what is wrong with a line, as it is read.
struct HexHandlers {
  std::function<void(const InputMessage&)> message;
  std::function<void(const InputError&)> error;
};

// Reads a hex source (captures are left to the capture reader) line by line,
// naming each line "NAME:LINE", and hands each line on before the next is
// read. A file that cannot be read is an error of its own, with the system's
// reason; so is a stream that starts as a pcap or pcapng file does.
void ReadHexSource(const InputSource& source, std::FILE* standardInput,
                   const HexHandlers& handlers);

}  // namespace rnsap::cli
