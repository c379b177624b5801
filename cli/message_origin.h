// Where a message read from a capture came from: the network endpoints and
// SCTP association that carried it, the point codes of its signalling
// relation, and the SCCP message and connection it rode in.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

namespace rnsap::cli {

// An IP address and port; ipVersion 0 where the message came over an SS7
// link (MTP2, MTP3) rather than IP.
struct NetworkEndpoint {
  uint8_t ipVersion = 0;              // 0, 4 or 6
  std::array<uint8_t, 16> address{};  // IPv4 in the first 4 octets
  uint16_t port = 0;
};

enum class SccpMessageKind : uint8_t {
  kUdt,
  kXudt,
  kLudt,
  kCr,    // connection request
  kCc,    // connection confirm
  kCref,  // connection refused
  kRlsd,  // released
  kRlc,   // release complete
  kDt1,   // data form 1
  kDt2,   // data form 2
};

// "UDT", "XUDT", "LUDT", "CR", "CC", "CREF", "RLSD", "RLC", "DT1", "DT2".
std::string_view SccpMessageKindName(SccpMessageKind kind);

// The address in its usual text form ("192.0.2.1", "2001:db8::1"); empty for
// an endpoint without IP.
std::string IpAddressText(const NetworkEndpoint& endpoint);

struct MessageOrigin {
  NetworkEndpoint source, destination;  // of the frame that completed the message
  uint32_t association = 0;             // SCTP association, numbered from 1 as met; 0 without SCTP
  bool hasPointCodes = false;           // false only where no routing label was read
  uint32_t opc = 0, dpc = 0;
  SccpMessageKind sccpKind = SccpMessageKind::kUdt;
  // The SCCP connection, numbered from 1 as met in the capture, the same for
  // every message of one connection; 0 for connectionless messages.
  uint64_t connection = 0;
  // The signalling relation, numbered from 1 as met: one pair of point codes
  // (in either direction) over one association or SS7 link.
  uint32_t relation = 0;
};

}  // namespace rnsap::cli
