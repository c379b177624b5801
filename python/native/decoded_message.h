// What one pass makes of one message, kept as values for Python to read: the
// same reports, keys and summary that rnsap-decode prints.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "cli/capture_input.h"
#include "cli/key_rows.h"
#include "cli/options.h"
#include "cli/report.h"
#include "contract/decode_state.h"

namespace rnsap::python {

struct DecodedField {
  uint32_t fieldId = 0;
  std::string label;   // without the blanks it is indented by
  uint32_t depth = 0;  // the blanks it is indented by
  std::string text;
  std::optional<int64_t> value;  // none for a field wider than 32 bits
  std::vector<BitSegment> segments;
  uint32_t firstSegment = 0;
  uint32_t bitOrderGroup = 0;
};

struct DisplayedLine {
  uint32_t displayId = 0;
  std::string text;
};

struct DecodedMessage {
  cli::Pass pass = cli::Pass::kDecode;
  std::vector<uint8_t> octets;
  std::vector<DecodedField> fields;
  std::vector<DisplayedLine> lines;
  std::vector<cli::KeyValue> keys;
  cli::MessageSummary summary;
  std::optional<cli::FrameStamp> frame;  // of a message read from a capture, with its origin
  cli::MessageOrigin origin;
};

// Runs `pass` over `octets` through the shared decoder and keeps what it reports.
DecodedMessage DecodeMessage(cli::Pass pass, std::vector<uint8_t> octets);

}  // namespace rnsap::python
