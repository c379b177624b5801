#include "cli/capture_run.h"

#include <utility>

namespace rnsap::cli {
namespace {

// What the reading passed over or dropped, one note per kind that happened.
void NoteDropped(OutputWriter& writer, const std::string& path, const CaptureCounts& counts) {
  const std::pair<uint64_t, std::string_view> notes[] = {
      {counts.duplicates, "parts sent again (SCTP DATA chunks, IP fragments), decoded once"},
      {counts.evicted, "held parts of messages dropped to make room"},
      {counts.incomplete, "held parts of messages the capture does not complete"},
      {counts.unattributed, "SCCP connection data of connections not known to carry RNSAP"},
  };
  for (const auto& [count, what] : notes) {
    if (count != 0) writer.Error("{}: note: {} {}\n", path, count, what);
  }
}

}  // namespace

std::string CaptureName(const std::string& given) {
  return given == "-" ? std::string(kStandardInputName) : given;
}

void PrintMessage(const MessageHead& head, std::span<const uint8_t> octets,
                  const MessageDecode& decode, MessagePrinter& printer) {
  printer.Begin(head);
  printer.End(decode(head.pass, octets, printer));
}

CaptureOutcome PrintCapture(const std::string& given, const CapturePrinting& printing,
                            size_t& index) {
  const std::string path = CaptureName(given);
  OutputWriter& writer = printing.writer;
  const auto message = [&](const CapturedMessage& message) {
    if (printing.dispatch) return printing.dispatch->Message(index++, message);
    if (printing.analysis) {
      return printing.analysis->Message(index++, path, &message, message.octets);
    }
    const auto octets = static_cast<uint32_t>(message.octets.size());
    PrintMessage({index++, path, &message.frame, &message.origin, octets, printing.pass},
                 message.octets, printing.decode, printing.printer);
  };
  const auto note = [&](const CaptureNote& note) {
    if (printing.dispatch) printing.dispatch->Drain();
    writer.Error("{}: frame {}: note: {}\n", path, note.frame, note.reason);
  };
  const CaptureOutcome outcome = ReadCapture(given, {message, note}, printing.carriers);
  if (printing.dispatch) printing.dispatch->Drain();
  NoteDropped(writer, path, outcome.counts);
  if (!outcome.failure.empty()) writer.Error("{}: error: {}\n", path, outcome.failure);
  if (outcome.opened && printing.analysis) printing.analysis->Capture(outcome.counts);
  if (outcome.opened && !printing.analysis) printing.printer.Capture(path, outcome.counts);
  return outcome;
}

}  // namespace rnsap::cli
