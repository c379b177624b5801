// Composes test messages field by field, in wire bit order.
#pragma once

#include <cstdint>
#include <vector>

namespace rnsap::testing {

class BitWriter {
 public:
  // Appends the low `width` bits of `value`, most significant first.
  BitWriter& Put(uint64_t value, uint32_t width) {
    for (uint32_t i = width; i-- > 0;) PutBit((value >> i) & 1);
    return *this;
  }
  // Zero bits up to the next octet boundary.
  BitWriter& Align() {
    while (bits_ % 8 != 0) PutBit(0);
    return *this;
  }
  uint32_t bits() const { return bits_; }
  const std::vector<uint8_t>& bytes() const { return bytes_; }

 private:
  void PutBit(uint64_t bit) {
    if (bits_ % 8 == 0) bytes_.push_back(0);
    if (bit) bytes_.back() |= static_cast<uint8_t>(0x80 >> (bits_ % 8));
    ++bits_;
  }

  std::vector<uint8_t> bytes_;
  uint32_t bits_ = 0;
};

// The empty radio link setup request: the header up to a count of no IEs.
inline const std::vector<uint8_t> kEmptySetupRequest{0x00, 0x14, 0x40, 0x50,
                                                     0x03, 0x00, 0x00, 0x00};

// What a test stores in an output word to see whether a pass wrote it.
inline constexpr uint32_t kUnwritten = 0xdeadbeef;

// The message header up to and including the IE count, public form.
inline BitWriter PublicHeader(uint32_t pduType, uint32_t procedure, uint32_t ieCount,
                              bool extensions = false) {
  BitWriter w;
  w.Put(0, 1).Put(pduType, 2).Align();
  if (pduType < 3) w.Put(procedure, 8);
  w.Put(1, 2).Put(0, 2);          // ddMode fdd, criticality reject
  w.Put(0, 1).Put(5, 7).Align();  // short transaction id 5
  w.Put(0, 1).Put(3, 7);          // message size, one-octet form
  w.Put(0, 1).Put(extensions, 1).Align();
  w.Put(ieCount, 16);
  return w;
}

// The frame of one public IE, up to its value.
inline BitWriter& PutIeFrame(BitWriter& w, uint32_t ieId, uint32_t length) {
  w.Align().Put(ieId, 16).Put(1, 2).Align();
  if (length < 128) return w.Put(0, 1).Put(length, 7);
  return w.Put(1, 1).Put(0, 1).Put(length, 14);
}

}  // namespace rnsap::testing
