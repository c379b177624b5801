// A capture decoded message by message and printed as rnsap-decode prints it:
// each message between its head and its summary, or handed to the analyst's
// views; notes and errors on the writer's error stream, and a closing line
// with the counts.
#pragma once

#include <cstddef>
#include <functional>
#include <span>
#include <string>

#include "cli/analysis.h"
#include "cli/capture_input.h"
#include "cli/options.h"
#include "cli/output_writer.h"
#include "cli/report.h"

namespace rnsap::cli {

// Runs a pass over one message, handing its reports to the printer.
using MessageDecode =
    std::function<MessageSummary(Pass, std::span<const uint8_t>, MessagePrinter&)>;

// Where the messages of a capture go when they are not decoded in turn.
class MessageDispatch {
 public:
  virtual ~MessageDispatch() = default;
  // The message numbered `index` is complete.
  virtual void Message(size_t index, const CapturedMessage& message) = 0;
  // Prints every message dispatched so far, before a note or the closing line.
  virtual void Drain() = 0;
};

struct CapturePrinting {
  Pass pass = Pass::kDecode;
  const MessageDecode& decode;
  MessagePrinter& printer;
  OutputWriter& writer;
  const RnsapCarriers& carriers;
  MessageDispatch* dispatch = nullptr;  // none: each message decoded as it is read
  Analysis* analysis = nullptr;         // takes the messages instead of the printer
};

// What messages of the capture `given` on the command line are said to come from.
std::string CaptureName(const std::string& given);

// Prints one message: its head, what the pass reports, its summary.
void PrintMessage(const MessageHead& head, std::span<const uint8_t> octets,
                  const MessageDecode& decode, MessagePrinter& printer);

// Decodes the capture at `path` ("-" for standard input), numbering its
// messages on from `index`.
// Returns what was read; an empty failure when the file was read to its end.
CaptureOutcome PrintCapture(const std::string& path, const CapturePrinting& printing,
                            size_t& index);

}  // namespace rnsap::cli
