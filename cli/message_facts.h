// What the Key-field pass and the frame tell of one message, without a full
// decode: procedure, message kind, transaction id, the key fields present,
// where it came from, and whether it was flagged or cut off.
#pragma once

#include <fmt/format.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/capture_input.h"
#include "cli/key_rows.h"

namespace rnsap::cli {

// The PDU Type of a message: 0 InitiatingMessage, 1 SuccessfulOutcome,
// 2 UnsuccessfulOutcome, 3 Outcome.
enum class MessageKind : uint8_t { kInitiating, kSuccessful, kUnsuccessful, kOutcome };

struct MessageFacts {
  size_t index = 0;                       // among the messages read, from 0
  std::string_view source;                // the capture file, or where a hex message stood
  const FrameStamp* frame = nullptr;      // of a message read from a capture
  const MessageOrigin* origin = nullptr;  // likewise
  std::optional<MessageKind> kind;        // absent when the PDU Type was not read
  std::optional<uint32_t> procedureCode;
  std::optional<uint32_t> transactionId;
  std::string_view kindName;   // the value name of the PDU Type, such as "InitiatingMessage"
  std::string_view procedure;  // the value name of the procedure code
  std::string_view cause;      // the value name of the cause, "" without one
  std::vector<KeyValue> keys;  // in key-field table order
  uint32_t flags = 0;          // the error flags the pass left
  bool cutOff = false;         // the frame was captured short

  bool flagged() const { return flags != 0; }
  const KeyValue* Key(std::string_view name) const;
  // Capture time in microseconds since the epoch; 0 for a hex message.
  int64_t microseconds() const;
};

// Appends a key's value as text: a fixed slot or a variable key of up to 32
// bits in decimal, a longer one (IMSI) as its hex digits.
void AppendKeyText(const KeyValue& key, fmt::memory_buffer& out);
std::string KeyText(const KeyValue& key);

}  // namespace rnsap::cli
