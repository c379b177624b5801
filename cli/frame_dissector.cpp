#include "cli/frame_dissector.h"

#include <pcap/dlt.h>

#include <algorithm>

#include "cli/octet_reader.h"
#include "cli/sccp.h"

namespace rnsap::cli {
namespace {

constexpr uint16_t kEtherTypeIpv4 = 0x0800;
constexpr uint16_t kEtherTypeIpv6 = 0x86dd;
constexpr uint16_t kEtherTypeVlan = 0x8100;
constexpr uint16_t kEtherTypeQinQ = 0x88a8;
constexpr uint8_t kIpProtocolSctp = 132;
constexpr uint8_t kSctpDataChunk = 0;
constexpr uint32_t kPayloadProtocolM3ua = 3;
constexpr uint16_t kM3uaPort = 2905;
constexpr uint16_t kM3uaProtocolData = 0x0210;
constexpr uint8_t kServiceIndicatorSccp = 3;

std::string Number(size_t value) { return std::to_string(value); }

// Chunks and M3UA parameters are padded to a multiple of four octets; the
// padding of the last one may be missing.
void SkipPadding(OctetReader& reader, size_t length) {
  reader.Skip(std::min((4 - length % 4) % 4, reader.left()));
}

void AddRnsap(OptionalOctets sccp, FrameYield& yield) {
  if (!sccp) return;
  if (const auto rnsap = RnsapInSccp(*sccp))
    yield.messages.emplace_back(rnsap->begin(), rnsap->end());
}

// OPC, DPC, then SI, NI, MP and SLS in front of the user data.
OptionalOctets SccpInProtocolData(std::span<const uint8_t> value) {
  OctetReader data(value, "M3UA Protocol Data");
  data.Skip(8);
  const uint8_t serviceIndicator = data.U8();
  data.Skip(3);
  return serviceIndicator == kServiceIndicatorSccp ? OptionalOctets(data.Rest()) : std::nullopt;
}

// A message signal unit's length indicator counts the octets from the SIO
// on; 63 stands for 63 or more. FISUs and LSSUs (below 3) carry no MTP3
// message.
OptionalOctets Mtp3InMtp2(std::span<const uint8_t> frame) {
  OctetReader signalUnit(frame, "MTP2");
  signalUnit.Skip(2);  // BSN and BIB, FSN and FIB
  const size_t lengthIndicator = signalUnit.U8() & 0x3f;
  if (lengthIndicator < 3) return std::nullopt;
  return lengthIndicator < 63 ? signalUnit.Take(lengthIndicator) : signalUnit.Rest();
}

}  // namespace

OptionalOctets SccpInM3ua(std::span<const uint8_t> m3ua) {
  OctetReader header(m3ua, "M3UA");
  const uint8_t version = header.U8();
  if (version != 1) header.Fail("version " + Number(version) + ", not 1");
  header.Skip(1);
  const uint8_t messageClass = header.U8();
  const uint8_t messageType = header.U8();
  const bool dataMessage = messageClass == 1 && messageType == 1;  // transfer class, DATA
  const uint32_t length = header.U32();
  if (length < 8 || length > m3ua.size()) {
    header.Fail("message length " + Number(length) + " does not fit its " + Number(m3ua.size()) +
                " octets");
  }
  if (!dataMessage) return std::nullopt;
  OctetReader parameters(m3ua.subspan(8, length - 8), "M3UA parameter");
  while (parameters.left() > 0) {
    const uint16_t tag = parameters.U16();
    const uint16_t parameterLength = parameters.U16();
    if (parameterLength < 4) parameters.Fail("length " + Number(parameterLength) + " below 4");
    const auto value = parameters.Take(parameterLength - 4);
    SkipPadding(parameters, parameterLength);
    if (tag == kM3uaProtocolData) return SccpInProtocolData(value);
  }
  return std::nullopt;
}

OptionalOctets SccpInMtp3(std::span<const uint8_t> mtp3) {
  OctetReader unit(mtp3, "MTP3");
  const uint8_t serviceIndicator = unit.U8() & 0x0f;
  if (serviceIndicator != kServiceIndicatorSccp) return std::nullopt;
  unit.Skip(4);  // ITU routing label: DPC, OPC, SLS
  return unit.Rest();
}

void FrameDissector::Dissect(int linkType, std::span<const uint8_t> frame, FrameYield& yield) {
  switch (linkType) {
    case DLT_EN10MB:
      return Ethernet(frame, yield);
    case DLT_LINUX_SLL: {
      OctetReader cooked(frame, "Linux cooked capture");
      cooked.Skip(14);  // packet type, ARPHRD type, address length and address
      const uint16_t protocol = cooked.U16();
      return EtherType(protocol, cooked.Rest(), yield);
    }
    case DLT_LINUX_SLL2: {
      OctetReader cooked(frame, "Linux cooked capture v2");
      const uint16_t protocol = cooked.U16();
      cooked.Skip(18);  // reserved, interface, ARPHRD type, packet type, address
      return EtherType(protocol, cooked.Rest(), yield);
    }
    case DLT_RAW:
    case DLT_IPV4:
    case DLT_IPV6:
      return Ip(frame, yield);
    case DLT_MTP2: {
      const OptionalOctets mtp3 = Mtp3InMtp2(frame);
      if (mtp3) AddRnsap(SccpInMtp3(*mtp3), yield);
      return;
    }
    case DLT_MTP3:
      return AddRnsap(SccpInMtp3(frame), yield);
    default:
      return;
  }
}

void FrameDissector::Ethernet(std::span<const uint8_t> frame, FrameYield& yield) {
  OctetReader ethernet(frame, "Ethernet");
  ethernet.Skip(12);  // destination and source addresses
  uint16_t type = ethernet.U16();
  while (type == kEtherTypeVlan || type == kEtherTypeQinQ) {
    ethernet.Skip(2);  // the tag's priority and VLAN id
    type = ethernet.U16();
  }
  EtherType(type, ethernet.Rest(), yield);
}

void FrameDissector::EtherType(uint16_t type, std::span<const uint8_t> payload, FrameYield& yield) {
  if (type == kEtherTypeIpv4 || type == kEtherTypeIpv6) Ip(payload, yield);
}

void FrameDissector::Ip(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader ip(packet, "IP");
  const uint8_t version = ip.U8() >> 4;
  if (version == 4) return Ipv4(packet, yield);
  if (version == 6) return Ipv6(packet, yield);
  ip.Fail("version " + Number(version));
}

// IP fragments are not put together: a fragmented packet is skipped.
void FrameDissector::Ipv4(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader ip(packet, "IPv4");
  const size_t headerLength = (ip.U8() & 0x0f) * 4u;
  ip.Skip(1);
  const size_t totalLength = ip.U16();
  ip.Skip(2);
  const bool fragment = (ip.U16() & 0x3fff) != 0;  // more fragments, or an offset
  ip.Skip(1);
  const uint8_t protocol = ip.U8();
  if (headerLength < 20 || totalLength < headerLength || totalLength > packet.size()) {
    ip.Fail("header length " + Number(headerLength) + " and total length " + Number(totalLength) +
            " do not fit its " + Number(packet.size()) + " octets");
  }
  if (protocol != kIpProtocolSctp || fragment) return;
  ip.Seek(12);
  const auto addresses = ip.Take(8);
  Sctp({addresses.begin(), addresses.end()},
       packet.subspan(headerLength, totalLength - headerLength), yield);
}

// Hop-by-hop, routing and destination options headers are passed over; a
// fragment header, like any other next header but SCTP, skips the packet.
void FrameDissector::Ipv6(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader ip(packet, "IPv6");
  ip.Skip(4);
  const uint16_t payloadLength = ip.U16();
  uint8_t nextHeader = ip.U8();
  ip.Skip(1);
  const auto addresses = ip.Take(32);
  OctetReader payload(ip.Take(payloadLength), "IPv6 extension header");
  while (nextHeader == 0 || nextHeader == 43 || nextHeader == 60) {
    nextHeader = payload.U8();
    payload.Skip((payload.U8() + 1u) * 8 - 2);
  }
  if (nextHeader != kIpProtocolSctp) return;
  Sctp({addresses.begin(), addresses.end()}, payload.Rest(), yield);
}

void FrameDissector::Sctp(std::string addresses, std::span<const uint8_t> packet,
                          FrameYield& yield) {
  OctetReader sctp(packet, "SCTP");
  const auto ports = sctp.Take(4);
  sctp.Skip(8);  // verification tag, checksum
  const bool m3uaPort =
      (ports[0] << 8 | ports[1]) == kM3uaPort || (ports[2] << 8 | ports[3]) == kM3uaPort;
  const std::string direction = addresses.append(ports.begin(), ports.end());
  while (sctp.left() > 0) {
    const size_t start = sctp.offset();
    sctp.Skip(2);  // type, flags
    const uint16_t length = sctp.U16();
    if (length < 4) sctp.Fail("chunk length " + Number(length) + " below 4");
    sctp.Seek(start);
    const auto chunk = sctp.Take(length);
    SkipPadding(sctp, length);
    if (chunk[0] == kSctpDataChunk) DataChunk(direction, m3uaPort, chunk, yield);
  }
}

// The payload is M3UA by its protocol identifier, or, when that is left 0,
// by the M3UA port.
void FrameDissector::DataChunk(const std::string& direction, bool m3uaPort,
                               std::span<const uint8_t> chunk, FrameYield& yield) {
  OctetReader data(chunk, "SCTP DATA chunk");
  data.Skip(1);
  SctpDataChunk parsed;
  parsed.flags = data.U8();
  data.Skip(2);
  parsed.tsn = data.U32();
  parsed.stream = data.U16();
  parsed.sequence = data.U16();
  parsed.payloadProtocol = data.U32();
  parsed.data = data.Rest();
  const bool m3ua =
      parsed.payloadProtocol == kPayloadProtocolM3ua || (parsed.payloadProtocol == 0 && m3uaPort);
  if (!m3ua) return;
  const std::optional<SctpUserMessage> message = reassembler_.Add(direction, parsed);
  if (!message) {
    yield.fragmentsHeld = true;
    return;
  }
  AddRnsap(SccpInM3ua(message->data), yield);
}

}  // namespace rnsap::cli
