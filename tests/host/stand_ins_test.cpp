// The host runtime's libraries: pu_ParserUtilities's layer row growth (the
// message vectors check the reports it hands to the recorder, the set-up and
// allocation failure tests its allocation knob), and the key buffer layout
// kf_OptSupport writes into a key-field table with the result knob through
// which the module's handling is steered.
#include <gtest/gtest.h>

#include <bit>
#include <cstdlib>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "contract/host_services.h"
#include "tests/stand_in/recorder.h"

namespace rnsap::host {
namespace {

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
