// Any byte string through all four passes: no crash, the buffer restored
// after every pass that ends normally, and every pass walking to the same end
// with the same fields: the Decoded-field reports and the Display lines name
// the same fields, every reported run of bits lies inside the message, and
// each pass leaves the same result, position, bits left and field record.
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <span>
#include <unordered_map>
#include <vector>

#include "boundary/module_api.h"
#include "engine/grammar_tables.h"
#include "tests/stand_in/recorder.h"
#include "hostrt/setup.h"
#include "tests/support/record_snapshot.h"

namespace {

using rnsap::DecodeState;
namespace host = rnsap::host;

// Written into bitsLeftOut before each pass: a pass that fails must leave it.
constexpr uint32_t kUnwritten = 0xa5a5a5a5;

void Require(bool condition) {
  if (!condition) std::abort();
}

// What a walk leaves in the state and the request.
struct WalkEnd {
  std::vector<uint8_t> record;  // the last read's words and texts among them
  uint32_t result;
  uint32_t position;
  uint32_t bitsLeft;
  uint32_t bitsLeftOut;
  uint32_t flags;

  bool SameWalk(const WalkEnd& other) const {
    return record == other.record && result == other.result && position == other.position &&
           bitsLeft == other.bitsLeft && bitsLeftOut == other.bitsLeftOut;
  }
};

WalkEnd EndOf(uint32_t result, const DecodeState& state, uint32_t bitsLeftOut) {
  return {rnsap::testing::RecordSnapshot(state),
          result,
          state.position,
          state.bitsLeft,
          bitsLeftOut,
          state.flags};
}

// A pass that ends normally gives the message back as it was; one that fails
// (nothing fails to allocate here, so only a walk nested too deep) writes no
// bitsLeftOut.
bool EndsProperly(const WalkEnd& end, const DecodeState& state, std::span<const uint8_t> message) {
  if (end.result == 1) return std::memcmp(state.buffer, message.data(), message.size()) == 0;
  return end.bitsLeftOut == kUnwritten && (end.flags & rnsap::ERR_NO_MEMORY_STACK) != 0;
}

uint32_t DisplayIdOf(uint32_t fieldId) {
  static const auto* const displayIds = [] {
    auto* ids = new std::unordered_map<uint32_t, uint32_t>;
    for (uint32_t i = 0; i < rnsap::grammar::kFieldCount; ++i)
      (*ids)[rnsap::grammar::kFields[i].fieldId] = rnsap::grammar::kFields[i].displayId;
    return ids;
  }();
  const auto it = displayIds->find(fieldId);
  return it == displayIds->end() ? 0 : it->second;
}

// Every Display line shows the field that the Decoded-field report in its place names.
bool DisplayFollowsDecodedFields() {
  const auto& fields = host::DecodedFields();
  const auto& lines = host::DisplayLines();
  if (fields.size() != lines.size()) return false;
  for (size_t i = 0; i < fields.size(); ++i) {
    if (lines[i].displayId != DisplayIdOf(fields[i].fieldId)) return false;
  }
  return true;
}

// Every run of bits a Decoded-field report names lies inside the message; an
// alignment of no bits names the empty run behind its position.
bool ReportsLieInMessage(uint32_t totalBits) {
  for (const host::DecodedFieldReport& field : host::DecodedFields()) {
    for (const rnsap::BitSegment& segment : field.segments) {
      if (segment.firstBit == 0 || segment.lastBit > totalBits ||
          segment.firstBit > segment.lastBit + 1)
        return false;
    }
  }
  return true;
}

// Runs one reporting pass from the start of the message.
WalkEnd RunDecodePass(host::HostDecodeContext& context, std::span<const uint8_t> message,
                      uint32_t (*pass)(rnsap::DecodeRequest*)) {
  context.Rewind();
  context.decode_request().bitsLeftOut = kUnwritten;
  rnsap::testing::FillRecord(context.state());
  const uint32_t result = pass(&context.decode_request());
  const WalkEnd end = EndOf(result, context.state(), context.decode_request().bitsLeftOut);
  Require(EndsProperly(end, context.state(), message));
  return end;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size == 0 || size > 65536) return 0;
  // The first octet cuts 0 to 7 bits off the end of the message, so that
  // lengths which are not whole octets are walked too.
  const uint32_t cutBits = data[0] % 8;
  const std::span<const uint8_t> message(data + 1, size - 1);
  static host::HostDecodeContext context;
  const uint32_t bits = static_cast<uint32_t>(8 * message.size());
  context.LoadMessage(message, bits >= cutBits ? bits - cutBits : 0);
  host::ResetHost();

  const WalkEnd validation = RunDecodePass(context, message, vex_PreDecodeMV);
  const WalkEnd decoded = RunDecodePass(context, message, vex_PreDecodeMD);
  const WalkEnd display = RunDecodePass(context, message, vex_PreDecodeTO);
  Require(decoded.SameWalk(validation) && display.SameWalk(validation));
  // Only the Validation pass checks loop counts, so it may hold one flag more.
  Require(display.flags == decoded.flags &&
          (validation.flags & ~decoded.flags & ~rnsap::ERR_CONDITION) == 0);
  Require(DisplayFollowsDecodedFields() && ReportsLieInMessage(context.state().totalBits));

  context.Rewind();
  context.key_request().bitsLeftOut = kUnwritten;
  rnsap::testing::FillRecord(context.state());
  const int32_t keys = KFE_vorel_rnsap_04b(&context.key_request());
  const WalkEnd key =
      EndOf(static_cast<uint32_t>(keys), context.state(), context.key_request().bitsLeftOut);
  Require(keys == 1 || keys == 0);
  if (keys == 1) {
    Require(key.SameWalk(decoded) && key.flags == decoded.flags);
    Require(EndsProperly(key, context.state(), message));
  } else {
    // 0: a key too long for keyLimit ended the walk where it stood, or the
    // walk went as deep as the others.
    Require(key.bitsLeftOut == kUnwritten);
    if (key.flags & rnsap::ERR_NO_MEMORY_STACK) Require(key.SameWalk(decoded));
  }
  return 0;
}
