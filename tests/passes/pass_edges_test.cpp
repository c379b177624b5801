// All four passes at the edges of what a host can hand them: messages whose
// length is not a whole number of octets, and nesting beyond the rule depth.
#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

enum class Pass { kValidation, kDecodedField, kDisplay, kKeyField };
constexpr Pass kPasses[] = {Pass::kValidation, Pass::kDecodedField, Pass::kDisplay,
                            Pass::kKeyField};

std::string NameOf(Pass pass) {
  constexpr const char* kNames[] = {"validation", "decoded-field", "display", "key-field"};
  return kNames[static_cast<int>(pass)];
}

// Runs `pass` on the message loaded in `host`; the result as the export gives it.
int64_t RunPass(Pass pass, PassHost& host) {
  host.request().bitsLeftOut = kUnwritten;
  host.key_request().bitsLeftOut = kUnwritten;
  switch (pass) {
    case Pass::kValidation:
      return vex_PreDecodeMV(&host.request());
    case Pass::kDecodedField:
      return vex_PreDecodeMD(&host.request());
    case Pass::kDisplay:
      return vex_PreDecodeTO(&host.request());
    case Pass::kKeyField:
      return KFE_vorel_rnsap_04b(&host.key_request());
  }
  return -1;
}

uint32_t BitsLeftOut(Pass pass, PassHost& host) {
  return pass == Pass::kKeyField ? host.key_request().bitsLeftOut : host.request().bitsLeftOut;
}

// A message of `bits` bits: the octets before the last partial one are
// bit-reversed for the walk, the partial one is not, so its bits are read
// from its low end. Alignment counts from the end of the message, and the
// closing alignment takes `bitsLeft` below zero as a u32.
struct PartialOctetCase {
  uint32_t bits;
  std::vector<uint8_t> octets;
  std::vector<uint32_t> fieldIds;  // reported by the Decoded-field pass
  uint32_t position;
  uint32_t bitsLeftOut;
  uint32_t validationFlags;
};

const PartialOctetCase kPartialOctetCases[] = {
    // PDU EXTENSION is the low bit of the octet: 1.
    {1, {0x01}, {684}, 9, 0u - 7, 0},
    // PDU EXTENSION 1, PDU Type 3 (Outcome), and a Spare of the one bit left
    // to the octet boundary counted from the end; ddMode finds no room.
    {4, {0x0F}, {684, 685, 682}, 9, 0u - 4, 0},
    // One Spare bit, then a procedure code across the octet boundary: 0000
    // from the first octet, 1111 from the low end of the second.
    {12, {0x00, 0x0F}, {684, 685, 682, 688}, 17, 0u - 4, 0},
    // The empty setup request one bit short: every Spare is one bit narrower
    // or wider, the header reads shifted, and "Number Of IEs" takes 64 from
    // the low end of the last octet. The first IE then finds no room, which
    // only the Validation pass flags.
    {63,
     {0x00, 0x14, 0x40, 0x50, 0x03, 0x00, 0x00, 0x01},
     {684, 685, 682, 688, 697, 698, 746, 749, 682, 699, 702, 706, 709, 682, 710, 682},
     65,
     0u - 1,
     ERR_CONDITION},
};

TEST(PassEdgesTest, MessagesOfPartialOctetsWalkAlikeInEveryPass) {
  for (const PartialOctetCase& c : kPartialOctetCases) {
    for (Pass pass : kPasses) {
      SCOPED_TRACE(std::to_string(c.bits) + " bits, " + NameOf(pass) + " pass");
      PassHost host;
      ASSERT_TRUE(host.ready());
      host.Load(c.octets, c.bits);
      ASSERT_EQ(RunPass(pass, host), 1);
      EXPECT_EQ(host.state().position, c.position);
      EXPECT_EQ(BitsLeftOut(pass, host), c.bitsLeftOut);
      EXPECT_EQ(host.state().flags, pass == Pass::kValidation ? c.validationFlags : 0u);
      EXPECT_TRUE(host.BufferRestored());
      std::vector<uint32_t> reported;
      for (const host::DecodedFieldReport& f : host::DecodedFields()) reported.push_back(f.fieldId);
      if (pass == Pass::kDecodedField) {
        EXPECT_EQ(reported, c.fieldIds);
      } else if (pass == Pass::kDisplay) {
        EXPECT_EQ(host::DisplayLines().size(), c.fieldIds.size());
      }
    }
  }
}

TEST(PassEdgesTest, NestingBeyondTheRuleDepthFailsAsTheStackWould) {
  // Geographical points whose coordinates each carry one more point in their
  // extension container, thousands deep.
  constexpr int kLevels = 3000;
  BitWriter w = PublicHeader(0, 20, 0, true);
  w.Align().Put(0, 16);  // one extension
  for (int level = 0; level < kLevels; ++level) {
    w.Align().Put(7, 16).Put(1, 2).Align().Put(0, 1).Put(9, 7);  // GeographicalAreaCell
    w.Put(0, 1).Put(0, 2);                                       // point
    w.Put(0, 1).Put(0, 1);                                       // GA_Point, no container
    w.Put(0, 1).Put(1, 1).Put(0, 1);                             // coordinates with one
    w.Put(0, 2).Align().Put(0x55, 8).Put(0, 2).Align().Put(0xAA, 8);
    w.Align().Put(0, 16);  // ProtocolExtensionContainer COUNT: one extension
  }
  for (Pass pass : kPasses) {
    SCOPED_TRACE(NameOf(pass) + " pass");
    PassHost host;
    host.Load(w);
    EXPECT_EQ(RunPass(pass, host), 0);
    EXPECT_EQ(host.state().flags & ERR_NO_MEMORY_STACK, ERR_NO_MEMORY_STACK);
    EXPECT_EQ(BitsLeftOut(pass, host), kUnwritten);
    EXPECT_FALSE(host.BufferRestored()) << "the walk stopped with the buffer reversed";
  }
}

}  // namespace
}  // namespace rnsap::testing
