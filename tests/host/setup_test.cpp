// The host-side set-up of a decode: AllocFieldRecord and the HostDecodeContext
// that owns a decode's memory. The partial-octet tests of the passes show what
// InitDecodeState copies.
#include "hostrt/setup.h"

#include <gtest/gtest.h>

#include <array>
#include <cstdlib>
#include <cstring>
#include <stdexcept>
#include <string>
#include <vector>

#include "contract/host_services.h"
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

}  // namespace
}  // namespace rnsap::host
