#include "cli/json.h"

#include <array>

#include "cli/escaped_copy.h"

namespace rnsap::cli {
namespace {

// The short escapes JSON has; 0 for a byte without one.
char ShortEscape(unsigned char byte) {
  switch (byte) {
    case '"':
      return '"';
    case '\\':
      return '\\';
    case '\b':
      return 'b';
    case '\f':
      return 'f';
    case '\n':
      return 'n';
    case '\r':
      return 'r';
    case '\t':
      return 't';
    default:
      return 0;
  }
}

constexpr std::array<bool, 256> kNeedsEscape = [] {
  std::array<bool, 256> table{};
  for (unsigned byte = 0; byte < table.size(); ++byte) {
    table[byte] = byte < 0x20 || byte >= 0x7f || byte == '"' || byte == '\\';
  }
  return table;
}();

// Bytes below 0x20, from 0x7f on, '"' and '\\': the short escapes JSON has, or
// the code point of the byte.
struct JsonEscaping {
  static escaped_copy::Bytes16 Flags(escaped_copy::Bytes16 bytes) {
    return (bytes < 0x20) | (bytes == 0x7f) | (bytes == '"') | (bytes == '\\');
  }

  static bool Needs(unsigned char byte) { return kNeedsEscape[byte]; }

  static char* Escape(unsigned char byte, char* out) {
    using escaped_copy::kHexDigits;
    *out++ = '\\';
    if (const char escape = ShortEscape(byte)) {
      *out++ = escape;
      return out;
    }
    for (const char character : {'u', '0', '0', kHexDigits[byte >> 4], kHexDigits[byte & 0xf]}) {
      *out++ = character;
    }
    return out;
  }
};

}  // namespace

char* WriteJsonEscaped(std::string_view text, char* out) {
  return escaped_copy::WriteEscaped<JsonEscaping>(text, out);
}

char* WriteJsonString(std::string_view text, char* out) {
  *out++ = '"';
  out = WriteJsonEscaped(text, out);
  *out++ = '"';
  return out;
}

std::string JsonString(std::string_view text) {
  std::string json(JsonStringBound(text.size()), '\0');
  json.resize(static_cast<size_t>(WriteJsonString(text, json.data()) - json.data()));
  return json;
}

}  // namespace rnsap::cli
