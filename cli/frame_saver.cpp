#include "cli/frame_saver.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <stdexcept>

#include "cli/capture_formats.h"

namespace rnsap::cli {
namespace {

using namespace capture_format;

constexpr uint32_t kSnapLength = 262144;
constexpr uint8_t kNanoseconds = 9;  // the time resolution's power of 10

constexpr int kEthernet = 1;

// Words in the machine's byte order (little-endian), as both formats allow:
// their magic numbers tell the reader which order it is.
template <size_t Count>
using Words = std::array<uint32_t, Count>;

uint32_t Padded(size_t size) { return static_cast<uint32_t>((size + 3) & ~size_t{3}); }

}  // namespace

FrameSaver::FrameSaver(std::string path)
    : path_(std::move(path)), pcapng_(path_.ends_with(".pcapng")) {}

FrameSaver::~FrameSaver() {
  if (file_ != nullptr) std::fclose(file_);
}

// With no frame saved the file is still written, as an empty Ethernet capture.
void FrameSaver::Close() {
  if (file_ == nullptr && !closed_) Open(kEthernet);
  if (file_ == nullptr) return;
  closed_ = true;
  const bool failed = std::fclose(file_) != 0;
  file_ = nullptr;
  if (failed) throw SaveFailure("cannot write " + path_ + ": " + std::strerror(errno));
}

void FrameSaver::Write(const void* data, size_t size) {
  if (std::fwrite(data, 1, size, file_) != size) {
    throw SaveFailure("cannot write " + path_ + ": " + std::strerror(errno));
  }
}

void FrameSaver::Open(int linkType) {
  file_ = std::fopen(path_.c_str(), "wb");
  if (file_ == nullptr) throw SaveFailure("cannot write " + path_ + ": " + std::strerror(errno));
  if (pcapng_) {
    const Words<7> section = {kSectionHeaderBlock, 28, kByteOrderMagic, 1, 0xffffffff,
                              0xffffffff,          28};  // version 1.0, section length unknown
    return Write(section.data(), sizeof section);
  }
  const Words<6> header = {kPcapNanosecondMagic,           2 | 4u << 16, 0, 0, kSnapLength,
                           static_cast<uint32_t>(linkType)};  // version 2.4
  Write(header.data(), sizeof header);
  interfaces_.push_back(linkType);
}

// A pcapng section gets an interface for each link type as it is met.
uint32_t FrameSaver::Interface(int linkType) {
  const auto found = std::find(interfaces_.begin(), interfaces_.end(), linkType);
  if (found != interfaces_.end()) return static_cast<uint32_t>(found - interfaces_.begin());
  const Words<8> block = {kInterfaceDescriptionBlock,
                          32,
                          static_cast<uint32_t>(linkType),
                          kSnapLength,
                          kTimeResolutionOption | 1u << 16,
                          kNanoseconds,
                          kEndOfOptions,
                          32};
  Write(block.data(), sizeof block);
  interfaces_.push_back(linkType);
  return static_cast<uint32_t>(interfaces_.size() - 1);
}

void FrameSaver::Save(std::string_view source, const CapturedMessage& message) {
  const FrameStamp& stamp = message.frame;
  const CapturedFrame& frame = message.captured;
  if (stamp.number == lastFrame_ && source == lastSource_) return;
  if (file_ == nullptr) Open(frame.linkType);
  if (pcapng_) {
    WritePcapngBlock(stamp, frame);
  } else {
    WritePcapRecord(stamp, frame);
  }
  lastFrame_ = stamp.number;
  lastSource_ = source;
}

void FrameSaver::WritePcapRecord(const FrameStamp& stamp, const CapturedFrame& frame) {
  if (frame.linkType != interfaces_.front()) {
    throw SaveFailure("cannot write frame " + std::to_string(stamp.number) + " to " + path_ +
                      ": its link type differs from the first frame's (pcapng can hold both)");
  }
  const Words<4> record = {static_cast<uint32_t>(stamp.seconds), stamp.nanoseconds,
                           static_cast<uint32_t>(frame.octets.size()), frame.wireLength};
  Write(record.data(), sizeof record);
  Write(frame.octets.data(), frame.octets.size());
}

void FrameSaver::WritePcapngBlock(const FrameStamp& stamp, const CapturedFrame& frame) {
  const uint32_t interface = Interface(frame.linkType);
  const uint64_t time = static_cast<uint64_t>(stamp.seconds) * 1'000'000'000 + stamp.nanoseconds;
  const uint32_t length = 32 + Padded(frame.octets.size());
  const Words<7> block = {kEnhancedPacketBlock,
                          length,
                          interface,
                          static_cast<uint32_t>(time >> 32),
                          static_cast<uint32_t>(time),
                          static_cast<uint32_t>(frame.octets.size()),
                          frame.wireLength};
  Write(block.data(), sizeof block);
  Write(frame.octets.data(), frame.octets.size());
  constexpr uint32_t kZero = 0;
  Write(&kZero, Padded(frame.octets.size()) - frame.octets.size());
  Write(&length, sizeof length);
}

}  // namespace rnsap::cli
