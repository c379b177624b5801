// IP datagrams put together from their fragments (IPv4, or the IPv6
// Fragment header), in any order. A fragment that overlaps one held is a
// retransmission and is passed over; datagrams held are capped in number
// and octets, the oldest making room.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <vector>

#include "cli/aged_map.h"
#include "cli/capture_counts.h"

namespace rnsap::cli {

// What the fragments of one datagram share.
struct IpDatagramKey {
  uint8_t version = 4;
  std::array<uint8_t, 32> addresses{};  // source then destination
  uint32_t identification = 0;
  uint8_t protocol = 0;
  auto operator<=>(const IpDatagramKey&) const = default;
};

struct IpFragment {
  size_t offset = 0;  // of its data in the datagram's payload
  bool more = false;  // more fragments follow
  std::span<const uint8_t> data;
};

class IpReassembler {
 public:
  explicit IpReassembler(CaptureCounts& counts);

  // The datagram's payload once `fragment` completes it.
  std::optional<std::vector<uint8_t>> Add(const IpDatagramKey& key, const IpFragment& fragment);

  uint64_t heldFragments() { return datagrams_.pieces(); }

 private:
  struct Datagram {
    std::map<size_t, std::vector<uint8_t>> fragments;  // by offset
    std::optional<size_t> length;                      // known from the last fragment
    size_t octets = 0, pieces = 0;
  };

  static bool Overlaps(const Datagram& datagram, const IpFragment& fragment);

  CaptureCounts& counts_;
  BoundedStore<IpDatagramKey, Datagram> datagrams_;
};

}  // namespace rnsap::cli
