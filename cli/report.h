// What one pass makes of one message, printed as it comes in one of two
// forms: text for a reader, or one JSON object per line for a program.
#pragma once

#include <fmt/format.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string_view>

#include "cli/capture_input.h"
#include "cli/field_dictionary.h"
#include "cli/key_rows.h"
#include "cli/message_facts.h"
#include "cli/options.h"
#include "cli/output_writer.h"
#include "hostrt/host_runtime.h"

namespace rnsap::cli {

// A message as its lines name it.
struct MessageHead {
  size_t index = 0;                        // of the message among those decoded, from 0
  std::string_view origin;                 // where the message came from
  const FrameStamp* frame = nullptr;       // of a message read from a capture
  const MessageOrigin* network = nullptr;  // likewise: the endpoints and SCCP message it came by
  uint32_t octets = 0;
  Pass pass = Pass::kDecode;
};

// How the pass ended.
struct MessageSummary {
  Pass pass = Pass::kDecode;
  int32_t result = 0;  // the pass's result; 1 or 0 for the boolean passes
  uint32_t bitsLeftOut = 0;
  uint32_t position = 0;
  uint32_t flags = 0;
  int32_t verdict = 0;  // the Validation pass's verdict
};

// Formats a message's lines into a buffer as its reports come: Begin, the
// header if asked for, the reports of the pass, End.
class MessagePrinter : public host::ReportSink {
 public:
  virtual void Begin(const MessageHead& head) = 0;
  virtual void Header(const MessageFacts& facts) = 0;
  virtual void Key(const KeyValue& key) = 0;
  virtual void End(const MessageSummary& summary) = 0;
  // The closing line of a capture: what was read from the file at `path`.
  virtual void Capture(std::string_view path, const CaptureCounts& counts) = 0;
};

// The blanks a label is indented by.
std::string_view LeadingBlanks(std::string_view text);
// A decoded field's number as JSON gives it: signed where its format prints
// it signed; none for a field wider than the 32 bits of its number.
std::optional<int64_t> FieldNumber(const host::DecodedFieldView& field,
                                   const FieldDictionary& dictionary);

std::unique_ptr<MessagePrinter> MakeTextPrinter(fmt::memory_buffer& out);
// Signed numbers are told by `dictionary`.
std::unique_ptr<MessagePrinter> MakeJsonPrinter(fmt::memory_buffer& out,
                                                const FieldDictionary& dictionary);

// `printer`, formatting into `writer`'s buffer, with the writer told of every
// line and message it completes.
std::unique_ptr<MessagePrinter> MakeWritingPrinter(std::unique_ptr<MessagePrinter> printer,
                                                   OutputWriter& writer);

}  // namespace rnsap::cli
