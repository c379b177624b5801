// What a message's frame says, as a query wants it beside the fields: its
// procedure, kind and transaction id, read from the key buffer of the
// Key-field pass and named by the field dictionary.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

#include "cli/field_dictionary.h"
#include "cli/key_rows.h"
#include "contract/decode_state.h"

namespace rnsap::cli {

struct MessageHeader {
  std::optional<uint32_t> procedureCode;
  std::string_view procedure;  // the code's value name, such as "id_radioLinkSetup"; may be empty
  std::string_view kind;  // the PDU Type's value name, such as "InitiatingMessage"; may be empty
  std::optional<uint32_t> transactionId;  // short or long
};

class MessageHeaderReader {
 public:
  MessageHeaderReader(const FieldDictionary& dictionary, const KeySizeClasses& sizeClasses);

  // The header keys in `keyBuffer`, through the key-field table `table` that
  // the host library laid out; a key that the message did not reach stays
  // empty.
  MessageHeader Read(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer);

 private:
  enum HeaderKey { kProcedureCode, kPduType, kShortTransactionId, kLongTransactionId, kKeyCount };

  void FindRows(std::span<const KeyFieldRow> table);
  std::optional<uint32_t> Value(HeaderKey key, std::span<const KeyFieldRow> table,
                                std::span<const uint8_t> keyBuffer) const;

  const FieldDictionary& dictionary_;
  std::array<uint32_t, kKeyCount> sizeClasses_{};
  std::array<std::optional<uint32_t>, kKeyCount> rows_;  // of the table the rows were found in
  const KeyFieldRow* rowsTable_ = nullptr;
  std::optional<uint32_t> procedureCodeId_, pduTypeId_;
};

}  // namespace rnsap::cli
