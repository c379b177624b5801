// The frames of a pcap or pcapng file, read as a stream (standard input
// too: nothing is sought). pcap: microsecond or nanosecond stamps in either
// byte order, one link type. pcapng: sections in either byte order, each
// with its interfaces, their link types, time resolutions and offsets;
// Enhanced, Simple and (obsolete) Packet Blocks; other blocks passed over.
// Every length is checked: a broken block or record ends the file with a
// CaptureFileFault that names its offset.
#pragma once

#include <cstdint>
#include <cstdio>
#include <span>
#include <stdexcept>
#include <string>
#include <vector>

namespace rnsap::cli {

class CaptureFileFault : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// Which frame of a capture, and when it was captured, to the precision its
// file gives.
struct FrameStamp {
  uint64_t number = 0;  // from 1
  int64_t seconds = 0;  // since the epoch
  uint32_t nanoseconds = 0;
  uint8_t fractionDigits = 6;  // of the second, as many as the resolution gives (at most 9)
  bool cutOff = false;         // captured shorter than it was on the wire
};

// A frame as the file holds it, valid until the next one is read; its
// stamp without the number.
struct FileFrame {
  int linkType = 0;
  FrameStamp stamp;
  std::span<const uint8_t> octets;
  uint32_t wireLength = 0;
};

class CaptureFile {
 public:
  // Reads the file's header; a CaptureFileFault if it is no capture.
  explicit CaptureFile(std::FILE* stream);

  // The next frame, or false at the end of the file.
  bool Next(FileFrame& frame);

 private:
  // A pcapng interface: its link type, ticks per second and the seconds
  // added to every stamp.
  struct Interface {
    int linkType = 0;
    uint32_t snapLength = 0;
    uint64_t ticksPerSecond = 1'000'000;
    uint8_t fractionDigits = 6;
    int64_t offsetSeconds = 0;
  };

  void ReadPcapHeader(const uint8_t* magic);
  bool NextPcapRecord(FileFrame& frame);
  bool Block(const uint8_t* typeOctets, FileFrame& frame);
  uint32_t BlockLength(const uint8_t* typeOctets, const uint8_t* lengthOctets);
  void ReadSectionHeader();
  void ReadInterface();
  bool Packet(uint32_t type, FileFrame& frame);
  const Interface& InterfaceAt(uint32_t index) const;
  void Frame(const Interface& interface, uint64_t ticks, uint32_t captured, uint32_t wire,
             size_t at, FileFrame& frame) const;

  // Reads `count` octets to `into`; false at a clean end of the file if
  // `mayEnd`, a fault if it ends inside them.
  bool Read(void* into, size_t count, bool mayEnd = false);
  void ReadBody(size_t count);
  void PassOver(uint64_t count);
  uint32_t Number(const uint8_t* octets, size_t size) const;
  uint16_t U16(size_t at) const { return static_cast<uint16_t>(Number(&body_[at], 2)); }
  uint32_t U32(size_t at) const { return Number(&body_[at], 4); }
  uint64_t U64(size_t at) const;
  void NeedBody(size_t size, const char* what) const;
  [[noreturn]] void Fail(const std::string& what) const;

  std::FILE* stream_;
  uint64_t offset_ = 0;     // of the next octet to read
  uint64_t unitStart_ = 0;  // of the block or record being read
  bool pcapng_ = false;
  bool bigEndian_ = false;
  std::vector<uint8_t> body_;
  std::vector<Interface> interfaces_;  // pcap: the one of its header
};

}  // namespace rnsap::cli
