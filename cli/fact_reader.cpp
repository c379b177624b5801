#include "cli/fact_reader.h"

namespace rnsap::cli {
namespace {

constexpr std::string_view kPduType = "PDU Type";
constexpr std::string_view kProcedureCode = "Procedure Code";

std::optional<uint32_t> Number(const MessageFacts& facts, std::string_view name) {
  const KeyValue* key = facts.Key(name);
  return key ? std::optional(key->number) : std::nullopt;
}

}  // namespace

FactReader::FactReader(const FieldDictionary& dictionary)
    : dictionary_(dictionary),
      pduTypeId_(dictionary.KeyFieldId(kPduType)),
      procedureCodeId_(dictionary.KeyFieldId(kProcedureCode)) {
  for (size_t cause = 0; cause < kCauseKeys.size(); ++cause) {
    causeIds_[cause] = dictionary.KeyFieldId(kCauseKeys[cause]);
  }
}

void FactReader::ReadHeader(MessageFacts& facts) const {
  const std::optional<uint32_t> pduType = Number(facts, kPduType);
  facts.kind = pduType ? std::optional(static_cast<MessageKind>(*pduType & 3)) : std::nullopt;
  facts.kindName =
      pduType && pduTypeId_ ? dictionary_.ValueName(*pduTypeId_, *pduType) : std::string_view();
  facts.procedureCode = Number(facts, kProcedureCode);
  facts.procedure = facts.procedureCode && procedureCodeId_
                        ? dictionary_.ValueName(*procedureCodeId_, *facts.procedureCode)
                        : std::string_view();
  facts.transactionId = Number(facts, "ShortTransActionId");
  if (!facts.transactionId) facts.transactionId = Number(facts, "LongTransActionId");
  facts.cause = {};
  for (size_t cause = 0; cause < kCauseKeys.size(); ++cause) {
    if (const KeyValue* key = facts.Key(kCauseKeys[cause])) {
      if (causeIds_[cause]) facts.cause = dictionary_.ValueName(*causeIds_[cause], key->number);
      break;
    }
  }
}

}  // namespace rnsap::cli
