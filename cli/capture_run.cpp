#include "cli/capture_run.h"

namespace rnsap::cli {

CaptureOutcome PrintCapture(const std::string& path, const CapturePrinting& printing,
                            size_t& index) {
  OutputWriter& writer = printing.writer;
  MessagePrinter& printer = printing.printer;
  const CaptureOutcome outcome =
      ReadCapture(path, {[&](const CapturedMessage& message) {
                           const auto octets = static_cast<uint32_t>(message.octets.size());
                           printer.Begin({index++, path, &message.frame, octets, printing.pass});
                           printer.End(printing.decode(printing.pass, message.octets, printer));
                         },
                         [&](const CaptureNote& note) {
                           writer.Error("{}: frame {}: note: {}\n", path, note.frame, note.reason);
                         }});
  if (outcome.heldFragments != 0) {
    writer.Error("{}: note: {} SCTP fragments of messages the capture does not complete\n", path,
                 outcome.heldFragments);
  }
  if (!outcome.failure.empty()) writer.Error("{}: error: {}\n", path, outcome.failure);
  if (outcome.opened) printer.Capture(path, outcome.counts);
  return outcome;
}

}  // namespace rnsap::cli
