#include "cli/message_header.h"

namespace rnsap::cli {
namespace {

constexpr std::string_view kProcedureCode = "Procedure Code";
constexpr std::string_view kPduType = "PDU Type";
constexpr std::string_view kTransactionIds[] = {"ShortTransActionId", "LongTransActionId"};

}  // namespace

MessageHeaderReader::MessageHeaderReader(const FieldDictionary& dictionary)
    : dictionary_(dictionary),
      procedureCodeId_(dictionary.KeyFieldId(kProcedureCode)),
      pduTypeId_(dictionary.KeyFieldId(kPduType)) {}

MessageHeader MessageHeaderReader::Read(std::span<const KeyValue> keys) const {
  MessageHeader header;
  for (const KeyValue& key : keys) {
    if (key.name == kProcedureCode && procedureCodeId_) {
      header.procedureCode = key.number;
      header.procedure = dictionary_.ValueName(*procedureCodeId_, key.number);
    } else if (key.name == kPduType && pduTypeId_) {
      header.kind = dictionary_.ValueName(*pduTypeId_, key.number);
    } else if (key.name == kTransactionIds[0] || key.name == kTransactionIds[1]) {
      header.transactionId = key.number;
    }
  }
  return header;
}

}  // namespace rnsap::cli
