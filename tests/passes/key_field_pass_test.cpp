// The Key-field pass through its export, with the stand-in host library,
// which lays out the key buffer and answers the initialisation with 1: what
// the message vectors cannot say, the key size bound and the end of the key
// offsets (the vectors check the stored keys). And lists whose items read the
// numbered RL_ID: each place in a list has a field and a key row of its own,
// chosen by the position counter that the list's count loads; a container
// inside a container of the same kind overwrites the one count both loops test.
//
// The pass asks the host library to initialise until it has succeeded; a
// result above 1 marks the row the library names in every later pass, a
// negative one is the pass's answer from then on. The result is kept for the
// life of the module: the tests of the sequences of results come first and run
// their passes in child processes, which meet the module as no pass has left
// it; the tests after them hold for a module that has reached 1.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

// Rows of the key-field table, the last row of each name.
enum KeyRow : uint32_t { kPduType = 0, kProcedureCode = 3, kDRnti = 39, kImsi = 42 };

constexpr uint16_t kMarkRow = 163;  // the row with the empty name: no field stores there

class KeyFieldInitTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(host.ready());
    host::ResetHost();
    host.Load(PublicHeader(0, 20, 0));
  }
  // Runs `passes` in a forked child; this process never runs the pass.
  template <class Passes>
  void InFreshModule(Passes passes) {
    EXPECT_EXIT((passes(), std::exit(HasFailure())), ::testing::ExitedWithCode(0), "");
  }
  int RunPass() {
    host.context().Rewind();  // an empty key buffer for each pass
    host.key_request().bitsLeftOut = kUnwritten;
    return KFE_vorel_rnsap_04b(&host.key_request());
  }
  PassHost host;
};

TEST_F(KeyFieldInitTest, UnfinishedThenMarkingInitialisation) {
  InFreshModule([this] {
    host::SetInitialiseResult(0);
    EXPECT_EQ(RunPass(), 1) << "a result of 0 lets the pass go on";
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
    ASSERT_EQ(host::LastKeyTable().size(), 164u);
    EXPECT_TRUE(host.KeyPresent(kPduType));
    EXPECT_FALSE(host.KeyPresent(kMarkRow));
    EXPECT_EQ(host.key_request().bitsLeftOut, 0u);

    EXPECT_EQ(RunPass(), 1);
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 2u) << "0 is tried again at the next pass";
    EXPECT_FALSE(host.KeyPresent(kMarkRow));

    host::SetInitialiseResult(2, kMarkRow);
    for (uint32_t pass = 0; pass < 3; ++pass) {
      EXPECT_EQ(RunPass(), 1);
      EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u) << "initialised: no further call";
      EXPECT_TRUE(host.KeyPresent(kMarkRow)) << "the row is marked in every pass";
      EXPECT_TRUE(host.KeyPresent(kPduType));
      host::SetInitialiseResult(0);
    }
  });
}

TEST_F(KeyFieldInitTest, NegativeResultIsReturnedForGoodWithoutAnotherCall) {
  InFreshModule([this] {
    KeyFieldRequest& key = host.key_request();
    const uint16_t keyOffset = key.keyOffset;
    host::SetInitialiseResult(-7, 3);
    for (int pass = 0; pass < 3; ++pass) {
      EXPECT_EQ(RunPass(), -7);
      EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
      EXPECT_EQ(key.bitsLeftOut, kUnwritten);
      EXPECT_EQ(host.state().position, 1u) << "nothing was decoded";
      EXPECT_TRUE(host.BufferRestored()) << "nor reversed";
      EXPECT_EQ(key.keyOffset, keyOffset);
      EXPECT_TRUE(std::all_of(key.keyBuffer, key.keyBuffer + keyOffset + 64,
                              [](uint8_t b) { return b == 0; }));
      host::SetInitialiseResult(1);
    }
  });
}

const std::vector<uint8_t> kImsiOf15Digits{0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0xF5};
const std::vector<uint8_t> kImsiOf16Digits{0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0x65};

class KeyFieldPassTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(host_.ready()); }

  int32_t Extract(const BitWriter& w,
                  uint16_t keyLimit = host::HostDecodeContext::kDefaultKeyLimit) {
    host_.Load(w);
    key().keyLimit = keyLimit;
    key().bitsLeftOut = kUnwritten;
    const int32_t result = KFE_vorel_rnsap_04b(&key());
    EXPECT_EQ(host::LastKeyTable().size(), 164u) << "the table the host library laid out";
    return result;
  }

  KeyFieldRequest& key() { return host_.key_request(); }
  std::vector<uint8_t> Slot(uint32_t row, uint32_t bytes) {
    return {host_.KeySlot(row), host_.KeySlot(row) + bytes};
  }
  uint32_t KeyOffsetWord(uint32_t row) {
    const std::vector<uint8_t> slot = Slot(row, 4);
    return slot[2] | slot[3] << 8;
  }

  PassHost host_;
};

TEST_F(KeyFieldPassTest, InitialisedModuleDoesNotCallTheHostLibraryAgain) {
  ASSERT_EQ(Extract(PublicHeader(0, 20, 0)), 1);
  const uint32_t calls = host::InitialiseOptKfeCalls();
  EXPECT_LE(calls, 1u);
  ASSERT_EQ(Extract(PublicHeader(1, 20, 0)), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), calls);
  EXPECT_EQ(Slot(kPduType, 1), std::vector<uint8_t>{1}) << "the second pass stored all the same";
}

// keyLimit bounds each key alone, with a margin of one octet: a key that does
// not fit ends the pass with 0, its slot marked, the buffer left reversed.
TEST_F(KeyFieldPassTest, KeyLimitBoundsEachKey) {
  struct LimitCase {
    const char* what;
    BitWriter message;
    uint16_t keyLimit;
    int32_t result;
    uint32_t row;
  };
  BitWriter oneOctet = PublicHeader(0, 20, 1), two15 = PublicHeader(0, 20, 2),
            one16 = PublicHeader(0, 20, 1);
  PutDRnti(oneOctet, 1, 0x5A);
  PutImsiOfEightOctets(PutImsiOfEightOctets(two15, kImsiOf15Digits), kImsiOf15Digits);
  PutImsiOfEightOctets(one16, kImsiOf16Digits);
  const LimitCase cases[] = {
      {"no room at all", oneOctet, 0, 0, kDRnti},
      {"one octet in a room of 1", oneOctet, 1, 0, kDRnti},
      {"one octet in a room of 2", oneOctet, 2, 1, kDRnti},
      {"two keys of 15 digits, 8 octets each", two15, 8, 1, kImsi},
      {"15 digits in a room of 7", two15, 7, 0, kImsi},
      {"16 digits in a room of 8", one16, 8, 0, kImsi},
      {"16 digits in a room of 9", one16, 9, 1, kImsi},
  };
  for (const LimitCase& c : cases) {
    SCOPED_TRACE(c.what);
    EXPECT_EQ(Extract(c.message, c.keyLimit), c.result);
    EXPECT_TRUE(host_.KeyPresent(c.row));
    EXPECT_EQ(key().bitsLeftOut, c.result ? 0u : kUnwritten);
    EXPECT_EQ(host_.BufferRestored(), c.result == 1);
    if (c.result == 0) {
      EXPECT_EQ(Slot(c.row, 2), (std::vector<uint8_t>{0, 0}));
      EXPECT_EQ(KeyOffsetWord(c.row), key().keyOffset | 0x8000u) << "top bit of the slot set";
    }
  }
}

TEST_F(KeyFieldPassTest, KeyOctetsThatWouldPassOffset65535FailTheKey) {
  // 9000 IMSIs of 8 octets each would drive keyOffset past 65535: the key
  // that would not end within it fails, and the offset never wraps onto the
  // key layout at the start of the buffer.
  constexpr uint32_t kImsis = 9000;
  BitWriter w = PublicHeader(0, 20, kImsis);
  for (uint32_t i = 0; i < kImsis; ++i) PutImsiOfEightOctets(w, kImsiOf16Digits);
  EXPECT_EQ(Extract(w, UINT16_MAX), 0);
  EXPECT_GT(key().keyOffset, 0xffff - 8);
  EXPECT_EQ(Slot(kImsi, 2), (std::vector<uint8_t>{0, 0}));
  EXPECT_EQ(KeyOffsetWord(kImsi), key().keyOffset | 0x8000u);
  EXPECT_EQ(Slot(kProcedureCode, 1), std::vector<uint8_t>{20}) << "the layout stands";
}

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
    for (uint32_t place = 1; place <= 16; ++place) {
      const uint32_t row = kFirstKeyRowOfRlId1 + place - 1;
      ASSERT_EQ(host.KeyPresent(row), place <= items) << "row " << row;
      if (place <= items) {
        EXPECT_EQ(*host.KeySlot(row), items - place + 1) << "row " << row;
      }
    }
    EXPECT_EQ(host.KeyPresent(kKeyRowOfRlId), items > 16);
    if (items > 16) {
      EXPECT_EQ(*host.KeySlot(kKeyRowOfRlId), items - 16) << "the last place beyond 16";
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
