#include "engine/bit_access.h"

#include <array>
#include <cstring>

#include "contract/host_services.h"

namespace rnsap {
namespace {

constexpr uint32_t kBitsPerByte = 8;

// The low highBit + 1 bits set, for highBit 0 to 7.
constexpr uint32_t LowBitsUpTo(uint32_t highBit) { return (2u << highBit) - 1u; }

// Mask of the low `count` bits of a byte, for count 0 to 8.
constexpr uint8_t LowBits(uint32_t count) { return static_cast<uint8_t>((1u << count) - 1u); }

// Exchanges adjacent bits, then pairs, nibbles, bytes and half-words.
constexpr uint32_t Reverse32(uint32_t value) {
  value = ((value >> 1) & 0x55555555u) | ((value & 0x55555555u) << 1);
  value = ((value >> 2) & 0x33333333u) | ((value & 0x33333333u) << 2);
  value = ((value >> 4) & 0x0F0F0F0Fu) | ((value & 0x0F0F0F0Fu) << 4);
  value = ((value >> 8) & 0x00FF00FFu) | ((value & 0x00FF00FFu) << 8);
  return (value >> 16) | (value << 16);
}

// Shifts the lowest bit of `value` into the result, `width` times.
constexpr uint32_t ReverseByLoop(uint32_t value, uint32_t width) {
  uint32_t reversed = 0;
  for (uint32_t round = 0; round < width; ++round) {
    reversed = (reversed << 1) | (value & 1u);
    value >>= 1;
  }
  return reversed;
}

constexpr std::array<uint8_t, 256> MakeByteReversalTable() {
  std::array<uint8_t, 256> table{};
  for (uint32_t byte = 0; byte < table.size(); ++byte) {
    table[byte] = static_cast<uint8_t>(ReverseByLoop(byte, kBitsPerByte));
  }
  return table;
}

constexpr std::array<uint8_t, 256> kReversedByte = MakeByteReversalTable();

// Bits lowBit..7 of byte `first`, all of the bytes between and bits 0..highBit
// of byte `last`, the last byte most significant.
uint32_t GatherBytes(const uint8_t* buffer, uint32_t first, uint32_t last, uint32_t lowBit,
                     uint32_t highBit) {
  uint32_t result = buffer[last] & LowBitsUpTo(highBit);
  for (uint32_t index = last - 1; index > first; --index) {
    result = (result << kBitsPerByte) | buffer[index];
  }
  return (result << (kBitsPerByte - lowBit)) | (buffer[first] >> lowBit);
}

void ReverseWholeBytes(uint8_t* buffer, uint32_t firstByte, uint32_t endByte) {
  for (uint32_t index = firstByte; index < endByte; ++index) {
    buffer[index] = kReversedByte[buffer[index]];
  }
}

// Reverses the octets that begin `offset` bits into each byte and end in the
// next one; the low `offset` bits of the first byte stay.
void ReverseStraddlingOctets(uint8_t* buffer, uint32_t firstByte, uint32_t endByte,
                             uint32_t offset) {
  const uint32_t upperCount = kBitsPerByte - offset;
  const uint8_t lowMask = LowBits(offset);
  for (uint32_t index = firstByte + 1; index < endByte; ++index) {
    uint8_t& lower = buffer[index - 1];
    uint8_t& upper = buffer[index];
    const uint8_t octet =
        static_cast<uint8_t>((lower >> offset) | ((upper & lowMask) << upperCount));
    const uint8_t reversed = kReversedByte[octet];
    lower = static_cast<uint8_t>((lower & lowMask) | (reversed << offset));
    upper = static_cast<uint8_t>((upper & ~lowMask) | (reversed >> upperCount));
  }
}

// Bit n of the buffer in its reversed numbering: byte (n-1)/8, bit (n-1) mod 8
// from the least significant.
uint32_t BitAt(const uint8_t* buffer, uint32_t bit) {
  return (buffer[(bit - 1) / kBitsPerByte] >> ((bit - 1) % kBitsPerByte)) & 1u;
}

void ExchangeBits(uint8_t* buffer, uint32_t first, uint32_t second) {
  if (BitAt(buffer, first) == BitAt(buffer, second)) return;
  buffer[(first - 1) / kBitsPerByte] ^= static_cast<uint8_t>(1u << ((first - 1) % kBitsPerByte));
  buffer[(second - 1) / kBitsPerByte] ^= static_cast<uint8_t>(1u << ((second - 1) % kBitsPerByte));
}

void ReverseGroupsBitByBit(uint8_t* buffer, uint32_t start, uint32_t groupBits, uint32_t endBit) {
  if (groupBits == 0) return;
  for (uint32_t groupFirst = start; groupFirst + groupBits - 1 <= endBit; groupFirst += groupBits) {
    for (uint32_t low = groupFirst, high = groupFirst + groupBits - 1; low < high; ++low, --high) {
      ExchangeBits(buffer, low, high);
    }
  }
}

// Reallocates `*array` to `count` elements; false when the size does not fit
// the host's 32-bit sizes or memory runs out.
bool Resize(void** array, uint64_t count, uint32_t elementSize) {
  const uint64_t bytes = count * elementSize;
  if (bytes > UINT32_MAX) return false;
  *array = pu_Realloc(*array, static_cast<uint32_t>(bytes));
  return *array != nullptr;
}

}  // namespace

uint32_t ExtractBits(const uint8_t* buffer, uint32_t from, uint32_t to) {
  const bool reversed = from > to;
  const uint32_t low = (reversed ? to : from) - 1;
  const uint32_t high = (reversed ? from : to) - 1;
  const uint32_t first = low / kBitsPerByte;
  const uint32_t last = high / kBitsPerByte;
  const uint32_t lowBit = low % kBitsPerByte;
  const uint32_t highBit = high % kBitsPerByte;
  const uint32_t bits = first == last ? (buffer[first] & LowBitsUpTo(highBit)) >> lowBit
                                      : GatherBytes(buffer, first, last, lowBit, highBit);
  return reversed ? ReverseBits(bits, from - to + 1) : bits;
}

uint32_t ReverseBits(uint32_t value, uint32_t width) {
  switch (width) {
    case 8:
      return kReversedByte[value & 0xFFu];
    case 16:
      return Reverse32(value) >> 16;
    case 32:
      return Reverse32(value);
    default:
      return ReverseByLoop(value, width);
  }
}

void ReverseBitGroups(uint8_t* buffer, uint32_t start, uint32_t groupBits, uint32_t endBit) {
  if (groupBits != kBitsPerByte) {
    ReverseGroupsBitByBit(buffer, start, groupBits, endBit);
    return;
  }
  const uint32_t firstByte = (start - 1) / kBitsPerByte;
  const uint32_t offset = (start - 1) % kBitsPerByte;
  const uint32_t endByte = endBit / kBitsPerByte;  // a last partial byte stays as it is
  if (offset == 0) {
    ReverseWholeBytes(buffer, firstByte, endByte);
  } else {
    ReverseStraddlingOctets(buffer, firstByte, endByte, offset);
  }
}

void BitOrderStack::Clear() {
  index = 0;
  swapped[0] = 0;
  groupBits[0] = 1;
}

void BitOrderStack::Push() {
  if (index + 1 >= kDepth) return;
  const bool topIsOctetSwapped = swapped[index] == 1 && groupBits[index] == kBitsPerByte;
  ++index;
  swapped[index] = topIsOctetSwapped ? 0 : 1;
  groupBits[index] = topIsOctetSwapped ? 0 : kBitsPerByte;
}

void BitOrderStack::Pop() {
  if (index > 0) --index;
}

uint32_t EnsureExact(void** array, uint32_t lastIndex, uint32_t* capacity, uint32_t elementSize) {
  const uint32_t needed = lastIndex + 1;  // a loop of no elements needs 0: no growth
  if (needed < *capacity) return 1;
  if (!Resize(array, needed, elementSize)) return 0;
  *capacity = needed;
  return 1;
}

uint32_t EnsureDoubling(void** array, uint32_t index, uint32_t* capacity, uint32_t elementSize) {
  while (index >= *capacity) {
    const uint64_t doubled = 2 * uint64_t{*capacity};
    if (doubled > UINT32_MAX || !Resize(array, doubled, elementSize)) return 0;
    *capacity = static_cast<uint32_t>(doubled);
  }
  return 1;
}

void OpenLayerRecord(DecodeState& state) {
  // A message that starts at bit 1 takes the current row, a further layer the next.
  state.layerIndex += state.position != 1 ? 1 : 0;
  state.layerPending = 0;
  LayerRecord& row = state.layerTable[state.layerIndex];
  row.startPosition = state.position;
  std::memset(row.unused, 0, sizeof row.unused);
}

}  // namespace rnsap
