// The LayerBoundary row that the Decoded-field and Display passes open at
// entry and close at a normal end.
#pragma once

#include "contract/decode_state.h"
#include "contract/host_services.h"
#include "engine/message_walk.h"

namespace rnsap {

// False when the host could not give the row: its limit is still below the index.
inline bool OpenLayerBoundary(DecodeRequest& request) {
  if (request.layerRowIndex > request.layerRowLimit) pu_CreateNewLayerInfo(&request);
  if (request.layerRowIndex > request.layerRowLimit) return false;
  LayerBoundary& row = request.layerRows[request.layerRowIndex];
  row.firstBit = request.state->position;
  row.layerValue = request.layerValue;
  row.tag = request.tag;
  return true;
}

inline void CloseLayerBoundary(DecodeRequest& request) {
  request.layerRows[request.layerRowIndex].lastBit = request.state->position - 1;
  ++request.layerRowIndex;
}

// The whole of a reporting pass around its sink. Without its layer row it
// gives up at once, as when its own layer table cannot grow.
template <class Sink>
bool RunReportingPass(DecodeRequest& request, Sink& sink, PassState& pass) {
  pass.Clear();
  if (!OpenLayerBoundary(request)) {
    request.state->flags |= ERR_LAYER;
    return false;
  }
  if (!WalkMessage(*request.state, sink, pass)) return false;
  CloseLayerBoundary(request);
  request.bitsLeftOut = request.state->bitsLeft;
  return true;
}

}  // namespace rnsap
