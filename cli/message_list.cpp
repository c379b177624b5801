#include "cli/message_list.h"

#include <string_view>

#include "cli/fact_columns.h"
#include "cli/json.h"
#include "cli/terminal_text.h"

namespace rnsap::cli {
namespace {

std::string SafeText(std::string_view text) {
  std::string safe(TerminalTextBound(text.size()), '\0');
  safe.resize(static_cast<size_t>(WriteTerminalText(text, safe.data()) - safe.data()));
  return safe;
}

// The keys of the UE and its radio links that the packet list shows.
bool IsUeOrRadioLinkKey(std::string_view name) {
  return name == "S_RNTI" || name == "D_RNTI" || name == "IMSI" || name == "C_ID" ||
         name.starts_with("RL_ID");
}

std::string Side(const NetworkEndpoint& endpoint, bool hasPointCode, uint32_t pointCode) {
  std::string text = EndpointText(endpoint);
  if (!hasPointCode) return text.empty() ? "?" : text;
  return text.empty() ? fmt::format("pc {}", pointCode)
                      : fmt::format("{} (pc {})", text, pointCode);
}

// A CSV cell in quotes when it holds a separator, quote or line break.
std::string CsvCell(const std::string& text) {
  if (text.find_first_of(",\"\r\n") == std::string::npos) return text;
  std::string quoted = "\"";
  for (const char c : text) quoted += c == '"' ? std::string("\"\"") : std::string(1, c);
  return quoted + '"';
}

}  // namespace

void SummaryPrinter::Print(const MessageFacts& facts) {
  PrintFrom(facts);
  const auto out = fmt::appender(out_);
  fmt::format_to(out, " {}", facts.procedure.empty() ? "-" : facts.procedure);
  if (facts.kind) fmt::format_to(out, " {}", MessageKindName(*facts.kind));
  if (facts.transactionId) fmt::format_to(out, " tid {}", *facts.transactionId);
  for (const KeyValue& key : facts.keys) {
    if (IsUeOrRadioLinkKey(key.name)) fmt::format_to(out, " {}={}", key.name, KeyText(key));
  }
  if (!facts.cause.empty()) fmt::format_to(out, " cause={}", facts.cause);
  if (facts.flagged()) fmt::format_to(out, " flagged");
  if (facts.cutOff) fmt::format_to(out, " cut-off");
  out_.push_back('\n');
}

void SummaryPrinter::PrintFrom(const MessageFacts& facts) {
  const auto out = fmt::appender(out_);
  if (facts.origin == nullptr) {
    fmt::format_to(out, "{} {}", facts.index + 1, SafeText(facts.source));
    return;
  }
  const MessageOrigin& origin = *facts.origin;
  if (firstMicroseconds_ < 0) firstMicroseconds_ = facts.microseconds();
  const int64_t since = facts.microseconds() - firstMicroseconds_;
  fmt::format_to(out, "{} {}.{:06} {} -> {} {}", facts.frame->number, since / 1000000,
                 since % 1000000, Side(origin.source, origin.hasPointCodes, origin.opc),
                 Side(origin.destination, origin.hasPointCodes, origin.dpc),
                 SccpMessageKindName(origin.sccpKind));
  if (origin.connection != 0) fmt::format_to(out, " conn {}", origin.connection);
}

ColumnPrinter::ColumnPrinter(fmt::memory_buffer& out, std::vector<std::string> columns,
                             ColumnFormat format)
    : out_(out), columns_(std::move(columns)), format_(format) {
  if (format_ == ColumnFormat::kJson) return;
  for (size_t at = 0; at < columns_.size(); ++at) Cell(at, &columns_[at]);
  out_.push_back('\n');
}

void ColumnPrinter::Print(const MessageFacts& facts) {
  if (format_ == ColumnFormat::kJson) out_.push_back('{');
  for (size_t at = 0; at < columns_.size(); ++at) {
    const std::optional<std::string> text = ColumnText(facts, columns_[at]);
    Cell(at, text ? &*text : nullptr);
  }
  if (format_ == ColumnFormat::kJson) out_.push_back('}');
  out_.push_back('\n');
}

void ColumnPrinter::Cell(size_t at, const std::string* text) {
  const auto out = fmt::appender(out_);
  switch (format_) {
    case ColumnFormat::kTsv:
      fmt::format_to(out, "{}{}", at == 0 ? "" : "\t", text ? SafeText(*text) : "");
      break;
    case ColumnFormat::kCsv:
      fmt::format_to(out, "{}{}", at == 0 ? "" : ",", text ? CsvCell(*text) : "");
      break;
    case ColumnFormat::kJson:
      fmt::format_to(out, "{}{}:{}", at == 0 ? "" : ",", JsonString(columns_[at]),
                     text ? JsonString(*text) : "null");
      break;
  }
}

}  // namespace rnsap::cli
