// The kf_OptSupport stand-in: the key buffer layout it writes into a key-field
// table and the result knob through which the module's handling is steered.
#include <gtest/gtest.h>

#include <bit>
#include <set>
#include <utility>
#include <vector>

#include "contract/host_services.h"
#include "host/recorder.h"

namespace rnsap::host {
namespace {

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

class InitialiseResultTest : public OptSupportTest,
                             public ::testing::WithParamInterface<int32_t> {};

TEST_P(InitialiseResultTest, AnswersTheChosenResultAndLeavesTheMarkRowUnlessAboveOne) {
  SetInitialiseResult(GetParam(), 42);
  EXPECT_EQ(Initialise(), GetParam());
  EXPECT_EQ(markRow_, GetParam() > 1 ? 42 : 77);
}

INSTANTIATE_TEST_SUITE_P(EveryKindOfResult, InitialiseResultTest, ::testing::Values(-3, 0, 1, 2));

TEST_F(OptSupportTest, CountsCallsAndResetRestoresTheDefaults) {
  SetInitialiseResult(0);
  Initialise();
  Initialise();
  EXPECT_EQ(InitialiseOptKfeCalls(), 2u);

  ResetOptSupport();
  EXPECT_EQ(InitialiseOptKfeCalls(), 0u);
  EXPECT_EQ(LastKeyLayoutSize(), 0u);
  EXPECT_EQ(Initialise(), 1);
}

}  // namespace
}  // namespace rnsap::host
