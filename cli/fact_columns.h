// The named values of a message's facts, as filters test them and the field
// selection prints them: the frame's columns, the header's, and every key
// field by its name.
#pragma once

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

// Whether `name` is a column or a key field of `reader`; if not, the error
// that lists the known names.
std::optional<std::string> UnknownColumn(std::string_view name,
                                         const std::vector<std::string>& keyNames);

// The value of column `name` in `facts`; nullopt when the message has none.
std::optional<std::string> ColumnText(const MessageFacts& facts, std::string_view name);

// An endpoint as "address:port" ("[address]:port" for IPv6); "" without IP.
std::string EndpointText(const NetworkEndpoint& endpoint);

}  // namespace rnsap::cli
