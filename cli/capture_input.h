// RNSAP messages read from a pcap or pcapng file through libpcap, frame by
// frame, with the frame number and time of the frame that carries (or, for
// a message sent in SCTP fragments, completes) each one.
#pragma once

#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <vector>

#include "cli/capture_counts.h"
#include "cli/message_origin.h"
#include "cli/rnsap_carriers.h"

namespace rnsap::cli {

// Which frame of a capture, and when it was captured.
struct FrameStamp {
  uint64_t number = 0;  // from 1
  int64_t seconds = 0;  // since the epoch
  uint32_t nanoseconds = 0;
  bool cutOff = false;  // captured shorter than it was on the wire
};

// The frame as captured, valid while its messages are handled.
struct CapturedFrame {
  int linkType = 0;
  std::span<const uint8_t> octets;
  uint32_t wireLength = 0;
};

struct CapturedMessage {
  FrameStamp frame;
  MessageOrigin origin;
  std::vector<uint8_t> octets;
  CapturedFrame captured;
};

// A frame that could not be read through, and why.
struct CaptureNote {
  uint64_t frame = 0;
  std::string reason;
};

struct CaptureOutcome {
  CaptureCounts counts;
  std::string failure;  // why the file could not be opened or read to its end
  bool opened = false;
};

struct CaptureHandlers {
  std::function<void(const CapturedMessage&)> message;
  std::function<void(const CaptureNote&)> note;
};

CaptureOutcome ReadCapture(const std::string& path, const CaptureHandlers& handlers,
                           const RnsapCarriers& carriers = {});

}  // namespace rnsap::cli
