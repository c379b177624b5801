// The Validation pass: walks a message without reporting any field, and
// gives back a verdict word and the bits left.
#include "boundary/module_api.h"
#include "engine/message_walk.h"

namespace rnsap {
namespace {

// The Validation pass's sink: no field, only the flags check; with kChecks the
// walk adds the count check behind every counted loop.
struct ValidationSink {
  DecodeRequest& request;

  static constexpr bool kChecks = true;
  static bool WantsField(const grammar::FieldInfo&) { return false; }
  static uint32_t OnField(DecodeState&, const grammar::FieldInfo&) { return 1; }

  void CheckPoint(const DecodeState& s) {
    if (s.flags != 0) request.verdict = VERDICT_FLAGGED;
  }
};

PassState validationPass;

}  // namespace
}  // namespace rnsap

uint32_t vex_PreDecodeMV(rnsap::DecodeRequest* request) {
  rnsap::DecodeState& s = *request->state;
  rnsap::validationPass.Clear();
  rnsap::ValidationSink sink{*request};
  if (!rnsap::WalkMessage(s, sink, rnsap::validationPass)) return 0;
  request->bitsLeftOut = s.bitsLeft;
  return 1;
}
