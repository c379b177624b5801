// The Key-field pass through its export, with the stand-in host library,
// which lays out the key buffer and answers the initialisation with 1: the
// fixed and variable slots, the packed key octets, and the key size bound.
//
// The module keeps the initialisation result for its whole life; the tests
// here hold for a module that has reached 1 in an earlier test or reaches it
// in this one. The other sequences of results run in programs of their own.
#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

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

  int32_t Extract(const BitWriter& w,
                  uint16_t keyLimit = host::HostDecodeContext::kDefaultKeyLimit) {
    host_.Load(w);
    key().keyLimit = keyLimit;
    key().bitsLeftOut = kUnwritten;
    firstKeyOffset_ = key().keyOffset;
    const int32_t result = KFE_vorel_rnsap_04b(&key());
    EXPECT_EQ(host::LastKeyTable().size(), 164u) << "the table the host library laid out";
    return result;
  }

  KeyFieldRequest& key() { return host_.key_request(); }
  const KeyFieldRow& Row(uint32_t row) { return host::LastKeyTable()[row]; }
  bool Present(uint32_t row) {
    return (key().keyBuffer[Row(row).presenceOffset] & Row(row).presenceMask) != 0;
  }
  std::vector<uint8_t> Octets(uint32_t offset, uint32_t count) {
    return {key().keyBuffer + offset, key().keyBuffer + offset + count};
  }
  std::vector<uint8_t> Slot(uint32_t row, uint32_t bytes) {
    return Octets(Row(row).valueOffset, bytes);
  }
  uint32_t KeyOffsetWord(uint32_t row) {
    const std::vector<uint8_t> slot = Slot(row, 4);
    return slot[2] | slot[3] << 8;
  }

  PassHost host_;
  uint16_t firstKeyOffset_ = 0;
};

TEST_F(KeyFieldPassTest, InitialisedModuleDoesNotCallTheHostLibraryAgain) {
  ASSERT_EQ(Extract(PublicHeader(0, 20, 0)), 1);
  const uint32_t calls = host::InitialiseOptKfeCalls();
  EXPECT_LE(calls, 1u);
  ASSERT_EQ(Extract(PublicHeader(1, 20, 0)), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), calls);
  EXPECT_EQ(Slot(kPduType, 1), std::vector<uint8_t>{1}) << "the second pass stored all the same";
}

// A key the pass must have stored: the bytes of its slot (the value of a
// fixed slot, little-endian; the u16 bit count of a variable one) and, for a
// variable slot, where its octets lie behind the first key offset.
struct StoredKey {
  uint32_t row;
  std::vector<uint8_t> slot;
  int32_t at = -1;
};

struct KeyCase {
  std::string what;
  BitWriter message;
  std::vector<StoredKey> stored;
  std::vector<uint32_t> absent;
  std::vector<uint8_t> keyOctets = {};  // all that the pass packed, in order
  uint32_t bitsLeftOut = 0;
};

BitWriter LongTransactionIdMessage() {
  BitWriter w;
  w.Put(0, 1).Put(2, 2).Align().Put(20, 8);
  w.Put(2, 2).Put(1, 2);                // ddMode common, criticality ignore
  w.Put(1, 1).Align().Put(0x1234, 16);  // long transaction id
  return w.Align().Put(0, 1).Put(3, 7).Put(0, 1).Put(0, 1).Align().Put(0, 16);
}

BitWriter Message(uint32_t ies, void (*body)(BitWriter&)) {
  BitWriter w = PublicHeader(0, 20, ies);
  body(w);
  return w;
}

std::vector<KeyCase> KeyCases() {
  const std::vector<uint8_t> imsi15Packed{0x01, 0x23, 0x45, 0x67, 0x89, 0x01, 0x23, 0x45};
  const std::vector<uint8_t> imsi16Packed{0x12, 0x34, 0x56, 0x78, 0x90, 0x12, 0x34, 0x56};
  return {
      {"header of a successful outcome",
       PublicHeader(1, 20, 0),
       {{kPduType, {1}},
        {kProcedureCode, {20}},
        {kDdMode, {1}},
        {kCriticality, {0}},
        {kShortTransactionId, {5}}},
       {kProcedureCodeFirst, kProcedureCodeSecond, kLongTransactionId}},
      {"header of an unsuccessful outcome",
       PublicHeader(2, 20, 0),
       {{kPduType, {2}}, {kProcedureCode, {20}}},
       {kProcedureCodeFirst, kProcedureCodeSecond}},
      {"outcome, which has no procedure code",
       PublicHeader(3, 20, 0),
       {{kPduType, {3}}},
       {kProcedureCode}},
      {"long transaction id",
       LongTransactionIdMessage(),
       {{kLongTransactionId, {0x34, 0x12}}, {kDdMode, {2}}, {kCriticality, {1}}},
       {kShortTransactionId}},
      {"two-octet slots, the last value of each",
       Message(5,
               [](BitWriter& w) {
                 PutIeFrame(w, 156, 8).Put(0, 1).Align();  // SAI
                 w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0012, 16).Put(0xabcd, 16);
                 PutIeFrame(w, 10, 7).Put(0, 1).Align();  // CN_PS_DomainIdentifier
                 w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0789, 16).Put(0xA5, 8);
                 PutIeFrame(w, 6, 2).Align().Put(0x0102, 16);    // C_ID
                 PutIeFrame(w, 6, 2).Align().Put(0x0304, 16);    // C_ID again
                 PutIeFrame(w, 157, 2).Align().Put(0xBEEF, 16);  // RNC_ID
               }),
       {{kLac, {0x89, 0x07}},
        {kSac, {0xcd, 0xab}},
        {kRac, {0xA5}},
        {kCId, {0x04, 0x03}},
        {kRncId, {0xEF, 0xBE}}},
       {}},
      {"IMSI forms share a row and append their octets",
       Message(2,
               [](BitWriter& w) {
                 PutImsiOfEightOctets(w, kImsiOf16Digits);
                 PutIeFrame(w, 84, 8).Put(4, 3).Align();  // seven octets in wire order
                 for (uint8_t octet : {0x12, 0x34, 0x56, 0x78, 0x90, 0x12, 0x34}) w.Put(octet, 8);
               }),
       {{kImsi, {56, 0}, 8}},
       {},
       [&] {
         std::vector<uint8_t> octets = imsi16Packed;
         octets.insert(octets.end(), imsi16Packed.begin(), imsi16Packed.end() - 1);
         return octets;
       }()},
      {"bit form of the IP address, no key",
       Message(1,
               [](BitWriter& w) {
                 PutIeFrame(w, 205, 4).Put(0, 1).Put(0, 1);
                 w.Put(0, 1).Put(6, 8).Align().Put(0b1011001, 7).Align().Put(0, 16);
               }),
       {},
       {kIpAddress}},
      {"octet form of the IP address, each octet with its first wire bit "
       "lowest",
       Message(1,
               [](BitWriter& w) {
                 PutIeFrame(w, 205, 7).Put(0, 1).Put(0, 1).Put(0, 1).Put(31, 8).Align();
                 w.Put(0xC0, 8).Put(0xA8, 8).Put(0x01, 8).Put(0x02, 8).Align().Put(0, 16);
               }),
       {{kIpAddress, {32, 0}, 0}},
       {},
       {0x03, 0x15, 0x80, 0x40}},
      {"BindingID read backward, packed in segment order",
       Message(
           1,
           [](BitWriter& w) { PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x05, 8).Put(0x0a, 8); }),
       {{kBindingId, {16, 0}, 0}},
       {},
       {0x0a, 0x05}},
      {"variable keys follow each other",
       Message(3,
               [](BitWriter& w) {
                 PutDRnti(w, 3, 0x0A0B0C);
                 PutImsiOfEightOctets(w, kImsiOf15Digits);
                 PutIeFrame(w, 155, 2).Put(0, 2).Align().Put(0x77, 8);  // S_RNTI
               }),
       {{kDRnti, {24, 0}, 0}, {kImsi, {60, 0}, 3}, {kSRnti, {8, 0}, 11}},
       {},
       [&] {
         std::vector<uint8_t> octets{0x0A, 0x0B, 0x0C};
         octets.insert(octets.end(), imsi15Packed.begin(), imsi15Packed.end());
         octets.push_back(0x77);
         return octets;
       }()},
      {"a key read twice overwrites its slot",
       Message(2,
               [](BitWriter& w) {
                 PutDRnti(w, 3, 0x111111);
                 PutDRnti(w, 1, 0x22);
               }),
       {{kDRnti, {8, 0}, 3}},
       {},
       {0x11, 0x11, 0x11, 0x22}},
      {"a message cut short keeps the keys before the cut",
       Message(2,
               [](BitWriter& w) {
                 PutDRnti(w, 1, 0x5A);
                 PutIeFrame(w, 21, 4).Put(2, 2).Align().Put(0xAB, 8);  // 3 octets promised
               }),
       {{kDRnti, {8, 0}, 0}, {kProcedureCode, {20}}},
       {},
       {0x5A},
       8},
  };
}

TEST_F(KeyFieldPassTest, StoresEachKeyInItsSlot) {
  for (const KeyCase& c : KeyCases()) {
    SCOPED_TRACE(c.what);
    ASSERT_EQ(Extract(c.message), 1);
    for (const StoredKey& k : c.stored) {
      SCOPED_TRACE("row " + std::to_string(k.row));
      EXPECT_TRUE(Present(k.row));
      EXPECT_EQ(Slot(k.row, static_cast<uint32_t>(k.slot.size())), k.slot);
      if (k.at >= 0) {
        EXPECT_EQ(KeyOffsetWord(k.row), firstKeyOffset_ + k.at);
      }
    }
    for (uint32_t row : c.absent) EXPECT_FALSE(Present(row)) << "row " << row;
    EXPECT_EQ(key().keyOffset, firstKeyOffset_ + c.keyOctets.size());
    EXPECT_EQ(Octets(firstKeyOffset_, static_cast<uint32_t>(c.keyOctets.size())), c.keyOctets);
    EXPECT_EQ(key().bitsLeftOut, c.bitsLeftOut);
    EXPECT_TRUE(host_.BufferRestored());
  }
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
  const BitWriter oneOctet = Message(1, [](BitWriter& w) { PutDRnti(w, 1, 0x5A); });
  const BitWriter two15 = Message(2, [](BitWriter& w) {
    PutImsiOfEightOctets(w, kImsiOf15Digits);
    PutImsiOfEightOctets(w, kImsiOf15Digits);
  });
  const BitWriter one16 =
      Message(1, [](BitWriter& w) { PutImsiOfEightOctets(w, kImsiOf16Digits); });
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
    EXPECT_TRUE(Present(c.row));
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

}  // namespace
}  // namespace rnsap::testing
