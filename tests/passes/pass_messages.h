// Messages, a host set-up and a pass runner shared by the tests of the
// passes: the IMSI and D_RNTI IEs that the key tests look at, nesting beyond
// the rule bound, and a context that loads a message and clears the
// stand-in's records.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "hostrt/setup.h"
#include "tests/stand_in/recorder.h"
#include "tests/support/bit_writer.h"

namespace rnsap::testing {

// IMSI IE (84) of eight octets, as stored: the digits of each octet swapped,
// the high half of the last octet a filler 0xF or a 16th digit.
inline BitWriter& PutImsiOfEightOctets(BitWriter& w, const std::vector<uint8_t>& octets) {
  PutIeFrame(w, 84, 9).Put(5, 3).Align();
  for (uint8_t octet : octets) w.Put(octet, 8);
  return w;
}

// D_RNTI IE (21) of `octets` octets, given most significant first.
inline BitWriter& PutDRnti(BitWriter& w, uint32_t octets, uint32_t value) {
  return PutIeFrame(w, 21, octets + 1).Put(octets - 1, 2).Align().Put(value, 8 * octets);
}

// Geographical points whose coordinates each carry one more point in their
// extension container, far deeper than the walk's rule bound.
inline BitWriter DeepestNesting() {
  BitWriter w = PublicHeader(0, 20, 0, true);
  w.Align().Put(0, 16);  // one extension
  for (int level = 0; level < 3000; ++level) {
    w.Align().Put(7, 16).Put(1, 2).Align().Put(0, 1).Put(9, 7);  // GeographicalAreaCell
    w.Put(0, 1).Put(0, 2).Put(0, 1).Put(0, 1);                   // point, GA_Point
    w.Put(0, 1).Put(1, 1).Put(0, 1);                             // coordinates with one
    w.Put(0, 2).Align().Put(0x55, 8).Put(0, 2).Align().Put(0xAA, 8);
    w.Align().Put(0, 16);  // ProtocolExtensionContainer COUNT: one extension
  }
  return w;
}

// The bits a field's segments cover, "FIRST-LAST" from the lowest to the
// highest, or "-" for a field of no segments.
inline std::string BitRange(const std::vector<BitSegment>& segments) {
  if (segments.empty()) return "-";
  uint32_t first = segments[0].firstBit, last = segments[0].lastBit;
  for (const BitSegment& s : segments) {
    first = std::min(first, s.firstBit);
    last = std::max(last, s.lastBit);
  }
  return std::to_string(first) + "-" + std::to_string(last);
}

// A DecodeState and both requests with a loaded message; every load starts
// the stand-in's field and line records afresh.
class PassHost {
 public:
  explicit PassHost(const host::HostDecodeCapacities& capacities = {})
      : context_(std::make_unique<host::HostDecodeContext>(capacities)) {}

  bool ready() const { return context_->ready(); }

  // Whole octets: the alignment of a walk counts from the end of the message.
  void Load(const BitWriter& w) { Load(w.bytes(), static_cast<uint32_t>(8 * w.bytes().size())); }
  void Load(const std::vector<uint8_t>& message, uint32_t bits) {
    message_ = message;
    context_->LoadMessage(message_, bits);
    host::ResetRecorder();
  }

  bool BufferRestored() const {
    return std::equal(message_.begin(), message_.end(), context_->state().buffer);
  }

  // The presence bit and the slot of key row `row` in the key buffer.
  bool KeyPresent(uint32_t row) {
    const KeyFieldRow& r = host::LastKeyTable()[row];
    return (key_request().keyBuffer[r.presenceOffset] & r.presenceMask) != 0;
  }
  const uint8_t* KeySlot(uint32_t row) {
    return key_request().keyBuffer + host::LastKeyTable()[row].valueOffset;
  }

  host::HostDecodeContext& context() { return *context_; }
  DecodeState& state() { return context_->state(); }
  DecodeRequest& request() { return context_->decode_request(); }
  KeyFieldRequest& key_request() { return context_->key_request(); }

 private:
  std::unique_ptr<host::HostDecodeContext> context_;
  std::vector<uint8_t> message_;
};

enum class Pass { kValidation, kDecodedField, kDisplay, kKeyField };
inline constexpr Pass kAllPasses[] = {Pass::kValidation, Pass::kDecodedField, Pass::kDisplay,
                                      Pass::kKeyField};

inline std::string NameOf(Pass pass) {
  constexpr const char* kNames[] = {"Validation", "Decoded-field", "Display", "Key-field"};
  return kNames[static_cast<int>(pass)];
}

// Runs `pass` through its export on the message loaded in `c`.
inline int32_t RunPass(Pass pass, host::HostDecodeContext& c) {
  if (pass == Pass::kKeyField) return KFE_vorel_rnsap_04b(&c.key_request());
  constexpr uint32_t (*kDecodePasses[])(DecodeRequest*) = {vex_PreDecodeMV, vex_PreDecodeMD,
                                                           vex_PreDecodeTO};
  return static_cast<int32_t>(kDecodePasses[static_cast<int>(pass)](&c.decode_request()));
}

inline uint32_t& BitsLeftOut(Pass pass, host::HostDecodeContext& c) {
  return pass == Pass::kKeyField ? c.key_request().bitsLeftOut : c.decode_request().bitsLeftOut;
}

}  // namespace rnsap::testing
