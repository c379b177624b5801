// Copies a text with some of its bytes escaped, taking sixteen bytes at once
// while none of them needs an escape. What needs one and how it is written
// is the Escaping's:
//
//   static Bytes16 Flags(Bytes16 bytes)     non-zero in each lane whose byte needs one
//   static bool Needs(unsigned char byte)   the same for one byte
//   static char* Escape(unsigned char byte, char* out)  writes it, returns the end
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace rnsap::cli::escaped_copy {

// Sixteen bytes as one vector, so that they are tested all at once; the
// bytes from 0x80 on are the negative ones.
using Bytes16 = signed char __attribute__((vector_size(16)));

inline constexpr size_t kBlockSize = sizeof(Bytes16);

inline constexpr char kHexDigits[] = "0123456789abcdef";

template <class Escaping>
bool AnyNeedsEscape(uint64_t first, uint64_t second) {
  const uint64_t words[2] = {first, second};
  Bytes16 bytes;
  std::memcpy(&bytes, words, sizeof bytes);
  const Bytes16 needs = Escaping::Flags(bytes);
  uint64_t halves[2];
  std::memcpy(halves, &needs, sizeof halves);
  return (halves[0] | halves[1]) != 0;
}

// Copies the `size` bytes at `from`, one to two times a `Half`, to `to` if
// none needs an escape. They are taken as their first and their last half,
// which overlap below two halves, and tested in one block.
template <class Escaping, typename Half>
bool CopyIfPlain(const char* from, size_t size, char* to) {
  const size_t lastHalf = size - sizeof(Half);
  Half first;
  Half last;
  std::memcpy(&first, from, sizeof first);
  std::memcpy(&last, from + lastHalf, sizeof last);
  if constexpr (sizeof(Half) == sizeof(uint64_t)) {
    if (AnyNeedsEscape<Escaping>(first, last)) return false;
  } else {
    const uint64_t both = first | uint64_t{last} << 32;
    // twice, so that the block stays in registers
    if (AnyNeedsEscape<Escaping>(both, both)) return false;
  }
  std::memcpy(to, &first, sizeof first);
  std::memcpy(to + lastHalf, &last, sizeof last);
  return true;
}

// Copies the rest of a text that was plain up to it, shorter than a block,
// if it is plain too; reaches back over bytes already copied as they are
// where the rest alone is too short. False when some byte needs an escape or
// the text is shorter than four.
template <class Escaping>
bool CopyPlainRest(std::string_view text, size_t rest, char* out) {
  const char* const from = text.data() + text.size() - rest;
  if (text.size() >= sizeof(uint64_t)) {
    const size_t back = rest < sizeof(uint64_t) ? sizeof(uint64_t) - rest : 0;
    return CopyIfPlain<Escaping, uint64_t>(from - back, rest + back, out - back);
  }
  return text.size() >= sizeof(uint32_t) && CopyIfPlain<Escaping, uint32_t>(from, rest, out);
}

// Blocks of sixteen plain bytes are copied whole, and so is the rest of a
// text plain up to it; from the first block that holds a byte that needs an
// escape on, and in texts shorter than four, byte by byte. Returns the end.
template <class Escaping>
char* WriteEscaped(std::string_view text, char* out) {
  const char* next = text.data();
  const char* const end = next + text.size();
  while (static_cast<size_t>(end - next) >= kBlockSize &&
         CopyIfPlain<Escaping, uint64_t>(next, kBlockSize, out)) {
    next += kBlockSize;
    out += kBlockSize;
  }
  const size_t rest = static_cast<size_t>(end - next);
  if (rest < kBlockSize && CopyPlainRest<Escaping>(text, rest, out)) return out + rest;
  for (; next != end; ++next) {
    const auto byte = static_cast<unsigned char>(*next);
    if (Escaping::Needs(byte)) {
      out = Escaping::Escape(byte, out);
    } else {
      *out++ = *next;
    }
  }
  return out;
}

}  // namespace rnsap::cli::escaped_copy
