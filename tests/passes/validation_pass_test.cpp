// The verdict of the Validation pass, and what all four passes do when a
// table cannot grow. Walks, flags and verdicts of whole messages are the
// message vectors'.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

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

struct PassUnderTest {
  const char* name;
  int64_t (*run)(PassHost&);
  bool reports;
};

const PassUnderTest kPasses[] = {
    {"validation", [](PassHost& h) -> int64_t { return vex_PreDecodeMV(&h.request()); }, false},
    {"decoded-field", [](PassHost& h) -> int64_t { return vex_PreDecodeMD(&h.request()); }, true},
    {"display", [](PassHost& h) -> int64_t { return vex_PreDecodeTO(&h.request()); }, true},
    {"key-field", [](PassHost& h) -> int64_t { return KFE_vorel_rnsap_04b(&h.key_request()); },
     false},
};

// L3_Information of 300 bits needs 300 segments, more than the first 200.
BitWriter MessageOf300Segments() {
  BitWriter w = PublicHeader(0, 7, 1);
  PutIeFrame(w, 85, 40).Align().Put(1, 1).Put(0, 1).Put(300, 14);
  for (int i = 0; i < 300; ++i) w.Put(i & 1, 1);
  return w;
}

struct GrowthCase {
  const char* table;
  host::HostDecodeCapacities capacities;
  BitWriter message;
  uint32_t flag;
  bool reversed;             // the walk had begun: the buffer stays bit-reversed
  const char* lastReported;  // the text of the last field reported, if any
};

// A failed growth returns failure at once, writes neither bitsLeftOut nor the
// end of the layer row, and leaves reported what was reported.
TEST(PassGrowthTest, FailedGrowthEndsEveryPassAtOnce) {
  BitWriter emptyRequest;
  for (uint8_t octet : kEmptySetupRequest) emptyRequest.Put(octet, 8);
  const GrowthCase cases[] = {
      {"layer table",
       {.positionStack = 64, .layerTable = 1},
       emptyRequest,
       ERR_LAYER,
       false,
       nullptr},
      {"position stack",
       {.positionStack = 2, .layerTable = 4},
       emptyRequest,
       ERR_NO_MEMORY_STACK,
       true,
       nullptr},
      {"segments", {}, MessageOf300Segments(), ERR_NO_MEMORY_SEGMENTS, true, "  Length=300"},
  };
  for (const GrowthCase& c : cases) {
    for (const PassUnderTest& pass : kPasses) {
      SCOPED_TRACE(std::string(c.table) + ", " + pass.name + " pass");
      PassHost host(c.capacities);
      ASSERT_TRUE(host.ready());
      host.Load(c.message);
      host.request().bitsLeftOut = host.key_request().bitsLeftOut = kUnwritten;
      host.request().layerRows[0].lastBit = kUnwritten;
      host::FailAllocationCall(1);
      EXPECT_EQ(pass.run(host), 0);
      EXPECT_EQ(host.state().flags, c.flag);
      EXPECT_EQ(host.request().bitsLeftOut, kUnwritten);
      EXPECT_EQ(host.key_request().bitsLeftOut, kUnwritten);
      EXPECT_EQ(host.BufferRestored(), !c.reversed);
      EXPECT_EQ(host.request().layerRows[0].lastBit, kUnwritten);
      EXPECT_EQ(host.request().layerRowIndex, 0u);
      const bool reported = !host::DecodedFields().empty() || !host::DisplayLines().empty();
      ASSERT_EQ(reported, pass.reports && c.lastReported != nullptr);
      if (!reported) continue;
      const std::string last = c.lastReported;
      if (host::DecodedFields().empty()) {
        EXPECT_EQ(host::DisplayLines().back().text, last.substr(last.find('=') + 1));
      } else {
        EXPECT_EQ(host::DecodedFields().back().text, last);
      }
    }
  }
}

TEST(PassGrowthTest, SegmentsGrowToTheExactNeedOfTheRead) {
  PassHost host;
  host.Load(MessageOf300Segments());
  ASSERT_TRUE(vex_PreDecodeMV(&host.request()));
  EXPECT_EQ(host.state().field.segmentCapacity, 300u);
  EXPECT_EQ(host.state().flags, 0u);
}

}  // namespace
}  // namespace rnsap::testing
