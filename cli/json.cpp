#include "cli/json.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>

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

// Whether any of the eight bytes of `word` needs an escape, tested all at
// once: a byte below 0x20, from 0x7f on, '"' or '\\'.
bool AnyNeedsEscape(uint64_t word) {
  constexpr uint64_t kOnes = 0x0101010101010101;
  constexpr uint64_t kHighBits = 0x8080808080808080;
  const auto anyBelow = [](uint64_t bytes, uint64_t limit) {
    return (bytes - limit * kOnes) & ~bytes & kHighBits;
  };
  const auto anyEqual = [&](uint64_t bytes, uint64_t value) {
    return anyBelow(bytes ^ (value * kOnes), 1);
  };
  return ((word & kHighBits) | anyBelow(word, 0x20) | anyEqual(word, 0x7f) | anyEqual(word, '"') |
          anyEqual(word, '\\')) != 0;
}

constexpr size_t kWordSize = sizeof(uint64_t);

// Copies the word at `from` to `to` if none of its bytes needs an escape.
bool CopyPlainWord(const char* from, char* to) {
  uint64_t word;
  std::memcpy(&word, from, sizeof word);
  if (AnyNeedsEscape(word)) return false;
  std::memcpy(to, &word, sizeof word);
  return true;
}

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

// Words of eight plain bytes are copied whole, and so is the last word of a
// text plain up to it, overlapping bytes already copied as they are; from the
// first word that holds a byte that needs an escape on, and in texts shorter
// than a word, byte by byte.
char* WriteJsonEscaped(std::string_view text, char* out) {
  const char* next = text.data();
  const char* const end = next + text.size();
  while (static_cast<size_t>(end - next) >= kWordSize && CopyPlainWord(next, out)) {
    next += kWordSize;
    out += kWordSize;
  }
  const size_t rest = static_cast<size_t>(end - next);
  if (rest < kWordSize && text.size() >= kWordSize) {
    const size_t back = kWordSize - rest;
    if (CopyPlainWord(next - back, out - back)) return out + rest;
  }
  for (; next != end; ++next) {
    if (NeedsEscape(*next)) {
      out = WriteEscaped(static_cast<unsigned char>(*next), out);
    } else {
      *out++ = *next;
    }
  }
  return out;
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
