// Finds the RNSAP messages in captured frames: over SIGTRAN (Ethernet, Linux
// cooked capture, BSD loopback or raw IP; IPv4 or IPv6, fragmented or not;
// SCTP DATA chunks; M3UA DATA) or over classic SS7 links (MTP2, MTP3), then
// SCCP, connectionless or connection-oriented, to an RNSAP subsystem.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "cli/capture_counts.h"
#include "cli/ip_reassembly.h"
#include "cli/message_origin.h"
#include "cli/sccp_connections.h"
#include "cli/sctp_reassembly.h"

namespace rnsap::cli {

struct OriginatedMessage {
  MessageOrigin origin;
  std::vector<uint8_t> octets;
};

// What one frame gave.
struct FrameYield {
  std::vector<OriginatedMessage> messages;  // carried or completed by the frame
  bool partsHeld = false;                   // parts of messages kept for a later frame
};

// The SCCP message of an M3UA or MTP3 message and the point codes it went
// between.
struct RoutedSccp {
  std::span<const uint8_t> sccp;
  uint32_t opc = 0, dpc = 0;
};

class FrameDissector {
 public:
  // Counts of parts passed over or dropped go to `counts`; `carriers` tell
  // what carries RNSAP.
  FrameDissector(CaptureCounts& counts, const RnsapCarriers& carriers);

  // Whether frames of libpcap link type `linkType` are read.
  static bool Reads(int linkType);

  // Adds to `yield` what the frame of link type `linkType` holds. A frame cut
  // short or with lengths that do not fit throws MalformedFrame; what was
  // found in front of the fault stays in `yield`. Of a frame `capturedShort`
  // (snap length), an unfragmented IP packet is read as far as it was
  // captured, so that the SCTP chunks in front of the cut still count.
  void Dissect(int linkType, std::span<const uint8_t> frame, bool capturedShort, FrameYield& yield);

  // Parts of messages that no frame has completed yet.
  uint64_t heldParts();

 private:
  void Ethernet(std::span<const uint8_t> frame, FrameYield& yield);
  void EtherType(uint16_t type, std::span<const uint8_t> payload, FrameYield& yield);
  void Ip(std::span<const uint8_t> packet, FrameYield& yield);
  void Ipv4(std::span<const uint8_t> packet, FrameYield& yield);
  void Ipv6(std::span<const uint8_t> packet, FrameYield& yield);
  void Ipv6Payload(uint8_t nextHeader, std::span<const uint8_t> payload, FrameYield& yield);
  void Transport(uint8_t protocol, std::span<const uint8_t> payload, FrameYield& yield);
  void Sctp(std::span<const uint8_t> packet, FrameYield& yield);
  void DataChunk(const SctpDirection& direction, std::span<const uint8_t> chunk, FrameYield& yield);
  void Sccp(const std::optional<RoutedSccp>& routed, FrameYield& yield);
  uint32_t Relation(uint32_t opc, uint32_t dpc);

  struct RelationKey {
    uint32_t lowerPointCode, higherPointCode, association;
    auto operator<=>(const RelationKey&) const = default;
  };

  CaptureCounts& counts_;
  const RnsapCarriers& carriers_;
  IpReassembler ip_;
  SctpReassembler sctp_;
  SccpTracker sccp_;
  AgedMap<RelationKey, uint32_t> relations_;
  uint32_t relationCount_ = 0;
  MessageOrigin origin_;        // of the frame and message at hand
  bool capturedShort_ = false;  // the frame at hand
};

// The SCCP message an M3UA message carries: the user data of a DATA message
// whose Protocol Data names SCCP; nullopt when there is none.
std::optional<RoutedSccp> SccpInM3ua(std::span<const uint8_t> m3ua);

// The SCCP message of an MTP3 message signal unit (SIO, ITU routing label);
// nullopt when its service indicator is not SCCP.
std::optional<RoutedSccp> SccpInMtp3(std::span<const uint8_t> mtp3);

}  // namespace rnsap::cli
