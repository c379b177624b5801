// The Display pass through its export, with the stand-in host: bare value
// texts under display ids, the message names of the procedure code, the
// forms that differ from the decoded text, and the layer boundary row.
#include <gtest/gtest.h>

#include <set>
#include <string>
#include <utility>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

using host::DisplayLine;

constexpr uint32_t kProcedureLine = 688;

class DisplayPassTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(host_.ready()); }

  bool Display(const BitWriter& w) {
    host_.Load(w);
    return Run();
  }
  bool Run() {
    request().bitsLeftOut = kUnwritten;
    return vex_PreDecodeTO(&request());
  }

  DecodeRequest& request() { return host_.request(); }
  static const std::vector<DisplayLine>& Lines() { return host::DisplayLines(); }

  // Texts of the lines with `displayId`, in order.
  static std::vector<std::string> TextsOf(uint32_t displayId) {
    std::vector<std::string> texts;
    for (const DisplayLine& line : Lines()) {
      if (line.displayId == displayId) texts.push_back(line.text);
    }
    return texts;
  }
  static std::string TextOf(uint32_t displayId) {
    const std::vector<std::string> texts = TextsOf(displayId);
    return texts.empty() ? "<no line>" : texts.front();
  }

  PassHost host_;
};

using LinePairs = std::vector<std::pair<std::string, uint32_t>>;

LinePairs AsPairs(const std::vector<DisplayLine>& lines) {
  LinePairs pairs;
  for (const DisplayLine& line : lines) pairs.emplace_back(line.text, line.displayId);
  return pairs;
}

// ---------------------------------------------------------------- the header

TEST_F(DisplayPassTest, HeaderFieldsAreBareValues) {
  host_.Load(kEmptySetupRequest, 64);
  ASSERT_TRUE(Run());
  EXPECT_EQ(AsPairs(Lines()), (LinePairs{{"0", 684},
                                         {"InitiatingMessage", 685},
                                         {"0", 682},
                                         {"RadioLinkSetupRequest", 688},
                                         {"fdd", 697},
                                         {"Reject", 698},
                                         {"shortTransActionId", 746},
                                         {"5", 749},
                                         {"0", 682},
                                         {"0", 699},
                                         {"3", 702},
                                         {"0", 706},
                                         {"no extension", 709},
                                         {"0", 682},
                                         {"0", 710}}));
  EXPECT_EQ(request().bitsLeftOut, 0u);
  EXPECT_TRUE(host_.BufferRestored());
}

TEST_F(DisplayPassTest, ProcedureCodeNamesTheMessageByItsPduType) {
  struct Case {
    uint32_t pduType;
    uint32_t code;
    const char* name;
  };
  const Case cases[] = {
      {0, 20, "RadioLinkSetupRequest"},
      {1, 20, "RadioLinkSetupResponse"},
      {2, 20, "RadioLinkSetupFailure"},
      {0, 17, "RadioLinkDeletionRequest"},
      {1, 17, "RadioLinkDeletionResponse"},
      {2, 17, "Unknown"},
      {0, 27, "Unknown"},
      {1, 27, "Unknown"},
      {2, 27, "Unknown"},
      {0, 255, "Unknown"},
      {0, 0, "CommonTransportChannelResourcesRequest"},
      {0, 6, "DL-PowerControlRequest"},
      {0, 26, "UplinkSignallingTransferIndication"},
      {1, 2, "Unknown"},
      {1, 8, "DedicatedMeasurementInitiationResponse"},
      {1, 10, "DedicatedMeasurementInitiationRequest"},
      {2, 10, "DedicatedMeasurementInitiationRequest"},
      {1, 12, "PhysicalChannelReconfigurationCommand"},
      {2, 12, "PhysicalChannelReconfigurationFailure"},
      {2, 14, "PhysicalChannelReconfigurationCommand"},
      {1, 19, "RadioLinkSetupResponse"},
      {2, 25, "RadioLinkReconfigurationFailure"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE("PDU type " + std::to_string(c.pduType) + ", code " + std::to_string(c.code));
    ASSERT_TRUE(Display(PublicHeader(c.pduType, c.code, 0)));
    EXPECT_EQ(TextsOf(kProcedureLine), std::vector<std::string>{c.name});
  }
}

TEST_F(DisplayPassTest, OutcomeHasNoProcedureLine) {
  ASSERT_TRUE(Display(PublicHeader(3, 20, 0)));
  EXPECT_TRUE(TextsOf(kProcedureLine).empty());
  ASSERT_EQ(Lines().size(), 14u);
  EXPECT_EQ(Lines()[1].text, "Outcome");
  EXPECT_EQ(Lines()[3].displayId, 697u) << "ddMode follows the alignment";
}

// ---------------------------------------------------------------- forms of their own

TEST_F(DisplayPassTest, NamedIdentifierPartsShowTheNameAlone) {
  for (const auto& [protocol, name] :
       {std::pair{0u, "not defined"}, std::pair{3u, "rnsap"}, std::pair{7u, "not defined"}}) {
    BitWriter w = PrivateHeader(0);
    PutGlobalPrivateIe(w, protocol, 3, 5);  // OAM_InformationResponse
    w.Put(0, 1).Align().Put(0, 8).Put(0x2a, 8);
    ASSERT_TRUE(Display(w));
    EXPECT_EQ(TextOf(3272), name);
    EXPECT_EQ(TextsOf(3244), std::vector<std::string>{"Japan"});
    EXPECT_EQ(TextsOf(3264), std::vector<std::string>{"vorel"});
    EXPECT_EQ(TextOf(3274), "OAM_InformationResponse");
    EXPECT_EQ(TextOf(710), "1") << "the private IE count is the stored count plus 1";
    EXPECT_EQ(TextOf(3001), "42");
  }
}

TEST_F(DisplayPassTest, DigitListsOfAreasAndBindingIdAreWholeHexValues) {
  BitWriter w = PublicHeader(0, 20, 2);
  PutIeFrame(w, 156, 8).Put(0, 1).Align();  // SAI
  w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0012, 16).Put(0xabcd, 16);
  PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x05, 8).Put(0x0a, 8);  // BindingID
  ASSERT_TRUE(Display(w));
  EXPECT_EQ(TextOf(2945), "12") << "LAC 0x0012 without its leading zeros";
  EXPECT_EQ(TextOf(3060), "abcd");
  EXPECT_EQ(TextOf(3012), "563412");
  EXPECT_EQ(TextOf(2606), "a05") << "the segments 0x0a, 0x05 as one number";
  EXPECT_EQ(TextOf(2602), "1");
}

TEST_F(DisplayPassTest, OtherListsKeepTheirElements) {
  BitWriter w = PublicHeader(0, 20, 3);
  PutImsiOfEightOctets(w, {0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0xF5});
  PutImsiOfEightOctets(w, {0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0x65});
  PutIeFrame(w, 205, 7).Put(0, 1).Put(0, 1);  // IPAddressSet of 32 bits
  w.Put(0, 1).Put(31, 8).Align().Put(0xC0, 8).Put(0xA8, 8).Put(0x01, 8).Put(0x02, 8);
  w.Align().Put(2152, 16);
  ASSERT_TRUE(Display(w));
  EXPECT_EQ(TextsOf(2918), (std::vector<std::string>{"123456789012345", "1234567890123456"}));
  EXPECT_EQ(TextsOf(2920), (std::vector<std::string>{"15", "6"})) << "Filler as a number";
  EXPECT_EQ(TextOf(2932), "3.21.128.64");
  EXPECT_EQ(TextOf(3212), "2152");
}

// A TransportLayerAddress of 32 bits: the 15 header lines, then the IE
// frame (Spare, IE ID, Criticality, Spare, IE LENGTH Type, IE LENGTH), the
// Extension Bit, the length, the alignment and the address, line 24.
BitWriter MessageWithTransportLayerAddress() {
  BitWriter w = PublicHeader(0, 20, 3);
  PutIeFrame(w, 165, 6).Put(0, 1).Put(31, 8).Align();  // "ABCD"
  w.Put(0x82, 8).Put(0x42, 8).Put(0xC2, 8).Put(0x22, 8);
  PutIeFrame(w, 205, 4).Put(0, 1).Put(0, 1);  // IPAddressSet of 7 bits
  w.Put(0, 1).Put(6, 8).Align().Put(0b1011001, 7).Align().Put(0, 16);
  PutIeFrame(w, 184, 1).Align().Put(0, 8);  // UL_SIR
  return w;
}
constexpr size_t kAddressLine = 24;

TEST_F(DisplayPassTest, BitFormsAndOctetText) {
  ASSERT_TRUE(Display(MessageWithTransportLayerAddress()));
  ASSERT_GT(Lines().size(), kAddressLine);
  EXPECT_EQ(Lines()[kAddressLine - 1].text, "0") << "the alignment in front of the address";
  EXPECT_EQ(Lines()[kAddressLine].text, "ABCD");
  EXPECT_EQ(TextOf(2932), "1001101");
  EXPECT_EQ(TextOf(3193), "-82");
}

TEST_F(DisplayPassTest, SpareShowsItsBitsAlsoWhenThereAreNone) {
  BitWriter w = PublicHeader(0, 20, 1);
  PutIeFrame(w, 4, 1).Put(17, 6);
  std::vector<uint8_t> message = w.bytes();
  message[0] |= 0x1F;  // the padding behind the PDU type
  host_.Load(message, static_cast<uint32_t>(8 * message.size()));
  ASSERT_TRUE(Run());
  ASSERT_GT(Lines().size(), 15u);
  EXPECT_EQ(AsPairs(Lines())[2], std::pair(std::string("1f"), 682u));
  EXPECT_EQ(AsPairs(Lines())[15], std::pair(std::string("0"), 682u))
      << "the alignment in front of the IE";
  EXPECT_EQ(TextOf(2597), "17");
}

// ---------------------------------------------------------------- against the Decoded-field pass

// Every field read makes one line, in the order of the decoded fields, with
// the value part of the decoded text, except where the line has a form of
// its own.
TEST_F(DisplayPassTest, OneLinePerFieldWithTheValuePartOfTheDecodedText) {
  std::vector<BitWriter> messages;
  {
    BitWriter w = PrivateHeader(0);
    PutGlobalPrivateIe(w, 2, 3, 5);
    w.Put(0, 1).Align().Put(2, 8).Put(0x01, 8).Put(0x02, 8).Put(0x03, 8);
    messages.push_back(w);
  }
  {
    BitWriter w = PublicHeader(1, 20, 6);
    PutImsiOfEightOctets(w, {0x21, 0x43, 0x65, 0x87, 0x09, 0x21, 0x43, 0xF5});
    PutIeFrame(w, 156, 8).Put(0, 1).Align();
    w.Put(0x12, 8).Put(0x34, 8).Put(0x56, 8).Put(0x0012, 16).Put(0xabcd, 16);
    PutIeFrame(w, 5, 3).Put(0, 1).Put(1, 2).Put(0x05, 8).Put(0x0a, 8);
    PutIeFrame(w, 85, 1).Align().Put(0, 1).Put(3, 7).Put(0b101, 3);
    PutIeFrame(w, 67, 2).Align().Put(0, 16);
    PutIeFrame(w, 21, 4).Put(2, 2).Align().Put(0xABCDEF, 24);
    messages.push_back(w);
  }
  const std::set<uint32_t> ownForms{688, 692, 696, 3248, 3264, 3272, 2606, 2945, 3060, 2920};
  for (const BitWriter& w : messages) {
    host_.Load(w);
    ASSERT_TRUE(vex_PreDecodeMD(&request()));
    const std::vector<host::DecodedFieldReport> decoded = host::DecodedFields();
    host_.context().Rewind();
    ASSERT_TRUE(Run());
    ASSERT_EQ(Lines().size(), decoded.size());
    for (size_t i = 0; i < decoded.size(); ++i) {
      if (ownForms.count(decoded[i].fieldId)) continue;
      const std::string& text = decoded[i].text;
      SCOPED_TRACE(text);
      ASSERT_NE(text.find('='), std::string::npos);
      EXPECT_EQ(Lines()[i].text, text.substr(text.find('=') + 1));
    }
  }
}

// ---------------------------------------------------------------- layer boundary row

TEST_F(DisplayPassTest, LayerRowIsOpenedAndClosedAsInTheDecodedFieldPass) {
  PassHost host({.positionStack = 64, .layerTable = 4, .layerRows = 1});
  ASSERT_TRUE(host.ready());
  host.Load(kEmptySetupRequest, 64);
  DecodeRequest& r = host.request();
  r.layerRowIndex = 1;  // a row beyond the host's only one
  r.layerValue = 99;
  r.tag = 0xC3;
  ASSERT_TRUE(vex_PreDecodeTO(&r));
  EXPECT_EQ(host::CreateNewLayerInfoCalls(), 1u);
  ASSERT_GE(r.layerRowLimit, 1u);
  EXPECT_EQ(r.layerRowIndex, 2u);
  EXPECT_EQ(r.layerRows[1].firstBit, 1u);
  EXPECT_EQ(r.layerRows[1].lastBit, 64u);
  EXPECT_EQ(r.layerRows[1].layerValue, 99u);
  EXPECT_EQ(r.layerRows[1].tag, 0xC3u);
}

TEST_F(DisplayPassTest, FailedGrowthLeavesTheLayerRowOpen) {
  BitWriter w = PublicHeader(0, 7, 1);
  PutIeFrame(w, 85, 40).Align().Put(1, 1).Put(0, 1).Put(300, 14);
  for (int i = 0; i < 300; ++i) w.Put(1, 1);
  host_.Load(w);
  host::FailAllocationCall(1);
  request().layerRows[0].lastBit = kUnwritten;
  EXPECT_FALSE(Run());
  EXPECT_EQ(request().layerRows[0].firstBit, 1u);
  EXPECT_EQ(request().layerRows[0].lastBit, kUnwritten);
  EXPECT_EQ(request().layerRowIndex, 0u);
  EXPECT_EQ(request().bitsLeftOut, kUnwritten);
  ASSERT_FALSE(Lines().empty());
  EXPECT_EQ(AsPairs(Lines()).back(), std::pair(std::string("300"), 3297u));
}

}  // namespace
}  // namespace rnsap::testing
