// Test support: packet captures written here, layer by layer, in the pcap
// and pcapng file formats, to feed the capture reader of rnsap-decode.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace rnsap::testing {

using Octets = std::vector<uint8_t>;

// ----------------------------------------------------------------- layers

enum class Unitdata { kUdt, kXudt, kLudt };

struct CalledParty {
  uint8_t subsystem = 143;
  bool pointCodeAndGlobalTitle = false;  // else the subsystem number alone
};

Octets Sccp(Unitdata type, const CalledParty& called, const Octets& data);
// M3UA DATA with a Protocol Data parameter of service indicator `si`.
Octets M3uaData(const Octets& userData, uint8_t si = 3);
// SIO (national network, service indicator `si`) and an ITU routing label.
Octets Mtp3(const Octets& userData, uint8_t si = 3);
// A signal unit with BSN, FSN and the length indicator.
Octets Mtp2(const Octets& mtp3);

struct DataChunk {
  static constexpr uint8_t kWhole = 0x03, kFirst = 0x02, kMiddle = 0x00, kLast = 0x01;
  uint32_t tsn = 1;
  uint16_t stream = 1;
  uint16_t sequence = 0;
  uint8_t flags = kWhole;
  uint32_t payloadProtocol = 3;
  Octets data;
};
Octets Chunk(const DataChunk& chunk);
// An SCTP packet of the given (padded) chunks.
Octets Sctp(const std::vector<Octets>& chunks, uint16_t sourcePort = 2905,
            uint16_t destinationPort = 2905);

Octets Ipv4(const Octets& payload, uint8_t sourceHost = 1);
Octets Ipv6(const Octets& payload);

inline constexpr uint16_t kIpv4 = 0x0800, kIpv6 = 0x86dd, kArp = 0x0806;
Octets Ethernet(uint16_t etherType, const Octets& payload);
Octets LinuxCooked(uint16_t protocol, const Octets& payload);
Octets LinuxCookedV2(uint16_t protocol, const Octets& payload);

// Every layer down to Ethernet and IPv4 around one SCCP message.
Octets OverSigtran(const Octets& sccp, uint32_t tsn = 1);

// ------------------------------------------------------------------ files

enum LinkType : uint16_t {
  kEthernet = 1,
  kRawIp = 101,
  kLinuxCooked = 113,
  kMtp2 = 140,
  kMtp3 = 141,
  kLinuxCookedV2 = 276,
};

struct Frame {
  Octets octets;
  uint32_t originalLength = 0;  // on the wire, if more than captured
};

// Frame i (from 0) is stamped kFirstSecond + i seconds and i milliseconds.
inline constexpr uint32_t kFirstSecond = 1700000000;

std::string Pcap(LinkType linkType, const std::vector<Frame>& frames);
std::string Pcapng(LinkType linkType, const std::vector<Frame>& frames);
void WriteFile(const std::string& path, const std::string& content);

// The capture shipped in samples/: the sample messages in several framings
// and a frame to skip.
std::string SampleCapture(const std::vector<Octets>& messages);

}  // namespace rnsap::testing
