// A map whose entries keep the order they were last used in, so that the
// state a capture reader holds can be capped by evicting the oldest entry.
#pragma once

#include <cstdint>
#include <iterator>
#include <map>
#include <utility>

namespace rnsap::cli {

template <typename Key, typename Value>
class AgedMap {
 public:
  // The entry of `key`, made the youngest; nullptr if there is none.
  Value* Use(const Key& key) {
    const auto found = entries_.find(key);
    if (found == entries_.end()) return nullptr;
    Rejuvenate(found);
    return &found->second.value;
  }

  // The entry of `key`, made (empty) if there is none, and the youngest.
  Value& Emplace(const Key& key) {
    auto [at, made] = entries_.try_emplace(key);
    if (made) {
      at->second.age = byAge_.emplace(nextAge_++, at).first;
    } else {
      Rejuvenate(at);
    }
    return at->second.value;
  }

  void Erase(const Key& key) {
    const auto found = entries_.find(key);
    if (found == entries_.end()) return;
    byAge_.erase(found->second.age);
    entries_.erase(found);
  }

  // The oldest entry taken out; the map must not be empty.
  std::pair<Key, Value> TakeOldest() {
    const auto oldest = byAge_.begin()->second;
    std::pair<Key, Value> taken(oldest->first, std::move(oldest->second.value));
    byAge_.erase(byAge_.begin());
    entries_.erase(oldest);
    return taken;
  }

  size_t size() const { return entries_.size(); }
  bool empty() const { return entries_.empty(); }

  // Visits the entries oldest first; `visit` returns false to stop.
  template <typename Visit>
  void OldestFirst(Visit visit) {
    for (auto& [age, entry] : byAge_)
      if (!visit(entry->first, entry->second.value)) return;
  }

 private:
  struct Entry;
  using Entries = std::map<Key, Entry>;
  struct Entry {
    Value value{};
    typename std::map<uint64_t, typename Entries::iterator>::iterator age;
  };

  // Moves the entry's node in the age order: no allocation; nothing to do for
  // the youngest.
  void Rejuvenate(typename Entries::iterator at) {
    if (at->second.age->first + 1 == nextAge_) return;
    auto node = byAge_.extract(at->second.age);
    node.key() = nextAge_++;
    at->second.age = byAge_.insert(std::move(node)).position;
  }

  Entries entries_;
  std::map<uint64_t, typename Entries::iterator> byAge_;
  uint64_t nextAge_ = 0;
};

}  // namespace rnsap::cli

namespace rnsap::cli {

// Parts of messages held until the rest comes, capped in entries and
// octets: the oldest entries make room, their pieces counted as evicted.
// A Value holds `octets` and `pieces` (fragments or segments) that the
// caller adds through Grow.
template <typename Key, typename Value>
class BoundedStore {
 public:
  BoundedStore(size_t maxEntries, size_t maxOctets, uint64_t& evicted)
      : maxEntries_(maxEntries), maxOctets_(maxOctets), evicted_(evicted) {}

  Value* Find(const Key& key) { return entries_.Use(key); }

  Value& Make(const Key& key) {
    if (entries_.size() >= maxEntries_ && !entries_.Use(key)) EvictOldest();
    return entries_.Emplace(key);
  }

  // `key`'s entry, the youngest, holds `octets` more in one more piece.
  // Returns false when it alone outgrew the cap and was evicted.
  bool Grow(const Key& key, Value& value, size_t octets) {
    value.octets += octets;
    ++value.pieces;
    octets_ += octets;
    while (octets_ > maxOctets_ && entries_.size() > 1) EvictOldest();
    if (octets_ <= maxOctets_) return true;
    evicted_ += Take(key).pieces;
    return false;
  }

  // Takes the entry out whole (complete, or dropped by the caller).
  Value Take(const Key& key) {
    Value& value = *entries_.Use(key);
    Value taken = std::move(value);
    octets_ -= taken.octets;
    entries_.Erase(key);
    return taken;
  }

  // Pieces held in all entries.
  uint64_t pieces() {
    uint64_t count = 0;
    entries_.OldestFirst([&](const Key&, const Value& value) {
      count += value.pieces;
      return true;
    });
    return count;
  }

 private:
  void EvictOldest() {
    const auto [key, value] = entries_.TakeOldest();
    octets_ -= value.octets;
    evicted_ += value.pieces;
  }

  AgedMap<Key, Value> entries_;
  size_t maxEntries_, maxOctets_;
  size_t octets_ = 0;
  uint64_t& evicted_;
};

}  // namespace rnsap::cli
