// The pu_ParserUtilities stand-in: the allocation knob and the layer row
// growth. The message vectors check its records of field reports and display
// lines.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>

#include "contract/host_services.h"
#include "host/recorder.h"

namespace rnsap::host {
namespace {

class ParserUtilitiesTest : public ::testing::Test {
 protected:
  void SetUp() override { ResetParserUtilities(); }
};

TEST_F(ParserUtilitiesTest, FailsOnlyTheChosenCallCountingMallocAndReallocTogether) {
  FailAllocationCall(2);
  void* first = pu_Malloc(8);
  void* grown = pu_Realloc(first, 64);
  void* third = pu_Malloc(8);
  EXPECT_NE(first, nullptr);
  EXPECT_EQ(grown, nullptr);
  EXPECT_NE(third, nullptr);
  EXPECT_EQ(AllocationCalls(), 3u);
  std::free(first);  // a failed growth leaves the block as it was
  std::free(third);

  FailAllocationCall(1);
  ResetParserUtilities();
  void* block = pu_Malloc(4);
  EXPECT_NE(block, nullptr) << "a reset clears the knob";
  EXPECT_EQ(AllocationCalls(), 1u);
  std::free(block);
}

// Rows up to the row index, old rows kept and new ones zeroed, at least
// doubling so that row after row does not reallocate each time.
TEST_F(ParserUtilitiesTest, CreateNewLayerInfoGrowsRowsUpToTheRowIndex) {
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

}  // namespace
}  // namespace rnsap::host
