// The Validation pass through its export, with the stand-in host.
#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"
#include "tests/support/bit_writer.h"

namespace rnsap {
namespace {

using testing::BitWriter;
using testing::kEmptySetupRequest;
using testing::kUnwritten;
using testing::PublicHeader;
using testing::PutIeFrame;

class ValidationPassTest : public ::testing::Test {
 protected:
  // Loads `message` (of `bits` bits, all of it by default) into a fresh host
  // context and runs the pass on it.
  bool Validate(const std::vector<uint8_t>& message, uint32_t bits = 0,
                host::HostDecodeCapacities capacities = {}) {
    context_ = std::make_unique<host::HostDecodeContext>(capacities);
    context_->LoadMessage(message, bits ? bits : static_cast<uint32_t>(8 * message.size()));
    host::ResetHost();
    if (failAllocation_) host::FailAllocationCall(failAllocation_);
    request().verdict = presetVerdict_;
    request().bitsLeftOut = kUnwritten;
    return vex_PreDecodeMV(&request());
  }

  DecodeState& state() { return context_->state(); }
  DecodeRequest& request() { return context_->decode_request(); }
  bool BufferRestored(const std::vector<uint8_t>& message) {
    return std::memcmp(state().buffer, message.data(), message.size()) == 0;
  }

  std::unique_ptr<host::HostDecodeContext> context_;
  uint32_t failAllocation_ = 0;
  int32_t presetVerdict_ = 0;
};

TEST_F(ValidationPassTest, WalksHeaderOfEmptyRadioLinkSetupRequest) {
  const std::vector<uint8_t>& message = kEmptySetupRequest;
  ASSERT_TRUE(Validate(message));
  EXPECT_EQ(state().position, 65u);
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_EQ(state().flags, 0u);
  EXPECT_EQ(request().verdict, 0);
  EXPECT_TRUE(BufferRestored(message));
  EXPECT_EQ(state().stackTop, state().stackBase);
}

TEST_F(ValidationPassTest, OutcomeHasNoProcedureCode) {
  const BitWriter w = PublicHeader(3, 0, 0);
  ASSERT_EQ(w.bits(), 56u);
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().position, 57u);
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_EQ(state().flags, 0u);
}

TEST_F(ValidationPassTest, ShortMessagesEndNormally) {
  // One octet: PDU EXTENSION, PDU Type and five Spare bits, then the
  // procedure code finds no room.
  ASSERT_TRUE(Validate({0x00}));
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_EQ(state().position, 9u);
  EXPECT_EQ(request().verdict, 0);
  EXPECT_EQ(state().flags, 0u);

  // A message of no bits: nothing is reversed and the first read fails.
  ASSERT_TRUE(Validate(std::vector<uint8_t>{}, 0));
  EXPECT_EQ(state().position, 1u);
  EXPECT_EQ(request().bitsLeftOut, 0u);
}

TEST_F(ValidationPassTest, BitsBeyondTheWalkAreLeftOut) {
  std::vector<uint8_t> message = kEmptySetupRequest;
  message.push_back(0xFE);
  ASSERT_TRUE(Validate(message, 71));
  EXPECT_EQ(state().position, 65u);
  EXPECT_EQ(request().bitsLeftOut, 7u);
  EXPECT_TRUE(BufferRestored(message));
}

TEST_F(ValidationPassTest, IeListShorterThanItsCountRaisesCondition) {
  BitWriter w = PublicHeader(0, 20, 3);
  PutIeFrame(w, 4, 1).Put(17, 6);  // AllowedQueuingTime
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, ERR_CONDITION);
  EXPECT_EQ(request().verdict, VERDICT_FLAGGED);
  EXPECT_TRUE(BufferRestored(w.bytes()));
}

TEST_F(ValidationPassTest, IeListOfExactCountRaisesNothing) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutIeFrame(w, 4, 1).Put(17, 6);
  PutIeFrame(w, 8, 1).Align().Put(200, 8);  // CFN
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, 0u);
  EXPECT_EQ(request().verdict, 0);
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_EQ(state().position, w.bits() + 1);
}

TEST_F(ValidationPassTest, IeListCutInItsLastIeRaisesNothing) {
  // The counter reaches the count when the last IE starts, so losing the
  // bits inside it leaves the loop complete.
  BitWriter w = PublicHeader(0, 20, 3);
  PutIeFrame(w, 4, 1).Put(17, 6);
  PutIeFrame(w, 8, 1).Align().Put(200, 8);
  w.Align().Put(8, 16);  // the third IE's id, and no more
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, 0u);
  EXPECT_EQ(request().verdict, 0);
}

TEST_F(ValidationPassTest, AbsentOptionalMemberFlagsAWellFormedMessage) {
  // UC_ID without its iE_Extensions: complete, yet flagged.
  BitWriter w = PublicHeader(0, 20, 1);
  PutIeFrame(w, 166, 5).Put(0, 1).Put(0, 1).Align().Put(300, 16).Align().Put(4000, 16);
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, ERR_CONDITION);
  EXPECT_EQ(request().verdict, VERDICT_FLAGGED);
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_EQ(state().position, w.bits() + 1);
}

TEST_F(ValidationPassTest, IeWithoutBranchReadsNoValue) {
  // Id 142 has no branch: the next frame starts right behind its length.
  BitWriter w = PublicHeader(0, 20, 2);
  PutIeFrame(w, 142, 5);
  PutIeFrame(w, 4, 1).Put(17, 6);
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, 0u);
  EXPECT_EQ(state().position, w.bits() + 1 + 2);  // closing alignment of the 6-bit value
}

TEST_F(ValidationPassTest, VerdictPresetByTheHostStays) {
  presetVerdict_ = VERDICT_FLAGGED;
  ASSERT_TRUE(Validate(kEmptySetupRequest));
  EXPECT_EQ(request().verdict, VERDICT_FLAGGED);
  EXPECT_EQ(state().flags, 0u);
}

TEST_F(ValidationPassTest, FlagsLeftByTheHostGiveTheVerdictAtOnce) {
  context_ = std::make_unique<host::HostDecodeContext>();
  const std::vector<uint8_t>& message = kEmptySetupRequest;
  context_->LoadMessage(message);
  state().flags = ERR_CONDITION;
  request().verdict = 0;
  ASSERT_TRUE(vex_PreDecodeMV(&request()));
  EXPECT_EQ(request().verdict, VERDICT_FLAGGED);
}

TEST_F(ValidationPassTest, FailedLayerTableGrowth) {
  failAllocation_ = 1;
  const std::vector<uint8_t>& message = kEmptySetupRequest;
  EXPECT_FALSE(Validate(message, 0, {.positionStack = 64, .layerTable = 1}));
  EXPECT_EQ(state().flags, ERR_LAYER);
  EXPECT_EQ(request().bitsLeftOut, kUnwritten);
  EXPECT_TRUE(BufferRestored(message));  // not yet reversed
}

TEST_F(ValidationPassTest, FailedPositionStackGrowth) {
  failAllocation_ = 1;
  const std::vector<uint8_t>& message = kEmptySetupRequest;
  EXPECT_FALSE(Validate(message, 0, {.positionStack = 2, .layerTable = 4}));
  EXPECT_EQ(state().flags, ERR_NO_MEMORY_STACK);
  EXPECT_EQ(request().bitsLeftOut, kUnwritten);
  EXPECT_FALSE(BufferRestored(message));  // left bit-reversed
}

TEST_F(ValidationPassTest, FailedSegmentGrowth) {
  // L3_Information of 300 bits needs 300 segments, more than the first 200.
  BitWriter w = PublicHeader(0, 7, 1);
  PutIeFrame(w, 85, 40).Align().Put(1, 1).Put(0, 1).Put(300, 14);
  for (int i = 0; i < 300; ++i) w.Put(i & 1, 1);
  failAllocation_ = 1;
  EXPECT_FALSE(Validate(w.bytes()));
  EXPECT_EQ(state().flags, ERR_NO_MEMORY_SEGMENTS);
  EXPECT_EQ(request().bitsLeftOut, kUnwritten);

  failAllocation_ = 0;
  ASSERT_TRUE(Validate(w.bytes()));
  EXPECT_EQ(state().field.segmentCapacity, 300u);
  EXPECT_EQ(state().flags, 0u);
}

}  // namespace
}  // namespace rnsap
