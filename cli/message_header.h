// What a message's frame says, as a query wants it beside the fields: its
// procedure, kind and transaction id, read from the keys of the Key-field
// pass and named by the field dictionary.
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "cli/field_dictionary.h"
#include "cli/key_rows.h"

namespace rnsap::cli {

struct MessageHeader {
  std::optional<uint32_t> procedureCode;
  std::string_view procedure;  // the code's value name, such as "id_radioLinkSetup"; may be empty
  std::string_view kind;  // the PDU Type's value name, such as "InitiatingMessage"; may be empty
  std::optional<uint32_t> transactionId;  // short or long
};

class MessageHeaderReader {
 public:
  explicit MessageHeaderReader(const FieldDictionary& dictionary);

  // A key that the message did not reach stays empty.
  MessageHeader Read(std::span<const KeyValue> keys) const;

 private:
  const FieldDictionary& dictionary_;
  std::optional<uint32_t> procedureCodeId_, pduTypeId_;
};

}  // namespace rnsap::cli
