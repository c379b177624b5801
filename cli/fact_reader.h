// Names what a message's keys tell of its frame: its kind, procedure,
// transaction id and cause, with the value names of the module's tables.
#pragma once

#include <array>
#include <optional>
#include <string_view>

#include "cli/field_dictionary.h"
#include "cli/message_facts.h"

namespace rnsap::cli {

// The key rows of a cause; the one present names it.
inline constexpr std::array<std::string_view, 6> kCauseKeys = {
    "CauseRadioNetwork", "CauseRadioNetworkExt", "CauseTransport", "CauseProtocol",
    "CauseMisc",         "CauseMiscExt"};

class FactReader {
 public:
  explicit FactReader(const FieldDictionary& dictionary);

  // Fills in the kind, procedure, transaction id and cause of `facts` from
  // its keys.
  void ReadHeader(MessageFacts& facts) const;

 private:
  const FieldDictionary& dictionary_;
  std::optional<uint32_t> pduTypeId_, procedureCodeId_;
  std::array<std::optional<uint32_t>, kCauseKeys.size()> causeIds_;
};

}  // namespace rnsap::cli
