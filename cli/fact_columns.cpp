#include "cli/fact_columns.h"

#include <fmt/compile.h>

#include <algorithm>
#include <utility>

namespace rnsap::cli {
namespace {

using Out = fmt::memory_buffer;

template <typename Value>
bool Append(Out& out, const Value& value) {
  fmt::format_to(fmt::appender(out), FMT_COMPILE("{}"), value);
  return true;
}

template <typename Number>
bool AppendIf(Out& out, const std::optional<Number>& number) {
  return number && Append(out, *number);
}

bool AppendNonEmpty(Out& out, std::string_view text) { return !text.empty() && Append(out, text); }

bool FromCapture(const MessageFacts& facts) { return facts.origin != nullptr; }

bool AppendPointCode(Out& out, const MessageOrigin& origin, uint32_t code) {
  if (origin.hasPointCodes) Append(out, code);
  return true;
}

using Writer = bool (*)(const MessageFacts&, Out&);
using Column = std::pair<std::string_view, Writer>;

constexpr Column kColumns[] = {
    {"frame", [](const MessageFacts& f,
                 Out& out) { return FromCapture(f) && Append(out, f.frame->number); }},
    {"time",
     [](const MessageFacts& f, Out& out) {
       if (!FromCapture(f)) return false;
       fmt::format_to(fmt::appender(out), FMT_COMPILE("{}.{:06}"), f.frame->seconds,
                      f.frame->nanoseconds / 1000);
       return true;
     }},
    {"source",
     [](const MessageFacts& f, Out& out) {
       if (FromCapture(f)) AppendEndpoint(f.origin->source, out);
       return FromCapture(f);
     }},
    {"destination",
     [](const MessageFacts& f, Out& out) {
       if (FromCapture(f)) AppendEndpoint(f.origin->destination, out);
       return FromCapture(f);
     }},
    {"opc",
     [](const MessageFacts& f, Out& out) {
       return FromCapture(f) && AppendPointCode(out, *f.origin, f.origin->opc);
     }},
    {"dpc",
     [](const MessageFacts& f, Out& out) {
       return FromCapture(f) && AppendPointCode(out, *f.origin, f.origin->dpc);
     }},
    {"sccp",
     [](const MessageFacts& f, Out& out) {
       return FromCapture(f) && Append(out, SccpMessageKindName(f.origin->sccpKind));
     }},
    {"connection", [](const MessageFacts& f,
                      Out& out) { return FromCapture(f) && Append(out, f.origin->connection); }},
    {"relation", [](const MessageFacts& f,
                    Out& out) { return FromCapture(f) && Append(out, f.origin->relation); }},
    {"procedure", [](const MessageFacts& f, Out& out) { return AppendNonEmpty(out, f.procedure); }},
    {"code", [](const MessageFacts& f, Out& out) { return AppendIf(out, f.procedureCode); }},
    {"kind", [](const MessageFacts& f, Out& out) { return AppendNonEmpty(out, f.kindName); }},
    {"transaction", [](const MessageFacts& f, Out& out) { return AppendIf(out, f.transactionId); }},
    {"cause", [](const MessageFacts& f, Out& out) { return AppendNonEmpty(out, f.cause); }},
    {"flagged",
     [](const MessageFacts& f, Out& out) { return Append(out, f.flagged() ? '1' : '0'); }},
    {"cutoff", [](const MessageFacts& f, Out& out) { return Append(out, f.cutOff ? '1' : '0'); }},
};

Writer WriterOf(std::string_view name) {
  for (const auto& [column, writer] : kColumns) {
    if (column == name) return writer;
  }
  return nullptr;
}

}  // namespace

const std::vector<std::string_view>& FrameAndHeaderColumns() {
  static const std::vector<std::string_view> names = [] {
    std::vector<std::string_view> all;
    for (const Column& column : kColumns) all.push_back(column.first);
    return all;
  }();
  return names;
}

std::optional<std::string> UnknownColumn(std::string_view name,
                                         const std::vector<std::string>& keyNames) {
  if (WriterOf(name) != nullptr ||
      std::find(keyNames.begin(), keyNames.end(), name) != keyNames.end()) {
    return std::nullopt;
  }
  std::string known = fmt::format("{}", fmt::join(FrameAndHeaderColumns(), ", "));
  for (const std::string& key : keyNames) known += ", " + key;
  return "unknown field '" + std::string(name) + "'; the known fields are: " + known;
}

FactColumn::FactColumn(std::string name) : name_(std::move(name)), writer_(WriterOf(name_)) {}

bool FactColumn::Append(const MessageFacts& facts, fmt::memory_buffer& out) const {
  if (writer_ != nullptr) return writer_(facts, out);
  const KeyValue* key = facts.Key(name_);
  if (key != nullptr) AppendKeyText(*key, out);
  return key != nullptr;
}

void AppendEndpoint(const NetworkEndpoint& endpoint, fmt::memory_buffer& out) {
  const auto to = fmt::appender(out);
  if (endpoint.ipVersion == 4) {
    fmt::format_to(to, FMT_COMPILE("{}:{}"), IpAddressText(endpoint), endpoint.port);
  } else if (endpoint.ipVersion == 6) {
    fmt::format_to(to, FMT_COMPILE("[{}]:{}"), IpAddressText(endpoint), endpoint.port);
  }
}

}  // namespace rnsap::cli
