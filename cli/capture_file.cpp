#include "cli/capture_file.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "cli/capture_formats.h"

namespace rnsap::cli {
namespace {

constexpr uint8_t kPcapngMagic[4] = {0x0a, 0x0d, 0x0d, 0x0a};
using namespace capture_format;

// Blocks and records that hold frames are read whole; none may be longer.
constexpr uint32_t kLongestKept = 16 << 20;
// A section describes at most this many interfaces (the Packet Block's
// interface field has 16 bits).
constexpr size_t kMostInterfaces = 1 << 16;

// Octets read at a time.
constexpr size_t kStep = 1 << 16;

constexpr uint64_t kNanosecondsPerSecond = 1'000'000'000;

uint64_t PowerOfTen(unsigned exponent) {
  uint64_t power = 1;
  while (exponent-- > 0) power *= 10;
  return power;
}

uint32_t Padded(uint32_t size) { return (size + 3) & ~3u; }

}  // namespace

CaptureFile::CaptureFile(std::FILE* stream) : stream_(stream) {
  uint8_t magic[4];
  if (!Read(magic, sizeof magic, true)) throw CaptureFileFault("the file is empty");
  if (std::equal(magic, magic + 4, kPcapngMagic)) {
    pcapng_ = true;
    FileFrame none;
    Block(magic, none);
  } else {
    ReadPcapHeader(magic);
  }
}

bool CaptureFile::Next(FileFrame& frame) {
  if (!pcapng_) return NextPcapRecord(frame);
  uint8_t type[4];
  do {
    unitStart_ = offset_;
    if (!Read(type, sizeof type, true)) return false;
  } while (!Block(type, frame));
  return true;
}

// Version 2.4 behind the magic number, which tells the byte order and
// whether stamps count microseconds or nanoseconds.
void CaptureFile::ReadPcapHeader(const uint8_t* magic) {
  bigEndian_ = magic[0] == 0xa1;
  const uint32_t value = Number(magic, 4);
  if (value != kPcapMicrosecondMagic && value != kPcapNanosecondMagic) {
    throw CaptureFileFault("unknown file format");
  }
  const bool nanoseconds = value == kPcapNanosecondMagic;
  ReadBody(20);
  Interface& interface = interfaces_.emplace_back();
  interface.snapLength = U32(12);
  interface.linkType = static_cast<int>(U32(16) & 0x03ffffff);
  interface.ticksPerSecond = nanoseconds ? kNanosecondsPerSecond : 1'000'000;
  interface.fractionDigits = nanoseconds ? 9 : 6;
}

bool CaptureFile::NextPcapRecord(FileFrame& frame) {
  unitStart_ = offset_;
  uint8_t header[16];
  if (!Read(header, sizeof header, true)) return false;
  const uint32_t captured = Number(header + 8, 4);
  if (captured > kLongestKept) Fail("a frame of " + std::to_string(captured) + " octets");
  ReadBody(captured);
  const Interface& interface = interfaces_.front();
  const uint64_t ticks = Number(header, 4) * interface.ticksPerSecond + Number(header + 4, 4);
  Frame(interface, ticks, captured, Number(header + 12, 4), 0, frame);
  return true;
}

// Reads the block whose type octets were read; true if it holds a frame.
bool CaptureFile::Block(const uint8_t* typeOctets, FileFrame& frame) {
  uint8_t lengthOctets[4];
  Read(lengthOctets, sizeof lengthOctets);
  const uint32_t length = BlockLength(typeOctets, lengthOctets);
  const uint32_t type = Number(typeOctets, 4);
  const bool kept = type == kSectionHeaderBlock || type == kInterfaceDescriptionBlock ||
                    type == kPacketBlock || type == kSimplePacketBlock ||
                    type == kEnhancedPacketBlock;
  if (!kept) {
    PassOver(length - 12);
    ReadBody(4);
  } else if (length > kLongestKept) {
    Fail("length " + std::to_string(length) + " is more than this reader takes");
  } else {
    ReadBody(length - (type == kSectionHeaderBlock ? 12 : 8));
  }
  const uint32_t trailing = U32(body_.size() - 4);
  if (trailing != length) {
    Fail("length " + std::to_string(trailing) + " at its end differs from " +
         std::to_string(length) + " at its start");
  }
  body_.resize(body_.size() - 4);
  if (type == kSectionHeaderBlock) ReadSectionHeader();
  if (type == kInterfaceDescriptionBlock) ReadInterface();
  return Packet(type, frame);
}

// A Section Header Block's length is read in the byte order its byte-order
// magic, which follows, gives.
uint32_t CaptureFile::BlockLength(const uint8_t* typeOctets, const uint8_t* lengthOctets) {
  const bool section = std::equal(typeOctets, typeOctets + 4, kPcapngMagic);
  if (section) {
    uint8_t magic[4];
    Read(magic, sizeof magic);
    bigEndian_ = magic[0] == 0x1a;
    if (Number(magic, 4) != kByteOrderMagic)
      Fail("byte-order magic is not 1a2b3c4d in either order");
    interfaces_.clear();
  }
  const uint32_t length = Number(lengthOctets, 4);
  const uint32_t least = section ? 28 : 12;
  if (length < least || length % 4 != 0) {
    Fail("length " + std::to_string(length) + " is not a multiple of 4 from " +
         std::to_string(least));
  }
  return length;
}

// Version 1 of the format; the section's interfaces follow.
void CaptureFile::ReadSectionHeader() {
  const uint16_t major = U16(0);
  if (major != 1) {
    Fail("section version " + std::to_string(major) + "." + std::to_string(U16(2)) +
         " is not read");
  }
}

// Link type and snap length, then options: of them the time resolution
// (ticks of 10^-n or, with the top bit, 2^-n seconds) and offset.
void CaptureFile::ReadInterface() {
  NeedBody(8, "an Interface Description Block");
  if (interfaces_.size() == kMostInterfaces) Fail("more interfaces than a section may have");
  Interface interface;
  interface.linkType = U16(0);
  interface.snapLength = U32(4);
  for (size_t at = 8; at + 4 <= body_.size();) {
    const uint16_t code = U16(at), size = U16(at + 2);
    if (code == kEndOfOptions) break;
    if (at + 4 + size > body_.size()) Fail("option " + std::to_string(code) + " runs past its end");
    if (code == kTimeResolutionOption && size >= 1) {
      const unsigned exponent = body_[at + 4] & 0x7f;
      const bool binary = body_[at + 4] & 0x80;
      if (exponent > (binary ? 63 : 19))
        Fail("time resolution " + std::to_string(body_[at + 4]) +
             " is finer than this reader takes");
      interface.ticksPerSecond = binary ? uint64_t{1} << exponent : PowerOfTen(exponent);
      interface.fractionDigits = 0;
      while (interface.fractionDigits < 9 &&
             PowerOfTen(interface.fractionDigits) < interface.ticksPerSecond)
        ++interface.fractionDigits;
    }
    if (code == kTimeOffsetOption && size >= 8)
      interface.offsetSeconds = static_cast<int64_t>(U64(at + 4));
    at += 4 + Padded(size);
  }
  interfaces_.push_back(interface);
}

// An Enhanced Packet Block or an obsolete Packet Block: interface, stamp,
// captured and wire lengths, frame; a Simple Packet Block: wire length and
// frame, of the first interface, cut to its snap length, without a stamp.
bool CaptureFile::Packet(uint32_t type, FileFrame& frame) {
  if (type == kEnhancedPacketBlock || type == kPacketBlock) {
    NeedBody(20, type == kPacketBlock ? "a Packet Block" : "an Enhanced Packet Block");
    const uint32_t index = type == kPacketBlock ? U16(0) : U32(0);
    const uint64_t ticks = uint64_t{U32(4)} << 32 | U32(8);
    Frame(InterfaceAt(index), ticks, U32(12), U32(16), 20, frame);
    return true;
  }
  if (type == kSimplePacketBlock) {
    NeedBody(4, "a Simple Packet Block");
    const Interface& interface = InterfaceAt(0);
    const uint32_t wire = U32(0);
    uint32_t captured = std::min<uint32_t>(wire, static_cast<uint32_t>(body_.size() - 4));
    if (interface.snapLength != 0) captured = std::min(captured, interface.snapLength);
    Frame(interface, 0, captured, wire, 4, frame);
    return true;
  }
  return false;
}

const CaptureFile::Interface& CaptureFile::InterfaceAt(uint32_t index) const {
  if (index >= interfaces_.size())
    Fail("interface " + std::to_string(index) + " is not described in its section");
  return interfaces_[index];
}

// The frame of `captured` octets at `at` of the body, stamped `ticks` of its
// interface's resolution.
void CaptureFile::Frame(const Interface& interface, uint64_t ticks, uint32_t captured,
                        uint32_t wire, size_t at, FileFrame& frame) const {
  if (captured > body_.size() - at) {
    Fail("a frame of " + std::to_string(captured) + " octets in " +
         std::to_string(body_.size() - at));
  }
  uint64_t fraction = ticks % interface.ticksPerSecond, perSecond = interface.ticksPerSecond;
  // Binary fractions finer than 2^-32 lose what no nanosecond shows.
  const bool binary = (perSecond & (perSecond - 1)) == 0;
  while (binary && perSecond > (uint64_t{1} << 32)) {
    fraction >>= 1;
    perSecond >>= 1;
  }
  const uint64_t nanoseconds = perSecond <= kNanosecondsPerSecond
                                   ? fraction * kNanosecondsPerSecond / perSecond
                                   : fraction / (perSecond / kNanosecondsPerSecond);
  const uint64_t seconds = ticks / interface.ticksPerSecond;
  frame.linkType = interface.linkType;
  frame.stamp = {0, static_cast<int64_t>(seconds + static_cast<uint64_t>(interface.offsetSeconds)),
                 static_cast<uint32_t>(nanoseconds), interface.fractionDigits, captured < wire};
  frame.octets = {body_.data() + at, captured};
  frame.wireLength = wire;
}

bool CaptureFile::Read(void* into, size_t count, bool mayEnd) {
  const size_t got = std::fread(into, 1, count, stream_);
  offset_ += got;
  if (got == count) return true;
  if (std::ferror(stream_)) Fail(std::strerror(errno));
  if (got == 0 && mayEnd) return false;
  throw CaptureFileFault("the file ends at offset " + std::to_string(offset_) + " inside the " +
                         (pcapng_ ? "block" : "record") + " at offset " +
                         std::to_string(unitStart_));
}

// Grown as the octets come, so that a length the file does not hold costs
// no more than the file.
void CaptureFile::ReadBody(size_t count) {
  body_.resize(std::min(count, kStep));
  Read(body_.data(), body_.size());
  while (body_.size() < count) {
    const size_t had = body_.size();
    body_.resize(had + std::min(count - had, kStep));
    Read(body_.data() + had, body_.size() - had);
  }
}

void CaptureFile::PassOver(uint64_t count) {
  for (; count > kStep; count -= kStep) ReadBody(kStep);
  ReadBody(count);
}

uint32_t CaptureFile::Number(const uint8_t* octets, size_t size) const {
  uint32_t value = 0;
  for (size_t index = 0; index < size; ++index)
    value |= uint32_t{octets[bigEndian_ ? size - 1 - index : index]} << (8 * index);
  return value;
}

uint64_t CaptureFile::U64(size_t at) const {
  const uint64_t first = U32(at), second = U32(at + 4);
  return bigEndian_ ? first << 32 | second : second << 32 | first;
}

void CaptureFile::NeedBody(size_t size, const char* what) const {
  if (body_.size() < size) {
    Fail(std::string(what) + " needs " + std::to_string(size) + " octets before its options, has " +
         std::to_string(body_.size()));
  }
}

void CaptureFile::Fail(const std::string& what) const {
  throw CaptureFileFault((pcapng_ ? "block at offset " : "record at offset ") +
                         std::to_string(unitStart_) + ": " + what);
}

}  // namespace rnsap::cli
