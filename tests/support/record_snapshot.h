// What a pass leaves behind in the field record, the rule name and the
// position stack, to the last byte of every text. The host's texts and arrays
// are filled with a pattern before the pass, so that tails behind a NUL and
// entries no read wrote are determined. The reporting passes write the record
// at every read; the others may write it later, but must leave the same.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <initializer_list>
#include <vector>

#include "contract/decode_state.h"
#include "hostrt/setup.h"

namespace rnsap::testing {

// Fills the texts and arrays of `state`, all but the bottom stack entry that
// the host wrote.
inline void FillRecord(DecodeState& state) {
  constexpr uint8_t kFill = 0xA5;
  FieldRecord& record = state.field;
  std::memset(state.ruleName, kFill, kRuleNameBufferSize);
  std::memset(record.label, kFill, kLabelBufferSize);
  std::memset(record.valueText, kFill, kValueTextBufferSize);
  std::memset(record.segments, kFill, record.segmentCapacity * sizeof(BitSegment));
  std::memset(state.stackBase + 1, kFill, (state.stackCapacity - 1) * sizeof(uint32_t));
}

// The texts as bytes, the words as their little-endian bytes, so that a
// snapshot is the same on every platform. It holds the segments and stack
// entries of a host's first arrays, which were filled and which every later
// pass still has.
inline std::vector<uint8_t> RecordSnapshot(const DecodeState& state) {
  std::vector<uint8_t> snapshot;
  const auto bytes = [&](const void* data, size_t size) {
    const size_t at = snapshot.size();
    snapshot.resize(at + size);
    std::memcpy(snapshot.data() + at, data, size);
  };
  const auto words = [&](std::initializer_list<uint32_t> values) {
    for (uint32_t value : values)
      for (int shift = 0; shift < 32; shift += 8) snapshot.push_back(uint8_t(value >> shift));
  };
  const FieldRecord& record = state.field;
  bytes(state.ruleName, kRuleNameBufferSize);
  bytes(record.label, kLabelBufferSize);
  bytes(record.valueText, kValueTextBufferSize);
  words({record.fieldId, record.value, record.readCount, record.segmentCount, record.paddingHigh,
         record.paddingBits, record.rawFlag, state.test, state.width,
         static_cast<uint32_t>(state.stackIndex),
         static_cast<uint32_t>(state.stackTop - state.stackBase)});
  for (uint32_t i = 0; i < std::min(record.segmentCapacity, kInitialSegmentCapacity); ++i) {
    const BitSegment& s = record.segments[i];
    words({s.segmentValue, s.firstBit, s.lastBit, s.shapeWord});
  }
  for (uint32_t i = 0;
       i < std::min(state.stackCapacity, host::HostDecodeCapacities{}.positionStack); ++i)
    words({state.stackBase[i]});
  return snapshot;
}

}  // namespace rnsap::testing
