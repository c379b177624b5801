#include "cli/sccp_connections.h"

namespace rnsap::cli {
namespace {

constexpr size_t kMaxConnectionEnds = 1 << 16;
constexpr size_t kMaxRelations = 1 << 12;
constexpr size_t kMaxHeldMessages = 1 << 12;
constexpr size_t kMaxHeldOctets = 4 << 20;

template <typename Key, typename Value>
void MakeRoom(AgedMap<Key, Value>& map, size_t cap, uint64_t& evicted) {
  if (map.size() < cap) return;
  map.TakeOldest();
  ++evicted;
}

}  // namespace

SccpTracker::SccpTracker(CaptureCounts& counts, const RnsapCarriers& carriers)
    : counts_(counts),
      carriers_(carriers),
      pending_(kMaxHeldMessages, kMaxHeldOctets, counts.evicted),
      segments_(kMaxHeldMessages, kMaxHeldOctets, counts.evicted) {}

std::optional<RnsapDelivery> SccpTracker::Add(const SccpRoute& route, const SccpMessage& message,
                                              bool& held) {
  held = false;
  const bool unitdata = message.kind == SccpMessageKind::kUdt ||
                        message.kind == SccpMessageKind::kXudt ||
                        message.kind == SccpMessageKind::kLudt;
  std::optional<RnsapDelivery> delivery =
      unitdata ? Unitdata(route, message, held) : Connected(route, message, held);
  return delivery;
}

std::optional<RnsapDelivery> SccpTracker::Unitdata(const SccpRoute& route,
                                                   const SccpMessage& message, bool& held) {
  const bool rnsap = carriers_.IsRnsapSubsystem(message.calledSubsystem);
  if (rnsap) NoteUse(route.relation, true);
  if (message.segmentation) return Segment(route, message, rnsap, held);
  if (!rnsap || !message.data) return std::nullopt;
  return RnsapDelivery{{message.data->begin(), message.data->end()}, 0};
}

// Segments come in order, the first telling how many follow; one out of
// place drops what was held of its message.
std::optional<RnsapDelivery> SccpTracker::Segment(const SccpRoute& route,
                                                  const SccpMessage& message, bool rnsap,
                                                  bool& held) {
  const SccpSegmentation& segmentation = *message.segmentation;
  const SegmentKey key{
      route.relation, {message.calling.begin(), message.calling.end()}, segmentation.reference};
  Parts* parts = segments_.Find(key);
  if (parts && (segmentation.first || parts->remaining != segmentation.remaining + 1)) {
    counts_.incomplete += segments_.Take(key).pieces;
    parts = nullptr;
  }
  if (!parts) {
    if (!segmentation.first) return ++counts_.incomplete, std::nullopt;
    parts = &segments_.Make(key);
    parts->rnsap = rnsap;
  }
  parts->remaining = segmentation.remaining;
  if (message.data)
    parts->data.insert(parts->data.end(), message.data->begin(), message.data->end());
  if (!segments_.Grow(key, *parts, message.data ? message.data->size() : 0)) return std::nullopt;
  held = parts->rnsap;
  if (segmentation.remaining != 0) return std::nullopt;
  Parts whole = segments_.Take(key);
  if (!whole.rnsap) return std::nullopt;
  return RnsapDelivery{std::move(whole.data), 0};
}

std::optional<RnsapDelivery> SccpTracker::Connected(const SccpRoute& route,
                                                    const SccpMessage& message, bool& held) {
  const EndKey sender{route.relation, route.opc, message.sourceReference};
  const EndKey receiver{route.relation, route.dpc, message.destinationReference};
  const bool hasData = message.data.has_value();
  switch (message.kind) {
    case SccpMessageKind::kCr: {
      const bool rnsap = carriers_.IsRnsapSubsystem(message.calledSubsystem);
      NoteUse(route.relation, rnsap);
      return Data(sender, Open(sender, {++connections_, rnsap}), message, held);
    }
    case SccpMessageKind::kCc:
      if (Connection* connection = Known(receiver, hasData)) {
        const Connection confirmed = *connection;
        return Data(receiver, Open(sender, confirmed), message, held);
      }
      return std::nullopt;
    case SccpMessageKind::kRlc:
      for (const EndKey& end : {sender, receiver}) {
        ends_.Erase(end);
        if (pending_.Find(end)) counts_.incomplete += pending_.Take(end).pieces;
      }
      return std::nullopt;
    default: {
      Connection* connection = Known(receiver, hasData);
      if (!connection) return std::nullopt;
      const Connection known = *connection;
      if (message.kind == SccpMessageKind::kCref) ends_.Erase(receiver);
      return Data(receiver, known, message, held);
    }
  }
}

// The connection whose end `key` names; a connection not met before is
// taken as RNSAP when its relation carries RNSAP connections only, if the
// message has data to attribute.
SccpTracker::Connection* SccpTracker::Known(const EndKey& key, bool hasData) {
  if (Connection* connection = ends_.Use(key)) return connection;
  if (!hasData) return nullptr;
  const RelationUse* use = relations_.Use(key.relation);
  if (!use || !use->rnsap || use->otherSubsystem) {
    ++counts_.unattributed;
    return nullptr;
  }
  return &Open(key, {++connections_, true});
}

SccpTracker::Connection& SccpTracker::Open(const EndKey& key, Connection connection) {
  MakeRoom(ends_, kMaxConnectionEnds, counts_.evicted);
  return ends_.Emplace(key) = connection;
}

// Data with "more data" set is held at the receiving end until the DT1
// without it.
std::optional<RnsapDelivery> SccpTracker::Data(const EndKey& key, const Connection& connection,
                                               const SccpMessage& message, bool& held) {
  if (!message.data || !connection.rnsap) return std::nullopt;
  const std::span<const uint8_t> data = *message.data;
  Parts* parts = pending_.Find(key);
  if (!parts && !message.moreData)
    return RnsapDelivery{{data.begin(), data.end()}, connection.number};
  if (!parts) parts = &pending_.Make(key);
  parts->data.insert(parts->data.end(), data.begin(), data.end());
  if (!pending_.Grow(key, *parts, data.size())) return std::nullopt;
  held = message.moreData;
  if (message.moreData) return std::nullopt;
  return RnsapDelivery{pending_.Take(key).data, connection.number};
}

void SccpTracker::NoteUse(uint32_t relation, bool rnsap) {
  RelationUse* use = relations_.Use(relation);
  if (!use) {
    MakeRoom(relations_, kMaxRelations, counts_.evicted);
    use = &relations_.Emplace(relation);
  }
  (rnsap ? use->rnsap : use->otherSubsystem) = true;
}

}  // namespace rnsap::cli
