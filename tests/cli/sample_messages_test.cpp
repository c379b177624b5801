// The sample messages the project ships: each one is composed here field by
// field, must stand in samples/messages.hex exactly so, and must decode to
// its end with the fields it was written to show.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "cli/hex_input.h"
#include "host/recorder.h"
#include "host/setup.h"
#include "tests/support/bit_writer.h"

namespace rnsap {
namespace {

using testing::BitWriter;

enum PduType : uint32_t { kInitiating = 0, kSuccessful = 1 };
constexpr uint32_t kPrivateProcedure = 15;

BitWriter& Append(BitWriter& w, const BitWriter& part) {
  const uint32_t wholeOctets = part.bits() / 8;
  for (uint32_t i = 0; i < wholeOctets; ++i) w.Put(part.bytes()[i], 8);
  const uint32_t restBits = part.bits() % 8;
  if (restBits != 0) w.Put(part.bytes().back() >> (8 - restBits), restBits);
  return w;
}

uint8_t ReverseOctet(uint8_t octet) {
  uint8_t reversed = 0;
  for (int bit = 0; bit < 8; ++bit)
    reversed = static_cast<uint8_t>(reversed << 1 | (octet >> bit & 1));
  return reversed;
}

uint32_t Octets(const BitWriter& w) { return (w.bits() + 7) / 8; }

// A length determinant of the one-octet form.
BitWriter& PutLength(BitWriter& w, uint32_t octets) { return w.Put(0, 1).Put(octets, 7); }

struct Header {
  uint32_t pduType = kInitiating;
  uint32_t procedure = 0;
  uint32_t ddMode = 1;  // fdd
  uint32_t transactionId = 5;
  bool longTransactionId = false;
};

// Header up to the message size, which counts the octets behind it.
BitWriter Message(const Header& header, const BitWriter& rest) {
  BitWriter w;
  w.Put(0, 1).Put(header.pduType, 2).Align().Put(header.procedure, 8);
  w.Put(header.ddMode, 2).Put(0, 2);  // criticality reject
  if (header.longTransactionId) {
    w.Put(1, 1).Align().Put(header.transactionId, 16);
  } else {
    w.Put(0, 1).Put(header.transactionId, 7);
  }
  PutLength(w.Align(), Octets(rest));
  return Append(w, rest);
}

// The public form: IEs, then the message's extension list if it has one.
BitWriter PublicBody(const std::vector<BitWriter>& ies,
                     const std::vector<BitWriter>& extensions = {}) {
  BitWriter w;
  w.Put(0, 1).Put(!extensions.empty(), 1).Align().Put(ies.size(), 16);
  for (const BitWriter& ie : ies) Append(w.Align(), ie);
  if (extensions.empty()) return w;
  w.Align().Put(extensions.size() - 1, 16);
  for (const BitWriter& extension : extensions) Append(w.Align(), extension);
  return w;
}

// An IE or extension frame (both have the same shape) around its value.
BitWriter Framed(uint32_t id, uint32_t criticality, const BitWriter& value) {
  BitWriter w;
  PutLength(w.Put(id, 16).Put(criticality, 2).Align(), Octets(value));
  return Append(w, value);
}

BitWriter Ie(uint32_t id, const BitWriter& value) { return Framed(id, 0, value); }

// -------------------------------------------------------------- IE values

BitWriter CauseRadioNetwork(uint32_t cause) {
  return BitWriter().Put(0, 1).Put(0, 2).Put(0, 1).Put(cause, 5);
}

// Procedure code, triggering message, criticality and short transaction id
// present, one IE in the list with a repetition number, no extensions.
BitWriter CriticalityDiagnostics() {
  BitWriter w;
  w.Put(0, 1).Put(0b11110, 5).Align().Put(20, 8);  // procedure code 20
  w.Put(0, 2).Put(0, 2).Put(0, 1).Put(5, 7);       // initiating, reject, transaction 5
  w.Align().Put(0, 8);                             // one IE in the list
  w.Put(0, 1).Put(0b10, 2).Put(0, 2).Align().Put(118, 16).Align().Put(1, 8);
  return w;
}

BitWriter S_Rnti(uint32_t rnti) { return BitWriter().Put(2, 2).Align().Put(rnti, 24); }
BitWriter C_Id(uint32_t cellId) { return BitWriter().Align().Put(cellId, 16); }
BitWriter Cfn(uint32_t cfn) { return BitWriter().Align().Put(cfn, 8); }
BitWriter AllowedQueuingTime(uint32_t time) { return BitWriter().Put(time, 6); }

// Eight octets of swapped digit pairs, 0xF in the last high half-octet for 15.
BitWriter Imsi(const std::vector<uint8_t>& octets) {
  BitWriter w;
  w.Put(octets.size() - 3, 3).Align();
  for (const uint8_t octet : octets) w.Put(octet, 8);
  return w;
}

BitWriter DrxCycleLengthCoefficient(uint32_t raw) { return BitWriter().Put(raw, 4); }

// MCC 440, MNC 20, and a location area code; no extensions.
BitWriter CnCsDomainIdentifier() {
  return BitWriter().Put(0, 1).Align().Put(0x44F002, 24).Put(0x1A2B, 16);
}

// The private identifier 1.2.440.200043.3.ie: Japan, vorel, rnsap.
BitWriter GlobalPrivateId(uint32_t ie) {
  BitWriter w;
  w.Put(1, 1).Align();
  PutLength(w, 8).Put(0x2A, 8);              // size, 1st sub-identifier
  w.Put(0x83, 8).Put(0x38, 8);               // 440 in two octets
  w.Put(0x8C, 8).Put(0x9A, 8).Put(0x6B, 8);  // 200043 in three octets
  return w.Put(0, 1).Put(3, 7).Put(0, 1).Put(ie, 7);
}

BitWriter PrivateMessage(uint32_t ie, const BitWriter& body) {
  BitWriter w;
  w.Put(0, 1).Align().Put(0, 16);  // no extensions, one IE
  Append(w.Align(), GlobalPrivateId(ie)).Put(0, 2).Align();
  PutLength(w, Octets(body));
  return Append(w, body).Align();
}

// One IP address set: the address in mirrored octets and a UDP port.
BitWriter IpAddressSet(const std::vector<uint8_t>& address, uint32_t port) {
  BitWriter w;
  w.Put(0, 1).Put(0, 1).Put(0, 1).Put(8 * address.size() - 1, 8).Align();
  for (const uint8_t octet : address) w.Put(ReverseOctet(octet), 8);
  return w.Align().Put(port, 16);
}

// A call reset of the calls of one IP address set.
BitWriter CallResetType(const BitWriter& addressSet) {
  BitWriter w;
  w.Put(0, 1).Put(1, 1).Put(0, 1).Put(0, 1).Put(0, 7).Align().Put(1, 16);
  return Append(w.Align(), Ie(205, addressSet));
}

BitWriter ResetResourceRequest(const BitWriter& resetType) {
  BitWriter w;
  w.Put(0, 1).Put(0, 1).Align().Put(1, 16);
  return Append(w.Align(), Ie(204, resetType));
}

// A point: north, latitude and longitude in three octets each.
BitWriter GeographicalAreaCellPoint(uint32_t latitude, uint32_t longitude) {
  BitWriter w;
  w.Put(0, 1).Put(0, 2).Put(0, 1).Put(0, 1).Put(0, 1).Put(0, 1).Put(0, 1).Put(2, 2);
  w.Align().Put(latitude, 24).Put(2, 2).Align().Put(longitude, 24);
  return w;
}

BitWriter ServiceType(uint32_t bits) { return BitWriter().Put(bits, 8); }

// ------------------------------------------------------------ the samples

struct Sample {
  std::string what;
  BitWriter message;
  std::vector<std::string> texts;  // shown in this order, among others
};

std::vector<Sample> Samples() {
  return {
      {"radio link setup request without IEs",
       Message({kInitiating, 20}, PublicBody({})),
       {"Procedure Code=id_radioLinkSetup", "ShortTransActionId=5", "Number Of IEs=0"}},
      {"error indication with cause and criticality diagnostics",
       Message({kInitiating, 8, 1, 17},
               PublicBody({Ie(11, CauseRadioNetwork(3)), Ie(20, CriticalityDiagnostics())})),
       {"Procedure Code=id_errorIndication", "IE ID=id_Cause",
        "  CauseRadioNetwork=ul_scrambling_code_already_in_use", "IE ID=id_CriticalityDiagnostics",
        "  ProcedureCode=20", "  TriggeringMessage=initiating_message",
        "  TransactionID_shortTransActionId=5", "  CriticalityDiagnostics_IE_List Length=0",
        "  ProtocolIE_ID=118", "  RepetitionNumber=1"}},
      {"radio link setup request with scalar IEs",
       Message({kInitiating, 20, 1, 300, true},
               PublicBody({Ie(155, S_Rnti(0x0ABCDE)), Ie(6, C_Id(1234)), Ie(8, Cfn(200)),
                           Ie(4, AllowedQueuingTime(17))})),
       {"LongTransActionId=300", "  S_RNTI=703710", "  C_ID=1234", "  CFN=200",
        "  AllowedQueuingTime=17"}},
      {"paging request with an IMSI of 15 digits",
       Message({kInitiating, 13, 2},
               PublicBody({Ie(84, Imsi({0x44, 0x20, 0x00, 0x21, 0x43, 0x65, 0x87, 0xF9})),
                           Ie(70, DrxCycleLengthCoefficient(4)), Ie(9, CnCsDomainIdentifier())})),
       {"Procedure Code=id_pagingRequest", "  IMSI=440200123456789",
        "  DRXCycleLengthCoefficient=6", "  PLMN_ID=2f044", "  LAC=1a2b"}},
      {"paging request with an IMSI of 16 digits",
       Message({kInitiating, 13, 2},
               PublicBody({Ie(84, Imsi({0x44, 0x20, 0x00, 0x21, 0x43, 0x65, 0x87, 0x09}))})),
       {"  IMSI=4402001234567890"}},
      {"private message: OAM information request",
       Message({kInitiating, kPrivateProcedure, 1, 9},
               PrivateMessage(2, BitWriter().Put(0, 1).Put(1, 1))),
       {"Procedure Code=id_privateMessage", "  Number Of IEs=1", "  PrivateIE_ID Index=global",
        "    Nation=Japan (440)", "    Company=vorel (200043)", "    Protocol=rnsap (3)",
        "  IE=OAM_InformationRequest", "  ReportType=drnc"}},
      {"private message: reset of the calls of one IP address set",
       Message({kInitiating, kPrivateProcedure, 1, 10},
               PrivateMessage(
                   5, ResetResourceRequest(CallResetType(IpAddressSet({192, 168, 1, 10}, 2152))))),
       {"  IE=ResetResourceRequest", "IE ID=id_ResetType", "  ResetType Index=callReset",
        "IE ID=id_IE_IPAddressSet", "IPAddress=192.168.1.10", "  UDPPortNumber=2152"}},
      {"radio link setup response with an extension list",
       Message({kSuccessful, 20, 1, 11},
               PublicBody({Ie(6, C_Id(1234))},
                          {Framed(7, 1, GeographicalAreaCellPoint(3325728, 6513641)),
                           Framed(37, 1, ServiceType(0b10100000))})),
       {"Procedure Code=id_radioLinkSetup", "  C_ID=1234", "Number Of Extensions=2",
        "Extension ID=id_GeographicalAreaCell", "  GeographicalAreaCell Index=point",
        "  latitudeSign=north", "  latitude=3325728", "  longitude=14902249",
        "Extension ID=id_ServiceType", " ServiceType=10100000"}},
  };
}

// --------------------------------------------------------------- the file

std::vector<std::vector<uint8_t>> ShippedMessages() {
  std::ifstream file(RNSAP_SAMPLES_FILE);
  std::vector<std::vector<uint8_t>> messages;
  std::string line;
  while (std::getline(file, line)) {
    cli::HexLine parsed = cli::ParseHexLine(line);
    EXPECT_NE(parsed.kind, cli::HexLine::Kind::kBad) << line;
    if (parsed.kind == cli::HexLine::Kind::kMessage) messages.push_back(parsed.octets);
  }
  return messages;
}

std::string Hex(const std::vector<uint8_t>& octets) {
  std::string hex;
  char octet[4];
  for (const uint8_t value : octets) {
    std::snprintf(octet, sizeof octet, "%02X ", value);
    hex += octet;
  }
  return hex;
}

TEST(SampleMessagesTest, FileShipsExactlyTheComposedMessages) {
  const std::vector<Sample> samples = Samples();
  const std::vector<std::vector<uint8_t>> shipped = ShippedMessages();
  ASSERT_EQ(shipped.size(), samples.size());
  for (size_t i = 0; i < samples.size(); ++i) {
    EXPECT_EQ(Hex(shipped[i]), Hex(samples[i].message.bytes())) << samples[i].what;
  }
}

// The texts the pass reported, with `expected` found in order among them.
void ExpectTextsInOrder(const std::vector<std::string>& expected) {
  auto next = host::DecodedFields().begin();
  const auto end = host::DecodedFields().end();
  for (const std::string& text : expected) {
    next = std::find_if(next, end, [&](const host::DecodedFieldReport& field) {
      return field.text.starts_with(text);
    });
    ASSERT_NE(next, end) << "not reported in order: " << text;
  }
}

TEST(SampleMessagesTest, EachDecodesToItsEndWithTheFieldsItShows) {
  host::HostDecodeContext context;
  for (const Sample& sample : Samples()) {
    SCOPED_TRACE(sample.what);
    host::ResetHost();
    context.LoadMessage(sample.message.bytes());
    ASSERT_TRUE(vex_PreDecodeMD(&context.decode_request()));
    EXPECT_EQ(context.decode_request().bitsLeftOut, 0u);
    EXPECT_EQ(context.state().position, 8 * sample.message.bytes().size() + 1);
    EXPECT_EQ(context.state().flags & ~ERR_CONDITION, 0u);
    ExpectTextsInOrder(sample.texts);
  }
}

}  // namespace
}  // namespace rnsap
