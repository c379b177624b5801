#include "cli/sctp_reassembly.h"

#include <algorithm>

namespace rnsap::cli {
namespace {

constexpr size_t kMaxDirections = 1024;
constexpr size_t kMaxUnpaired = 1024;
constexpr size_t kMaxFragmentsPerDirection = 8192;
constexpr size_t kMaxOctetsPerDirection = 2 << 20;
constexpr size_t kMaxFragments = 32768;
constexpr size_t kMaxOctets = 8 << 20;

// Addresses and ports of a packet from one end to the other.
std::string PathKey(std::string_view from, std::string_view to, uint16_t fromPort,
                    uint16_t toPort) {
  std::string key = std::string(from).append(to);
  for (const uint16_t port : {fromPort, toPort}) {
    key += static_cast<char>(port >> 8);
    key += static_cast<char>(port);
  }
  return key;
}

}  // namespace

SctpReassembler::State& SctpReassembler::StateOf(const SctpDirection& direction) {
  if (State* state = states_.Use(direction)) return *state;
  if (states_.size() >= kMaxDirections) {
    State oldest = states_.TakeOldest().second;
    while (!oldest.runEndByStart.empty()) {
      const auto [start, end] = *oldest.runEndByStart.begin();
      Take(oldest, start, end, true);
    }
  }
  return states_.Emplace(direction);
}

uint32_t SctpReassembler::Association(const SctpDirection& direction,
                                      const std::string& addresses) {
  State& state = StateOf(direction);
  if (state.association != 0) return state.association;
  const std::string_view source = std::string_view(addresses).substr(0, addresses.size() / 2);
  const std::string_view destination = std::string_view(addresses).substr(source.size());
  const uint16_t sourcePort = direction.sourcePort, destinationPort = direction.destinationPort;
  if (const auto paired = unpaired_.find(PathKey(source, destination, sourcePort, destinationPort));
      paired != unpaired_.end()) {
    state.association = paired->second;
    unpaired_.erase(paired);
    return state.association;
  }
  if (unpaired_.size() >= kMaxUnpaired) unpaired_.clear();
  state.association = ++associations_;
  unpaired_[PathKey(destination, source, destinationPort, sourcePort)] = state.association;
  return state.association;
}

void SctpReassembler::InitAck(const SctpDirection& direction, uint32_t initiateTag) {
  const uint32_t association = StateOf(direction).association;
  State& peer = StateOf({direction.destinationPort, direction.sourcePort, initiateTag});
  if (peer.association == 0) peer.association = association;
}

uint64_t SctpReassembler::Extended(State& state, uint32_t tsn) {
  if (state.highest == 0) return uint64_t{1} << 32 | tsn;
  return state.highest + static_cast<int32_t>(tsn - static_cast<uint32_t>(state.highest));
}

// Remembers the last kSeenWindow TSNs below the highest; an older one cannot
// be told from a new one and is taken as new.
bool SctpReassembler::SeenBefore(State& state, uint64_t tsn) {
  if (tsn > state.highest) {
    const uint64_t from = std::max(state.highest + 1, tsn > kSeenWindow ? tsn - kSeenWindow : 0);
    for (uint64_t cleared = from; cleared < tsn; ++cleared) state.seen.reset(cleared % kSeenWindow);
    state.highest = tsn;
  } else if (state.highest - tsn >= kSeenWindow) {
    return false;
  } else if (state.seen.test(tsn % kSeenWindow)) {
    return true;
  }
  state.seen.set(tsn % kSeenWindow);
  return false;
}

std::optional<std::vector<uint8_t>> SctpReassembler::Add(const SctpDirection& direction,
                                                         const SctpDataChunk& chunk) {
  State& state = StateOf(direction);
  const uint64_t tsn = Extended(state, chunk.tsn);
  if (SeenBefore(state, tsn)) {
    ++counts_.duplicates;
    return std::nullopt;
  }
  constexpr uint8_t kWhole = SctpDataChunk::kBeginning | SctpDataChunk::kEnding;
  if ((chunk.flags & kWhole) == kWhole)
    return std::vector<uint8_t>(chunk.data.begin(), chunk.data.end());
  return Hold(state, tsn, chunk);
}

// Fragments of one message share the stream and, unless unordered, the
// stream sequence number; one ends before the next begins only at an E or B
// flag.
bool SctpReassembler::Joins(const Fragment& before, const Fragment& after) {
  const bool unordered = before.flags & after.flags & SctpDataChunk::kUnordered;
  return !(before.flags & SctpDataChunk::kEnding) && !(after.flags & SctpDataChunk::kBeginning) &&
         before.stream == after.stream && (unordered || before.sequence == after.sequence);
}

// Adds the fragment as a run of its own, joined with the runs that end just
// before and start just after it; a run from a B to an E fragment is whole.
std::optional<std::vector<uint8_t>> SctpReassembler::Hold(State& state, uint64_t tsn,
                                                          const SctpDataChunk& chunk) {
  const auto [held, made] = state.fragments.emplace(
      tsn, Fragment{chunk.stream, chunk.sequence, chunk.flags,
                    std::vector<uint8_t>(chunk.data.begin(), chunk.data.end())});
  if (!made) {
    ++counts_.duplicates;
    return std::nullopt;
  }
  const Fragment& fragment = held->second;
  state.octets += chunk.data.size();
  heldOctets_ += chunk.data.size();
  ++heldFragments_;
  uint64_t start = tsn, end = tsn;
  if (const auto before = state.runStartByEnd.find(tsn - 1);
      before != state.runStartByEnd.end() && Joins(state.fragments.at(tsn - 1), fragment)) {
    start = before->second;
    state.runStartByEnd.erase(before);
  }
  if (const auto after = state.runEndByStart.find(tsn + 1);
      after != state.runEndByStart.end() && Joins(fragment, state.fragments.at(tsn + 1))) {
    end = after->second;
    state.runEndByStart.erase(after);
  }
  state.runEndByStart[start] = end;
  state.runStartByEnd[end] = start;
  if (state.fragments.at(start).flags & SctpDataChunk::kBeginning &&
      state.fragments.at(end).flags & SctpDataChunk::kEnding) {
    return Take(state, start, end, false);
  }
  MakeRoom(state);
  return std::nullopt;
}

// The run's fragments, taken out; counted as evicted if they make room.
std::vector<uint8_t> SctpReassembler::Take(State& state, uint64_t start, uint64_t end,
                                           bool evicted) {
  std::vector<uint8_t> message;
  const auto first = state.fragments.find(start), last = state.fragments.upper_bound(end);
  for (auto at = first; at != last; ++at) {
    if (!evicted) message.insert(message.end(), at->second.data.begin(), at->second.data.end());
    state.octets -= at->second.data.size();
    heldOctets_ -= at->second.data.size();
    --heldFragments_;
    if (evicted) ++counts_.evicted;
  }
  state.fragments.erase(first, last);
  state.runEndByStart.erase(start);
  state.runStartByEnd.erase(end);
  return message;
}

// The oldest runs (lowest TSNs) of the direction go first, then those of
// the directions least recently sent in.
void SctpReassembler::MakeRoom(State& growing) {
  const auto evictOldestRun = [this](State& state) {
    const auto [start, end] = *state.runEndByStart.begin();
    Take(state, start, end, true);
  };
  while (growing.fragments.size() > kMaxFragmentsPerDirection ||
         growing.octets > kMaxOctetsPerDirection) {
    evictOldestRun(growing);
  }
  while (heldFragments_ > kMaxFragments || heldOctets_ > kMaxOctets) {
    states_.OldestFirst([&](const SctpDirection&, State& state) {
      if (state.fragments.empty()) return true;
      evictOldestRun(state);
      return false;
    });
  }
}

}  // namespace rnsap::cli
