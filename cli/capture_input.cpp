#include "cli/capture_input.h"

#include <pcap/pcap.h>

#include <memory>

#include "cli/frame_dissector.h"
#include "cli/octet_reader.h"

namespace rnsap::cli {
namespace {

struct PcapCloser {
  void operator()(pcap_t* capture) const { pcap_close(capture); }
};
using PcapHandle = std::unique_ptr<pcap_t, PcapCloser>;

// Reads the frames of an open capture in order.
class CaptureWalk {
 public:
  CaptureWalk(pcap_t* capture, const CaptureHandlers& handlers, CaptureCounts& counts,
              const RnsapCarriers& carriers)
      : capture_(capture),
        linkType_(pcap_datalink(capture)),
        handlers_(handlers),
        dissector_(counts, carriers) {}

  // Returns why the file could not be read to its end, or "".
  std::string Run(CaptureOutcome& outcome) {
    pcap_pkthdr* header = nullptr;
    const u_char* data = nullptr;
    int status = 0;
    while ((status = pcap_next_ex(capture_, &header, &data)) == 1) {
      Frame(*header, {data, header->caplen}, outcome.counts);
    }
    outcome.counts.incomplete += dissector_.heldParts();
    if (status != PCAP_ERROR) return "";
    return "cannot read the capture after frame " + std::to_string(outcome.counts.frames) + ": " +
           pcap_geterr(capture_);
  }

 private:
  void Frame(const pcap_pkthdr& header, std::span<const uint8_t> frame, CaptureCounts& counts) {
    const uint64_t number = ++counts.frames;
    if (number == 1 && !FrameDissector::Reads(linkType_)) NoteUnreadLinkType(number);
    FrameYield yield;
    bool malformed = false;
    try {
      dissector_.Dissect(linkType_, frame, header.caplen < header.len, yield);
    } catch (const MalformedFrame& fault) {
      malformed = true;
      ++counts.malformed;
      handlers_.note({number, fault.what()});
    }
    for (OriginatedMessage& message : yield.messages) {
      ++counts.rnsap;
      // Opened at nanosecond precision, tv_usec holds nanoseconds.
      const FrameStamp stamp{number, header.ts.tv_sec, static_cast<uint32_t>(header.ts.tv_usec),
                             header.caplen < header.len};
      handlers_.message(
          {stamp, message.origin, std::move(message.octets), {linkType_, frame, header.len}});
    }
    if (!malformed && yield.messages.empty() && !yield.partsHeld) ++counts.skipped;
  }

  void NoteUnreadLinkType(uint64_t number) {
    const char* name = pcap_datalink_val_to_name(linkType_);
    handlers_.note({number, "link type " + std::to_string(linkType_) + " (" +
                                (name ? name : "unknown") +
                                ") is not read: every frame is skipped"});
  }

  pcap_t* capture_;
  int linkType_;
  const CaptureHandlers& handlers_;
  FrameDissector dissector_;
};

// libpcap names the file in some of its reasons; the caller names it anyway.
std::string WithoutPath(std::string_view reason, const std::string& path) {
  const std::string prefix = path + ": ";
  if (reason.starts_with(prefix)) reason.remove_prefix(prefix.size());
  return "cannot read the capture: " + std::string(reason);
}

}  // namespace

CaptureOutcome ReadCapture(const std::string& path, const CaptureHandlers& handlers,
                           const RnsapCarriers& carriers) {
  CaptureOutcome outcome;
  char error[PCAP_ERRBUF_SIZE] = "";
  const PcapHandle capture(
      pcap_open_offline_with_tstamp_precision(path.c_str(), PCAP_TSTAMP_PRECISION_NANO, error));
  if (!capture) {
    outcome.failure = WithoutPath(error, path);
    return outcome;
  }
  outcome.opened = true;
  outcome.failure = CaptureWalk(capture.get(), handlers, outcome.counts, carriers).Run(outcome);
  return outcome;
}

}  // namespace rnsap::cli
