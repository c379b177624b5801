// Bounds-checked reading of the octets of one protocol layer of a captured
// frame. A read past the end, or a length that does not fit, makes the frame
// malformed: the error names the layer and what did not fit.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <stdexcept>
#include <string>

namespace rnsap::cli {

class MalformedFrame : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class OctetReader {
 public:
  OctetReader(std::span<const uint8_t> octets, const char* layer)
      : octets_(octets), layer_(layer) {}

  uint8_t U8() { return Take(1)[0]; }
  uint16_t U16() {
    const auto octets = Take(2);
    return static_cast<uint16_t>(octets[0] << 8 | octets[1]);
  }
  uint32_t U32() {
    const uint32_t high = U16();
    const uint32_t low = U16();
    return high << 16 | low;
  }
  // SS7 (MTP and SCCP) sends the least significant octet first.
  uint16_t U16LittleEndian() {
    const auto octets = Take(2);
    return static_cast<uint16_t>(octets[1] << 8 | octets[0]);
  }

  std::span<const uint8_t> Take(size_t count) {
    if (count > left()) {
      Fail("needs " + std::to_string(count) + " octets at offset " + std::to_string(offset_) +
           ", " + std::to_string(left()) + " left");
    }
    const auto taken = octets_.subspan(offset_, count);
    offset_ += count;
    return taken;
  }
  void Skip(size_t count) { Take(count); }
  // Moves to `offset` from the start of the layer.
  void Seek(size_t offset) {
    if (offset > octets_.size()) {
      Fail("offset " + std::to_string(offset) + " lies beyond its " +
           std::to_string(octets_.size()) + " octets");
    }
    offset_ = offset;
  }
  std::span<const uint8_t> Rest() { return Take(left()); }

  size_t left() const { return octets_.size() - offset_; }
  size_t offset() const { return offset_; }

  [[noreturn]] void Fail(const std::string& what) const {
    throw MalformedFrame(std::string(layer_) + ": " + what);
  }

 private:
  std::span<const uint8_t> octets_;
  const char* layer_;
  size_t offset_ = 0;
};

}  // namespace rnsap::cli
