// What a host does before it runs a pass: the one-time set-up of the field
// record and the per-message set-up of the decode state, and an owner for all
// the host-side memory of a decode that tests and the command-line host share.
#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "contract/decode_state.h"

namespace rnsap::host {

// Loads a message into `state`: copies its (totalBits + 7) / 8 bytes from
// `source` to `buffer`, rewinds position and the position stack to bit 1 and
// clears flags and the per-read words. `buffer`, `stackBase` and `ruleName`
// must already be allocated.
void InitDecodeState(DecodeState* state, const uint8_t* source, uint32_t totalBits);

// Allocates the label and value text buffers and the first 200 segments of
// `record` through pu_Malloc and resets it. Returns 1, or 0 if any allocation
// failed; the pointers that did get memory are kept for the caller to free.
uint32_t AllocFieldRecord(FieldRecord* record);

// First sizes of the growable arrays; every one at least 1.
struct HostDecodeCapacities {
  uint32_t positionStack = 64;
  uint32_t layerTable = 4;
  uint32_t layerRows = 4;
};

// Owns the DecodeState of a host and everything it points to, and the two
// requests of the passes. The arrays the module grows through pu_Realloc
// and the layer rows that pu_CreateNewLayerInfo grows are heap blocks that
// are freed here; the requests always point at the current ones.
class HostDecodeContext {
 public:
  // Size of the key buffer: the whole 16-bit range of keyOffset, where the key
  // layout and the key octets lie, plus the most one key of any keyLimit
  // clears behind the last offset, so that no key write can pass the end.
  static constexpr uint32_t kKeyBufferSize = 0x10000 + UINT16_MAX;
  static constexpr uint16_t kDefaultKeyLimit = 64;

  explicit HostDecodeContext(const HostDecodeCapacities& capacities = {});
  ~HostDecodeContext();
  HostDecodeContext(const HostDecodeContext&) = delete;
  HostDecodeContext& operator=(const HostDecodeContext&) = delete;

  // False when an allocation of the set-up failed; no pass may run then.
  bool ready() const { return ready_; }

  // Takes a copy of `message` as the captured source and rewinds to it.
  // totalBits may not exceed the bits of `message`.
  void LoadMessage(std::span<const uint8_t> message, uint32_t totalBits);
  void LoadMessage(std::span<const uint8_t> message);
  // Starts the loaded message afresh, as before every pass but a further-layer
  // one: arrays that a failed pass dropped allocated anew, InitDecodeState, layer rows and text
  // records from 0, verdict 0, an empty key buffer with keys going right behind the key layout.
  void Rewind();

  DecodeState& state() { return state_; }
  DecodeRequest& decode_request() { return decodeRequest_; }
  KeyFieldRequest& key_request() { return keyRequest_; }
  std::span<const uint8_t> key_buffer() const { return keyBuffer_; }
  // The LayerBoundary rows that passes have closed since the last rewind.
  std::span<const LayerBoundary> closed_layer_rows() const;

 private:
  void AllocateArrays();
  bool ReplaceDroppedArrays();
  void WireRequests();
  void FreeArrays();

  HostDecodeCapacities capacities_;
  DecodeState state_{};
  DecodeRequest decodeRequest_{};
  KeyFieldRequest keyRequest_{};
  std::vector<uint8_t> source_;
  std::vector<uint8_t> buffer_;
  std::unique_ptr<char[]> ruleName_;
  std::vector<TextRecord> textRecords_;
  std::vector<uint8_t> keyBuffer_;
  uint32_t totalBits_ = 0;
  bool ready_ = false;
};

}  // namespace rnsap::host
