// Host-side set-up of a decode, done before the passes run.
#include "hostrt/setup.h"

#include <algorithm>
#include <cstdlib>
#include <stdexcept>

#include "contract/host_services.h"
#include "hostrt/host_runtime.h"

namespace rnsap::host {
namespace {

// The host's second stack, of bit limits, kept inline in the state's
// limitStack words: its only entry is the length of the message.
void StartLimitStack(DecodeState* state, uint32_t totalBits) {
  std::fill(std::begin(state->limitStack), std::end(state->limitStack), uint8_t{0});
  std::copy_n(reinterpret_cast<const uint8_t*>(&totalBits), sizeof totalBits, state->limitStack);
}

void ClearText(char* text) {
  if (text != nullptr) text[0] = '\0';
}

void ResetAllocatedFieldRecord(FieldRecord* record) {
  record->value = 0;
  record->readCount = 0;
  record->rawFlag = 0;
  ClearText(record->label);
  ClearText(record->valueText);
}

template <typename T>
T* AllocateZeroed(uint32_t count) {
  return static_cast<T*>(std::calloc(std::max(count, 1u), sizeof(T)));
}

// An array of `first` entries (at least one) where there is none.
template <typename T>
void AllocateIfMissing(T*& array, uint32_t& capacity, uint32_t first) {
  if (array != nullptr) return;
  array = AllocateZeroed<T>(first);
  capacity = array != nullptr ? std::max(first, 1u) : 0;
}

// A copy of `message` in a block of its own size, of one octet for an empty
// message: a host's message buffers are real memory even then.
std::vector<uint8_t> MessageBlock(std::span<const uint8_t> message) {
  std::vector<uint8_t> block(std::max<size_t>(message.size(), 1), 0);
  std::copy(message.begin(), message.end(), block.begin());
  return block;
}

// Where variable-length keys start: behind the largest key layout kf_OptSupport makes.
uint16_t FirstKeyOctetOffset() { return static_cast<uint16_t>(KeyLayoutSize(kMaxKeyRows)); }

}  // namespace

void InitDecodeState(DecodeState* state, const uint8_t* source, uint32_t totalBits) {
  state->source = source;
  std::copy_n(source, (totalBits + 7) / 8, state->buffer);
  state->totalBits = totalBits;
  state->bitsLeft = totalBits;
  state->position = 1;
  state->stackTop = state->stackBase;
  state->stackIndex = 0;
  *state->stackTop = 1;
  state->flags = 0;
  StartLimitStack(state, totalBits);
  state->test = 0;
  state->width = 0;
  std::fill(std::begin(state->reserved2), std::end(state->reserved2), uint8_t{0});
  std::fill(std::begin(state->reserved3), std::end(state->reserved3), uint8_t{0});
  state->ruleName[0] = '\0';
  state->layerPending = 1;
  state->layerIndex = 0;
}

uint32_t AllocFieldRecord(FieldRecord* record) {
  record->valueText = static_cast<char*>(pu_Malloc(kValueTextBufferSize));
  record->label = static_cast<char*>(pu_Malloc(kLabelBufferSize));
  record->segments =
      static_cast<BitSegment*>(pu_Malloc(kInitialSegmentCapacity * sizeof(BitSegment)));
  record->segmentCapacity = record->segments != nullptr ? kInitialSegmentCapacity : 0;
  ResetAllocatedFieldRecord(record);
  const bool allocated =
      record->valueText != nullptr && record->label != nullptr && record->segments != nullptr;
  return allocated ? 1 : 0;
}

HostDecodeContext::HostDecodeContext(const HostDecodeCapacities& capacities)
    : capacities_(capacities),
      ruleName_(std::make_unique<char[]>(kRuleNameBufferSize)),
      textRecords_(kTextRecordCount),
      keyBuffer_(kKeyBufferSize) {
  AllocateArrays();
  WireRequests();
  const bool arraysAllocated = state_.stackBase != nullptr && state_.layerTable != nullptr &&
                               decodeRequest_.layerRows != nullptr;
  ready_ = AllocFieldRecord(&state_.field) == 1 && arraysAllocated;
  if (ready_) LoadMessage({}, 0);
}

HostDecodeContext::~HostDecodeContext() { FreeArrays(); }

void HostDecodeContext::LoadMessage(std::span<const uint8_t> message, uint32_t totalBits) {
  if (totalBits > 8 * message.size()) {
    throw std::invalid_argument("message holds fewer bits than its stated length");
  }
  source_ = MessageBlock(message);
  buffer_.assign(source_.size(), 0);
  state_.buffer = buffer_.data();
  totalBits_ = totalBits;
  Rewind();
}

void HostDecodeContext::LoadMessage(std::span<const uint8_t> message) {
  LoadMessage(message, static_cast<uint32_t>(8 * message.size()));
}

void HostDecodeContext::Rewind() {
  if (ready_) ready_ = ReplaceDroppedArrays();
  if (!ready_) throw std::logic_error("decode context has no memory");
  InitDecodeState(&state_, source_.data(), totalBits_);
  decodeRequest_.verdict = 0;
  decodeRequest_.bitsLeftOut = 0;
  decodeRequest_.layerRowIndex = 0;
  decodeRequest_.textRecordIndex = 0;
  const size_t usedKeyBytes = size_t{keyRequest_.keyOffset} + keyRequest_.keyLimit;
  std::fill_n(keyBuffer_.begin(), std::min(keyBuffer_.size(), usedKeyBytes), uint8_t{0});
  keyRequest_.keyOffset = FirstKeyOctetOffset();
  keyRequest_.bitsLeftOut = 0;
}

std::span<const LayerBoundary> HostDecodeContext::closed_layer_rows() const {
  const uint32_t rows = std::min(decodeRequest_.layerRowIndex, decodeRequest_.layerRowLimit + 1);
  return {decodeRequest_.layerRows, rows};
}

void HostDecodeContext::AllocateArrays() {
  state_.ruleName = ruleName_.get();
  state_.ruleName[0] = '\0';
  AllocateIfMissing(state_.stackBase, state_.stackCapacity, capacities_.positionStack);
  AllocateIfMissing(state_.layerTable, state_.layerCapacity, capacities_.layerTable);
  decodeRequest_.layerRows = AllocateZeroed<LayerBoundary>(capacities_.layerRows);
  decodeRequest_.layerRowLimit = std::max(capacities_.layerRows, 1u) - 1;
}

// A pass that could not grow an array leaves its pointer null (its capacity
// as it was): such an array starts again at its first capacity.
bool HostDecodeContext::ReplaceDroppedArrays() {
  FieldRecord& field = state_.field;
  AllocateIfMissing(state_.stackBase, state_.stackCapacity, capacities_.positionStack);
  AllocateIfMissing(state_.layerTable, state_.layerCapacity, capacities_.layerTable);
  AllocateIfMissing(field.segments, field.segmentCapacity, kInitialSegmentCapacity);
  return state_.stackBase != nullptr && state_.layerTable != nullptr && field.segments != nullptr;
}

void HostDecodeContext::WireRequests() {
  decodeRequest_.state = &state_;
  decodeRequest_.textRecords = textRecords_.data();
  keyRequest_.state = &state_;
  keyRequest_.keyBuffer = keyBuffer_.data();
  keyRequest_.keyLimit = kDefaultKeyLimit;
}

void HostDecodeContext::FreeArrays() {
  std::free(state_.field.valueText);
  std::free(state_.field.label);
  std::free(state_.field.segments);
  std::free(state_.stackBase);
  std::free(state_.layerTable);
  std::free(decodeRequest_.layerRows);
}

}  // namespace rnsap::host
