#include "cli/capture_input.h"

#include <pcap/pcap.h>

#include <bitset>
#include <cerrno>
#include <cstring>
#include <memory>

#include "cli/frame_dissector.h"
#include "cli/octet_reader.h"

namespace rnsap::cli {
namespace {

struct FileCloser {
  void operator()(std::FILE* file) const {
    if (file != stdin) std::fclose(file);
  }
};
using FileHandle = std::unique_ptr<std::FILE, FileCloser>;

// Files hold LINKTYPE_ numbers; the dissector, like libpcap, takes DLT_
// numbers, which differ for raw IP.
int DataLinkType(int linkType) {
  constexpr int kLinkTypeRaw = 101;
  return linkType == kLinkTypeRaw ? DLT_RAW : linkType;
}

// Reads the frames of an open capture in order.
class CaptureWalk {
 public:
  CaptureWalk(CaptureFile& file, const CaptureHandlers& handlers, CaptureCounts& counts,
              const RnsapCarriers& carriers)
      : file_(file), handlers_(handlers), dissector_(counts, carriers) {}

  // Returns why the file could not be read to its end, or "".
  std::string Run(CaptureOutcome& outcome) {
    std::string failure;
    try {
      for (FileFrame frame; file_.Next(frame);) Frame(frame, outcome.counts);
    } catch (const CaptureFileFault& fault) {
      failure = "cannot read the capture after frame " + std::to_string(outcome.counts.frames) +
                ": " + fault.what();
    }
    outcome.counts.incomplete += dissector_.heldParts();
    return failure;
  }

 private:
  void Frame(FileFrame& frame, CaptureCounts& counts) {
    frame.stamp.number = ++counts.frames;
    frame.linkType = DataLinkType(frame.linkType);
    if (!FrameDissector::Reads(frame.linkType)) NoteUnreadLinkType(frame);
    FrameYield yield;
    bool malformed = false;
    try {
      dissector_.Dissect(frame.linkType, frame.octets, frame.stamp.cutOff, yield);
    } catch (const MalformedFrame& fault) {
      malformed = true;
      ++counts.malformed;
      handlers_.note({frame.stamp.number, fault.what()});
    }
    for (OriginatedMessage& message : yield.messages) {
      ++counts.rnsap;
      handlers_.message({frame.stamp,
                         message.origin,
                         std::move(message.octets),
                         {frame.linkType, frame.octets, frame.wireLength}});
    }
    if (!malformed && yield.messages.empty() && !yield.partsHeld) ++counts.skipped;
  }

  // Once for each link type, at its first frame.
  void NoteUnreadLinkType(const FileFrame& frame) {
    const auto linkType = static_cast<size_t>(frame.linkType) % noted_.size();
    if (noted_[linkType]) return;
    noted_[linkType] = true;
    const char* name = pcap_datalink_val_to_name(frame.linkType);
    handlers_.note({frame.stamp.number, "link type " + std::to_string(frame.linkType) + " (" +
                                            (name ? name : "unknown") +
                                            ") is not read: every frame is skipped"});
  }

  CaptureFile& file_;
  const CaptureHandlers& handlers_;
  FrameDissector dissector_;
  std::bitset<1 << 16> noted_;  // by link type (pcapng gives 16 bits)
};

}  // namespace

CaptureOutcome ReadCapture(const std::string& path, const CaptureHandlers& handlers,
                           const RnsapCarriers& carriers) {
  CaptureOutcome outcome;
  const FileHandle stream(path == "-" ? stdin : std::fopen(path.c_str(), "rb"));
  if (!stream) {
    outcome.failure = "cannot read the capture: " + std::string(std::strerror(errno));
    return outcome;
  }
  try {
    CaptureFile file(stream.get());
    outcome.opened = true;
    outcome.failure = CaptureWalk(file, handlers, outcome.counts, carriers).Run(outcome);
  } catch (const CaptureFileFault& fault) {
    outcome.failure = "cannot read the capture: " + std::string(fault.what());
  }
  return outcome;
}

}  // namespace rnsap::cli
