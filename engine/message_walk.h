// What every pass does around the walk of one message: the layer record, the
// outermost rule, the bit order of the buffer, and the closing alignment.
#pragma once

#include <cstring>

#include "engine/bit_access.h"
#include "engine/walk.h"

namespace rnsap {

// The checks of the Validation pass, which every other pass leaves out.
struct UncheckedSink {
  static constexpr bool kChecks = false;
};

// Pads the walk to a whole number of octets, counted from where the message began.
inline void CloseAlignment(DecodeState& s) {
  const uint32_t r = (s.position - *s.stackTop) % 8;
  if (r != 0) {
    s.position += 8 - r;
    s.bitsLeft -= 8 - r;
  }
}

// Walks the message at `position` through the grammar. The pass's variables
// and bit order must have been cleared. False when a table failed to grow; the
// buffer then stays bit-reversed.
template <class Sink>
bool WalkMessage(DecodeState& s, Sink& sink, PassState& pass) {
  if (!EnsureDoubling(reinterpret_cast<void**>(&s.layerTable), s.layerIndex + 1, &s.layerCapacity,
                      sizeof(LayerRecord))) {
    s.flags |= ERR_LAYER;
    return false;
  }
  OpenLayerRecord(s);
  static constexpr char kMessageRule[] = "RNSAP";
  if (!EnterRule(s, kMessageRule, sizeof kMessageRule - 1)) return false;
  if constexpr (Sink::kChecks) sink.CheckPoint(s);
  pass.bitOrder.Push();
  ReverseBitGroups(s.buffer, s.position, 8, s.totalBits);

  Walker<Sink> walker(s, sink, pass);
  if (!walker.Walk()) return false;

  if (s.totalBits >= 8) std::memcpy(s.buffer, s.source, s.totalBits / 8);
  CloseAlignment(s);
  pass.bitOrder.Pop();
  walker.LeaveRule();
  return true;
}

}  // namespace rnsap
