// The RNSAP messages of an SCCP message stream: connections followed by
// local reference on each signalling relation, data split over DT1s (or
// DT2s) joined by their "more data" bit, and XUDT or LUDT segments joined by
// calling address and segmentation reference. Each message is given once,
// by the SCCP message that completes it.
//
// A connection is RNSAP when its CR is addressed to an RNSAP subsystem. Data of a
// connection whose CR the capture does not hold (it starts mid-call, or the
// connection was evicted) is taken as RNSAP when its relation has carried
// RNSAP and no connection to another subsystem; otherwise it is counted as
// unattributed.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "cli/aged_map.h"
#include "cli/capture_counts.h"
#include "cli/rnsap_carriers.h"
#include "cli/sccp.h"

namespace rnsap::cli {

// The signalling relation and the point codes an SCCP message went between.
struct SccpRoute {
  uint32_t relation = 0;
  uint32_t opc = 0, dpc = 0;
};

struct RnsapDelivery {
  std::vector<uint8_t> octets;
  uint64_t connection = 0;  // 0 for connectionless
};

class SccpTracker {
 public:
  SccpTracker(CaptureCounts& counts, const RnsapCarriers& carriers);

  // The RNSAP message `message` carries or completes, if any; `held` tells
  // whether it left a part of an RNSAP message held for a later one.
  std::optional<RnsapDelivery> Add(const SccpRoute& route, const SccpMessage& message, bool& held);

  // Parts held of messages not yet complete.
  uint64_t heldParts() { return pending_.pieces() + segments_.pieces(); }

 private:
  // One end of a connection: the node at a point code and its local
  // reference, which the other end's messages carry as destination.
  struct EndKey {
    uint32_t relation, pointCode, reference;
    auto operator<=>(const EndKey&) const = default;
  };
  struct Connection {
    uint64_t number = 0;
    bool rnsap = false;
  };
  struct Parts {
    std::vector<uint8_t> data;
    size_t octets = 0, pieces = 0;
    bool rnsap = false;
    uint8_t remaining = 0;  // segments still to come
  };
  struct SegmentKey {
    uint32_t relation;
    std::vector<uint8_t> calling;
    uint32_t reference;
    auto operator<=>(const SegmentKey&) const = default;
  };
  struct RelationUse {
    bool rnsap = false, otherSubsystem = false;
  };

  std::optional<RnsapDelivery> Unitdata(const SccpRoute& route, const SccpMessage& message,
                                        bool& held);
  std::optional<RnsapDelivery> Segment(const SccpRoute& route, const SccpMessage& message,
                                       bool rnsap, bool& held);
  std::optional<RnsapDelivery> Connected(const SccpRoute& route, const SccpMessage& message,
                                         bool& held);
  Connection* Known(const EndKey& key, bool hasData);
  Connection& Open(const EndKey& key, Connection connection);
  std::optional<RnsapDelivery> Data(const EndKey& key, const Connection& connection,
                                    const SccpMessage& message, bool& held);
  void NoteUse(uint32_t relation, bool rnsap);

  CaptureCounts& counts_;
  const RnsapCarriers& carriers_;
  AgedMap<EndKey, Connection> ends_;
  AgedMap<uint32_t, RelationUse> relations_;
  BoundedStore<EndKey, Parts> pending_;
  BoundedStore<SegmentKey, Parts> segments_;
  uint64_t connections_ = 0;
};

}  // namespace rnsap::cli
