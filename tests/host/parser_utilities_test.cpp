// The pu_ParserUtilities stand-in: allocation knob, layer row growth and the
// recorder of field reports and display lines.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <vector>

#include "boundary/host_services.h"
#include "host/recorder.h"

namespace rnsap::host {
namespace {

class ParserUtilitiesTest : public ::testing::Test {
 protected:
  void SetUp() override { ResetParserUtilities(); }
};

// ---- allocation ----------------------------------------------------------

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
}

TEST_F(ParserUtilitiesTest, NoCallFailsWithoutAChosenCall) {
  std::vector<void*> blocks;
  for (int i = 0; i < 5; ++i) blocks.push_back(pu_Malloc(4));
  for (void* block : blocks) EXPECT_NE(block, nullptr);
  for (void* block : blocks) std::free(block);
}

TEST_F(ParserUtilitiesTest, ResetClearsCounterAndKnob) {
  FailAllocationCall(1);
  ResetParserUtilities();
  void* block = pu_Malloc(4);
  EXPECT_NE(block, nullptr);
  EXPECT_EQ(AllocationCalls(), 1u);
  std::free(block);
}

// ---- pu_CreateNewLayerInfo -------------------------------------------------

class LayerInfoTest : public ParserUtilitiesTest {
 protected:
  void TearDown() override { std::free(request_.layerRows); }

  void GiveRows(uint32_t count) {
    request_.layerRows = static_cast<LayerBoundary*>(std::calloc(count, sizeof(LayerBoundary)));
    request_.layerRowLimit = count - 1;
  }

  DecodeRequest request_{};
};

TEST_F(LayerInfoTest, GrowsRowsUpToTheRowIndexKeepingOldRowsAndZeroingNewOnes) {
  GiveRows(1);
  request_.layerRows[0] = {1, 64, 7, 9};
  request_.layerRowIndex = 5;
  pu_CreateNewLayerInfo(&request_);
  ASSERT_GE(request_.layerRowLimit, 5u);
  EXPECT_EQ(request_.layerRows[0].lastBit, 64u);
  EXPECT_EQ(request_.layerRows[0].tag, 9u);
  for (uint32_t row = 1; row <= request_.layerRowLimit; ++row) {
    EXPECT_EQ(request_.layerRows[row].firstBit, 0u) << row;
    EXPECT_EQ(request_.layerRows[row].layerValue, 0u) << row;
  }
  EXPECT_EQ(CreateNewLayerInfoCalls(), 1u);
}

TEST_F(LayerInfoTest, AtLeastDoublesSoThatRowAfterRowDoesNotReallocateEachTime) {
  GiveRows(4);
  request_.layerRowIndex = 4;
  pu_CreateNewLayerInfo(&request_);
  EXPECT_EQ(request_.layerRowLimit, 7u);
}

TEST_F(LayerInfoTest, CreatesTheFirstRowWhenThereAreNone) {
  request_.layerRowIndex = 0;
  pu_CreateNewLayerInfo(&request_);
  ASSERT_NE(request_.layerRows, nullptr);
  EXPECT_EQ(request_.layerRowLimit, 0u);
}

TEST_F(LayerInfoTest, LeavesRowsAloneWhenTheRowExists) {
  GiveRows(3);
  LayerBoundary* const rows = request_.layerRows;
  request_.layerRowIndex = 2;
  pu_CreateNewLayerInfo(&request_);
  EXPECT_EQ(request_.layerRows, rows);
  EXPECT_EQ(request_.layerRowLimit, 2u);
}

// ---- pu_AddDecodedFieldsData and pu_AddFieldsToDisplayData -------------------

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

TEST_F(FieldReportTest, CapturesTheMarkedTextRecordAndMovesTheIndexOn) {
  std::vector<BitSegment> segments(1);
  request_.textRecordIndex = 3;
  textRecords_[3].bytes[0] = 0x2A;
  textRecords_[3].bytes[3] = 0x77;  // beyond the marked bytes
  Report(segments, "", "");
  const DecodedFieldReport& report = DecodedFields().back();
  EXPECT_EQ(report.textRecordIndex, 3u);
  EXPECT_EQ(report.textRecordBytes, (std::array<uint8_t, 3>{0x2A, 0, 0}));
  EXPECT_EQ(request_.textRecordIndex, 4u);
}

TEST_F(FieldReportTest, TextRecordIndexWrapsAtTheEndOfTheRecords) {
  std::vector<BitSegment> segments(1);
  request_.textRecordIndex = kTextRecordCount - 1;
  Report(segments, "", "");
  EXPECT_EQ(request_.textRecordIndex, 0u);
}

TEST_F(FieldReportTest, AnIndexBeyondTheRecordsIsNotRead) {
  std::vector<BitSegment> segments(1);
  request_.textRecordIndex = kTextRecordCount + 2;
  Report(segments, "", "");
  EXPECT_EQ(DecodedFields().back().textRecordBytes, (std::array<uint8_t, 3>{}));
  EXPECT_EQ(request_.textRecordIndex, 3u);
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
