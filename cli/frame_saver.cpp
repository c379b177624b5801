#include "cli/frame_saver.h"

#include <stdexcept>

namespace rnsap::cli {
namespace {

constexpr int kSnapLength = 262144;

}  // namespace

FrameSaver::~FrameSaver() {
  if (dumper_ != nullptr) pcap_dump_close(dumper_);
  if (dead_ != nullptr) pcap_close(dead_);
}

void FrameSaver::Open(int linkType) {
  dead_ = pcap_open_dead_with_tstamp_precision(linkType, kSnapLength, PCAP_TSTAMP_PRECISION_NANO);
  if (dead_ == nullptr) throw std::runtime_error("cannot write " + path_);
  dumper_ = pcap_dump_open(dead_, path_.c_str());
  if (dumper_ == nullptr) {
    throw std::runtime_error("cannot write " + path_ + ": " + pcap_geterr(dead_));
  }
  linkType_ = linkType;
}

void FrameSaver::Save(std::string_view source, const CapturedMessage& message) {
  const FrameStamp& stamp = message.frame;
  const CapturedFrame& frame = message.captured;
  if (stamp.number == lastFrame_ && source == lastSource_) return;
  if (dumper_ == nullptr) Open(frame.linkType);
  if (frame.linkType != linkType_) {
    throw std::runtime_error("cannot write frame " + std::to_string(stamp.number) + " to " + path_ +
                             ": its link type differs from the first frame's");
  }
  pcap_pkthdr header{};
  header.ts.tv_sec = stamp.seconds;
  header.ts.tv_usec = static_cast<decltype(header.ts.tv_usec)>(stamp.nanoseconds);
  header.caplen = static_cast<uint32_t>(frame.octets.size());
  header.len = frame.wireLength;
  pcap_dump(reinterpret_cast<u_char*>(dumper_), &header, frame.octets.data());
  lastFrame_ = stamp.number;
  lastSource_ = source;
}

}  // namespace rnsap::cli
