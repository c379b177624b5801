// SCTP user messages put together from the DATA chunks that carry them: a
// message sent in fragments is whole when its first (B flag) to its last
// (E flag) fragment, at consecutive TSNs of one stream, have all been seen.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <vector>

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

struct SctpUserMessage {
  uint32_t payloadProtocol = 0;
  std::vector<uint8_t> data;
};

class SctpReassembler {
 public:
  // The user message `chunk` completes, or nullopt while fragments of it are
  // missing. `direction` names the association and direction the chunk was
  // sent in (addresses and ports), within which TSNs are unique.
  std::optional<SctpUserMessage> Add(const std::string& direction, const SctpDataChunk& chunk);

  // Fragments of messages not yet complete.
  size_t heldFragments() const;

 private:
  struct Fragment {
    uint16_t stream;
    uint16_t sequence;
    uint8_t flags;
    uint32_t payloadProtocol;
    std::vector<uint8_t> data;
  };
  using Fragments = std::map<uint32_t, Fragment>;  // by TSN

  static std::optional<uint32_t> FirstTsn(const Fragments& held, uint32_t tsn);
  static std::optional<uint32_t> LastTsn(const Fragments& held, uint32_t tsn);
  static bool SameMessage(const Fragment& a, const Fragment& b);
  static SctpUserMessage Join(Fragments& held, uint32_t first, uint32_t last);

  std::map<std::string, Fragments> held_;
};

}  // namespace rnsap::cli
