// Hex messages as a user types them: octets of two hex digits, with blanks or
// ':' allowed between octets, one message per argument or per line.
#pragma once

#include <cstdint>
#include <istream>
#include <span>
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

struct InputBatch {
  std::vector<InputMessage> messages;
  std::vector<InputError> errors;
};

// Adds the lines of `stream` to `batch`, naming each "NAME:LINE". A UTF-8
// byte-order mark in front of the first line is skipped.
void ReadLines(std::istream& stream, std::string_view name, InputBatch& batch);

// Reads every hex source in order (captures are left to the capture reader). A file that cannot be
// read is an error of its own, with the system's reason; the other sources are read all the same.
InputBatch ReadInputs(std::span<const InputSource> sources, std::istream& standardInput);

}  // namespace rnsap::cli
