// The bit buffer of a decode: numbering, extraction and in-place reversal,
// and the growable arrays of the DecodeState.
//
// Bit 1 of a message is the most significant bit of its first octet on the
// wire. While a pass runs, the buffer is bit-reversed per octet, so bit n lies
// in byte (n-1)/8 at bit (n-1) mod 8 counted from the least significant bit.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>

#include "contract/decode_state.h"

namespace rnsap {

// Bits `from` to `to` (inclusive, 1-based) of the reversed buffer, at most 32.
// from <= to: the bit numbered `to` is the most significant. from > to: the
// bits in message order, the first one most significant.
uint32_t ExtractBits(const uint8_t* buffer, uint32_t from, uint32_t to);

// The `width` bits (1 to 32) of the message from bit `first` on, the first
// one most significant: ExtractBits(buffer, first + width - 1, first), taken
// with one load where the message has eight octets from there on. A 32-bit
// target calls ExtractBits instead: the 64-bit steps inlined into every read
// would give each rule a frame of several hundred bytes.
inline uint32_t ReadMessageBits(const DecodeState& s, uint32_t first, uint32_t width) {
  const uint32_t byte = (first - 1) / 8;
  if constexpr (std::endian::native == std::endian::little && sizeof(void*) == 8) {
    if (byte + 8 <= (s.totalBits + 7) / 8) {
      uint64_t word;
      std::memcpy(&word, s.buffer + byte, sizeof word);
      // Bit `first` is the lowest; mirrored, it becomes the most significant.
      word = __builtin_bswap64(word >> (first - 1) % 8);
      word = ((word >> 4) & 0x0F0F0F0F0F0F0F0Full) | ((word & 0x0F0F0F0F0F0F0F0Full) << 4);
      word = ((word >> 2) & 0x3333333333333333ull) | ((word & 0x3333333333333333ull) << 2);
      word = ((word >> 1) & 0x5555555555555555ull) | ((word & 0x5555555555555555ull) << 1);
      return static_cast<uint32_t>(word >> (64 - width));
    }
  }
  return ExtractBits(s.buffer, first + width - 1, first);
}

// The low `width` bits of `value` in the opposite order.
uint32_t ReverseBits(uint32_t value, uint32_t width);

// Reverses the message in place group by group, from bit `start` up to `endBit`.
void ReverseBitGroups(uint8_t* buffer, uint32_t start, uint32_t groupBits, uint32_t endBit);

// The order the buffer is in: one per pass, eight entries deep.
struct BitOrderStack {
  static constexpr uint32_t kDepth = 8;
  uint32_t swapped[kDepth];
  uint32_t groupBits[kDepth];
  uint32_t index;

  void Clear();  // index 0, entry 0 unswapped with groupBits 1
  void Push();
  void Pop();
  // What a reported field carries as its bit order: groupBits of the top entry if swapped.
  uint32_t TopGroupBits() const { return swapped[index] == 1 ? groupBits[index] : 0; }
};

// Grows `*array` through pu_Realloc to exactly lastIndex + 1 elements unless
// it already has more. Returns 0 when memory runs out.
uint32_t EnsureExact(void** array, uint32_t lastIndex, uint32_t* capacity, uint32_t elementSize);

// Doubles `*array` through pu_Realloc until `index` is below the capacity.
// Returns 0 when memory runs out.
uint32_t EnsureDoubling(void** array, uint32_t index, uint32_t* capacity, uint32_t elementSize);

// Starts the LayerRecord of the message at `position`.
void OpenLayerRecord(DecodeState& state);

}  // namespace rnsap
