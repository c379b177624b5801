#include "cli/message_filter.h"

#include <charconv>
#include <stdexcept>

#include "cli/fact_columns.h"

namespace rnsap::cli {
namespace {

uint64_t FrameNumber(std::string_view text, std::string_view range) {
  uint64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size() || number == 0) {
    throw std::invalid_argument("bad frame range '" + std::string(range) +
                                "': frames are numbered from 1");
  }
  return number;
}

// The frame a message is counted under: its capture frame, or its place among
// the hex messages, from 1.
uint64_t FrameOf(const MessageFacts& facts) {
  return facts.frame ? facts.frame->number : facts.index + 1;
}

}  // namespace

MessageFilter::MessageFilter(const FilterSettings& settings,
                             const std::vector<std::string>& keyNames)
    : limit_(settings.limit) {
  for (const std::string& condition : settings.conditions) {
    const size_t equals = condition.find('=');
    if (equals == std::string::npos) {
      throw std::invalid_argument("filter '" + condition + "' is not NAME=VALUE");
    }
    const std::string name = condition.substr(0, equals);
    if (const auto unknown = UnknownColumn(name, keyNames)) {
      throw std::invalid_argument("filter '" + condition + "': " + *unknown);
    }
    conditions_.push_back({FactColumn(name), condition.substr(equals + 1)});
  }
  const std::string_view range = settings.frames;
  if (range.empty()) return;
  const size_t dash = range.find('-');
  const std::string_view first = range.substr(0, dash);
  if (!first.empty()) firstFrame_ = FrameNumber(first, range);
  if (dash == std::string_view::npos) {
    lastFrame_ = firstFrame_;
  } else if (dash + 1 < range.size()) {
    lastFrame_ = FrameNumber(range.substr(dash + 1), range);
  }
}

bool MessageFilter::Take(const MessageFacts& facts) {
  if (Full() || !Holds(facts)) return false;
  ++taken_;
  return true;
}

bool MessageFilter::Holds(const MessageFacts& facts) {
  const uint64_t frame = FrameOf(facts);
  if (frame < firstFrame_ || frame > lastFrame_) return false;
  for (const Condition& condition : conditions_) {
    text_.clear();
    if (!condition.column.Append(facts, text_) ||
        std::string_view(text_.data(), text_.size()) != condition.value) {
      return false;
    }
  }
  return true;
}

}  // namespace rnsap::cli
