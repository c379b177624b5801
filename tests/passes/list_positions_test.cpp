// Lists whose items read the numbered RL_ID: each place in a list has a field
// and a key row of its own, chosen by the position counter that the list's
// count loads; and a container inside a container of the same kind
// overwrites the one count both loops test.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

constexpr uint32_t kDiversityIndicationSetupRsp = 79;  // combining: a protocolIEs list
constexpr uint32_t kCombiningItemSetupRsp = 19;        // one numbered RL_ID
constexpr uint32_t kUnnumberedRlId = 3462;
constexpr uint32_t kFirstKeyRowOfRlId1 = 44;  // RL_ID1 to RL_ID16 in rows 44 to 59
constexpr uint32_t kKeyRowOfRlId = 61;

// A diversity indication of the setup response, combining the radio links
// whose RL_IDs are `rlIds`, in one protocolIEs list.
BitWriter CombiningList(const std::vector<uint32_t>& rlIds) {
  BitWriter w = PublicHeader(1, 20, 1);
  PutIeFrame(w, kDiversityIndicationSetupRsp, 3 + 5 * static_cast<uint32_t>(rlIds.size()));
  w.Put(0, 1).Put(0, 1);  // Extension Bit, combining
  w.Align().Put(rlIds.size(), 16);
  for (uint32_t rlId : rlIds) PutIeFrame(w, kCombiningItemSetupRsp, 1).Put(0, 2).Put(rlId, 5);
  return w;
}

// The field id and label of the item at `place` counted from the end of a list.
std::pair<uint32_t, std::string> NumberedRlId(uint32_t place) {
  if (place > 16) return {kUnnumberedRlId, "  RL_ID"};
  return {3400 + 4 * (place - 1), "  RL_ID" + std::to_string(place)};
}

TEST(ListPositionsTest, EachPlaceOfAListReadsAndStoresItsOwnRlId) {
  for (uint32_t items : {1u, 3u, 8u, 16u, 17u, 20u}) {
    SCOPED_TRACE(std::to_string(items) + " items");
    std::vector<uint32_t> rlIds;
    for (uint32_t i = 0; i < items; ++i) rlIds.push_back(i + 1);
    PassHost host;
    host.Load(CombiningList(rlIds));
    ASSERT_EQ(vex_PreDecodeMD(&host.request()), 1u);
    std::vector<std::pair<uint32_t, std::string>> reported, expected;
    for (const host::DecodedFieldReport& f : host::DecodedFields()) {
      if (f.label.rfind("  RL_ID", 0) == 0) reported.emplace_back(f.fieldId, f.label);
    }
    for (uint32_t i = 0; i < items; ++i) expected.push_back(NumberedRlId(items - i));
    EXPECT_EQ(reported, expected) << "the first item of a list of three is RL_ID3";

    host.context().Rewind();
    ASSERT_EQ(KFE_vorel_rnsap_04b(&host.key_request()), 1);
    const auto present = [&](uint32_t row) { return host.KeyPresent(row); };
    const auto value = [&](uint32_t row) { return *host.KeySlot(row); };
    for (uint32_t place = 1; place <= 16; ++place) {
      const uint32_t row = kFirstKeyRowOfRlId1 + place - 1;
      ASSERT_EQ(present(row), place <= items) << "row " << row;
      if (place <= items) {
        EXPECT_EQ(value(row), items - place + 1) << "row " << row;
      }
    }
    EXPECT_EQ(present(kKeyRowOfRlId), items > 16);
    if (items > 16) {
      EXPECT_EQ(value(kKeyRowOfRlId), items - 16) << "the last place beyond 16";
    }
  }
}

// A combining item with its extension container present, holding one
// extension that carries nothing, so that no absent member raises a flag.
BitWriter& PutCombiningItemWithExtension(BitWriter& w, uint32_t rlId) {
  constexpr uint32_t kEmptyExtension = 30;
  PutIeFrame(w, kCombiningItemSetupRsp, 7).Put(0, 1).Put(1, 1).Put(rlId, 5);
  w.Align().Put(0, 16);  // ProtocolExtensionContainer COUNT: one extension
  return w.Align().Put(kEmptyExtension, 16).Put(1, 2).Align().Put(0, 8);
}

TEST(ListPositionsTest, InnerContainerCountEndsTheOuterLoopWithoutAFlag) {
  // An outer list of two IEs whose first one holds a list of one: the inner
  // count replaces the outer one, so the outer loop ends after its first IE
  // with its counter equal to the count it tests.
  BitWriter w = PublicHeader(1, 20, 1);
  PutIeFrame(w, kDiversityIndicationSetupRsp, 20).Put(0, 2).Align().Put(2, 16);
  PutIeFrame(w, kDiversityIndicationSetupRsp, 14).Put(0, 2).Align().Put(1, 16);
  PutCombiningItemWithExtension(w, 7);
  const uint32_t walkedBits = w.bits();
  PutCombiningItemWithExtension(w, 9);  // never read
  PassHost host;
  host.Load(w);
  ASSERT_EQ(vex_PreDecodeMV(&host.request()), 1u);
  EXPECT_EQ(host.state().flags, 0u);
  EXPECT_EQ(host.request().verdict, 0);
  EXPECT_EQ(host.request().bitsLeftOut, w.bits() - walkedBits);
}

}  // namespace
}  // namespace rnsap::testing
