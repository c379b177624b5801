#include "cli/frame_dissector.h"

#include <pcap/dlt.h>

#include <algorithm>
#include <utility>

#include "cli/octet_reader.h"

namespace rnsap::cli {
namespace {

constexpr uint16_t kEtherTypeIpv4 = 0x0800;
constexpr uint16_t kEtherTypeIpv6 = 0x86dd;
constexpr uint16_t kEtherTypeVlan = 0x8100;
constexpr uint16_t kEtherTypeQinQ = 0x88a8;
constexpr uint8_t kIpProtocolSctp = 132;
constexpr uint8_t kIpv6Fragment = 44;
constexpr uint8_t kSctpDataChunk = 0, kSctpInitAck = 2;
constexpr size_t kMaxRelations = 4096;
constexpr uint16_t kM3uaProtocolData = 0x0210;
constexpr uint8_t kServiceIndicatorSccp = 3;

std::string Number(size_t value) { return std::to_string(value); }

// Chunks and M3UA parameters are padded to a multiple of four octets; the
// padding of the last one may be missing.
void SkipPadding(OctetReader& reader, size_t length) {
  reader.Skip(std::min((4 - length % 4) % 4, reader.left()));
}

// OPC, DPC, then SI, NI, MP and SLS in front of the user data.
std::optional<RoutedSccp> SccpInProtocolData(std::span<const uint8_t> value) {
  OctetReader data(value, "M3UA Protocol Data");
  RoutedSccp routed;
  routed.opc = data.U32();
  routed.dpc = data.U32();
  const uint8_t serviceIndicator = data.U8();
  data.Skip(3);
  routed.sccp = data.Rest();
  if (serviceIndicator != kServiceIndicatorSccp) return std::nullopt;
  return routed;
}

// The BSD loopback header: the address family in the sender's byte order.
bool LoopbackIp(uint32_t family) {
  constexpr uint32_t kFamilies[] = {2, 24, 28, 30};  // AF_INET, the BSDs' AF_INET6
  for (const uint32_t known : kFamilies) {
    if (family == known || family == __builtin_bswap32(known)) return true;
  }
  return false;
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

std::optional<RoutedSccp> SccpInM3ua(std::span<const uint8_t> m3ua) {
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

// The ITU routing label, least significant octet first: DPC and OPC of 14
// bits each, then the SLS.
std::optional<RoutedSccp> SccpInMtp3(std::span<const uint8_t> mtp3) {
  OctetReader unit(mtp3, "MTP3");
  const uint8_t serviceIndicator = unit.U8() & 0x0f;
  if (serviceIndicator != kServiceIndicatorSccp) return std::nullopt;
  const auto octets = unit.Take(4);
  const uint32_t label = octets[0] | octets[1] << 8 | octets[2] << 16 | octets[3] << 24;
  return RoutedSccp{unit.Rest(), label >> 14 & 0x3fff, label & 0x3fff};
}

FrameDissector::FrameDissector(CaptureCounts& counts, const RnsapCarriers& carriers)
    : counts_(counts), carriers_(carriers), ip_(counts), sctp_(counts), sccp_(counts, carriers) {}

bool FrameDissector::Reads(int linkType) {
  constexpr int kRead[] = {DLT_EN10MB, DLT_LINUX_SLL, DLT_LINUX_SLL2, DLT_RAW,  DLT_IPV4,
                           DLT_IPV6,   DLT_MTP2,      DLT_MTP3,       DLT_NULL, DLT_LOOP};
  return std::find(std::begin(kRead), std::end(kRead), linkType) != std::end(kRead);
}

uint64_t FrameDissector::heldParts() {
  return ip_.heldFragments() + sctp_.heldFragments() + sccp_.heldParts();
}

void FrameDissector::Dissect(int linkType, std::span<const uint8_t> frame, bool capturedShort,
                             FrameYield& yield) {
  origin_ = {};
  capturedShort_ = capturedShort;
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
    case DLT_NULL:
    case DLT_LOOP: {
      OctetReader loopback(frame, "BSD loopback");
      if (LoopbackIp(loopback.U32())) Ip(loopback.Rest(), yield);
      return;
    }
    case DLT_MTP2: {
      const OptionalOctets mtp3 = Mtp3InMtp2(frame);
      if (mtp3) Sccp(SccpInMtp3(*mtp3), yield);
      return;
    }
    case DLT_MTP3:
      return Sccp(SccpInMtp3(frame), yield);
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

// A fragment is held until the datagram is whole; only fragments of SCTP
// datagrams are kept.
void FrameDissector::Ipv4(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader ip(packet, "IPv4");
  const size_t headerLength = (ip.U8() & 0x0f) * 4u;
  ip.Skip(1);
  const size_t totalLength = ip.U16();
  const uint16_t identification = ip.U16();
  const uint16_t fragmentField = ip.U16();
  ip.Skip(1);
  const uint8_t protocol = ip.U8();
  const bool more = fragmentField & 0x2000;
  const size_t offset = (fragmentField & 0x1fffu) * 8;
  const bool whole = !more && offset == 0;
  const size_t end = capturedShort_ && whole ? std::min(totalLength, packet.size()) : totalLength;
  if (headerLength < 20 || totalLength < headerLength || end < headerLength ||
      end > packet.size()) {
    ip.Fail("header length " + Number(headerLength) + " and total length " + Number(totalLength) +
            " do not fit its " + Number(packet.size()) + " octets");
  }
  ip.Seek(12);
  const auto addresses = ip.Take(8);
  origin_.source = {4, {}, 0};
  origin_.destination = {4, {}, 0};
  std::copy_n(addresses.begin(), 4, origin_.source.address.begin());
  std::copy_n(addresses.begin() + 4, 4, origin_.destination.address.begin());
  const auto payload = packet.subspan(headerLength, end - headerLength);
  if (whole) return Transport(protocol, payload, yield);
  if (protocol != kIpProtocolSctp) return;
  IpDatagramKey key{4, {}, identification, protocol};
  std::copy(addresses.begin(), addresses.end(), key.addresses.begin());
  std::optional<std::vector<uint8_t>> datagram = ip_.Add(key, {offset, more, payload});
  if (!datagram) {
    yield.partsHeld = true;
    return;
  }
  const std::vector<uint8_t> datagramOctets = std::move(*datagram);
  Transport(protocol, datagramOctets, yield);
}

void FrameDissector::Ipv6(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader ip(packet, "IPv6");
  ip.Skip(4);
  const uint16_t payloadLength = ip.U16();
  const uint8_t nextHeader = ip.U8();
  ip.Skip(1);
  const auto addresses = ip.Take(32);
  origin_.source = {6, {}, 0};
  origin_.destination = {6, {}, 0};
  std::copy_n(addresses.begin(), 16, origin_.source.address.begin());
  std::copy_n(addresses.begin() + 16, 16, origin_.destination.address.begin());
  const bool cutSctp = capturedShort_ && nextHeader == kIpProtocolSctp;
  Ipv6Payload(nextHeader,
              ip.Take(cutSctp ? std::min<size_t>(payloadLength, ip.left()) : payloadLength), yield);
}

// Hop-by-hop, routing and destination options headers are passed over; a
// Fragment header holds the fragment until its datagram is whole, which
// then goes on from the header that follows it.
void FrameDissector::Ipv6Payload(uint8_t nextHeader, std::span<const uint8_t> payload,
                                 FrameYield& yield) {
  OctetReader headers(payload, "IPv6 extension header");
  while (nextHeader == 0 || nextHeader == 43 || nextHeader == 60) {
    nextHeader = headers.U8();
    headers.Skip((headers.U8() + 1u) * 8 - 2);
  }
  if (nextHeader != kIpv6Fragment) return Transport(nextHeader, headers.Rest(), yield);
  OctetReader fragment(headers.Take(8), "IPv6 Fragment header");
  const uint8_t fragmentNext = fragment.U8();
  fragment.Skip(1);
  const uint16_t offsetField = fragment.U16();
  IpDatagramKey key{6, {}, fragment.U32(), fragmentNext};
  std::copy_n(origin_.source.address.begin(), 16, key.addresses.begin());
  std::copy_n(origin_.destination.address.begin(), 16, key.addresses.begin() + 16);
  std::optional<std::vector<uint8_t>> datagram =
      ip_.Add(key, {offsetField & 0xfff8u, (offsetField & 1) != 0, headers.Rest()});
  if (!datagram) {
    yield.partsHeld = true;
    return;
  }
  const std::vector<uint8_t> whole = std::move(*datagram);
  Ipv6Payload(fragmentNext, whole, yield);
}

void FrameDissector::Transport(uint8_t protocol, std::span<const uint8_t> payload,
                               FrameYield& yield) {
  if (protocol == kIpProtocolSctp) Sctp(payload, yield);
}

void FrameDissector::Sctp(std::span<const uint8_t> packet, FrameYield& yield) {
  OctetReader sctp(packet, "SCTP");
  SctpDirection direction;
  direction.sourcePort = sctp.U16();
  direction.destinationPort = sctp.U16();
  direction.verificationTag = sctp.U32();
  sctp.Skip(4);  // checksum
  origin_.source.port = direction.sourcePort;
  origin_.destination.port = direction.destinationPort;
  const size_t addressSize = origin_.source.ipVersion == 4 ? 4 : 16;
  std::string addresses(origin_.source.address.begin(),
                        origin_.source.address.begin() + addressSize);
  addresses.append(origin_.destination.address.begin(),
                   origin_.destination.address.begin() + addressSize);
  origin_.association = sctp_.Association(direction, addresses);
  while (sctp.left() > 0) {
    const size_t start = sctp.offset();
    sctp.Skip(2);  // type, flags
    const uint16_t length = sctp.U16();
    if (length < 4) sctp.Fail("chunk length " + Number(length) + " below 4");
    sctp.Seek(start);
    const auto chunk = sctp.Take(length);
    SkipPadding(sctp, length);
    if (chunk[0] == kSctpDataChunk) DataChunk(direction, chunk, yield);
    if (chunk[0] == kSctpInitAck) {
      OctetReader initAck(chunk, "SCTP INIT ACK chunk");
      initAck.Skip(4);
      sctp_.InitAck(direction, initAck.U32());
    }
  }
}

// The payload is M3UA by its protocol identifier, or, when that is left 0,
// by an M3UA port.
void FrameDissector::DataChunk(const SctpDirection& direction, std::span<const uint8_t> chunk,
                               FrameYield& yield) {
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
  if (!carriers_.IsM3ua(parsed.payloadProtocol, direction.sourcePort, direction.destinationPort))
    return;
  const uint64_t duplicates = counts_.duplicates;
  const std::optional<std::vector<uint8_t>> message = sctp_.Add(direction, parsed);
  if (!message) {
    yield.partsHeld |= counts_.duplicates == duplicates;
    return;
  }
  Sccp(SccpInM3ua(*message), yield);
}

// A relation is numbered by its pair of point codes, in either direction,
// and its association.
uint32_t FrameDissector::Relation(uint32_t opc, uint32_t dpc) {
  const RelationKey key{std::min(opc, dpc), std::max(opc, dpc), origin_.association};
  if (const uint32_t* known = relations_.Use(key)) return *known;
  if (relations_.size() >= kMaxRelations) relations_.TakeOldest();
  return relations_.Emplace(key) = ++relationCount_;
}

void FrameDissector::Sccp(const std::optional<RoutedSccp>& routed, FrameYield& yield) {
  if (!routed) return;
  const std::optional<SccpMessage> message = ReadSccp(routed->sccp);
  if (!message) return;
  origin_.hasPointCodes = true;
  origin_.opc = routed->opc;
  origin_.dpc = routed->dpc;
  origin_.relation = Relation(routed->opc, routed->dpc);
  origin_.sccpKind = message->kind;
  bool held = false;
  std::optional<RnsapDelivery> rnsap =
      sccp_.Add({origin_.relation, routed->opc, routed->dpc}, *message, held);
  yield.partsHeld |= held;
  if (!rnsap) return;
  origin_.connection = rnsap->connection;
  yield.messages.push_back({origin_, std::move(rnsap->octets)});
}

}  // namespace rnsap::cli
