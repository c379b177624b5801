// Finds the RNSAP messages in captured frames: over SIGTRAN (Ethernet, Linux
// cooked capture or raw IP; IPv4 or IPv6; SCTP DATA chunks; M3UA DATA) or
// over classic SS7 links (MTP2, MTP3), then SCCP unitdata to subsystem 143.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "cli/sctp_reassembly.h"

namespace rnsap::cli {

using OptionalOctets = std::optional<std::span<const uint8_t>>;

// What one frame gave.
struct FrameYield {
  std::vector<std::vector<uint8_t>> messages;  // carried or completed by the frame
  bool fragmentsHeld = false;                  // SCTP fragments kept for a later frame
};

class FrameDissector {
 public:
  // Adds to `yield` what the frame of libpcap link type `linkType` holds. A
  // frame cut short or with lengths that do not fit throws MalformedFrame;
  // what was found in front of the fault stays in `yield`.
  void Dissect(int linkType, std::span<const uint8_t> frame, FrameYield& yield);

  // SCTP fragments of messages that no frame has completed yet.
  size_t heldFragments() const { return reassembler_.heldFragments(); }

 private:
  void Ethernet(std::span<const uint8_t> frame, FrameYield& yield);
  void EtherType(uint16_t type, std::span<const uint8_t> payload, FrameYield& yield);
  void Ip(std::span<const uint8_t> packet, FrameYield& yield);
  void Ipv4(std::span<const uint8_t> packet, FrameYield& yield);
  void Ipv6(std::span<const uint8_t> packet, FrameYield& yield);
  void Sctp(std::string addresses, std::span<const uint8_t> packet, FrameYield& yield);
  void DataChunk(const std::string& direction, bool m3uaPort, std::span<const uint8_t> chunk,
                 FrameYield& yield);

  SctpReassembler reassembler_;
};

// The SCCP message an M3UA message carries: the user data of a DATA message
// whose Protocol Data names SCCP; nullopt when there is none.
OptionalOctets SccpInM3ua(std::span<const uint8_t> m3ua);

// The SCCP message of an MTP3 message signal unit (SIO, ITU routing label);
// nullopt when its service indicator is not SCCP.
OptionalOctets SccpInMtp3(std::span<const uint8_t> mtp3);

}  // namespace rnsap::cli
