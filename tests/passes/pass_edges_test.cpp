// All four passes at the edges of what a host can hand them: a verdict or
// flags left from before, a further layer inside an octet or on the same
// state, nesting beyond the rule depth, and messages whose length is not a
// whole number of octets; the cut of texts at the ends of their buffers, and
// the Display pass's names of the message by its procedure code under the PDU
// type, tables of its own that no value list of the dictionary gives. Walks,
// flags, verdicts and texts of whole messages are the message vectors'.
#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <sstream>
#include <string>
#include <vector>

#include "engine/message_walk.h"
#include "passes/field_text.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/facts.h"
#include "tests/support/generated_corpus.h"

namespace rnsap::testing {
namespace {

// The pass only ever sets the verdict, and from its first check point on: a
// verdict the host left stays, and flags the host left give it at once.
TEST(ValidationPassTest, VerdictIsOnlyEverSetFromTheFlags) {
  for (const auto& [presetVerdict, presetFlags] :
       {std::pair{VERDICT_FLAGGED, 0u}, std::pair{0, ERR_CONDITION}}) {
    PassHost host;
    host.Load(kEmptySetupRequest, 64);
    host.request().verdict = presetVerdict;
    host.state().flags = presetFlags;
    ASSERT_TRUE(vex_PreDecodeMV(&host.request()));
    EXPECT_EQ(host.request().verdict, VERDICT_FLAGGED);
  }
}

// A pass that a host starts inside an octet, as a further layer, aligns its
// end counted from where it began, and fills the next layer record.
TEST(ValidationPassTest, FurtherLayerAlignsItsEndFromItsOwnStart) {
  BitWriter w;
  w.Put(0, 3);
  for (uint8_t octet : kEmptySetupRequest) w.Put(octet, 8);
  PassHost host;
  host.Load(w);
  host.state().position = 4;
  host.state().bitsLeft -= 3;
  ASSERT_TRUE(vex_PreDecodeMV(&host.request()));
  EXPECT_EQ((host.state().position - 4) % 8, 0u);
  EXPECT_EQ(host.state().layerIndex, 1u);
  EXPECT_EQ(host.state().layerTable[1].startPosition, 4u);
}

// Nesting beyond the rule depth ends every pass at once: failure, the stack
// flag, neither bitsLeftOut nor the end of the layer row written, and the next
// message walks as usual. Allocations that fail are the allocation failure
// test's.
TEST(PassGrowthTest, NestingBeyondTheRuleDepthEndsEveryPassAtOnce) {
  for (const Pass pass : kAllPasses) {
    SCOPED_TRACE(NameOf(pass) + " pass");
    PassHost host;
    ASSERT_TRUE(host.ready());
    host.Load(DeepestNesting());
    host.request().bitsLeftOut = host.key_request().bitsLeftOut = kUnwritten;
    host.request().layerRows[0].lastBit = kUnwritten;
    EXPECT_EQ(RunPass(pass, host.context()), 0);
    EXPECT_EQ(host.state().flags, ERR_NO_MEMORY_STACK);
    EXPECT_EQ(host.request().bitsLeftOut, kUnwritten);
    EXPECT_EQ(host.key_request().bitsLeftOut, kUnwritten);
    EXPECT_FALSE(host.BufferRestored());
    EXPECT_EQ(host.request().layerRows[0].lastBit, kUnwritten);
    EXPECT_EQ(host.request().layerRowIndex, 0u);
    host.Load(kEmptySetupRequest, 64);
    EXPECT_EQ(RunPass(pass, host.context()), 1) << "the message after the failed one";
  }
}

struct CountingSink : UncheckedSink {
  uint32_t fields = 0;
  uint32_t OnField(DecodeState&, const grammar::FieldInfo&) { return ++fields; }
};

// A look-ahead needs room for its first bit only; the bits of its run behind
// the end of the message read as 0, and nothing is read past the buffer.
TEST(PassEdgesTest, LookAheadNeedsRoomForItsFirstBitOnly) {
  const grammar::Rule rule{"R", 1};
  struct Case {
    uint16_t offset, width;
    bool fits;
    uint32_t value;
  };
  for (const Case& c : {Case{0, 8, true, 0xA5}, Case{0, 9, true, 0x14A}, Case{1, 8, true, 0x4A},
                        Case{7, 32, true, 0x80000000}, Case{8, 1, false, 0}}) {
    SCOPED_TRACE(std::to_string(c.width) + " bits at " + std::to_string(c.offset));
    PassHost host;
    host.Load({0xA5}, 8);
    PassState pass;
    pass.Clear();
    CountingSink sink;
    Walker<CountingSink> walker(host.state(), sink, pass);
    const grammar::ReadPlan peek{.field = grammar::kSpareField,
                                 .shape = grammar::Shape::kPeek,
                                 .conversion = grammar::Conversion::kPlain,
                                 .keepSlot = grammar::kNoSlot,
                                 .bitmapSlot = grammar::kNoSlot,
                                 .width = c.width,
                                 .offset = c.offset,
                                 .groupCount = 1,
                                 .adjust = 0,
                                 .label = "  x",
                                 .labelLength = 3};
    EXPECT_EQ(walker.Read(peek, rule), 1u);
    EXPECT_EQ(walker.ok(), c.fits);
    EXPECT_EQ(sink.fields, c.fits ? 1u : 0u);
    if (c.fits) {
      EXPECT_EQ(host.state().field.value, c.value);
    }
  }
}

// Messages whose length is not a whole number of octets, from
// expected_passes.txt.
TEST(PassEdgesTest, MessagesOfPartialOctetsWalkAlikeInEveryPass) {
  const Facts facts = ReadFacts(RNSAP_EXPECTED_PASSES);
  for (const Fact& c : facts.at("partial")) {
    std::vector<uint32_t> fieldIds;
    std::istringstream ids(c[3]);
    for (uint32_t id; ids >> id;) fieldIds.push_back(id);
    for (const Pass pass : kAllPasses) {
      SCOPED_TRACE(c[1] + " bits, " + NameOf(pass) + " pass");
      PassHost host;
      ASSERT_TRUE(host.ready());
      host.Load(HexOctets(c[2]), Number(c[1]));
      BitsLeftOut(pass, host.context()) = kUnwritten;
      ASSERT_EQ(RunPass(pass, host.context()), 1);
      EXPECT_EQ(host.state().position, Number(c[4]));
      EXPECT_EQ(BitsLeftOut(pass, host.context()), static_cast<uint32_t>(std::stoi(c[5])));
      EXPECT_EQ(host.state().flags, pass == Pass::kValidation ? Number(c[6]) : 0u);
      EXPECT_TRUE(host.BufferRestored());
      std::vector<uint32_t> reported;
      for (const host::DecodedFieldReport& f : host::DecodedFields()) reported.push_back(f.fieldId);
      if (pass == Pass::kDecodedField) {
        EXPECT_EQ(reported, fieldIds);
      } else if (pass == Pass::kDisplay) {
        EXPECT_EQ(host::DisplayLines().size(), fieldIds.size());
      }
    }
  }
}

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
