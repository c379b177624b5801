#include "cli/fact_columns.h"

#include <arpa/inet.h>
#include <fmt/format.h>

#include <algorithm>
#include <functional>
#include <utility>

namespace rnsap::cli {
namespace {

using Text = std::optional<std::string>;
using Column = std::pair<std::string_view, std::function<Text(const MessageFacts&)>>;

template <typename Number>
Text NumberText(const std::optional<Number>& number) {
  return number ? Text(std::to_string(*number)) : std::nullopt;
}

Text NonEmpty(std::string text) { return text.empty() ? std::nullopt : Text(std::move(text)); }

// Columns that only a message from a capture has.
template <typename Read>
auto FromCapture(Read read) {
  return [read](const MessageFacts& facts) -> Text {
    return facts.origin == nullptr ? std::nullopt : Text(read(*facts.origin, *facts.frame));
  };
}

std::string PointCode(const MessageOrigin& origin, uint32_t code) {
  return origin.hasPointCodes ? std::to_string(code) : "";
}

const std::vector<Column>& Columns() {
  static const std::vector<Column> columns = {
      {"frame", FromCapture([](auto&, auto& frame) { return std::to_string(frame.number); })},
      {"time", FromCapture([](auto&, auto& frame) {
         return fmt::format("{}.{:06}", frame.seconds, frame.nanoseconds / 1000);
       })},
      {"source", FromCapture([](auto& origin, auto&) { return EndpointText(origin.source); })},
      {"destination",
       FromCapture([](auto& origin, auto&) { return EndpointText(origin.destination); })},
      {"opc", FromCapture([](auto& origin, auto&) { return PointCode(origin, origin.opc); })},
      {"dpc", FromCapture([](auto& origin, auto&) { return PointCode(origin, origin.dpc); })},
      {"sccp", FromCapture([](auto& origin, auto&) {
         return std::string(SccpMessageKindName(origin.sccpKind));
       })},
      {"connection",
       FromCapture([](auto& origin, auto&) { return std::to_string(origin.connection); })},
      {"relation",
       FromCapture([](auto& origin, auto&) { return std::to_string(origin.relation); })},
      {"procedure",
       [](const MessageFacts& facts) { return NonEmpty(std::string(facts.procedure)); }},
      {"code", [](const MessageFacts& facts) { return NumberText(facts.procedureCode); }},
      {"kind",
       [](const MessageFacts& facts) {
         return facts.kind ? Text(std::string(MessageKindName(*facts.kind))) : std::nullopt;
       }},
      {"transaction", [](const MessageFacts& facts) { return NumberText(facts.transactionId); }},
      {"cause", [](const MessageFacts& facts) { return NonEmpty(std::string(facts.cause)); }},
      {"flagged", [](const MessageFacts& facts) { return Text(facts.flagged() ? "1" : "0"); }},
      {"cutoff", [](const MessageFacts& facts) { return Text(facts.cutOff ? "1" : "0"); }},
  };
  return columns;
}

const Column* FindColumn(std::string_view name) {
  for (const Column& column : Columns()) {
    if (column.first == name) return &column;
  }
  return nullptr;
}

}  // namespace

const std::vector<std::string_view>& FrameAndHeaderColumns() {
  static const std::vector<std::string_view> names = [] {
    std::vector<std::string_view> all;
    for (const Column& column : Columns()) all.push_back(column.first);
    return all;
  }();
  return names;
}

std::optional<std::string> UnknownColumn(std::string_view name,
                                         const std::vector<std::string>& keyNames) {
  if (FindColumn(name) != nullptr ||
      std::find(keyNames.begin(), keyNames.end(), name) != keyNames.end()) {
    return std::nullopt;
  }
  std::string known = fmt::format("{}", fmt::join(FrameAndHeaderColumns(), ", "));
  for (const std::string& key : keyNames) known += ", " + key;
  return "unknown field '" + std::string(name) + "'; the known fields are: " + known;
}

std::optional<std::string> ColumnText(const MessageFacts& facts, std::string_view name) {
  if (const Column* column = FindColumn(name)) return column->second(facts);
  const KeyValue* key = facts.Key(name);
  return key ? Text(KeyText(*key)) : std::nullopt;
}

std::string EndpointText(const NetworkEndpoint& endpoint) {
  if (endpoint.ipVersion == 0) return "";
  char address[INET6_ADDRSTRLEN] = "";
  const int family = endpoint.ipVersion == 4 ? AF_INET : AF_INET6;
  inet_ntop(family, endpoint.address.data(), address, sizeof address);
  if (endpoint.ipVersion == 4) return fmt::format("{}:{}", address, endpoint.port);
  return fmt::format("[{}]:{}", address, endpoint.port);
}

}  // namespace rnsap::cli
