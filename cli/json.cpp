#include "cli/json.h"

#include <algorithm>
#include <array>

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

bool NeedsEscape(char character) { return kNeedsEscape[static_cast<unsigned char>(character)]; }

char* WriteEscaped(unsigned char byte, char* out) {
  static constexpr char kDigits[] = "0123456789abcdef";
  *out++ = '\\';
  if (const char escape = ShortEscape(byte)) {
    *out++ = escape;
    return out;
  }
  for (const char character : {'u', '0', '0', kDigits[byte >> 4], kDigits[byte & 0xf]}) {
    *out++ = character;
  }
  return out;
}

}  // namespace

// Runs of bytes that need no escape are copied whole.
char* WriteJsonString(std::string_view text, char* out) {
  *out++ = '"';
  const char* const end = text.data() + text.size();
  for (const char* plain = text.data(); plain != end;) {
    const char* const special = std::find_if(plain, end, NeedsEscape);
    out = std::copy(plain, special, out);
    if (special == end) break;
    out = WriteEscaped(static_cast<unsigned char>(*special), out);
    plain = special + 1;
  }
  *out++ = '"';
  return out;
}

std::string JsonString(std::string_view text) {
  std::string json(JsonStringBound(text.size()), '\0');
  json.resize(static_cast<size_t>(WriteJsonString(text, json.data()) - json.data()));
  return json;
}

}  // namespace rnsap::cli
