// The analyst's views of a stream of message facts: one line per message as
// an analyser's packet list, or chosen fields as columns in TSV, CSV or JSON.
#pragma once

#include <fmt/format.h>

#include <cstdint>
#include <string>
#include <vector>

#include "cli/fact_columns.h"
#include "cli/message_facts.h"

namespace rnsap::cli {

// The packet-list line of each message: frame, time since the first message,
// source and destination, SCCP message and connection, procedure, kind,
// transaction id, UE and radio link ids, cause, flagged and cut off.
class SummaryPrinter {
 public:
  explicit SummaryPrinter(fmt::memory_buffer& out) : out_(out) {}
  void Print(const MessageFacts& facts);

 private:
  void PrintFrom(const MessageFacts& facts);

  fmt::memory_buffer& out_;
  int64_t firstMicroseconds_ = -1;
};

enum class ColumnFormat { kTsv, kCsv, kJson };

// One row per message of the chosen columns; TSV and CSV start with a row of
// the column names. A value the message lacks is empty (null in JSON).
class ColumnPrinter {
 public:
  // Every name of `columns` is known (UnknownColumn).
  ColumnPrinter(fmt::memory_buffer& out, const std::vector<std::string>& columns,
                ColumnFormat format);
  void Print(const MessageFacts& facts);

 private:
  void Cell(size_t at, std::string_view text, bool present);

  fmt::memory_buffer& out_;
  std::vector<FactColumn> columns_;
  std::vector<std::string> jsonNames_;  // the columns' names as JSON strings
  ColumnFormat format_;
  fmt::memory_buffer cell_;
};

}  // namespace rnsap::cli
