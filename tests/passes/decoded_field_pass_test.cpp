// The Decoded-field pass through its export, with the stand-in host: the
// marks in the text records, the layer boundary row, the arguments of each
// field report and the texts the pass renders.
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "passes/field_text.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

using host::DecodedFieldReport;

constexpr uint32_t kSpare = 682;

struct ExpectedField {
  uint32_t fieldId;
  const char* label;
  const char* text;
  uint32_t firstBit;  // of the whole field, in message order
  uint32_t lastBit;
};

class DecodedFieldPassTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(host_.ready()); }

  bool Decode(const BitWriter& w) {
    host_.Load(w);
    return Run();
  }
  bool Run() {
    request().bitsLeftOut = kUnwritten;
    return vex_PreDecodeMD(&request());
  }

  DecodeRequest& request() { return host_.request(); }
  DecodeState& state() { return host_.state(); }
  static const std::vector<DecodedFieldReport>& Fields() { return host::DecodedFields(); }

  // The `nth` report of `fieldId`, or null.
  static const DecodedFieldReport* Find(uint32_t fieldId, int nth = 0) {
    for (const DecodedFieldReport& f : Fields()) {
      if (f.fieldId == fieldId && nth-- == 0) return &f;
    }
    return nullptr;
  }
  static std::string TextOf(uint32_t fieldId, int nth = 0) {
    const DecodedFieldReport* f = Find(fieldId, nth);
    return f != nullptr ? f->text : "<not reported>";
  }

  // The first and last bit that the segments of `f` cover, in message order.
  static std::pair<uint32_t, uint32_t> Span(const DecodedFieldReport& f) {
    const BitSegment& first = f.segments.at(f.firstSegment);
    const BitSegment& last = f.firstSegment == 0 ? f.segments.back() : f.segments.front();
    return {first.firstBit, last.lastBit};
  }

  void ExpectFields(const std::vector<ExpectedField>& expected) {
    ASSERT_EQ(Fields().size(), expected.size());
    for (size_t i = 0; i < expected.size(); ++i) {
      const DecodedFieldReport& f = Fields()[i];
      SCOPED_TRACE("report " + std::to_string(i) + ": " + f.label);
      EXPECT_EQ(f.fieldId, expected[i].fieldId);
      EXPECT_EQ(f.label, expected[i].label);
      EXPECT_EQ(f.text, expected[i].text);
      EXPECT_EQ(Span(f), std::make_pair(expected[i].firstBit, expected[i].lastBit));
    }
  }

  PassHost host_;
};

// ---------------------------------------------------------------- text records

TEST_F(DecodedFieldPassTest, MarksTheTextRecordOfEachFieldWithTheTag) {
  host_.Load(kEmptySetupRequest, 64);
  for (uint32_t i = 0; i < host::kTextRecordCount; ++i) {
    std::memset(request().textRecords[i].bytes, 0xEE, kTextRecordSize);
  }
  request().tag = 0xA7;
  ASSERT_TRUE(Run());

  // Fewer fields than the host has records, so no record is marked twice.
  ASSERT_EQ(Fields().size(), 15u);
  for (size_t i = 0; i < Fields().size(); ++i) {
    const DecodedFieldReport& f = Fields()[i];
    SCOPED_TRACE(f.label);
    EXPECT_EQ(f.textRecordIndex, i) << "the record the host's index named at that field";
    EXPECT_EQ(f.textRecordBytes[0], 0xA7);
    EXPECT_EQ(f.textRecordBytes[1], 0);
    EXPECT_EQ(f.textRecordBytes[2], f.fieldId == kSpare ? 0xEE : 0) << "Spare marks two bytes";
    EXPECT_EQ(request().textRecords[i].bytes[3], 0xEE);
    EXPECT_EQ(request().textRecords[i].bytes[kTextRecordSize - 1], 0xEE);
  }
  EXPECT_EQ(request().textRecords[15].bytes[0], 0xEE) << "a record no field was reported in";
}

// ---------------------------------------------------------------- layer boundary rows

TEST_F(DecodedFieldPassTest, LayerRowIsOpenedAtEntryAndClosedAtTheEnd) {
  // Two messages back to back; the second runs as a further layer on the same
  // state. The host has one row, so only the second pass asks for another.
  PassHost host({.positionStack = 64, .layerTable = 4, .layerRows = 1});
  ASSERT_TRUE(host.ready());
  std::vector<uint8_t> twoMessages = kEmptySetupRequest;
  twoMessages.insert(twoMessages.end(), kEmptySetupRequest.begin(), kEmptySetupRequest.end());
  host.Load(twoMessages, 128);
  DecodeRequest& r = host.request();
  ASSERT_EQ(r.layerRowLimit, 0u);
  r.layerRows[0] = {kUnwritten, kUnwritten, kUnwritten, kUnwritten};
  r.layerValue = 0x12345678;
  r.tag = 0xA7;

  ASSERT_TRUE(vex_PreDecodeMD(&r));
  EXPECT_EQ(host::CreateNewLayerInfoCalls(), 0u) << "row 0 is within the limit";
  EXPECT_EQ(r.layerRowIndex, 1u);
  EXPECT_EQ(r.layerRows[0].firstBit, 1u);
  EXPECT_EQ(r.layerRows[0].lastBit, 64u);
  EXPECT_EQ(r.layerRows[0].layerValue, 0x12345678u);
  EXPECT_EQ(r.layerRows[0].tag, 0xA7u);
  EXPECT_EQ(r.bitsLeftOut, 64u);

  r.layerValue = 0x0badcafe;
  r.tag = 0x5C;
  ASSERT_TRUE(vex_PreDecodeMD(&r));
  EXPECT_EQ(host::CreateNewLayerInfoCalls(), 1u) << "row 1 is above the limit";
  ASSERT_GE(r.layerRowLimit, 1u);
  EXPECT_EQ(r.layerRowIndex, 2u);
  EXPECT_EQ(r.layerRows[1].firstBit, 65u);
  EXPECT_EQ(r.layerRows[1].lastBit, 128u);
  EXPECT_EQ(r.layerRows[1].layerValue, 0x0badcafeu);
  EXPECT_EQ(r.layerRows[1].tag, 0x5Cu);
  EXPECT_EQ(r.layerRows[0].lastBit, 64u) << "the earlier row stays";
  EXPECT_EQ(r.bitsLeftOut, 0u);
  EXPECT_EQ(host::DecodedFields().size(), 30u);
}

TEST_F(DecodedFieldPassTest, MessageCutInsideAListEndsWithTheLastFieldThatFitted) {
  // The third IE of three promises 20 bits of L3_Information; 8 are there.
  BitWriter w = PublicHeader(0, 20, 3);
  PutIeFrame(w, 4, 1).Put(17, 6);           // AllowedQueuingTime
  PutIeFrame(w, 8, 1).Align().Put(200, 8);  // CFN
  PutIeFrame(w, 85, 3).Align().Put(0, 1).Put(20, 7).Put(0xFF, 8);
  ASSERT_EQ(w.bits(), 192u);
  host_.Load(w);
  request().layerRows[0].lastBit = kUnwritten;

  ASSERT_TRUE(Run());
  ASSERT_FALSE(Fields().empty());
  const DecodedFieldReport& last = Fields().back();
  EXPECT_EQ(last.fieldId, 2949u) << "the bits of the value did not fit";
  EXPECT_EQ(last.text, "  Length=20");
  EXPECT_EQ(Span(last), std::make_pair(178u, 184u));
  EXPECT_EQ(Find(2950), nullptr);
  EXPECT_EQ(TextOf(2693), "  CFN=200");
  EXPECT_EQ(request().layerRows[0].lastBit, 184u);
  EXPECT_EQ(request().layerRowIndex, 1u);
  EXPECT_EQ(request().bitsLeftOut, 8u);
  EXPECT_TRUE(host_.BufferRestored());
}

TEST_F(DecodedFieldPassTest, FailedGrowthLeavesTheLayerRowOpen) {
  // L3_Information of 300 bits needs 300 segments, more than the first 200.
  BitWriter w = PublicHeader(0, 7, 1);
  PutIeFrame(w, 85, 40).Align().Put(1, 1).Put(0, 1).Put(300, 14);
  for (int i = 0; i < 300; ++i) w.Put(i & 1, 1);
  host_.Load(w);
  host::FailAllocationCall(1);
  request().layerRows[0] = {kUnwritten, kUnwritten, kUnwritten, kUnwritten};
  request().layerValue = 77;
  request().tag = 0x31;

  EXPECT_FALSE(Run());
  EXPECT_EQ(state().flags, ERR_NO_MEMORY_SEGMENTS);
  EXPECT_EQ(request().layerRows[0].firstBit, 1u);
  EXPECT_EQ(request().layerRows[0].layerValue, 77u);
  EXPECT_EQ(request().layerRows[0].tag, 0x31u);
  EXPECT_EQ(request().layerRows[0].lastBit, kUnwritten);
  EXPECT_EQ(request().layerRowIndex, 0u);
  EXPECT_EQ(request().bitsLeftOut, kUnwritten);
  ASSERT_FALSE(Fields().empty());
  EXPECT_EQ(Fields().back().fieldId, 2953u) << "the fields before the failure stay reported";
  EXPECT_EQ(Fields().back().text, "  Length=300");
}

// ---------------------------------------------------------------- report arguments

TEST_F(DecodedFieldPassTest, PrivateMessageIsReportedFieldByField) {
  BitWriter w = PrivateHeader(0);
  PutGlobalPrivateIe(w, 3, 3, 5);  // OAM_InformationResponse
  w.Put(0, 1).Align().Put(2, 8).Put(0x01, 8).Put(0x02, 8).Put(0x03, 8);
  ASSERT_EQ(w.bits(), 200u);
  ASSERT_TRUE(Decode(w));

  ExpectFields({
      {684, "PDU EXTENSION", "PDU EXTENSION=0", 1, 1},
      {685, "PDU Type", "PDU Type=InitiatingMessage", 2, 3},
      {682, "  Spare", "  Spare=0", 4, 8},
      {688, "Procedure Code", "Procedure Code=id_privateMessage", 9, 16},
      {697, "ddMode", "ddMode=fdd", 17, 18},
      {698, "Criticality", "Criticality=Reject", 19, 20},
      {746, "TransactionID TYPE", "TransactionID TYPE=shortTransActionId", 21, 21},
      {749, "ShortTransActionId", "ShortTransActionId=5", 22, 28},
      {682, "  Spare", "  Spare=0", 29, 32},
      {699, "Message SIZE Type", "Message SIZE Type=0", 33, 33},
      {702, "Message SIZE", "Message SIZE=3", 34, 40},
      {706, "Message EXTENSION", "Message EXTENSION=0", 41, 41},
      {682, "  Spare", "  Spare=0", 42, 48},
      {712, "  Number Of IEs", "  Number Of IEs=1", 49, 64},
      {682, "  Spare", "  Spare=0", 65, 64},
      {3218, "  PrivateIE_ID Index", "  PrivateIE_ID Index=global", 65, 65},
      {682, "  Spare", "  Spare=0", 66, 72},
      {3220, "  Private IE ID SIZE Type", "  Private IE ID SIZE Type=0", 73, 73},
      {3223, "  Private IE ID SIZE", "  Private IE ID SIZE=9", 74, 80},
      {3227, "  SubIdentifier Extention Indicator", "  SubIdentifier Extention Indicator=0", 81,
       81},
      {3230, "  1st SubIdentifier", "  1st SubIdentifier=40", 82, 88},
      {3231, "  SubIdentifier 2 Extention Indicator", "  SubIdentifier 2 Extention Indicator=1", 89,
       89},
      {3234, "  SubIdentifier 2 Extention Indicator", "  SubIdentifier 2 Extention Indicator=0", 97,
       97},
      {3248, "  Nation", "    Nation=Japan (440)", 90, 104},
      {3251, "  SubIdentifier 3 Extention Indicator", "  SubIdentifier 3 Extention Indicator=1",
       105, 105},
      {3254, "  SubIdentifier 3 Extention Indicator", "  SubIdentifier 3 Extention Indicator=1",
       113, 113},
      {3259, "  SubIdentifier 3 Extention Indicator", "  SubIdentifier 3 Extention Indicator=0",
       121, 121},
      {3264, "  Company", "    Company=vorel (200043)", 106, 128},
      {3271, "  SubIdentifier 4 Extention Indicator", "  SubIdentifier 4 Extention Indicator=0",
       129, 129},
      {3272, "  Protocol", "    Protocol=rnsap (3)", 130, 136},
      {3273, "  SubIdentifier 5 Extention Indicator", "  SubIdentifier 5 Extention Indicator=0",
       137, 137},
      {3274, "  IE", "  IE=OAM_InformationResponse", 138, 144},
      {3216, "  Criticality", "  Criticality=ignore", 145, 146},
      {682, "  Spare", "  Spare=0", 147, 152},
      {3390, "  IE LENGTH Type", "  IE LENGTH Type=0", 153, 153},
      {3393, "  IE LENGTH", "  IE LENGTH=5", 154, 160},
      {2558, "  Extension Ext", "  Extension Ext=no extension", 161, 161},
      {682, "  Spare", "  Spare=0", 162, 168},
      {2998, "  OAM_Information Length", "  OAM_Information Length=2", 169, 176},
      {682, "  Spare", "  Spare=0", 177, 176},
      {3001, "  OAM_Information", "  OAM_Information=197121", 177, 200},
      {682, "  Spare", "  Spare=0", 201, 200},
  });
  for (const DecodedFieldReport& f : Fields()) {
    SCOPED_TRACE(f.label);
    EXPECT_EQ(f.bitOrderGroup, 8u);
    EXPECT_EQ(f.zero, 0u);
  }
  // The looks ahead take no bits; the groups leave out each octet's first bit.
  EXPECT_EQ(Find(3231)->segments.size(), 1u);
  ASSERT_EQ(Find(3264)->segments.size(), 3u);
  EXPECT_EQ(Find(3264)->segments[1].firstBit, 114u);
  EXPECT_EQ(Find(3264)->segments[1].segmentValue, 26u);
  EXPECT_EQ(request().layerRows[0].lastBit, 200u);
  EXPECT_EQ(request().bitsLeftOut, 0u);
}

TEST_F(DecodedFieldPassTest, BitOrderGroupIsEightInAFurtherLayerToo) {
  std::vector<uint8_t> twoMessages = kEmptySetupRequest;
  twoMessages.insert(twoMessages.end(), kEmptySetupRequest.begin(), kEmptySetupRequest.end());
  host_.Load(twoMessages, 128);
  ASSERT_TRUE(Run());
  ASSERT_TRUE(Run());
  ASSERT_EQ(Fields().size(), 30u);
  for (const DecodedFieldReport& f : Fields()) EXPECT_EQ(f.bitOrderGroup, 8u) << f.label;
  EXPECT_EQ(Span(Fields()[15]), std::make_pair(65u, 65u)) << "the second PDU EXTENSION";
}

TEST_F(DecodedFieldPassTest, BackwardLoopsGiveTheIndexOfTheirLastSegment) {
  BitWriter w = PublicHeader(0, 20, 4);
  PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x05, 8).Put(0x0a, 8);  // BindingID, 2 octets
  PutIeFrame(w, 156, 8).Put(0, 1).Align();                            // SAI
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0012, 16).Put(0xabcd, 16);
  PutIeFrame(w, 165, 6).Put(0, 1).Put(31, 8).Align();     // TransportLayerAddress, 32 bits
  w.Put(0x82, 8).Put(0x42, 8).Put(0xC2, 8).Put(0x22, 8);  // "ABCD", each octet mirrored
  PutIeFrame(w, 205, 4).Put(0, 1).Put(0, 1);              // IPAddressSet
  w.Put(0, 1).Put(6, 8).Align().Put(0b1011001, 7).Align().Put(2152, 16);
  ASSERT_EQ(w.bits(), 368u);
  ASSERT_TRUE(Decode(w));

  const DecodedFieldReport* binding = Find(2606);
  ASSERT_NE(binding, nullptr);
  EXPECT_EQ(binding->firstSegment, 1u);
  ASSERT_EQ(binding->segments.size(), 2u);
  EXPECT_EQ(binding->segments[0].firstBit, 108u) << "the last octet on the wire";
  EXPECT_EQ(binding->segments[0].segmentValue, 0x0au);
  EXPECT_EQ(Span(*binding), std::make_pair(100u, 115u));
  EXPECT_EQ(binding->text, "  BindingID=a5");
  EXPECT_EQ(TextOf(2602), "  BindingID Length=1");

  const DecodedFieldReport* plmn = Find(3012);
  ASSERT_NE(plmn, nullptr);
  EXPECT_EQ(plmn->firstSegment, 2u);
  EXPECT_EQ(Span(*plmn), std::make_pair(161u, 184u));
  EXPECT_EQ(plmn->text, "  PLMN_ID=563412");
  EXPECT_EQ(TextOf(2945), "  LAC=0012");
  EXPECT_EQ(TextOf(3060), "  SAC=abcd");

  const DecodedFieldReport* address = Find(3171);
  ASSERT_NE(address, nullptr);
  EXPECT_EQ(address->firstSegment, 31u);
  ASSERT_EQ(address->segments.size(), 32u);
  EXPECT_EQ(address->segments[0].firstBit, 296u);
  EXPECT_EQ(Span(*address), std::make_pair(265u, 296u));
  EXPECT_EQ(address->text, "  TransportLayerAddress=ABCD");

  const DecodedFieldReport* ip = Find(2932);
  ASSERT_NE(ip, nullptr);
  EXPECT_EQ(ip->firstSegment, 6u);
  EXPECT_EQ(Span(*ip), std::make_pair(345u, 351u));
  EXPECT_EQ(ip->text, "  IPAddress=1001101") << "the last bit on the wire is the highest";
  EXPECT_EQ(TextOf(3212), "  UDPPortNumber=2152");

  // Forward reads and single runs start at segment 0.
  for (const DecodedFieldReport& f : Fields()) {
    if (f.fieldId == 2606 || f.fieldId == 3012 || f.fieldId == 3171 || f.fieldId == 2932) continue;
    EXPECT_EQ(f.firstSegment, 0u) << f.label;
  }
}

TEST_F(DecodedFieldPassTest, BackwardLoopThatReadNothingGivesReadCountLessOne) {
  // A BindingID with its Extension Bit set reads no length: the first of the
  // pass has 0 octets, and the index of its last segment is 0 - 1 as a u32.
  BitWriter w = PublicHeader(0, 20, 1);
  PutIeFrame(w, 5, 1).Put(1, 1);
  ASSERT_TRUE(Decode(w));
  const DecodedFieldReport* binding = Find(2606);
  ASSERT_NE(binding, nullptr);
  EXPECT_TRUE(binding->segments.empty());
  EXPECT_EQ(binding->firstSegment, 0xffffffffu);
}

TEST_F(DecodedFieldPassTest, OctetLoopOfThePrivateOamInformationStartsAtItsLastSegment) {
  BitWriter w = PrivateHeader(0);
  PutGlobalPrivateIe(w, 3, 3, 6);
  w.Put(0, 1).Align().Put(3, 8).Put(0x11, 8).Put(0x22, 8).Put(0x33, 8).Put(0x44, 8);
  ASSERT_TRUE(Decode(w));
  const DecodedFieldReport* oam = Find(3001);
  ASSERT_NE(oam, nullptr);
  EXPECT_EQ(oam->firstSegment, 3u);
  ASSERT_EQ(oam->segments.size(), 4u);
  EXPECT_EQ(oam->segments[0].segmentValue, 0x44u);
  EXPECT_EQ(oam->segments[3].segmentValue, 0x11u);
  EXPECT_EQ(oam->text, "  OAM_Information=1144201745");  // 0x44332211
}

TEST_F(DecodedFieldPassTest, ImsiDigitPairsStartAtTheirSecondSegment) {
  BitWriter w = PublicHeader(0, 20, 3);
  PutImsiOfEightOctets(w, {0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0xF5});
  PutImsiOfEightOctets(w, {0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0x65});
  PutIeFrame(w, 84, 8).Put(4, 3).Align();  // seven octets, digits in wire order
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x78, 8).Put(0x90, 8).Put(0x12, 8).Put(0x34, 8);
  ASSERT_TRUE(Decode(w));

  const DecodedFieldReport* filler = Find(2920);
  ASSERT_NE(filler, nullptr);
  EXPECT_EQ(filler->text, "") << "Filler has an empty format";
  EXPECT_EQ(filler->label, "  Filler");
  ASSERT_EQ(filler->segments.size(), 1u);
  EXPECT_EQ(filler->segments[0].segmentValue, 15u);
  EXPECT_EQ(Span(*filler), std::make_pair(161u, 164u));

  const DecodedFieldReport* fifteen = Find(2923);
  ASSERT_NE(fifteen, nullptr);
  EXPECT_EQ(fifteen->label, "IMSI");
  EXPECT_EQ(fifteen->text, "  IMSI=123456789012345");
  EXPECT_EQ(fifteen->firstSegment, 1u);
  ASSERT_EQ(fifteen->segments.size(), 15u);
  EXPECT_EQ(fifteen->segments[0].firstBit, 109u);
  EXPECT_EQ(fifteen->segments[1].firstBit, 105u);
  EXPECT_EQ(fifteen->segments[14].firstBit, 165u);

  const DecodedFieldReport* sixteen = Find(2925);
  ASSERT_NE(sixteen, nullptr);
  EXPECT_EQ(sixteen->text, "  IMSI=1234567890123456");
  EXPECT_EQ(sixteen->firstSegment, 1u);
  EXPECT_EQ(sixteen->segments.size(), 16u);
  EXPECT_EQ(TextOf(2920, 1), "");

  const DecodedFieldReport* plain = Find(2918);
  ASSERT_NE(plain, nullptr);
  EXPECT_EQ(plain->label, "  IMSI");
  EXPECT_EQ(plain->text, "  IMSI=12345678901234");
  EXPECT_EQ(plain->firstSegment, 0u);
  EXPECT_EQ(plain->segments.size(), 14u);
  EXPECT_EQ(TextOf(2914, 2), "  IMSI SIZE=7");
}

// ---------------------------------------------------------------- texts

TEST_F(DecodedFieldPassTest, NamesWithTheirNumberFallBackToTheCatchAll) {
  for (const auto& [protocol, text] :
       {std::pair{0u, "    Protocol=not defined (0)"}, std::pair{3u, "    Protocol=rnsap (3)"},
        std::pair{7u, "    Protocol=not defined (7)"}}) {
    BitWriter w = PrivateHeader(0);
    PutGlobalPrivateIe(w, protocol, 9, 0);  // an IE without a body
    ASSERT_TRUE(Decode(w));
    EXPECT_EQ(TextOf(3272), text);
    EXPECT_EQ(TextOf(3274), "  IE=") << "a value without a name and no catch-all";
  }
}

TEST_F(DecodedFieldPassTest, ValuePartsOfTheNumberForms) {
  BitWriter w = PublicHeader(0, 20, 7);
  PutIeFrame(w, 85, 1).Align().Put(0, 1).Put(3, 7).Put(0b101, 3);        // L3_Information
  PutIeFrame(w, 85, 1).Align().Put(0, 1).Put(4, 7).Put(0b0000, 4);       // L3_Information, all 0
  PutIeFrame(w, 184, 1).Align().Put(0, 8);                               // UL_SIR
  PutIeFrame(w, 184, 1).Align().Put(255, 8);                             // UL_SIR
  PutIeFrame(w, 67, 2).Align().Put(0, 16);                               // DL_Power
  PutIeFrame(w, 165, 3).Put(0, 1).Put(15, 8).Put(0x82, 8).Put(0x42, 8);  // 16 bits, unaligned
  PutIeFrame(w, 165, 6).Put(0, 1).Put(39, 8).Align();                    // 40 bits
  w.Put(0x82, 8).Put(0x42, 8).Put(0xC2, 8).Put(0x22, 8).Put(0xA2, 8);
  ASSERT_TRUE(Decode(w));

  EXPECT_EQ(TextOf(2950, 0), "  L3_Information=101");
  EXPECT_EQ(TextOf(2950, 1), "  L3_Information=") << "a value of 0 has no binary digits";
  EXPECT_EQ(Find(2950, 1)->segments.size(), 4u);
  EXPECT_EQ(TextOf(3193, 0), "  UL_SIR=-82");
  EXPECT_EQ(TextOf(3193, 1), "  UL_SIR=173");
  EXPECT_EQ(TextOf(2796), "  DL_Power=-350");
  EXPECT_EQ(TextOf(3171, 0), "  TransportLayerAddress=AB");
  EXPECT_EQ(Span(*Find(3171, 0)), std::make_pair(330u, 345u)) << "16 bits are not aligned";
  EXPECT_EQ(TextOf(3171, 1), "  TransportLayerAddress=ABCD") << "four characters at most";
  EXPECT_EQ(Find(3171, 1)->segments.size(), 40u);
  EXPECT_EQ(request().bitsLeftOut, 0u);
}

TEST_F(DecodedFieldPassTest, ElementListsShowEachSegment) {
  BitWriter w = PublicHeader(0, 20, 3);
  PutIeFrame(w, 9, 6).Put(0, 1).Align();  // CN_CS_DomainIdentifier
  w.Put(0x00, 8).Put(0xF1, 8).Put(0x10, 8).Put(0x0012, 16);
  PutIeFrame(w, 205, 7).Put(0, 1).Put(0, 1);  // IPAddressSet of 32 bits
  w.Put(1, 1).Put(31, 8).Align().Put(0xC0, 8).Put(0xA8, 8).Put(0x01, 8).Put(0x02, 8);
  w.Align().Put(0, 16);
  PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x00, 8).Put(0x10, 8);  // BindingID
  ASSERT_TRUE(Decode(w));

  EXPECT_EQ(TextOf(2945), "  LAC=0012") << "one digit per half-octet, leading zeros kept";
  EXPECT_EQ(TextOf(3012), "  PLMN_ID=10f100");
  EXPECT_EQ(TextOf(2934), "IPAddress=3.21.128.64") << "each octet with its first bit lowest";
  EXPECT_EQ(TextOf(2928), "  IPAddress Length=32");
  EXPECT_EQ(TextOf(2927), "  Extension Bit=extension") << "the length follows all the same";
  EXPECT_EQ(TextOf(2606), "  BindingID=100") << "a lower-case octet has no leading zero";
}

// The longest texts the grammar can produce stay far below the limits of the
// text buffers, so the cut is shown on the rendering itself, with the buffer
// sizes the pass uses for its value part and its final text.
TEST(DecodedFieldTextLimits, ValuePartAndFinalTextAreCutAtTheirBuffers) {
  std::vector<BitSegment> segments(200);
  for (BitSegment& s : segments) s.segmentValue = 255;
  FieldRecord record{};
  record.segments = segments.data();
  record.readCount = record.segmentCount = 200;

  char valueStaging[500];
  char outputText[256];
  TextBuffer value(valueStaging, sizeof valueStaging);
  RenderValue(grammar::ValueForm::kElementsDecimal, grammar::kNoNames, ".", record, value);
  std::string full;
  for (int i = 0; i < 200; ++i) full += i ? ".255" : "255";
  EXPECT_EQ(value.length(), 499u);
  EXPECT_EQ(std::string(valueStaging), full.substr(0, 499));

  TextBuffer output(outputText, sizeof outputText);
  output.Append("IPAddress=");
  output.Append(value.c_str(), value.length());
  EXPECT_EQ(output.length(), 255u);
  EXPECT_EQ(std::string(outputText), "IPAddress=" + full.substr(0, 245));

  TextBuffer lower(outputText, sizeof outputText);
  lower.Append("  BindingID=");
  RenderValue(grammar::ValueForm::kElementsLowerHex, grammar::kNoNames, "", record, lower);
  EXPECT_EQ(lower.length(), 255u);
  EXPECT_EQ(std::string(outputText), "  BindingID=" + std::string(243, 'f'));
}

}  // namespace
}  // namespace rnsap::testing
