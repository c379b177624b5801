// What one pass made of one message, and its two printed forms: text for a
// reader, or one JSON object per line for a program.
#pragma once

#include <cstdint>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>
#include <vector>

#include "cli/capture_input.h"
#include "cli/key_rows.h"
#include "cli/options.h"
#include "host/recorder.h"

namespace rnsap::cli {

struct MessageOutcome {
  size_t index = 0;                 // of the message among those decoded, from 0
  std::string origin;               // where the message came from
  std::optional<FrameStamp> frame;  // of a message read from a capture
  uint32_t octets = 0;
  Pass pass = Pass::kDecode;
  int32_t result = 0;  // the pass's result; 1 or 0 for the boolean passes
  uint32_t bitsLeftOut = 0;
  uint32_t position = 0;
  uint32_t flags = 0;
  int32_t verdict = 0;  // the Validation pass's verdict
  std::vector<host::DecodedFieldReport> fields;
  std::vector<host::DisplayLine> displayLines;
  std::vector<KeyValue> keys;
};

void PrintText(const MessageOutcome& outcome, std::ostream& out);
void PrintJson(const MessageOutcome& outcome, std::ostream& out);

// The closing line of a capture: what was read from the file at `path`.
void PrintCaptureCountsText(std::string_view path, const CaptureCounts& counts, std::ostream& out);
void PrintCaptureCountsJson(std::string_view path, const CaptureCounts& counts, std::ostream& out);

}  // namespace rnsap::cli
