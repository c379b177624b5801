// Messages and a host set-up shared by the tests of the reporting passes and
// the Key-field pass: the private header, one IE of each identity the tests
// look at, and a context that loads a message and clears the stand-in's
// records.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <vector>

#include "host/recorder.h"
#include "host/setup.h"
#include "tests/support/bit_writer.h"

namespace rnsap::testing {

// Header of a private message (procedure 15) up to its IE count: no
// protocolExtensions bit, and the count as stored, one less than the IEs.
inline BitWriter PrivateHeader(uint32_t storedIeCount) {
  BitWriter w;
  w.Put(0, 1).Put(0, 2).Align();
  w.Put(15, 8);
  w.Put(1, 2).Put(0, 2);          // ddMode fdd, criticality reject
  w.Put(0, 1).Put(5, 7).Align();  // short transaction id 5
  w.Put(0, 1).Put(3, 7);          // message size, one-octet form
  w.Put(0, 1).Align();            // message extension
  return w.Put(storedIeCount, 16);
}

// One private IE with a global identifier: size 9 in the one-octet form, 1st
// sub-identifier 40, nation 440 in two octets, company 200043 in three,
// `protocol` and `ie` in one octet each, criticality ignore, and the length.
// The body is left to the caller.
inline BitWriter& PutGlobalPrivateIe(BitWriter& w, uint32_t protocol, uint32_t ie,
                                     uint32_t length) {
  w.Align().Put(1, 1).Align();
  w.Put(0, 1).Put(9, 7);
  w.Put(0, 1).Put(40, 7);
  w.Put(0x80 | 3, 8).Put(56, 8);                      // 3 x 128 + 56
  w.Put(0x80 | 12, 8).Put(0x80 | 26, 8).Put(107, 8);  // 12 x 16384 + 26 x 128 + 107
  w.Put(0, 1).Put(protocol, 7).Put(0, 1).Put(ie, 7);
  w.Put(1, 2).Align();
  return w.Put(0, 1).Put(length, 7);
}

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
