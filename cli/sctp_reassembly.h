// SCTP user messages put together from the DATA chunks that carry them, per
// direction of an association: its ports and verification tag, whatever
// addresses of a multi-homed peer a chunk travels between. A message sent in
// fragments is whole when its first (B flag) to its last (E flag) fragment,
// at consecutive TSNs of one stream, have all been seen; a chunk whose TSN
// was seen already is a retransmission and is passed over. Held fragments
// are capped per direction and in all; the oldest make room.
#pragma once

#include <bitset>
#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "cli/aged_map.h"
#include "cli/capture_counts.h"

namespace rnsap::cli {

struct SctpDataChunk {
  static constexpr uint8_t kEnding = 0x01, kBeginning = 0x02, kUnordered = 0x04;

  uint32_t tsn = 0;
  uint16_t stream = 0;
  uint16_t sequence = 0;  // the stream sequence number of an ordered message
  uint32_t payloadProtocol = 0;
  uint8_t flags = 0;
  std::span<const uint8_t> data;
};

// One direction of an association, as its packets name it.
struct SctpDirection {
  uint16_t sourcePort = 0, destinationPort = 0;
  uint32_t verificationTag = 0;
  auto operator<=>(const SctpDirection&) const = default;
};

class SctpReassembler {
 public:
  explicit SctpReassembler(CaptureCounts& counts) : counts_(counts) {}

  // The association `direction` belongs to, numbered from 1 as met. The two
  // directions are paired by the INIT ACK that names the other's tag, or
  // else by the first packet sent back between the same addresses and ports.
  uint32_t Association(const SctpDirection& direction, const std::string& addresses);

  // An INIT ACK sent in `direction`: the peer sends with `initiateTag`.
  void InitAck(const SctpDirection& direction, uint32_t initiateTag);

  // The user message `chunk` completes, or nullopt while fragments of it are
  // missing or when it was seen before.
  std::optional<std::vector<uint8_t>> Add(const SctpDirection& direction,
                                          const SctpDataChunk& chunk);

  // Fragments of messages not yet complete.
  uint64_t heldFragments() const { return heldFragments_; }

 private:
  static constexpr size_t kSeenWindow = 4096;
  struct Fragment {
    uint16_t stream;
    uint16_t sequence;
    uint8_t flags;
    std::vector<uint8_t> data;
  };
  // TSNs are extended to 64 bits from the highest one seen, so that they do
  // not wrap around. A run is a sequence of fragments at consecutive TSNs
  // that may belong to one message.
  struct State {
    uint32_t association = 0;
    uint64_t highest = 0;  // 0 before the first chunk
    std::bitset<kSeenWindow> seen;
    std::map<uint64_t, Fragment> fragments;
    std::map<uint64_t, uint64_t> runEndByStart, runStartByEnd;
    size_t octets = 0;
  };

  State& StateOf(const SctpDirection& direction);
  static uint64_t Extended(State& state, uint32_t tsn);
  static bool SeenBefore(State& state, uint64_t tsn);
  std::optional<std::vector<uint8_t>> Hold(State& state, uint64_t tsn, const SctpDataChunk& chunk);
  static bool Joins(const Fragment& before, const Fragment& after);
  std::vector<uint8_t> Take(State& state, uint64_t start, uint64_t end, bool evicted);
  void MakeRoom(State& growing);

  CaptureCounts& counts_;
  AgedMap<SctpDirection, State> states_;
  std::map<std::string, uint32_t> unpaired_;  // by the addresses and ports a reply would carry
  uint32_t associations_ = 0;
  uint64_t heldFragments_ = 0;
  size_t heldOctets_ = 0;
};

}  // namespace rnsap::cli
