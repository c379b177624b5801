// All four passes at the edges of what a host can hand them: a verdict or
// flags left from before, a further layer inside an octet, nesting beyond the
// rule depth, and messages whose length is not a
// whole number of octets. Walks, flags and verdicts of whole messages are the
// message vectors'.
#include <gtest/gtest.h>

#include <cstdint>
#include <sstream>
#include <string>
#include <tuple>
#include <vector>

#include "engine/message_walk.h"
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

}  // namespace
}  // namespace rnsap::testing
