#include "cli/message_facts.h"

#include <array>

namespace rnsap::cli {
namespace {

constexpr std::array<std::string_view, 4> kKindNames = {"InitiatingMessage", "SuccessfulOutcome",
                                                        "UnsuccessfulOutcome", "Outcome"};

constexpr uint32_t kWidestNumber = 32;

}  // namespace

const KeyValue* MessageFacts::Key(std::string_view name) const {
  for (const KeyValue& key : keys) {
    if (key.name == name) return &key;
  }
  return nullptr;
}

int64_t MessageFacts::microseconds() const {
  if (frame == nullptr) return 0;
  return frame->seconds * 1000000 + frame->nanoseconds / 1000;
}

std::string_view MessageKindName(MessageKind kind) { return kKindNames[static_cast<size_t>(kind)]; }

std::string KeyText(const KeyValue& key) {
  if (!key.variable) return std::to_string(key.number);
  if (key.bits <= kWidestNumber && !key.hex.empty()) {
    return std::to_string(std::stoul(key.hex, nullptr, 16));
  }
  const size_t digits = (key.bits + 3) / 4;
  return digits < key.hex.size() ? key.hex.substr(key.hex.size() - digits) : key.hex;
}

}  // namespace rnsap::cli
