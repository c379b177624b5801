#include "cli/ue_traces.h"

#include <algorithm>
#include <array>

#include "cli/fact_columns.h"

namespace rnsap::cli {
namespace {

constexpr std::array<std::string_view, 3> kUeKeys = {"S_RNTI", "D_RNTI", "IMSI"};

std::vector<std::string> IdentifiersOf(const MessageFacts& facts) {
  std::vector<std::string> identifiers;
  if (facts.origin != nullptr && facts.origin->connection != 0) {
    identifiers.push_back("connection=" + std::to_string(facts.origin->connection));
  }
  for (const std::string_view name : kUeKeys) {
    if (const KeyValue* key = facts.Key(name)) {
      identifiers.push_back(std::string(name) + "=" + KeyText(*key));
    }
  }
  return identifiers;
}

}  // namespace

UeTraces::UeTraces(fmt::memory_buffer& out, std::string selector, size_t contextLimit,
                   size_t messageLimit)
    : out_(out),
      selector_(std::move(selector)),
      contextLimit_(contextLimit),
      messageLimit_(messageLimit) {}

void UeTraces::Add(const MessageFacts& facts) {
  const std::vector<std::string> identifiers = IdentifiersOf(facts);
  if (identifiers.empty()) return;
  Context& context = contexts_[Join(identifiers)];
  if (context.steps.size() >= messageLimit_) {
    ++context.dropped;
  } else {
    context.steps.push_back({facts.frame ? facts.frame->number : facts.index + 1,
                             facts.microseconds(), facts.procedure, facts.kindName,
                             facts.transactionId, facts.cause});
  }
  while (contexts_.size() > contextLimit_) {
    const auto oldest = std::min_element(contexts_.begin(), contexts_.end(), [](auto& a, auto& b) {
      return a.second.lastUse < b.second.lastUse;
    });
    PrintAndForget(oldest->first);
  }
}

// The context of any of `identifiers`, contexts they tie together made one,
// or a new one; it takes every identifier.
uint64_t UeTraces::Join(const std::vector<std::string>& identifiers) {
  uint64_t number = 0;
  for (const std::string& identifier : identifiers) {
    const auto found = byIdentifier_.find(identifier);
    if (found == byIdentifier_.end() || found->second == number) continue;
    if (number == 0) {
      number = found->second;
    } else {
      const uint64_t other = found->second;
      Absorb(std::min(number, other), std::max(number, other));
      number = std::min(number, other);
    }
  }
  if (number == 0) number = nextNumber_++;
  Context& context = contexts_[number];
  context.lastUse = ++uses_;
  for (const std::string& identifier : identifiers) {
    const auto [at, made] = byIdentifier_.try_emplace(identifier, number);
    if (made) context.identifiers.push_back(identifier);
  }
  return number;
}

void UeTraces::Absorb(uint64_t into, uint64_t from) {
  Context& target = contexts_[into];
  Context& source = contexts_[from];
  for (const std::string& identifier : source.identifiers) {
    byIdentifier_[identifier] = into;
    target.identifiers.push_back(identifier);
  }
  target.steps.insert(target.steps.end(), source.steps.begin(), source.steps.end());
  std::stable_sort(target.steps.begin(), target.steps.end(),
                   [](const Step& a, const Step& b) { return a.frame < b.frame; });
  if (target.steps.size() > messageLimit_) {
    target.dropped += target.steps.size() - messageLimit_;
    target.steps.resize(messageLimit_);
  }
  target.dropped += source.dropped;
  contexts_.erase(from);
}

void UeTraces::PrintAndForget(uint64_t number) {
  const Context& context = contexts_.at(number);
  const bool selected =
      selector_.empty() || std::find(context.identifiers.begin(), context.identifiers.end(),
                                     selector_) != context.identifiers.end();
  if (selected) {
    const auto to = fmt::appender(out_);
    fmt::format_to(to, "UE context {}: {}\n", number, fmt::join(context.identifiers, " "));
    int64_t previous = context.steps.empty() ? 0 : context.steps.front().microseconds;
    for (const Step& step : context.steps) {
      const int64_t since = step.microseconds - previous;
      previous = step.microseconds;
      fmt::format_to(to, "  frame {} +{}.{:06} {}", step.frame, since / 1000000, since % 1000000,
                     step.procedure.empty() ? "-" : step.procedure);
      if (!step.kind.empty()) fmt::format_to(to, " {}", step.kind);
      if (step.transactionId) fmt::format_to(to, " tid {}", *step.transactionId);
      if (!step.cause.empty()) fmt::format_to(to, " cause={}", step.cause);
      out_.push_back('\n');
    }
    if (context.dropped != 0) fmt::format_to(to, "  … {} more messages\n", context.dropped);
  }
  for (const std::string& identifier : context.identifiers) byIdentifier_.erase(identifier);
  contexts_.erase(number);
}

void UeTraces::Finish() {
  while (!contexts_.empty()) PrintAndForget(contexts_.begin()->first);
}

}  // namespace rnsap::cli
