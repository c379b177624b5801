#include "cli/terminal_text.h"

#include "cli/escaped_copy.h"

namespace rnsap::cli {
namespace {

struct TerminalEscaping {
  static escaped_copy::Bytes16 Flags(escaped_copy::Bytes16 bytes) {
    return (bytes < 0x20) | (bytes == 0x7f) | (bytes == '\\');
  }

  static bool Needs(unsigned char byte) { return byte < 0x20 || byte >= 0x7f || byte == '\\'; }

  static char* Escape(unsigned char byte, char* out) {
    if (byte >= 0xa0) {
      *out++ = static_cast<char>(0xc0 | byte >> 6);
      *out++ = static_cast<char>(0x80 | (byte & 0x3f));
      return out;
    }
    *out++ = '\\';
    if (byte == '\\') {
      *out++ = '\\';
      return out;
    }
    for (const char character :
         {'x', escaped_copy::kHexDigits[byte >> 4], escaped_copy::kHexDigits[byte & 0xf]}) {
      *out++ = character;
    }
    return out;
  }
};

}  // namespace

char* WriteTerminalText(std::string_view text, char* out) {
  return escaped_copy::WriteEscaped<TerminalEscaping>(text, out);
}

}  // namespace rnsap::cli
