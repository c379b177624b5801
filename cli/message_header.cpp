#include "cli/message_header.h"

namespace rnsap::cli {
namespace {

constexpr std::string_view kKeyNames[] = {"Procedure Code", "PDU Type", "ShortTransActionId",
                                          "LongTransActionId"};

}  // namespace

MessageHeaderReader::MessageHeaderReader(const FieldDictionary& dictionary,
                                         const KeySizeClasses& sizeClasses)
    : dictionary_(dictionary),
      procedureCodeId_(dictionary.KeyFieldId(kKeyNames[kProcedureCode])),
      pduTypeId_(dictionary.KeyFieldId(kKeyNames[kPduType])) {
  for (size_t key = 0; key < kKeyCount; ++key) {
    const auto found = sizeClasses.find(kKeyNames[key]);
    if (found != sizeClasses.end()) sizeClasses_[key] = found->second;
  }
}

MessageHeader MessageHeaderReader::Read(std::span<const KeyFieldRow> table,
                                        std::span<const uint8_t> keyBuffer) {
  if (table.data() != rowsTable_) FindRows(table);
  MessageHeader header;
  header.procedureCode = Value(kProcedureCode, table, keyBuffer);
  if (header.procedureCode && procedureCodeId_)
    header.procedure = dictionary_.ValueName(*procedureCodeId_, *header.procedureCode);
  const std::optional<uint32_t> pduType = Value(kPduType, table, keyBuffer);
  if (pduType && pduTypeId_) header.kind = dictionary_.ValueName(*pduTypeId_, *pduType);
  header.transactionId = Value(kShortTransactionId, table, keyBuffer);
  if (!header.transactionId) header.transactionId = Value(kLongTransactionId, table, keyBuffer);
  return header;
}

// Keys of a size class that no fixed slot has are left out.
void MessageHeaderReader::FindRows(std::span<const KeyFieldRow> table) {
  rowsTable_ = table.data();
  rows_.fill(std::nullopt);
  for (uint32_t row = 0; row < table.size(); ++row) {
    for (size_t key = 0; key < kKeyCount; ++key) {
      const bool fixed = sizeClasses_[key] == 1 || sizeClasses_[key] == 2;
      if (fixed && table[row].keyName == kKeyNames[key]) rows_[key] = row;
    }
  }
}

std::optional<uint32_t> MessageHeaderReader::Value(HeaderKey key,
                                                   std::span<const KeyFieldRow> table,
                                                   std::span<const uint8_t> keyBuffer) const {
  if (!rows_[key]) return std::nullopt;
  return ReadFixedKey(table[*rows_[key]], *rows_[key], keyBuffer, sizeClasses_[key]);
}

}  // namespace rnsap::cli
