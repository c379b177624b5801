#include "cli/message_list.h"

#include <fmt/compile.h>

#include <string_view>

#include "cli/json.h"
#include "cli/line_writer.h"

namespace rnsap::cli {
namespace {

void AppendTerminalText(std::string_view text, fmt::memory_buffer& out) {
  LineWriter(out, TerminalTextBound(text.size())).Terminal(text);
}

// The keys of the UE and its radio links that the packet list shows.
bool IsUeOrRadioLinkKey(std::string_view name) {
  return name == "S_RNTI" || name == "D_RNTI" || name == "IMSI" || name == "C_ID" ||
         name.starts_with("RL_ID");
}

void AppendSide(const NetworkEndpoint& endpoint, bool hasPointCode, uint32_t pointCode,
                fmt::memory_buffer& out) {
  const size_t start = out.size();
  AppendEndpoint(endpoint, out);
  const bool hasAddress = out.size() > start;
  if (hasPointCode) {
    fmt::format_to(fmt::appender(out), FMT_COMPILE("{}pc {}{}"), hasAddress ? " (" : "", pointCode,
                   hasAddress ? ")" : "");
  } else if (!hasAddress) {
    out.push_back('?');
  }
}

// A CSV cell, in quotes when it holds a separator, quote or line break.
void AppendCsvCell(std::string_view text, fmt::memory_buffer& out) {
  if (text.find_first_of(",\"\r\n") == std::string_view::npos) return out.append(text);
  out.push_back('"');
  for (const char c : text) {
    if (c == '"') out.push_back('"');
    out.push_back(c);
  }
  out.push_back('"');
}

}  // namespace

void SummaryPrinter::Print(const MessageFacts& facts) {
  PrintFrom(facts);
  const auto out = fmt::appender(out_);
  fmt::format_to(out, FMT_COMPILE(" {}"), facts.procedure.empty() ? "-" : facts.procedure);
  if (!facts.kindName.empty()) fmt::format_to(out, FMT_COMPILE(" {}"), facts.kindName);
  if (facts.transactionId) fmt::format_to(out, FMT_COMPILE(" tid {}"), *facts.transactionId);
  for (const KeyValue& key : facts.keys) {
    if (!IsUeOrRadioLinkKey(key.name)) continue;
    fmt::format_to(out, FMT_COMPILE(" {}="), key.name);
    AppendKeyText(key, out_);
  }
  if (!facts.cause.empty()) fmt::format_to(out, FMT_COMPILE(" cause={}"), facts.cause);
  if (facts.flagged()) out_.append(std::string_view(" flagged"));
  if (facts.cutOff) out_.append(std::string_view(" cut-off"));
  out_.push_back('\n');
}

void SummaryPrinter::PrintFrom(const MessageFacts& facts) {
  const auto out = fmt::appender(out_);
  if (facts.origin == nullptr) {
    fmt::format_to(out, FMT_COMPILE("{} "), facts.index + 1);
    AppendTerminalText(facts.source, out_);
    return;
  }
  const MessageOrigin& origin = *facts.origin;
  if (firstMicroseconds_ < 0) firstMicroseconds_ = facts.microseconds();
  const int64_t since = facts.microseconds() - firstMicroseconds_;
  fmt::format_to(out, FMT_COMPILE("{} {}.{:06} "), facts.frame->number, since / 1000000,
                 since % 1000000);
  AppendSide(origin.source, origin.hasPointCodes, origin.opc, out_);
  out_.append(std::string_view(" -> "));
  AppendSide(origin.destination, origin.hasPointCodes, origin.dpc, out_);
  fmt::format_to(out, FMT_COMPILE(" {}"), SccpMessageKindName(origin.sccpKind));
  if (origin.connection != 0) fmt::format_to(out, FMT_COMPILE(" conn {}"), origin.connection);
}

ColumnPrinter::ColumnPrinter(fmt::memory_buffer& out, const std::vector<std::string>& columns,
                             ColumnFormat format)
    : out_(out), format_(format) {
  for (const std::string& name : columns) {
    columns_.emplace_back(name);
    jsonNames_.push_back(JsonString(name));
  }
  if (format_ == ColumnFormat::kJson) return;
  for (size_t at = 0; at < columns_.size(); ++at) Cell(at, columns_[at].name(), true);
  out_.push_back('\n');
}

void ColumnPrinter::Print(const MessageFacts& facts) {
  if (format_ == ColumnFormat::kJson) out_.push_back('{');
  for (size_t at = 0; at < columns_.size(); ++at) {
    cell_.clear();
    const bool present = columns_[at].Append(facts, cell_);
    Cell(at, {cell_.data(), cell_.size()}, present);
  }
  if (format_ == ColumnFormat::kJson) out_.push_back('}');
  out_.push_back('\n');
}

void ColumnPrinter::Cell(size_t at, std::string_view text, bool present) {
  if (at != 0) out_.push_back(format_ == ColumnFormat::kTsv ? '\t' : ',');
  switch (format_) {
    case ColumnFormat::kTsv:
      return AppendTerminalText(text, out_);
    case ColumnFormat::kCsv:
      return AppendCsvCell(text, out_);
    case ColumnFormat::kJson:
      out_.append(jsonNames_[at]);
      out_.push_back(':');
      if (!present) return out_.append(std::string_view("null"));
      LineWriter(out_, JsonStringBound(text.size())).Json(text);
  }
}

}  // namespace rnsap::cli
