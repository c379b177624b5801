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

// Sixteen bytes as one vector, so that they are tested all at once.
using Bytes16 = signed char __attribute__((vector_size(16)));

// Whether any byte of the two words needs an escape: below 0x20, from 0x7f on
// (the bytes from 0x80 on are the negative ones), '"' or '\\'.
bool AnyNeedsEscape(uint64_t first, uint64_t second) {
  const uint64_t words[2] = {first, second};
  Bytes16 bytes;
  std::memcpy(&bytes, words, sizeof bytes);
  const Bytes16 needs = (bytes < 0x20) | (bytes == 0x7f) | (bytes == '"') | (bytes == '\\');
  uint64_t halves[2];
  std::memcpy(halves, &needs, sizeof halves);
  return (halves[0] | halves[1]) != 0;
}

constexpr size_t kBlockSize = sizeof(Bytes16);

// Copies the `size` bytes at `from`, one to two times a `Half`, to `to` if
// none needs an escape. They are taken as their first and their last half,
// which overlap below two halves, and tested in one block.
template <typename Half>
bool CopyIfPlain(const char* from, size_t size, char* to) {
  const size_t lastHalf = size - sizeof(Half);
  Half first;
  Half last;
  std::memcpy(&first, from, sizeof first);
  std::memcpy(&last, from + lastHalf, sizeof last);
  if constexpr (sizeof(Half) == sizeof(uint64_t)) {
    if (AnyNeedsEscape(first, last)) return false;
  } else {
    const uint64_t both = first | uint64_t{last} << 32;
    if (AnyNeedsEscape(both, both)) return false;  // twice, so that the block stays in registers
  }
  std::memcpy(to, &first, sizeof first);
  std::memcpy(to + lastHalf, &last, sizeof last);
  return true;
}

// Copies the rest of a text that was plain up to it, shorter than a block,
// if it is plain too; reaches back over bytes already copied as they are
// where the rest alone is too short. False when some byte needs an escape or
// the text is shorter than four.
bool CopyPlainRest(std::string_view text, size_t rest, char* out) {
  const char* const from = text.data() + text.size() - rest;
  if (text.size() >= sizeof(uint64_t)) {
    const size_t back = rest < sizeof(uint64_t) ? sizeof(uint64_t) - rest : 0;
    return CopyIfPlain<uint64_t>(from - back, rest + back, out - back);
  }
  return text.size() >= sizeof(uint32_t) && CopyIfPlain<uint32_t>(from, rest, out);
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

// Blocks of sixteen plain bytes are copied whole, and so is the rest of a
// text plain up to it; from the first block that holds a byte that needs an
// escape on, and in texts shorter than four, byte by byte.
char* WriteJsonEscaped(std::string_view text, char* out) {
  const char* next = text.data();
  const char* const end = next + text.size();
  while (static_cast<size_t>(end - next) >= kBlockSize &&
         CopyIfPlain<uint64_t>(next, kBlockSize, out)) {
    next += kBlockSize;
    out += kBlockSize;
  }
  const size_t rest = static_cast<size_t>(end - next);
  if (rest < kBlockSize && CopyPlainRest(text, rest, out)) return out + rest;
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
