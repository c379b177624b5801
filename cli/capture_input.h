// RNSAP messages read from a pcap or pcapng file through libpcap, frame by
// frame, with the frame number and time of the frame that carries (or, for
// a message sent in SCTP fragments, completes) each one.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "cli/message_origin.h"

namespace rnsap::cli {

// Which frame of a capture, and when it was captured.
struct FrameStamp {
  uint64_t number = 0;  // from 1
  int64_t seconds = 0;  // since the epoch
  uint32_t nanoseconds = 0;
};

struct CapturedMessage {
  FrameStamp frame;
  MessageOrigin origin;
  std::vector<uint8_t> octets;
};

// A frame that could not be read through, and why.
struct CaptureNote {
  uint64_t frame = 0;
  std::string reason;
};

struct CaptureCounts {
  uint64_t frames = 0;
  uint64_t rnsap = 0;      // messages found
  uint64_t skipped = 0;    // frames with neither an RNSAP message nor a fragment of one
  uint64_t malformed = 0;  // frames cut short or with lengths that do not fit
};

struct CaptureOutcome {
  CaptureCounts counts;
  uint64_t heldFragments = 0;  // SCTP fragments of messages the capture never completed
  std::string failure;         // why the file could not be opened or read to its end
  bool opened = false;
};

struct CaptureHandlers {
  std::function<void(const CapturedMessage&)> message;
  std::function<void(const CaptureNote&)> note;
};

CaptureOutcome ReadCapture(const std::string& path, const CaptureHandlers& handlers);

}  // namespace rnsap::cli
