// The Key-field pass through its export, with the stand-in host library,
// which lays out the key buffer and answers the initialisation with 1: what
// the message vectors cannot say, the key size bound and the end of the key
// offsets. The vectors check the stored keys.
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
enum KeyRow : uint32_t { kPduType = 0, kProcedureCode = 3, kDRnti = 39, kImsi = 42 };

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

BitWriter Message(uint32_t ies, void (*body)(BitWriter&)) {
  BitWriter w = PublicHeader(0, 20, ies);
  body(w);
  return w;
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

}  // namespace
}  // namespace rnsap::testing
