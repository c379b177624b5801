#include "tests/cli/capture_writer.h"

#include <fstream>

namespace rnsap::testing {
namespace {

void Put16(Octets& out, uint32_t value) {
  out.insert(out.end(), {static_cast<uint8_t>(value >> 8), static_cast<uint8_t>(value)});
}
void Put32(Octets& out, uint32_t value) {
  Put16(out, value >> 16);
  Put16(out, value & 0xffff);
}
void Put16Le(Octets& out, uint32_t value) {
  out.insert(out.end(), {static_cast<uint8_t>(value), static_cast<uint8_t>(value >> 8)});
}
void Put32Le(Octets& out, uint32_t value) {
  Put16Le(out, value & 0xffff);
  Put16Le(out, value >> 16);
}
Octets& Append(Octets& out, const Octets& part) {
  out.insert(out.end(), part.begin(), part.end());
  return out;
}
void Pad(Octets& out) { out.resize((out.size() + 3) / 4 * 4, 0); }

// A called party address: the address indicator, the point code and global
// title if present, the subsystem number.
Octets CalledAddress(const CalledParty& called) {
  if (!called.pointCodeAndGlobalTitle) return {0x42, called.subsystem};  // route on SSN
  // Point code 1234, then global title 4: translation type, numbering plan
  // and encoding, nature of address, digits.
  return {0x13, 0xd2, 0x04, called.subsystem, 0x00, 0x12, 0x04, 0x21, 0x43};
}

}  // namespace

// Pointers count from their own first octet; LUDT has two-octet pointers
// and data length, least significant octet first.
Octets Sccp(Unitdata type, const CalledParty& called, const Octets& data) {
  const bool ludt = type == Unitdata::kLudt;
  const size_t pointerSize = ludt ? 2 : 1;
  const size_t pointers = type == Unitdata::kUdt ? 3 : 4;
  Octets out{type == Unitdata::kUdt ? uint8_t{0x09} : ludt ? uint8_t{0x13} : uint8_t{0x11}, 0x00};
  if (type != Unitdata::kUdt) out.push_back(0x0f);  // hop counter
  const size_t firstPointer = out.size();
  out.resize(firstPointer + pointers * pointerSize, 0);
  const Octets calling{0x43, 0x2c, 0x01, 143};
  const Octets parts[] = {CalledAddress(called), calling, data};
  for (size_t part = 0; part < 3; ++part) {
    const size_t pointerAt = firstPointer + part * pointerSize;
    const size_t pointer = out.size() - pointerAt;
    out[pointerAt] = static_cast<uint8_t>(pointer);
    if (ludt) out[pointerAt + 1] = static_cast<uint8_t>(pointer >> 8);
    if (part == 2 && ludt) {
      Put16Le(out, static_cast<uint32_t>(parts[part].size()));
    } else {
      out.push_back(static_cast<uint8_t>(parts[part].size()));
    }
    Append(out, parts[part]);
  }
  return out;
}

Octets M3uaData(const Octets& userData, uint8_t si) {
  Octets parameter;
  Put16(parameter, 0x0210);
  Put16(parameter, static_cast<uint32_t>(16 + userData.size()));
  Put32(parameter, 1001);  // OPC
  Put32(parameter, 1002);  // DPC
  parameter.insert(parameter.end(), {si, 2, 0, 5});
  Append(parameter, userData);
  Pad(parameter);
  Octets out{1, 0, 1, 1};
  Put32(out, static_cast<uint32_t>(8 + parameter.size()));
  return Append(out, parameter);
}

Octets Mtp3(const Octets& userData, uint8_t si) {
  Octets out{static_cast<uint8_t>(0x80 | si)};
  Put32Le(out, 1002 | 1001u << 14 | 5u << 28);  // DPC, OPC, SLS
  return Append(out, userData);
}

Octets Mtp2(const Octets& mtp3) {
  Octets out{0x81, 0x82, static_cast<uint8_t>(std::min<size_t>(mtp3.size(), 63))};
  return Append(out, mtp3);
}

Octets Chunk(const DataChunk& chunk) {
  Octets out{0, chunk.flags};
  Put16(out, static_cast<uint32_t>(16 + chunk.data.size()));
  Put32(out, chunk.tsn);
  Put16(out, chunk.stream);
  Put16(out, chunk.sequence);
  Put32(out, chunk.payloadProtocol);
  return Append(out, chunk.data);
}

Octets Sctp(const std::vector<Octets>& chunks, uint16_t sourcePort, uint16_t destinationPort) {
  Octets out;
  Put16(out, sourcePort);
  Put16(out, destinationPort);
  Put32(out, 0x01020304);  // verification tag
  Put32(out, 0);           // checksum, not checked
  for (const Octets& chunk : chunks) Pad(Append(out, chunk));
  return out;
}

Octets Ipv4(const Octets& payload, uint8_t sourceHost) {
  Octets out{0x45, 0};
  Put16(out, static_cast<uint32_t>(20 + payload.size()));
  out.insert(out.end(), {0, 1, 0x40, 0, 64, 132, 0, 0, 10, 0, 0, sourceHost, 10, 0, 0, 2});
  return Append(out, payload);
}

Octets Ipv6(const Octets& payload) {
  Octets out{0x60, 0, 0, 0};
  Put16(out, static_cast<uint32_t>(payload.size()));
  out.insert(out.end(), {132, 64});
  for (const uint8_t host : {1, 2}) {
    out.insert(out.end(), {0x20, 0x01, 0x0d, 0xb8});
    out.resize(out.size() + 11, 0);
    out.push_back(host);
  }
  return Append(out, payload);
}

Octets Ethernet(uint16_t etherType, const Octets& payload) {
  Octets out{0x02, 0, 0, 0, 0, 2, 0x02, 0, 0, 0, 0, 1};
  Put16(out, etherType);
  return Append(out, payload);
}

Octets LinuxCooked(uint16_t protocol, const Octets& payload) {
  Octets out{0, 0, 0, 1, 0, 6, 0x02, 0, 0, 0, 0, 1, 0, 0};  // to us, Ethernet address
  Put16(out, protocol);
  return Append(out, payload);
}

Octets LinuxCookedV2(uint16_t protocol, const Octets& payload) {
  Octets out;
  Put16(out, protocol);
  out.insert(out.end(), {0, 0, 0, 0, 0, 3, 0, 1, 0, 6, 0x02, 0, 0, 0, 0, 1, 0, 0});
  return Append(out, payload);
}

Octets OverSigtran(const Octets& sccp, uint32_t tsn) {
  return Ethernet(kIpv4, Ipv4(Sctp({Chunk({.tsn = tsn, .data = M3uaData(sccp)})})));
}

// ------------------------------------------------------------------ files

namespace {

std::string Text(const Octets& octets) { return {octets.begin(), octets.end()}; }

uint32_t Microseconds(size_t index) { return static_cast<uint32_t>(index % 1000 * 1000); }
uint32_t Seconds(size_t index) { return kFirstSecond + static_cast<uint32_t>(index); }
uint32_t OnTheWire(const Frame& frame) {
  return std::max(frame.originalLength, static_cast<uint32_t>(frame.octets.size()));
}

// pcapng blocks: type, total length, body, total length again.
Octets Block(uint32_t type, Octets body) {
  Pad(body);
  Octets out;
  const auto length = static_cast<uint32_t>(12 + body.size());
  Put32Le(out, type);
  Put32Le(out, length);
  Append(out, body);
  Put32Le(out, length);
  return out;
}

}  // namespace

std::string Pcap(LinkType linkType, const std::vector<Frame>& frames) {
  Octets out;
  Put32Le(out, 0xa1b2c3d4);  // microsecond time stamps
  Put16Le(out, 2);
  Put16Le(out, 4);
  Put32Le(out, 0);  // time zone
  Put32Le(out, 0);  // accuracy
  Put32Le(out, 65535);
  Put32Le(out, linkType);
  for (size_t index = 0; index < frames.size(); ++index) {
    Put32Le(out, Seconds(index));
    Put32Le(out, Microseconds(index));
    Put32Le(out, static_cast<uint32_t>(frames[index].octets.size()));
    Put32Le(out, OnTheWire(frames[index]));
    Append(out, frames[index].octets);
  }
  return Text(out);
}

std::string Pcapng(LinkType linkType, const std::vector<Frame>& frames) {
  Octets header;
  Put32Le(header, 0x1a2b3c4d);  // byte-order magic
  Put16Le(header, 1);
  Put16Le(header, 0);
  Put32Le(header, 0xffffffff);  // section length unknown
  Put32Le(header, 0xffffffff);
  Octets interface;
  Put16Le(interface, linkType);
  Put16Le(interface, 0);
  Put32Le(interface, 65535);  // no options: microsecond time stamps
  Octets out = Block(0x0a0d0d0a, header);
  Append(out, Block(1, interface));
  for (size_t index = 0; index < frames.size(); ++index) {
    const uint64_t stamp = uint64_t{Seconds(index)} * 1000000 + Microseconds(index);
    Octets packet;
    Put32Le(packet, 0);  // interface
    Put32Le(packet, static_cast<uint32_t>(stamp >> 32));
    Put32Le(packet, static_cast<uint32_t>(stamp));
    Put32Le(packet, static_cast<uint32_t>(frames[index].octets.size()));
    Put32Le(packet, OnTheWire(frames[index]));
    Append(out, Block(6, Append(packet, frames[index].octets)));
  }
  return Text(out);
}

void WriteFile(const std::string& path, const std::string& content) {
  std::ofstream(path, std::ios::binary) << content;
}

// Ethernet throughout: M3UA over SCTP over IPv4 and IPv6, UDT, XUDT and
// LUDT, two messages bundled in one packet, one sent in two fragments, and
// one to subsystem 142 that is skipped.
std::string SampleCapture(const std::vector<Octets>& messages) {
  const auto m3ua = [](Unitdata type, const Octets& message, uint8_t subsystem = 143) {
    return M3uaData(Sccp(type, {subsystem, type != Unitdata::kUdt}, message));
  };
  const auto overIpv4 = [](const std::vector<Octets>& chunks) {
    return Frame{Ethernet(kIpv4, Ipv4(Sctp(chunks)))};
  };
  const Octets fragmented = m3ua(Unitdata::kUdt, messages.at(4));
  const size_t half = fragmented.size() / 2;
  std::vector<Frame> frames{
      overIpv4({Chunk({.tsn = 1, .data = m3ua(Unitdata::kUdt, messages.at(0))})}),
      {Ethernet(kIpv6, Ipv6(Sctp({Chunk({.data = m3ua(Unitdata::kXudt, messages.at(1))})})))},
      overIpv4({Chunk({.tsn = 2, .data = m3ua(Unitdata::kUdt, messages.at(2))}),
                Chunk({.tsn = 3, .sequence = 1, .data = m3ua(Unitdata::kLudt, messages.at(3))})}),
      overIpv4({Chunk({.tsn = 4,
                       .sequence = 2,
                       .flags = DataChunk::kFirst,
                       .data = Octets(fragmented.begin(), fragmented.begin() + half)})}),
      overIpv4({Chunk({.tsn = 6, .data = m3ua(Unitdata::kUdt, messages.at(5), 142)})}),
      overIpv4({Chunk({.tsn = 5,
                       .sequence = 2,
                       .flags = DataChunk::kLast,
                       .data = Octets(fragmented.begin() + half, fragmented.end())})}),
  };
  for (size_t index = 5; index < messages.size(); ++index) {
    frames.push_back(overIpv4({Chunk({.tsn = static_cast<uint32_t>(index + 2),
                                      .data = m3ua(Unitdata::kUdt, messages[index])})}));
  }
  return Pcap(kEthernet, frames);
}

}  // namespace rnsap::testing
