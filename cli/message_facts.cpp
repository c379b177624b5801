#include "cli/message_facts.h"

#include <fmt/compile.h>

#include <charconv>

namespace rnsap::cli {
namespace {

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

void AppendKeyText(const KeyValue& key, fmt::memory_buffer& out) {
  const auto to = fmt::appender(out);
  if (!key.variable) {
    fmt::format_to(to, FMT_COMPILE("{}"), key.number);
    return;
  }
  const std::string_view hex = key.hex;
  uint64_t number = 0;
  if (key.bits <= kWidestNumber && !hex.empty() &&
      std::from_chars(hex.data(), hex.data() + hex.size(), number, 16).ec == std::errc()) {
    fmt::format_to(to, FMT_COMPILE("{}"), number);
    return;
  }
  const size_t digits = (key.bits + 3) / 4;
  out.append(digits < hex.size() ? hex.substr(hex.size() - digits) : hex);
}

std::string KeyText(const KeyValue& key) {
  fmt::memory_buffer text;
  AppendKeyText(key, text);
  return fmt::to_string(text);
}

}  // namespace rnsap::cli
