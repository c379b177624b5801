// The host runtime: the set-up of a decode, AllocFieldRecord and the
// HostDecodeContext that owns a decode's memory (the partial-octet tests of
// the passes show what InitDecodeState copies); pu_ParserUtilities's layer row
// growth (the message vectors check the reports it hands to the recorder);
// and the key buffer layout kf_OptSupport writes into a key-field table, with
// the result knob through which the module's handling is steered.
#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <cstdlib>
#include <cstring>
#include <set>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "contract/host_services.h"
#include "hostrt/setup.h"
#include "tests/stand_in/recorder.h"

namespace rnsap::host {
namespace {

// ---- AllocFieldRecord ------------------------------------------------------

// Full-size buffers through the host, the record reset but for its id and
// segment count; with allocation `failingCall` refused, failure, and the other
// buffers still usable.
TEST(AllocFieldRecordTest, AllocatesThroughTheHostAndSurvivesEachRefusal) {
  for (const uint32_t failingCall : {0u, 1u, 2u, 3u}) {
    SCOPED_TRACE("allocation " + std::to_string(failingCall) + " refused");
    ResetRecorder();
    FailAllocationCall(failingCall);
    FieldRecord record{};
    record.fieldId = 99;
    record.segmentCount = 2;
    record.value = record.readCount = record.rawFlag = 5;
    EXPECT_EQ(AllocFieldRecord(&record), failingCall == 0 ? 1u : 0u);
    EXPECT_EQ(AllocationCalls(), 3u) << "each buffer is tried";
    EXPECT_EQ(record.valueText == nullptr, failingCall == 1);
    EXPECT_EQ(record.label == nullptr, failingCall == 2);
    EXPECT_EQ(record.segments == nullptr, failingCall == 3);
    EXPECT_EQ(record.segmentCapacity, failingCall == 3 ? 0u : kInitialSegmentCapacity);
    EXPECT_EQ(record.value, 0u);
    EXPECT_EQ(record.readCount, 0u);
    EXPECT_EQ(record.rawFlag, 0u);
    EXPECT_EQ(record.fieldId, 99u);
    EXPECT_EQ(record.segmentCount, 2u);
    // Filling each buffer to its stated size trips a memory checker if one is short.
    if (record.label != nullptr) {
      EXPECT_STREQ(record.label, "");
      std::memset(record.label, 'x', kLabelBufferSize);
    }
    if (record.valueText != nullptr) {
      EXPECT_STREQ(record.valueText, "");
      std::memset(record.valueText, 'x', kValueTextBufferSize);
    }
    if (record.segments != nullptr)
      std::memset(record.segments, 0, kInitialSegmentCapacity * sizeof(BitSegment));
    std::free(record.valueText);
    std::free(record.label);
    std::free(record.segments);
  }
}

// ---- HostDecodeContext -----------------------------------------------------

class HostDecodeContextTest : public ::testing::Test {
 protected:
  void SetUp() override { ResetHost(); }
};

// The passes fail at once without the wiring; what they do not show is here.
TEST_F(HostDecodeContextTest, SizesItsArraysAndKeyBuffer) {
  HostDecodeContext context({.positionStack = 2, .layerTable = 1, .layerRows = 3});
  ASSERT_TRUE(context.ready());
  const DecodeState& state = context.state();
  EXPECT_EQ(state.stackCapacity, 2u);
  EXPECT_EQ(state.layerCapacity, 1u);
  EXPECT_EQ(context.decode_request().layerRowLimit, 2u);
  EXPECT_EQ(state.field.segmentCapacity, kInitialSegmentCapacity);
  std::memset(state.ruleName, 'r', kRuleNameBufferSize);  // the longest rule name and its NUL
  EXPECT_GE(context.key_request().keyOffset, KeyLayoutSize(kMaxKeyRows))
      << "key octets go behind the largest key layout";
  EXPECT_LT(context.key_request().keyOffset + size_t{context.key_request().keyLimit},
            context.key_buffer().size());
}

TEST_F(HostDecodeContextTest, LoadsAPrivateCopyOfTheMessageOfAnyWholeLength) {
  HostDecodeContext context;
  std::vector<uint8_t> message{0x00, 0x14, 0x40, 0x50};
  context.LoadMessage(message);
  message[1] = 0xFF;
  const DecodeState& state = context.state();
  EXPECT_EQ(state.totalBits, 32u);
  EXPECT_EQ(state.source[1], 0x14);
  EXPECT_EQ(state.buffer[1], 0x14);
  EXPECT_NE(state.buffer, state.source);

  context.LoadMessage(std::span<const uint8_t>{});
  EXPECT_EQ(context.state().totalBits, 0u);
  EXPECT_NE(context.state().buffer, nullptr);
  EXPECT_NE(context.state().source, nullptr);
  EXPECT_THROW(context.LoadMessage(std::array<uint8_t, 2>{}, 17), std::invalid_argument);
}

// The words of the last walk that the passes read without showing them: the
// message vectors, which rewind between passes, cover the others.
TEST_F(HostDecodeContextTest, RewindClearsTheWordsOfTheLastWalk) {
  HostDecodeContext context;
  context.LoadMessage(std::array<uint8_t, 1>{0x80});
  DecodeState& state = context.state();
  KeyFieldRequest& keys = context.key_request();
  context.decode_request().verdict = VERDICT_FLAGGED;
  state.test = 1;
  state.width = 16;
  std::memset(state.reserved2, 0xAA, sizeof state.reserved2);
  std::memset(state.reserved3, 0xAA, sizeof state.reserved3);
  std::strcpy(state.ruleName, "RNSAP_PDU");
  state.layerPending = 0;
  state.layerIndex = 3;
  keys.keyBuffer[0] = 0x01;

  context.Rewind();
  EXPECT_EQ(context.decode_request().verdict, 0);
  EXPECT_EQ(state.test, 0);
  EXPECT_EQ(state.width, 0u);
  for (uint8_t byte : state.reserved2) EXPECT_EQ(byte, 0);
  for (uint8_t byte : state.reserved3) EXPECT_EQ(byte, 0);
  EXPECT_STREQ(state.ruleName, "");
  EXPECT_EQ(state.layerPending, 1u);
  EXPECT_EQ(state.layerIndex, 0u);
  EXPECT_EQ(keys.keyBuffer[0], 0) << "the presence bits of the last key pass";
}

TEST_F(HostDecodeContextTest, FollowsLayerRowsThatTheHostLibraryReplaced) {
  HostDecodeContext context({.positionStack = 1, .layerTable = 1, .layerRows = 1});
  DecodeRequest& request = context.decode_request();
  request.layerRowIndex = 3;
  pu_CreateNewLayerInfo(&request);
  request.layerRows[3] = {9, 16, 0, 0};
  request.layerRowIndex = 4;
  ASSERT_EQ(context.closed_layer_rows().size(), 4u);
  EXPECT_EQ(context.closed_layer_rows()[3].lastBit, 16u);
}

TEST_F(HostDecodeContextTest, IsNotReadyWhenTheFieldRecordCannotBeAllocated) {
  FailAllocationCall(2);
  HostDecodeContext context;
  EXPECT_FALSE(context.ready());
  EXPECT_THROW(context.LoadMessage(std::array<uint8_t, 1>{}), std::logic_error);
}

// ---- pu_ParserUtilities and kf_OptSupport ---------------------------------

// Rows up to the row index, old rows kept and new ones zeroed, at least
// doubling so that row after row does not reallocate each time.
TEST(ParserUtilitiesTest, CreateNewLayerInfoGrowsRowsUpToTheRowIndex) {
  struct Case {
    uint32_t rows, rowIndex, limit;
  };
  for (const Case& c : {Case{1, 5, 5}, Case{4, 4, 7}, Case{0, 0, 0}, Case{3, 2, 2}}) {
    SCOPED_TRACE(std::to_string(c.rows) + " rows, index " + std::to_string(c.rowIndex));
    DecodeRequest request{};
    if (c.rows > 0) {
      request.layerRows = static_cast<LayerBoundary*>(std::calloc(c.rows, sizeof(LayerBoundary)));
      request.layerRows[0] = {1, 64, 7, 9};
      request.layerRowLimit = c.rows - 1;
    }
    LayerBoundary* const before = request.layerRows;
    request.layerRowIndex = c.rowIndex;
    pu_CreateNewLayerInfo(&request);
    ASSERT_NE(request.layerRows, nullptr);
    EXPECT_EQ(request.layerRowLimit, c.limit);
    if (c.rowIndex < c.rows) {
      EXPECT_EQ(request.layerRows, before);
    }
    if (c.rows > 0) {
      EXPECT_EQ(request.layerRows[0].lastBit, 64u);
    }
    for (uint32_t row = c.rows; row <= request.layerRowLimit; ++row)
      EXPECT_EQ(request.layerRows[row].tag, 0u) << row;
    std::free(request.layerRows);
  }
}

constexpr uint32_t kModuleKeyRows = 164;

class OptSupportTest : public ::testing::Test {
 protected:
  OptSupportTest() : table_(kModuleKeyRows) {
    for (KeyFieldRow& row : table_) {
      row.moduleName = "vorel_rnsap_04b";
      row.keyName = "IMSI";
    }
  }
  void SetUp() override { ResetOptSupport(); }

  int32_t Initialise() { return kf_InitialiseOptKFE(table_.data(), kModuleKeyRows, &markRow_); }

  std::vector<KeyFieldRow> table_;
  uint16_t markRow_ = 77;
};

TEST_F(OptSupportTest, GivesEveryRowItsOwnPresenceBitAndSlotInsideTheLayout) {
  ASSERT_EQ(Initialise(), 1);
  EXPECT_EQ(LastKeyLayoutSize(), KeyLayoutSize(kModuleKeyRows));

  const uint32_t firstSlot = table_[0].valueOffset;
  std::set<std::pair<uint32_t, uint32_t>> presenceBits;
  std::set<uint32_t> slots;
  for (const KeyFieldRow& row : table_) {
    EXPECT_EQ(std::popcount(row.presenceMask), 1);
    EXPECT_LE(row.presenceMask, 0x80u);
    EXPECT_LT(row.presenceOffset, firstSlot);
    EXPECT_EQ((row.valueOffset - firstSlot) % kKeySlotBytes, 0u);
    EXPECT_LE(row.valueOffset + kKeySlotBytes, LastKeyLayoutSize());
    presenceBits.insert({row.presenceOffset, row.presenceMask});
    slots.insert(row.valueOffset);
  }
  EXPECT_EQ(presenceBits.size(), kModuleKeyRows);
  EXPECT_EQ(slots.size(), kModuleKeyRows);
  EXPECT_STREQ(table_[163].moduleName, "vorel_rnsap_04b") << "the module's words stay";
  EXPECT_STREQ(table_[163].keyName, "IMSI");
}

// The result knob, and the mark row written only for a result above 1.
TEST_F(OptSupportTest, AnswersTheChosenResultCountsCallsAndResets) {
  for (const int32_t result : {-3, 0, 1, 2}) {
    markRow_ = 77;
    SetInitialiseResult(result, 42);
    EXPECT_EQ(Initialise(), result);
    EXPECT_EQ(markRow_, result > 1 ? 42 : 77) << "result " << result;
  }
  EXPECT_EQ(InitialiseOptKfeCalls(), 4u);
  ResetOptSupport();
  EXPECT_EQ(InitialiseOptKfeCalls(), 0u);
  EXPECT_EQ(LastKeyLayoutSize(), 0u);
  EXPECT_EQ(Initialise(), 1);
}

}  // namespace
}  // namespace rnsap::host
