#include "cli/sctp_reassembly.h"

namespace rnsap::cli {

std::optional<SctpUserMessage> SctpReassembler::Add(const std::string& direction,
                                                    const SctpDataChunk& chunk) {
  constexpr uint8_t kWhole = SctpDataChunk::kBeginning | SctpDataChunk::kEnding;
  if ((chunk.flags & kWhole) == kWhole) {
    return SctpUserMessage{chunk.payloadProtocol, {chunk.data.begin(), chunk.data.end()}};
  }
  Fragments& held = held_[direction];
  held[chunk.tsn] = {chunk.stream, chunk.sequence, chunk.flags, chunk.payloadProtocol,
                     std::vector<uint8_t>(chunk.data.begin(), chunk.data.end())};
  const std::optional<uint32_t> first = FirstTsn(held, chunk.tsn);
  const std::optional<uint32_t> last = LastTsn(held, chunk.tsn);
  if (!first || !last) return std::nullopt;
  return Join(held, *first, *last);
}

size_t SctpReassembler::heldFragments() const {
  size_t count = 0;
  for (const auto& [direction, fragments] : held_) count += fragments.size();
  return count;
}

// Fragments of one message share the stream and, unless unordered, the
// stream sequence number.
bool SctpReassembler::SameMessage(const Fragment& a, const Fragment& b) {
  const bool unordered = a.flags & b.flags & SctpDataChunk::kUnordered;
  return a.stream == b.stream && (unordered || a.sequence == b.sequence);
}

// Walks back from `tsn` to the message's first fragment; TSNs wrap around.
std::optional<uint32_t> SctpReassembler::FirstTsn(const Fragments& held, uint32_t tsn) {
  for (auto at = held.find(tsn); !(at->second.flags & SctpDataChunk::kBeginning);) {
    const auto before = held.find(tsn - 1);
    if (before == held.end() || before->second.flags & SctpDataChunk::kEnding ||
        !SameMessage(before->second, at->second)) {
      return std::nullopt;
    }
    at = before;
    --tsn;
  }
  return tsn;
}

std::optional<uint32_t> SctpReassembler::LastTsn(const Fragments& held, uint32_t tsn) {
  for (auto at = held.find(tsn); !(at->second.flags & SctpDataChunk::kEnding);) {
    const auto after = held.find(tsn + 1);
    if (after == held.end() || after->second.flags & SctpDataChunk::kBeginning ||
        !SameMessage(after->second, at->second)) {
      return std::nullopt;
    }
    at = after;
    ++tsn;
  }
  return tsn;
}

SctpUserMessage SctpReassembler::Join(Fragments& held, uint32_t first, uint32_t last) {
  SctpUserMessage message{held.at(first).payloadProtocol, {}};
  for (uint32_t tsn = first;; ++tsn) {
    const auto fragment = held.find(tsn);
    message.data.insert(message.data.end(), fragment->second.data.begin(),
                        fragment->second.data.end());
    held.erase(fragment);
    if (tsn == last) return message;
  }
}

}  // namespace rnsap::cli
