// Messages and a host set-up shared by the tests of the passes: the IMSI and
// D_RNTI IEs that the key tests look at, and a context that loads a message and clears the
// stand-in's records.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "host/recorder.h"
#include "host/setup.h"
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
    host::ResetParserUtilities();
  }

  bool BufferRestored() const {
    return std::equal(message_.begin(), message_.end(), context_->state().buffer);
  }

  host::HostDecodeContext& context() { return *context_; }
  DecodeState& state() { return context_->state(); }
  DecodeRequest& request() { return context_->decode_request(); }
  KeyFieldRequest& key_request() { return context_->key_request(); }

 private:
  std::unique_ptr<host::HostDecodeContext> context_;
  std::vector<uint8_t> message_;
};

}  // namespace rnsap::testing
