#include "cli/fact_reader.h"

#include <array>

namespace rnsap::cli {
namespace {

// The key rows of a cause; the one present names it.
constexpr std::array<std::string_view, 6> kCauseKeys = {"CauseRadioNetwork", "CauseRadioNetworkExt",
                                                        "CauseTransport",    "CauseProtocol",
                                                        "CauseMisc",         "CauseMiscExt"};

}  // namespace

FactReader::FactReader(const LoadedModule& module, MessageDecoder& decoder)
    : decoder_(decoder), names_(module) {
  for (const auto& [name, sizeClass] : ReadKeySizeClasses(module.dictionary())) {
    keyNames_.push_back(name);
  }
}

const MessageFacts& FactReader::Read(size_t index, std::string_view source, const FrameStamp* frame,
                                     const MessageOrigin* origin, std::span<const uint8_t> octets) {
  facts_.index = index;
  facts_.source = source;
  facts_.frame = frame;
  facts_.origin = origin;
  facts_.flags = decoder_.ExtractKeys(octets, facts_.keys).flags;
  facts_.cutOff = frame != nullptr && frame->cutOff;
  ReadHeader();
  return facts_;
}

void FactReader::ReadHeader() {
  const auto number = [&](std::string_view name) -> std::optional<uint32_t> {
    const KeyValue* key = facts_.Key(name);
    return key ? std::optional(key->number) : std::nullopt;
  };
  const std::optional<uint32_t> pduType = number("PDU Type");
  facts_.kind = pduType ? std::optional(static_cast<MessageKind>(*pduType & 3)) : std::nullopt;
  facts_.procedureCode = number("Procedure Code");
  facts_.procedure = facts_.procedureCode ? names_.Name("Procedure Code", *facts_.procedureCode)
                                          : std::string_view();
  facts_.transactionId = number("ShortTransActionId");
  if (!facts_.transactionId) facts_.transactionId = number("LongTransActionId");
  facts_.cause = {};
  for (const std::string_view causeKey : kCauseKeys) {
    if (const KeyValue* key = facts_.Key(causeKey)) {
      facts_.cause = names_.Name(causeKey, key->number);
      break;
    }
  }
}

}  // namespace rnsap::cli
