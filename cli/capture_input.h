// RNSAP messages read from a pcap or pcapng file, frame by frame, each
// frame by its own interface's link type, with the frame number and time of
// the frame that carries (or, for a message sent in SCTP fragments,
// completes) each one.
#pragma once

#include <cstdint>
#include <functional>
#include <span>
#include <string>
#include <vector>

#include "cli/capture_counts.h"
#include "cli/capture_file.h"
#include "cli/message_origin.h"
#include "cli/rnsap_carriers.h"

namespace rnsap::cli {

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
