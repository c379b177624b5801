#include "engine/bit_access.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <vector>

#include "host/recorder.h"

namespace rnsap {
namespace {

// The wire octets with every whole byte bit-reversed, as a pass holds them.
std::vector<uint8_t> Reversed(std::vector<uint8_t> wire) {
  ReverseBitGroups(wire.data(), 1, 8, static_cast<uint32_t>(8 * wire.size()));
  return wire;
}

uint32_t WireBit(const std::vector<uint8_t>& wire, uint32_t bit) {
  return (wire[(bit - 1) / 8] >> (7 - (bit - 1) % 8)) & 1u;
}

// ---- ExtractBits ----------------------------------------------------------

TEST(ExtractBitsTest, ReadsInMessageOrderWhenFromExceedsTo) {
  const std::vector<uint8_t> buffer = Reversed({0xC1, 0x80});
  EXPECT_EQ(ExtractBits(buffer.data(), 3, 1), 6u);
  EXPECT_EQ(ExtractBits(buffer.data(), 12, 1), 0xC18u);
}

TEST(ExtractBitsTest, RisingRequestPutsTheLastBitFirst) {
  const std::vector<uint8_t> buffer = Reversed({0xC1, 0x80});
  EXPECT_EQ(ExtractBits(buffer.data(), 1, 3), 3u);
  EXPECT_EQ(ExtractBits(buffer.data(), 1, 12), 0x183u);
}

TEST(ExtractBitsTest, OneBitReadGivesTheWireBit) {
  const std::vector<uint8_t> wire = {0xC1, 0x80, 0x5A};
  const std::vector<uint8_t> buffer = Reversed(wire);
  for (uint32_t bit = 1; bit <= 24; ++bit) {
    EXPECT_EQ(ExtractBits(buffer.data(), bit, bit), WireBit(wire, bit)) << "bit " << bit;
  }
}

TEST(ExtractBitsTest, ReadsWithinOneByteAwayFromItsEdges) {
  const std::vector<uint8_t> buffer = Reversed({0x12, 0x34, 0x56, 0x78, 0x9A});
  EXPECT_EQ(ExtractBits(buffer.data(), 14, 10), 0xDu);
  EXPECT_EQ(ExtractBits(buffer.data(), 38, 34), 0x6u);
}

TEST(ExtractBitsTest, ReadsAcrossThreeToFiveBytes) {
  const std::vector<uint8_t> buffer = Reversed({0x12, 0x34, 0x56, 0x78, 0x9A});
  EXPECT_EQ(ExtractBits(buffer.data(), 20, 4), 0x12345u);
  EXPECT_EQ(ExtractBits(buffer.data(), 32, 1), 0x12345678u);
  EXPECT_EQ(ExtractBits(buffer.data(), 36, 5), 0x23456789u);
}

// ---- ReverseBits ------------------------------------------------------------

TEST(ReverseBitsTest, ReversesTheLowBitsOfEachWidth) {
  EXPECT_EQ(ReverseBits(0xC1, 8), 0x83u);
  EXPECT_EQ(ReverseBits(0x01, 8), 0x80u);
  EXPECT_EQ(ReverseBits(0x1234, 16), 0x2C48u);
  EXPECT_EQ(ReverseBits(0x12345678, 32), 0x1E6A2C48u);
  EXPECT_EQ(ReverseBits(0x183, 12), 0xC18u);
  EXPECT_EQ(ReverseBits(0b110, 3), 0b011u);
  EXPECT_EQ(ReverseBits(1, 1), 1u);
  EXPECT_EQ(ReverseBits(0xFFFFFFFF, 0), 0u);
}

TEST(ReverseBitsTest, IgnoresBitsAboveTheWidth) {
  EXPECT_EQ(ReverseBits(0x1C1, 8), 0x83u);
  EXPECT_EQ(ReverseBits(0xFFFF0001, 16), 0x8000u);
  EXPECT_EQ(ReverseBits(0xF0000006, 3), 0b011u);
}

TEST(ReverseBitsTest, TwiceGivesTheLowBitsBack) {
  const uint32_t values[] = {0, 1, 0x80000000, 0x12345678, 0xDEADBEEF, 0xFFFFFFFF};
  for (uint32_t width = 1; width <= 32; ++width) {
    const uint32_t lowMask = width == 32 ? 0xFFFFFFFF : (1u << width) - 1;
    for (const uint32_t value : values) {
      EXPECT_EQ(ReverseBits(ReverseBits(value, width), width), value & lowMask)
          << "width " << width << " value " << value;
    }
  }
}

// ---- ReverseBitGroups -------------------------------------------------------

TEST(ReverseBitGroupsTest, AlignedStartReversesWholeBytesOnly) {
  std::vector<uint8_t> buffer = {0xC1, 0x80, 0xF0};
  ReverseBitGroups(buffer.data(), 1, 8, 20);
  EXPECT_EQ(buffer, (std::vector<uint8_t>{0x83, 0x01, 0xF0}));
}

TEST(ReverseBitGroupsTest, AlignedStartLeavesEarlierBytesAlone) {
  std::vector<uint8_t> buffer = {0xC1, 0x80, 0x0F};
  ReverseBitGroups(buffer.data(), 9, 8, 24);
  EXPECT_EQ(buffer, (std::vector<uint8_t>{0xC1, 0x01, 0xF0}));
}

TEST(ReverseBitGroupsTest, EmptyMessageIsLeftAlone) {
  std::vector<uint8_t> buffer = {0xC1};
  ReverseBitGroups(buffer.data(), 1, 8, 0);
  EXPECT_EQ(buffer, (std::vector<uint8_t>{0xC1}));
}

TEST(ReverseBitGroupsTest, UnalignedStartReversesTheOctetsStraddlingBytes) {
  std::vector<uint8_t> buffer = {0xAB, 0xCD, 0xEF, 0x12};
  ReverseBitGroups(buffer.data(), 4, 8, 32);
  EXPECT_EQ(buffer, (std::vector<uint8_t>{0x6B, 0xFD, 0xD4, 0x15}));
  EXPECT_EQ(buffer[0] & 0x07, 0xAB & 0x07) << "bits before the start moved";
}

TEST(ReverseBitGroupsTest, UnalignedStartStopsBeforeTheLastWholeByte) {
  std::vector<uint8_t> buffer = {0xAB, 0xCD, 0xEF, 0x12};
  ReverseBitGroups(buffer.data(), 4, 8, 28);
  EXPECT_EQ(buffer, (std::vector<uint8_t>{0x6B, 0xFD, 0xEC, 0x12}));
}

TEST(ReverseBitGroupsTest, SecondCallRestoresTheBuffer) {
  const std::vector<uint8_t> original = {0xAB, 0xCD, 0xEF, 0x12, 0x34};
  for (uint32_t start = 1; start <= 9; ++start) {
    std::vector<uint8_t> buffer = original;
    ReverseBitGroups(buffer.data(), start, 8, 40);
    ReverseBitGroups(buffer.data(), start, 8, 40);
    EXPECT_EQ(buffer, original) << "start " << start;
  }
}

TEST(ReverseBitGroupsTest, OtherGroupSizesExchangeBitsWithinWholeGroups) {
  std::vector<uint8_t> nibbles = {0x13};
  ReverseBitGroups(nibbles.data(), 1, 4, 8);
  EXPECT_EQ(nibbles[0], 0x8C);

  std::vector<uint8_t> triples = {0xB4, 0x01};
  ReverseBitGroups(triples.data(), 1, 3, 8);
  EXPECT_EQ(triples, (std::vector<uint8_t>{0x99, 0x01}));

  std::vector<uint8_t> fives = {0xAB, 0xCD, 0xEF};
  ReverseBitGroups(fives.data(), 2, 5, 24);
  EXPECT_EQ(fives, (std::vector<uint8_t>{0x6B, 0x9B, 0xFE}));
}

TEST(ReverseBitGroupsTest, GroupsOfNoBitsChangeNothing) {
  std::vector<uint8_t> buffer = {0xAB};
  ReverseBitGroups(buffer.data(), 1, 0, 8);
  EXPECT_EQ(buffer[0], 0xAB);
}

// ---- BitOrderStack ----------------------------------------------------------

TEST(BitOrderStackTest, ClearedStackIsUnswapped) {
  BitOrderStack stack;
  std::memset(&stack, 0xFF, sizeof stack);
  stack.Clear();
  EXPECT_EQ(stack.index, 0u);
  EXPECT_EQ(stack.swapped[0], 0u);
  EXPECT_EQ(stack.groupBits[0], 1u);
  EXPECT_EQ(stack.TopGroupBits(), 0u);
}

TEST(BitOrderStackTest, PushesAlternateBetweenOctetSwappedAndUnswapped) {
  BitOrderStack stack;
  stack.Clear();
  stack.Push();
  EXPECT_EQ(stack.swapped[1], 1u);
  EXPECT_EQ(stack.groupBits[1], 8u);
  EXPECT_EQ(stack.TopGroupBits(), 8u);
  stack.Push();
  EXPECT_EQ(stack.swapped[2], 0u);
  EXPECT_EQ(stack.groupBits[2], 0u);
  EXPECT_EQ(stack.TopGroupBits(), 0u);
  stack.Push();
  EXPECT_EQ(stack.swapped[3], 1u);
  EXPECT_EQ(stack.groupBits[3], 8u);
}

TEST(BitOrderStackTest, PopReturnsToThePreviousTopAndStopsAtTheBottom) {
  BitOrderStack stack;
  stack.Clear();
  stack.Push();
  stack.Pop();
  EXPECT_EQ(stack.index, 0u);
  EXPECT_EQ(stack.TopGroupBits(), 0u);
  stack.Pop();
  EXPECT_EQ(stack.index, 0u);
}

TEST(BitOrderStackTest, FullStackPushesNothing) {
  BitOrderStack stack;
  stack.Clear();
  for (uint32_t push = 1; push < BitOrderStack::kDepth; ++push) stack.Push();
  ASSERT_EQ(stack.index, BitOrderStack::kDepth - 1);
  const uint32_t topGroupBits = stack.TopGroupBits();
  stack.Push();
  EXPECT_EQ(stack.index, BitOrderStack::kDepth - 1);
  EXPECT_EQ(stack.TopGroupBits(), topGroupBits);
  stack.Pop();
  EXPECT_EQ(stack.index, BitOrderStack::kDepth - 2);
}

// ---- FieldRecord and LayerRecord --------------------------------------------

TEST(ResetFieldRecordTest, ClearsTheReadAndKeepsIdAndSegments) {
  char label[] = "label";
  char valueText[] = "text";
  BitSegment segment{};
  FieldRecord record{};
  record.fieldId = 684;
  record.label = label;
  record.value = 7;
  record.valueText = valueText;
  record.readCount = 3;
  record.segmentCount = 1;
  record.segments = &segment;
  record.rawFlag = 1;

  ResetFieldRecord(record);

  EXPECT_EQ(record.value, 0u);
  EXPECT_EQ(record.readCount, 0u);
  EXPECT_EQ(record.rawFlag, 0u);
  EXPECT_STREQ(record.label, "");
  EXPECT_STREQ(record.valueText, "");
  EXPECT_EQ(record.fieldId, 684u);
  EXPECT_EQ(record.segmentCount, 1u);
  EXPECT_EQ(record.segments, &segment);
}

TEST(OpenLayerRecordTest, MessageAtBitOneTakesTheCurrentRow) {
  LayerRecord rows[2];
  std::memset(rows, 0xFF, sizeof rows);
  DecodeState state{};
  state.layerTable = rows;
  state.layerPending = 1;
  state.position = 1;

  OpenLayerRecord(state);

  EXPECT_EQ(state.layerIndex, 0u);
  EXPECT_EQ(state.layerPending, 0u);
  EXPECT_EQ(rows[0].startPosition, 1u);
  for (const uint32_t word : rows[0].unused) EXPECT_EQ(word, 0u);
  EXPECT_EQ(rows[1].startPosition, 0xFFFFFFFFu);
}

TEST(OpenLayerRecordTest, FurtherLayerTakesTheNextRow) {
  LayerRecord rows[2];
  std::memset(rows, 0xFF, sizeof rows);
  DecodeState state{};
  state.layerTable = rows;
  state.position = 17;

  OpenLayerRecord(state);

  EXPECT_EQ(state.layerIndex, 1u);
  EXPECT_EQ(rows[1].startPosition, 17u);
  for (const uint32_t word : rows[1].unused) EXPECT_EQ(word, 0u);
  EXPECT_EQ(rows[0].startPosition, 0xFFFFFFFFu);
}

// ---- Growing arrays through pu_Realloc --------------------------------------

class GrowArrayTest : public ::testing::Test {
 protected:
  void SetUp() override { host::ResetParserUtilities(); }
  void TearDown() override {
    std::free(array_);
    host::ResetParserUtilities();
  }

  // An array of `count` u32 holding 0, 1, 2, ...
  void Allocate(uint32_t count) {
    array_ = std::malloc(count * sizeof(uint32_t));
    for (uint32_t index = 0; index < count; ++index) Element(index) = index;
    capacity_ = count;
  }

  uint32_t& Element(uint32_t index) { return static_cast<uint32_t*>(array_)[index]; }

  void ExpectFirstElementsKept(uint32_t count) {
    for (uint32_t index = 0; index < count; ++index) ASSERT_EQ(Element(index), index);
  }

  void* array_ = nullptr;
  uint32_t capacity_ = 0;
};

TEST_F(GrowArrayTest, ExactKeepsAnArrayWithRoomToSpare) {
  Allocate(4);
  void* const before = array_;
  EXPECT_EQ(EnsureExact(&array_, 2, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 4u);
  EXPECT_EQ(array_, before);
  EXPECT_EQ(host::AllocationCalls(), 0u);
}

TEST_F(GrowArrayTest, ExactReallocatesWhenTheLastIndexFillsTheArray) {
  Allocate(4);
  EXPECT_EQ(EnsureExact(&array_, 3, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 4u);
  EXPECT_EQ(host::AllocationCalls(), 1u);
  ExpectFirstElementsKept(4);
}

TEST_F(GrowArrayTest, ExactGrowsToTheNeedOfTheRead) {
  Allocate(200);
  EXPECT_EQ(EnsureExact(&array_, 254, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 255u);
  EXPECT_EQ(host::AllocationCalls(), 1u);
  ExpectFirstElementsKept(200);
  Element(254) = 254;  // the new room is writable
}

TEST_F(GrowArrayTest, ExactReportsARefusedAllocation) {
  Allocate(4);
  host::FailAllocationCall(1);
  EXPECT_EQ(EnsureExact(&array_, 9, &capacity_, sizeof(uint32_t)), 0u);
  EXPECT_EQ(array_, nullptr);
}

TEST_F(GrowArrayTest, DoublingKeepsAnArrayThatHoldsTheIndex) {
  Allocate(4);
  EXPECT_EQ(EnsureDoubling(&array_, 3, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 4u);
  EXPECT_EQ(host::AllocationCalls(), 0u);
}

TEST_F(GrowArrayTest, DoublingReallocatesOncePerDoubling) {
  Allocate(2);
  EXPECT_EQ(EnsureDoubling(&array_, 2, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 4u);
  EXPECT_EQ(host::AllocationCalls(), 1u);
  EXPECT_EQ(EnsureDoubling(&array_, 9, &capacity_, sizeof(uint32_t)), 1u);
  EXPECT_EQ(capacity_, 16u);
  EXPECT_EQ(host::AllocationCalls(), 3u);
  ExpectFirstElementsKept(2);
  Element(15) = 15;
}

TEST_F(GrowArrayTest, DoublingStopsAtARefusedAllocation) {
  Allocate(1);
  host::FailAllocationCall(2);
  EXPECT_EQ(EnsureDoubling(&array_, 7, &capacity_, sizeof(uint32_t)), 0u);
  EXPECT_EQ(array_, nullptr);
  EXPECT_EQ(capacity_, 2u);
  EXPECT_EQ(host::AllocationCalls(), 2u);
}

TEST_F(GrowArrayTest, SizesBeyondThirtyTwoBitsFailWithoutAnAllocation) {
  Allocate(4);
  // 0x0B000000 segments of 24 octets, and a capacity that would double past
  // 2^32: both would wrap in 32 bits.
  EXPECT_EQ(EnsureExact(&array_, 0x0B000000, &capacity_, 24), 0u);
  capacity_ = 0x80000000u;
  EXPECT_EQ(EnsureDoubling(&array_, 0x80000000u, &capacity_, 1), 0u);
  EXPECT_EQ(host::AllocationCalls(), 0u);
  capacity_ = 4;
  EXPECT_EQ(EnsureExact(&array_, 0xffffffffu, &capacity_, 24), 1u) << "a loop of no elements";
  EXPECT_EQ(host::AllocationCalls(), 0u);
}

}  // namespace
}  // namespace rnsap
