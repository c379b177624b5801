// The named values of a message's facts, as filters test them and the field
// selection prints them: the frame's columns, the header's, and every key
// field by its name.
#pragma once

#include <fmt/format.h>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cli/message_facts.h"

namespace rnsap::cli {

// "frame", "time", "source", "destination", "opc", "dpc", "sccp",
// "connection", "relation", "procedure", "code", "kind", "transaction",
// "cause", "flagged", "cutoff".
const std::vector<std::string_view>& FrameAndHeaderColumns();

// Whether `name` is a column or one of `keyNames`; if not, the error that
// lists the known names.
std::optional<std::string> UnknownColumn(std::string_view name,
                                         const std::vector<std::string>& keyNames);

// A column found by its name once, read from each message's facts.
class FactColumn {
 public:
  // `name` is one of FrameAndHeaderColumns(), else taken as a key field's.
  explicit FactColumn(std::string name);

  const std::string& name() const { return name_; }
  // Appends the column's text in `facts` to `out`; false, with nothing
  // appended, when the message has none.
  bool Append(const MessageFacts& facts, fmt::memory_buffer& out) const;

 private:
  using Writer = bool (*)(const MessageFacts&, fmt::memory_buffer&);

  std::string name_;
  Writer writer_ = nullptr;  // null for a key field
};

// Appends "address:port" ("[address]:port" for IPv6); nothing without IP.
void AppendEndpoint(const NetworkEndpoint& endpoint, fmt::memory_buffer& out);

}  // namespace rnsap::cli
