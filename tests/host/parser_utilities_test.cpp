// The pu_ParserUtilities stand-in: allocation knob, layer row growth and the
// recorder of field reports and display lines.
#include <gtest/gtest.h>

#include <array>
#include <cstdlib>
#include <cstring>
#include <vector>

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

class FieldReportTest : public ParserUtilitiesTest {
 protected:
  FieldReportTest() : textRecords_(kTextRecordCount) { request_.textRecords = textRecords_.data(); }

  void Report(std::vector<BitSegment>& segments, const char* text, const char* label) {
    pu_AddDecodedFieldsData(&request_, static_cast<uint32_t>(segments.size()), segments.data(),
                            text, 1, label, 2923, 0, 8);
  }

  std::vector<TextRecord> textRecords_;
  DecodeRequest request_{};
};

TEST_F(FieldReportTest, RecordsEveryArgumentAndCopiesWhatIsOnlyValidDuringTheCall) {
  std::vector<BitSegment> segments = {{3, 17, 20, 0, {}}, {9, 21, 24, 0, {}}};
  char text[] = "  IMSI=39";
  char label[] = "  IMSI";
  Report(segments, text, label);
  segments[0].segmentValue = 0xFF;
  std::memset(text, 0, sizeof text);
  std::memset(label, 0, sizeof label);

  ASSERT_EQ(DecodedFields().size(), 1u);
  const DecodedFieldReport& report = DecodedFields()[0];
  EXPECT_EQ(report.label, "  IMSI");
  EXPECT_EQ(report.text, "  IMSI=39");
  EXPECT_EQ(report.fieldId, 2923u);
  EXPECT_EQ(report.firstSegment, 1u);
  EXPECT_EQ(report.bitOrderGroup, 8u);
  EXPECT_EQ(report.zero, 0u);
  ASSERT_EQ(report.segments.size(), 2u);
  EXPECT_EQ(report.segments[0].segmentValue, 3u);
  EXPECT_EQ(report.segments[0].firstBit, 17u);
  EXPECT_EQ(report.segments[1].lastBit, 24u);
}

// The marked bytes of the record the index names, and the index moved on,
// round at the end of the records; an index beyond them is not read.
TEST_F(FieldReportTest, CapturesTheMarkedTextRecordAndMovesTheIndexOn) {
  struct Case {
    uint32_t index, next;
    std::array<uint8_t, 3> captured;
  };
  for (auto& record : textRecords_) record.bytes[0] = 0x2A;
  for (const Case& c : {Case{3, 4, {0x2A, 0, 0}}, Case{kTextRecordCount - 1, 0, {0x2A, 0, 0}},
                        Case{kTextRecordCount + 2, 3, {}}}) {
    std::vector<BitSegment> segments(1);
    request_.textRecordIndex = c.index;
    Report(segments, "", "");
    EXPECT_EQ(DecodedFields().back().textRecordIndex, c.index);
    EXPECT_EQ(DecodedFields().back().textRecordBytes, c.captured) << c.index;
    EXPECT_EQ(request_.textRecordIndex, c.next) << c.index;
  }
}

TEST_F(FieldReportTest, RecordsDisplayLinesInOrderAndResetForgetsEverything) {
  pu_AddFieldsToDisplayData(&request_, "RadioLinkSetupRequest", 688);
  pu_AddFieldsToDisplayData(&request_, "fdd", 697);
  ASSERT_EQ(DisplayLines().size(), 2u);
  EXPECT_EQ(DisplayLines()[0].text, "RadioLinkSetupRequest");
  EXPECT_EQ(DisplayLines()[0].displayId, 688u);
  EXPECT_EQ(DisplayLines()[1].displayId, 697u);

  std::vector<BitSegment> segments(1);
  Report(segments, "", "");
  ResetParserUtilities();
  EXPECT_TRUE(DisplayLines().empty());
  EXPECT_TRUE(DecodedFields().empty());
}

}  // namespace
}  // namespace rnsap::host
