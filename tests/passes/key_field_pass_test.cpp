// The Key-field pass through its export, with the stand-in host library,
// which lays out the key buffer and answers the initialisation with 1: the
// fixed and variable slots, the packed key octets, and the key size bound.
//
// The module keeps the initialisation result for its whole life; the tests
// here hold for a module that has reached 1 in an earlier test or reaches it
// in this one. The other sequences of results run in programs of their own.
#include <gtest/gtest.h>

#include <cstdint>
#include <span>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

constexpr uint32_t kKeyRows = 164;

// Rows of the key-field table, the last row of each name.
enum KeyRow : uint32_t {
  kPduType = 0,
  kProcedureCodeFirst = 1,
  kProcedureCodeSecond = 2,
  kProcedureCode = 3,
  kDdMode = 4,
  kCriticality = 5,
  kShortTransactionId = 6,
  kLongTransactionId = 7,
  kPrivateIe = 14,
  kCId = 15,
  kSRnti = 17,
  kIpAddress = 18,
  kLac = 30,
  kRac = 31,
  kDRnti = 39,
  kImsi = 42,
  kBindingId = 79,
  kRncId = 92,
  kSac = 93,
};

const std::vector<uint8_t> kImsiOf15Digits{0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0xF5};
const std::vector<uint8_t> kImsiOf16Digits{0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0x65};

class KeyFieldPassTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(host_.ready()); }

  int32_t Extract(const BitWriter& w) {
    host_.Load(w);
    return Run();
  }
  int32_t Run() {
    key().bitsLeftOut = kUnwritten;
    firstKeyOffset_ = key().keyOffset;
    const int32_t result = KFE_vorel_rnsap_04b(&key());
    EXPECT_EQ(host::LastKeyTable().size(), kKeyRows) << "the table the host library laid out";
    return result;
  }

  KeyFieldRequest& key() { return host_.key_request(); }
  const KeyFieldRow& Row(uint32_t row) { return host::LastKeyTable()[row]; }
  bool Present(uint32_t row) {
    return (key().keyBuffer[Row(row).presenceOffset] & Row(row).presenceMask) != 0;
  }
  const uint8_t* Slot(uint32_t row) { return key().keyBuffer + Row(row).valueOffset; }
  uint32_t OneOctet(uint32_t row) { return Slot(row)[0]; }
  uint32_t TwoOctets(uint32_t row) { return Slot(row)[0] | Slot(row)[1] << 8; }
  uint32_t KeyBits(uint32_t row) { return TwoOctets(row); }
  uint32_t KeyOffsetWord(uint32_t row) { return Slot(row)[2] | Slot(row)[3] << 8; }
  std::vector<uint8_t> Octets(uint32_t offset, uint32_t count) {
    return {key().keyBuffer + offset, key().keyBuffer + offset + count};
  }
  // The key octets the variable slot of `row` points to.
  std::vector<uint8_t> KeyOctets(uint32_t row) {
    return Octets(KeyOffsetWord(row), (KeyBits(row) + 7) / 8);
  }

  PassHost host_;
  uint16_t firstKeyOffset_ = 0;
};

// ---------------------------------------------------------------- initialisation

TEST_F(KeyFieldPassTest, InitialisedModuleDoesNotCallTheHostLibraryAgain) {
  ASSERT_EQ(Extract(PublicHeader(0, 20, 0)), 1);
  const uint32_t calls = host::InitialiseOptKfeCalls();
  EXPECT_LE(calls, 1u);
  ASSERT_EQ(Extract(PublicHeader(1, 20, 0)), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), calls);
  EXPECT_EQ(OneOctet(kPduType), 1u) << "the second pass stored its keys all the same";
}

// ---------------------------------------------------------------- fixed slots

TEST_F(KeyFieldPassTest, HeaderKeysUnderEveryPduType) {
  for (uint32_t pduType = 0; pduType < 4; ++pduType) {
    SCOPED_TRACE("PDU type " + std::to_string(pduType));
    ASSERT_EQ(Extract(PublicHeader(pduType, 20, 0)), 1);
    EXPECT_TRUE(Present(kPduType));
    EXPECT_EQ(OneOctet(kPduType), pduType);
    EXPECT_EQ(Present(kProcedureCode), pduType < 3) << "no procedure code under an Outcome";
    if (pduType < 3) {
      EXPECT_EQ(OneOctet(kProcedureCode), 20u);
    }
    EXPECT_FALSE(Present(kProcedureCodeFirst));
    EXPECT_FALSE(Present(kProcedureCodeSecond));
    EXPECT_TRUE(Present(kDdMode));
    EXPECT_EQ(OneOctet(kDdMode), 1u);
    EXPECT_TRUE(Present(kCriticality));
    EXPECT_EQ(OneOctet(kCriticality), 0u);
    EXPECT_TRUE(Present(kShortTransactionId));
    EXPECT_EQ(OneOctet(kShortTransactionId), 5u);
    EXPECT_FALSE(Present(kLongTransactionId));
    EXPECT_EQ(key().bitsLeftOut, 0u);
    EXPECT_EQ(key().keyOffset, firstKeyOffset_) << "no variable key";
    EXPECT_TRUE(host_.BufferRestored());
  }
}

TEST_F(KeyFieldPassTest, LongTransactionIdHasItsOwnTwoOctetRow) {
  BitWriter w;
  w.Put(0, 1).Put(2, 2).Align().Put(20, 8);
  w.Put(2, 2).Put(1, 2);                // ddMode common, criticality ignore
  w.Put(1, 1).Align().Put(0x1234, 16);  // long transaction id
  w.Align().Put(0, 1).Put(3, 7).Put(0, 1).Put(0, 1).Align().Put(0, 16);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kLongTransactionId));
  EXPECT_EQ(Slot(kLongTransactionId)[0], 0x34) << "little-endian";
  EXPECT_EQ(Slot(kLongTransactionId)[1], 0x12);
  EXPECT_FALSE(Present(kShortTransactionId));
  EXPECT_EQ(OneOctet(kProcedureCode), 20u);
  EXPECT_EQ(OneOctet(kDdMode), 2u);
  EXPECT_EQ(OneOctet(kCriticality), 1u);
}

TEST_F(KeyFieldPassTest, TwoOctetSlotsAreLittleEndianAndTakeTheLastValue) {
  BitWriter w = PublicHeader(0, 20, 5);
  PutIeFrame(w, 156, 8).Put(0, 1).Align();  // SAI
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0012, 16).Put(0xabcd, 16);
  PutIeFrame(w, 10, 7).Put(0, 1).Align();  // CN_PS_DomainIdentifier
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0789, 16).Put(0xA5, 8);
  PutIeFrame(w, 6, 2).Align().Put(0x0102, 16);    // C_ID
  PutIeFrame(w, 6, 2).Align().Put(0x0304, 16);    // C_ID again
  PutIeFrame(w, 157, 2).Align().Put(0xBEEF, 16);  // RNC_ID
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kLac));
  EXPECT_EQ(TwoOctets(kLac), 0x0789u) << "the second LAC";
  EXPECT_TRUE(Present(kSac));
  EXPECT_EQ(Slot(kSac)[0], 0xcd);
  EXPECT_EQ(Slot(kSac)[1], 0xab);
  EXPECT_TRUE(Present(kRac));
  EXPECT_EQ(OneOctet(kRac), 0xA5u);
  EXPECT_TRUE(Present(kCId));
  EXPECT_EQ(TwoOctets(kCId), 0x0304u);
  EXPECT_TRUE(Present(kRncId));
  EXPECT_EQ(TwoOctets(kRncId), 0xBEEFu);
  EXPECT_EQ(key().keyOffset, firstKeyOffset_);
}

TEST_F(KeyFieldPassTest, PrivateIeIdIsAOneOctetKey) {
  BitWriter w = PrivateHeader(0);
  PutGlobalPrivateIe(w, 3, 3, 4);
  w.Put(0, 1).Align().Put(0, 8).Put(0x2a, 8);  // OAM_InformationResponse
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kPrivateIe));
  EXPECT_EQ(OneOctet(kPrivateIe), 3u);
  EXPECT_EQ(OneOctet(kProcedureCode), 15u);
}

// ---------------------------------------------------------------- variable slots

TEST_F(KeyFieldPassTest, ImsiOfFifteenDigitsIsSixtyBitsInEightOctets) {
  BitWriter w = PublicHeader(0, 20, 1);
  PutImsiOfEightOctets(w, kImsiOf15Digits);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kImsi));
  EXPECT_EQ(KeyBits(kImsi), 60u);
  EXPECT_EQ(KeyOffsetWord(kImsi), firstKeyOffset_);
  EXPECT_EQ(KeyOctets(kImsi),
            (std::vector<uint8_t>{0x01, 0x23, 0x45, 0x67, 0x89, 0x01, 0x23, 0x45}));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 8);
  EXPECT_EQ(key().bitsLeftOut, 0u);
}

TEST_F(KeyFieldPassTest, ImsiFormsShareOneRowAndAppendTheirOctets) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutImsiOfEightOctets(w, kImsiOf16Digits);
  PutIeFrame(w, 84, 8).Put(4, 3).Align();  // seven octets, digits in wire order
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x78, 8).Put(0x90, 8).Put(0x12, 8).Put(0x34, 8);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_EQ(Octets(firstKeyOffset_, 8),
            (std::vector<uint8_t>{0x12, 0x34, 0x56, 0x78, 0x90, 0x12, 0x34, 0x56}))
      << "the 16 digits stay where they were packed";
  EXPECT_EQ(KeyBits(kImsi), 56u);
  EXPECT_EQ(KeyOffsetWord(kImsi), firstKeyOffset_ + 8);
  EXPECT_EQ(KeyOctets(kImsi), (std::vector<uint8_t>{0x12, 0x34, 0x56, 0x78, 0x90, 0x12, 0x34}));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 15);
}

TEST_F(KeyFieldPassTest, DRntiIsPackedAsItsWireOctets) {
  BitWriter w = PublicHeader(0, 20, 1);
  PutDRnti(w, 3, 0xABCDEF);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kDRnti));
  EXPECT_EQ(KeyBits(kDRnti), 24u);
  EXPECT_EQ(KeyOctets(kDRnti), (std::vector<uint8_t>{0xAB, 0xCD, 0xEF}));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 3);
}

TEST_F(KeyFieldPassTest, OnlyTheOctetFormOfTheIpAddressIsAKey) {
  BitWriter bitForm = PublicHeader(0, 20, 1);
  PutIeFrame(bitForm, 205, 4).Put(0, 1).Put(0, 1);
  bitForm.Put(0, 1).Put(6, 8).Align().Put(0b1011001, 7).Align().Put(0, 16);
  ASSERT_EQ(Extract(bitForm), 1);
  EXPECT_FALSE(Present(kIpAddress));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_);

  BitWriter octetForm = PublicHeader(0, 20, 1);
  PutIeFrame(octetForm, 205, 7).Put(0, 1).Put(0, 1);
  octetForm.Put(0, 1).Put(31, 8).Align().Put(0xC0, 8).Put(0xA8, 8).Put(0x01, 8).Put(0x02, 8);
  octetForm.Align().Put(0, 16);
  ASSERT_EQ(Extract(octetForm), 1);
  EXPECT_TRUE(Present(kIpAddress));
  EXPECT_EQ(KeyBits(kIpAddress), 32u);
  EXPECT_EQ(KeyOctets(kIpAddress), (std::vector<uint8_t>{0x03, 0x15, 0x80, 0x40}))
      << "each octet with its first wire bit lowest";
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 4);
}

TEST_F(KeyFieldPassTest, BackwardOctetsOfTheBindingIdArePackedInSegmentOrder) {
  BitWriter w = PublicHeader(0, 20, 1);
  PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x05, 8).Put(0x0a, 8);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kBindingId));
  EXPECT_EQ(KeyBits(kBindingId), 16u);
  EXPECT_EQ(KeyOctets(kBindingId), (std::vector<uint8_t>{0x0a, 0x05}));
}

TEST_F(KeyFieldPassTest, VariableKeysFollowEachOther) {
  BitWriter w = PublicHeader(0, 20, 3);
  PutDRnti(w, 3, 0x0A0B0C);
  PutImsiOfEightOctets(w, kImsiOf15Digits);
  PutIeFrame(w, 155, 2).Put(0, 2).Align().Put(0x77, 8);  // S_RNTI of one octet
  ASSERT_EQ(Extract(w), 1);
  EXPECT_EQ(KeyOffsetWord(kDRnti), firstKeyOffset_);
  EXPECT_EQ(KeyOffsetWord(kImsi), firstKeyOffset_ + 3);
  EXPECT_EQ(KeyOffsetWord(kSRnti), firstKeyOffset_ + 11);
  EXPECT_EQ(KeyBits(kSRnti), 8u);
  EXPECT_EQ(KeyOctets(kSRnti), std::vector<uint8_t>{0x77});
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 12);
  EXPECT_EQ(Octets(firstKeyOffset_, 3), (std::vector<uint8_t>{0x0A, 0x0B, 0x0C}));
}

TEST_F(KeyFieldPassTest, KeyReadTwiceOverwritesItsSlotAndAppendsItsOctets) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutDRnti(w, 3, 0x111111);
  PutDRnti(w, 1, 0x22);
  ASSERT_EQ(Extract(w), 1);
  EXPECT_TRUE(Present(kDRnti));
  EXPECT_EQ(KeyBits(kDRnti), 8u);
  EXPECT_EQ(KeyOffsetWord(kDRnti), firstKeyOffset_ + 3);
  EXPECT_EQ(KeyOctets(kDRnti), std::vector<uint8_t>{0x22});
  EXPECT_EQ(Octets(firstKeyOffset_, 3), (std::vector<uint8_t>{0x11, 0x11, 0x11}));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 4);
}

TEST_F(KeyFieldPassTest, MessageCutShortKeepsTheKeysBeforeTheCut) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutDRnti(w, 1, 0x5A);
  PutIeFrame(w, 21, 4).Put(2, 2).Align().Put(0xAB, 8);  // three octets promised, one there
  ASSERT_EQ(Extract(w), 1);
  EXPECT_EQ(KeyOctets(kDRnti), std::vector<uint8_t>{0x5A}) << "the first D_RNTI only";
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 1);
  EXPECT_EQ(key().bitsLeftOut, 8u);
  EXPECT_TRUE(Present(kProcedureCode));
}

TEST_F(KeyFieldPassTest, FailedGrowthEndsThePassWithNothingMoreStored) {
  // L3_Information of 300 bits needs 300 segments, more than the first 200;
  // the D_RNTI behind it is not reached.
  BitWriter w = PublicHeader(0, 7, 2);
  PutIeFrame(w, 85, 40).Align().Put(1, 1).Put(0, 1).Put(300, 14);
  for (int i = 0; i < 300; ++i) w.Put(i & 1, 1);
  PutDRnti(w, 1, 0x5A);
  host_.Load(w);
  host::FailAllocationCall(1);
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(host_.state().flags, ERR_NO_MEMORY_SEGMENTS);
  EXPECT_EQ(key().bitsLeftOut, kUnwritten);
  EXPECT_TRUE(Present(kProcedureCode));
  EXPECT_FALSE(Present(kDRnti));
  EXPECT_EQ(key().keyOffset, firstKeyOffset_);
}

// ---------------------------------------------------------------- the key size bound

TEST_F(KeyFieldPassTest, KeyLimitZeroFailsTheFirstVariableKey) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutIeFrame(w, 6, 2).Align().Put(0x0102, 16);  // C_ID: a fixed slot needs no room
  PutDRnti(w, 3, 0xABCDEF);
  host_.Load(w);
  key().keyLimit = 0;
  EXPECT_EQ(Run(), 0);
  EXPECT_TRUE(Present(kDRnti));
  EXPECT_EQ(KeyBits(kDRnti), 0u);
  EXPECT_EQ(KeyOffsetWord(kDRnti), firstKeyOffset_ | 0x8000u) << "top bit of the slot set";
  EXPECT_EQ(key().keyOffset, firstKeyOffset_);
  EXPECT_EQ(key().bitsLeftOut, kUnwritten);
  EXPECT_FALSE(host_.BufferRestored()) << "the walk stopped with the buffer reversed";
  EXPECT_EQ(TwoOctets(kCId), 0x0102u);
  EXPECT_EQ(OneOctet(kProcedureCode), 20u);
}

TEST_F(KeyFieldPassTest, KeyNeedsMoreRoomThanItsOctets) {
  BitWriter w = PublicHeader(0, 20, 1);
  PutDRnti(w, 1, 0x5A);

  host_.Load(w);
  key().keyLimit = 1;
  EXPECT_EQ(Run(), 0) << "one octet needs a room of 2";
  EXPECT_EQ(KeyBits(kDRnti), 0u);
  EXPECT_EQ(KeyOffsetWord(kDRnti), firstKeyOffset_ | 0x8000u);
  EXPECT_EQ(key().bitsLeftOut, kUnwritten);
  EXPECT_EQ(key().keyOffset, firstKeyOffset_);

  host_.Load(w);
  key().keyLimit = 2;
  EXPECT_EQ(Run(), 1);
  EXPECT_EQ(KeyBits(kDRnti), 8u);
  EXPECT_EQ(KeyOctets(kDRnti), std::vector<uint8_t>{0x5A});
  EXPECT_EQ(key().bitsLeftOut, 0u);
}

TEST_F(KeyFieldPassTest, KeyLimitBoundsEachKeyAlone) {
  // Fifteen digits leave the high half of the first octet empty and fit in
  // a room of their 8 octets; 16 digits need one more.
  BitWriter fifteen = PublicHeader(0, 20, 2);
  PutImsiOfEightOctets(fifteen, kImsiOf15Digits);
  PutImsiOfEightOctets(fifteen, kImsiOf15Digits);
  host_.Load(fifteen);
  key().keyLimit = 8;
  EXPECT_EQ(Run(), 1) << "the second key goes behind the first: the bound is per key";
  EXPECT_EQ(KeyOffsetWord(kImsi), firstKeyOffset_ + 8);
  EXPECT_EQ(key().keyOffset, firstKeyOffset_ + 16);

  host_.Load(fifteen);
  key().keyLimit = 7;
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(KeyBits(kImsi), 0u);

  BitWriter sixteen = PublicHeader(0, 20, 1);
  PutImsiOfEightOctets(sixteen, kImsiOf16Digits);
  host_.Load(sixteen);
  key().keyLimit = 8;
  EXPECT_EQ(Run(), 0);
  host_.Load(sixteen);
  key().keyLimit = 9;
  EXPECT_EQ(Run(), 1);
  EXPECT_EQ(KeyOctets(kImsi),
            (std::vector<uint8_t>{0x12, 0x34, 0x56, 0x78, 0x90, 0x12, 0x34, 0x56}));
}

TEST_F(KeyFieldPassTest, KeyOctetsThatWouldPassOffset65535FailTheKey) {
  // 9000 IMSIs of 8 octets each would drive keyOffset past 65535: the key
  // that would not end within it fails, and the offset never wraps onto the
  // key layout at the start of the buffer.
  constexpr uint32_t kImsis = 9000;
  BitWriter w = PublicHeader(0, 20, kImsis);
  for (uint32_t i = 0; i < kImsis; ++i) PutImsiOfEightOctets(w, kImsiOf16Digits);
  host_.Load(w);
  key().keyLimit = UINT16_MAX;  // the largest reach of one key behind the offset
  EXPECT_EQ(Run(), 0);
  EXPECT_GT(key().keyOffset, 0xffff - 8);
  EXPECT_EQ(KeyBits(kImsi), 0u);
  EXPECT_EQ(KeyOffsetWord(kImsi), key().keyOffset | 0x8000u);
  EXPECT_EQ(OneOctet(kProcedureCode), 20u) << "the layout before the key octets stands";
}

}  // namespace
}  // namespace rnsap::testing
