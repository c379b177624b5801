// The two reporting passes around the walk: the layer row of a further layer
// on the same state, the cut of texts at the ends of their buffers, and the
// Display pass's names of the message by its procedure code under the PDU
// type, tables of its own that no value list of the dictionary gives. The
// other texts are checked field by field by the message vectors.
#include <gtest/gtest.h>

#include <array>
#include <string>
#include <vector>

#include "passes/field_text.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/facts.h"

namespace rnsap::testing {
namespace {

std::array<uint32_t, 4> Words(const LayerBoundary& row) {
  return {row.firstBit, row.lastBit, row.layerValue, row.tag};
}

// A second message behind the first runs as a further layer on the same
// state: it takes the next row, which the host is asked for when it lies
// above the limit, and its bits are numbered on from the first message.
TEST(ReportingPassesTest, FurtherLayerFillsTheNextRow) {
  for (auto pass : {vex_PreDecodeTO, vex_PreDecodeMD}) {
    PassHost host({.positionStack = 64, .layerTable = 4, .layerRows = 1});
    ASSERT_TRUE(host.ready());
    std::vector<uint8_t> twoMessages = kEmptySetupRequest;
    twoMessages.insert(twoMessages.end(), kEmptySetupRequest.begin(), kEmptySetupRequest.end());
    host.Load(twoMessages, 128);
    DecodeRequest& r = host.request();
    r.layerValue = 0x12345678;
    r.tag = 0xA7;
    ASSERT_TRUE(pass(&r));
    EXPECT_EQ(host::CreateNewLayerInfoCalls(), 0u) << "row 0 is within the limit";
    r.layerValue = 0x0badcafe;
    r.tag = 0x5C;
    ASSERT_TRUE(pass(&r));
    EXPECT_EQ(host::CreateNewLayerInfoCalls(), 1u) << "row 1 is above the limit";
    EXPECT_EQ(r.layerRowIndex, 2u);
    EXPECT_EQ(Words(r.layerRows[0]), (std::array<uint32_t, 4>{1, 64, 0x12345678, 0xA7}));
    EXPECT_EQ(Words(r.layerRows[1]), (std::array<uint32_t, 4>{65, 128, 0x0badcafe, 0x5C}));
    EXPECT_EQ(host.state().layerIndex, 1u);
    EXPECT_EQ(host.state().layerTable[1].startPosition, 65u);
    EXPECT_EQ(r.bitsLeftOut, 0u);
  }
  const auto& fields = host::DecodedFields();  // of the Decoded-field pass, the last one
  ASSERT_EQ(fields.size(), 30u);
  EXPECT_EQ(fields[15].segments.at(0).firstBit, 65u) << "the second PDU EXTENSION";
  for (const host::DecodedFieldReport& f : fields) EXPECT_EQ(f.bitOrderGroup, 8u) << f.label;
}

// The longest texts the grammar can produce stay far below the limit of the
// text buffer, so the cut is shown on the rendering itself, with the buffer
// size the pass uses for its text; what lies behind the cut stays untouched.
TEST(DecodedFieldTextLimits, TextIsCutAtItsBuffer) {
  std::vector<BitSegment> segments(200);
  for (BitSegment& s : segments) s.segmentValue = 255;
  FieldRecord record{};
  record.segments = segments.data();
  record.readCount = record.segmentCount = 200;

  char outputText[257];
  outputText[256] = 'x';
  TextBuffer output(outputText, 256);
  output.Append("IPAddress=");
  RenderValue(grammar::ValueForm::kElementsDecimal, grammar::kNoNames, ".", record, output);
  std::string full;
  for (int i = 0; i < 200; ++i) full += i ? ".255" : "255";
  EXPECT_EQ(std::string(outputText), "IPAddress=" + full.substr(0, 245));
  EXPECT_EQ(outputText[256], 'x');
}

TEST(DisplayPassTest, ProcedureCodeNamesTheMessageByItsPduType) {
  constexpr uint32_t kProcedureLine = 688;
  PassHost host;
  ASSERT_TRUE(host.ready());
  const Facts facts = ReadFacts(RNSAP_EXPECTED_PASSES);
  for (const Fact& c : facts.at("procedure")) {
    SCOPED_TRACE("PDU type " + c[1] + ", code " + c[2]);
    host.Load(PublicHeader(Number(c[1]), Number(c[2]), 0));
    ASSERT_TRUE(vex_PreDecodeTO(&host.request()));
    std::vector<std::string> names;
    for (const host::DisplayLine& line : host::DisplayLines())
      if (line.displayId == kProcedureLine) names.push_back(line.text);
    EXPECT_EQ(names, std::vector<std::string>{c[3]});
  }
}

}  // namespace
}  // namespace rnsap::testing
