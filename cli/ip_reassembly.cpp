#include "cli/ip_reassembly.h"

namespace rnsap::cli {
namespace {

constexpr size_t kMaxDatagrams = 1024;
constexpr size_t kMaxOctets = 4 << 20;

}  // namespace

IpReassembler::IpReassembler(CaptureCounts& counts)
    : counts_(counts), datagrams_(kMaxDatagrams, kMaxOctets, counts.evicted) {}

bool IpReassembler::Overlaps(const Datagram& datagram, const IpFragment& fragment) {
  const size_t end = fragment.offset + fragment.data.size();
  const auto after = datagram.fragments.lower_bound(fragment.offset);
  if (after != datagram.fragments.end() && after->first < end) return true;
  if (after == datagram.fragments.begin()) return false;
  const auto& [offset, data] = *std::prev(after);
  return offset + data.size() > fragment.offset;
}

// Whole when the fragments, which do not overlap, cover the payload from 0
// to the end of the last one.
std::optional<std::vector<uint8_t>> IpReassembler::Add(const IpDatagramKey& key,
                                                       const IpFragment& fragment) {
  Datagram& datagram = datagrams_.Make(key);
  const size_t end = fragment.offset + fragment.data.size();
  if (Overlaps(datagram, fragment) || (datagram.length && end > *datagram.length) ||
      (!fragment.more && datagram.length)) {
    ++counts_.duplicates;
    return std::nullopt;
  }
  if (!fragment.more) datagram.length = end;
  datagram.fragments.emplace(fragment.offset,
                             std::vector<uint8_t>(fragment.data.begin(), fragment.data.end()));
  if (!datagrams_.Grow(key, datagram, fragment.data.size())) return std::nullopt;
  if (!datagram.length || datagram.octets != *datagram.length ||
      datagram.fragments.rbegin()->first + datagram.fragments.rbegin()->second.size() !=
          *datagram.length) {
    return std::nullopt;
  }
  std::vector<uint8_t> payload;
  for (const auto& [offset, data] : datagrams_.Take(key).fragments)
    payload.insert(payload.end(), data.begin(), data.end());
  return payload;
}

}  // namespace rnsap::cli
