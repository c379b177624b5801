#include "engine/bit_access.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <vector>

#include "tests/stand_in/recorder.h"

namespace rnsap {
namespace {

// The wire octets with every whole byte bit-reversed, as a pass holds them.
std::vector<uint8_t> Reversed(std::vector<uint8_t> wire) {
  ReverseBitGroups(wire.data(), 1, 8, static_cast<uint32_t>(8 * wire.size()));
  return wire;
}

TEST(ExtractBitsTest, ReadsTheRunBetweenTwoBitNumbers) {
  struct Case {
    std::vector<uint8_t> wire;
    uint32_t from, to, expected;
  };
  const std::vector<uint8_t> c180{0xC1, 0x80};
  const std::vector<uint8_t> counting{0x12, 0x34, 0x56, 0x78, 0x9A};
  const Case cases[] = {
      {c180, 3, 1, 6},                // message order: the first bit most significant
      {c180, 12, 1, 0xC18},           //
      {c180, 1, 3, 3},                // rising: the last bit most significant
      {c180, 1, 12, 0x183},           //
      {counting, 14, 10, 0xD},        // within one byte, away from its edges
      {counting, 38, 34, 0x6},        //
      {counting, 20, 4, 0x12345},     // across three,
      {counting, 32, 1, 0x12345678},  // four
      {counting, 36, 5, 0x23456789},  // and five bytes
  };
  for (const Case& c : cases) {
    EXPECT_EQ(ExtractBits(Reversed(c.wire).data(), c.from, c.to), c.expected)
        << c.from << " to " << c.to;
  }
  const std::vector<uint8_t> wire{0xC1, 0x80, 0x5A};
  const std::vector<uint8_t> buffer = Reversed(wire);
  for (uint32_t bit = 1; bit <= 24; ++bit) {
    EXPECT_EQ(ExtractBits(buffer.data(), bit, bit),
              (wire[(bit - 1) / 8] >> (7 - (bit - 1) % 8)) & 1u)
        << "bit " << bit;
  }
}

TEST(ReverseBitsTest, ReversesTheLowBitsOfEachWidth) {
  struct Case {
    uint32_t value, width, expected;
  };
  const Case cases[] = {{0xC1, 8, 0x83},
                        {0x1C1, 8, 0x83},
                        {0x1234, 16, 0x2C48},
                        {0xFFFF0001, 16, 0x8000},
                        {0x12345678, 32, 0x1E6A2C48},
                        {0x183, 12, 0xC18},
                        {0xF0000006, 3, 0b011},
                        {1, 1, 1},
                        {0xFFFFFFFF, 0, 0}};
  for (const Case& c : cases) EXPECT_EQ(ReverseBits(c.value, c.width), c.expected) << c.value;
}

TEST(ReverseBitGroupsTest, ReversesTheGroupsFromTheStartToTheEnd) {
  struct Case {
    std::vector<uint8_t> buffer;
    uint32_t start, groupBits, endBit;
    std::vector<uint8_t> expected;
  };
  const Case cases[] = {
      {{0xC1, 0x80, 0xF0}, 1, 8, 20, {0x83, 0x01, 0xF0}},  // a partial last byte stays
      {{0xC1, 0x80, 0x0F}, 9, 8, 24, {0xC1, 0x01, 0xF0}},  // earlier bytes stay
      {{0xC1}, 1, 8, 0, {0xC1}},                           // a message of no bits
      // Unaligned: the octets straddling two bytes, up to the last whole byte.
      {{0xAB, 0xCD, 0xEF, 0x12}, 4, 8, 32, {0x6B, 0xFD, 0xD4, 0x15}},
      {{0xAB, 0xCD, 0xEF, 0x12}, 4, 8, 28, {0x6B, 0xFD, 0xEC, 0x12}},
      // Other group sizes exchange bits within whole groups.
      {{0x13}, 1, 4, 8, {0x8C}},
      {{0xB4, 0x01}, 1, 3, 8, {0x99, 0x01}},
      {{0xAB, 0xCD, 0xEF}, 2, 5, 24, {0x6B, 0x9B, 0xFE}},
      {{0xAB}, 1, 0, 8, {0xAB}},
  };
  for (Case c : cases) {
    ReverseBitGroups(c.buffer.data(), c.start, c.groupBits, c.endBit);
    EXPECT_EQ(c.buffer, c.expected) << "start " << c.start << ", groups of " << c.groupBits;
  }
}

TEST(BitOrderStackTest, PushesAlternateAndStopAtBothEnds) {
  BitOrderStack stack;
  std::memset(&stack, 0xFF, sizeof stack);
  stack.Clear();
  EXPECT_EQ(stack.index, 0u);
  EXPECT_EQ(stack.groupBits[0], 1u);
  EXPECT_EQ(stack.TopGroupBits(), 0u) << "unswapped";
  for (uint32_t push = 1; push < BitOrderStack::kDepth; ++push) {
    stack.Push();
    EXPECT_EQ(stack.swapped[push], push % 2) << "push " << push;
    EXPECT_EQ(stack.groupBits[push], push % 2 ? 8u : 0u) << "push " << push;
    EXPECT_EQ(stack.TopGroupBits(), stack.groupBits[push]);
  }
  stack.Push();
  EXPECT_EQ(stack.index, BitOrderStack::kDepth - 1) << "a full stack pushes nothing";
  stack.Pop();
  EXPECT_EQ(stack.index, BitOrderStack::kDepth - 2);
  while (stack.index > 0) stack.Pop();
  stack.Pop();
  EXPECT_EQ(stack.index, 0u);
}

// How far each grows is the allocation failure tests'; here the growth that
// is refused or would wrap in 32 bits.
TEST(GrowArrayTest, RefusedOrOversizedGrowthFails) {
  void* array = nullptr;
  uint32_t capacity = 0;
  const auto allocate = [&](uint32_t count) {
    std::free(array);
    array = std::malloc(count * sizeof(uint32_t));
    capacity = count;
    host::ResetRecorder();
  };
  allocate(4);
  host::FailAllocationCall(1);
  EXPECT_EQ(EnsureExact(&array, 9, &capacity, sizeof(uint32_t)), 0u);
  EXPECT_EQ(array, nullptr);

  allocate(1);
  host::FailAllocationCall(2);
  EXPECT_EQ(EnsureDoubling(&array, 7, &capacity, sizeof(uint32_t)), 0u);
  EXPECT_EQ(array, nullptr);
  EXPECT_EQ(capacity, 2u) << "the first doubling went through";

  // 0x0B000000 segments of 24 octets, and a capacity that would double past
  // 2^32: both would wrap in 32 bits.
  allocate(4);
  EXPECT_EQ(EnsureExact(&array, 0x0B000000, &capacity, 24), 0u);
  capacity = 0x80000000u;
  EXPECT_EQ(EnsureDoubling(&array, 0x80000000u, &capacity, 1), 0u);
  capacity = 4;
  EXPECT_EQ(EnsureExact(&array, 0xffffffffu, &capacity, 24), 1u) << "a loop of no elements";
  EXPECT_EQ(host::AllocationCalls(), 0u);
  std::free(array);
}

}  // namespace
}  // namespace rnsap
