#include "cli/analysis.h"

#include <stdexcept>

#include "cli/fact_columns.h"

namespace rnsap::cli {
namespace {

FilterSettings FilterOf(const Options& options) {
  return {options.filters, options.frames, options.count};
}

ColumnFormat ColumnFormatNamed(std::string_view name) {
  return name == "csv"    ? ColumnFormat::kCsv
         : name == "json" ? ColumnFormat::kJson
                          : ColumnFormat::kTsv;
}

}  // namespace

Analysis::Analysis(const Options& options, MessageDecoder& decoder, OutputWriter& writer)
    : options_(options),
      writer_(writer),
      decoder_(decoder),
      keyNames_(decoder.KeyNames()),
      filter_(FilterOf(options), keyNames_) {
  if (!options.savePath.empty()) saver_ = std::make_unique<FrameSaver>(options.savePath);
  if (options.traces) {
    traces_ = std::make_unique<UeTraces>(writer.buffer(), options.ue);
  } else if (options.stats) {
    constexpr double kMicroseconds = 1e6;
    stats_ = std::make_unique<ProcedureStats>(
        static_cast<int64_t>(options.answerTimeout * kMicroseconds));
  } else if (!options.fields.empty()) {
    for (const std::string& field : options.fields) {
      if (const auto unknown = UnknownColumn(field, keyNames_)) {
        throw std::invalid_argument(*unknown);
      }
    }
    columns_ = std::make_unique<ColumnPrinter>(writer.buffer(), options.fields,
                                               ColumnFormatNamed(options.format));
  } else if (options.json) {
    std::vector<std::string> columns(FrameAndHeaderColumns().begin(),
                                     FrameAndHeaderColumns().end());
    columns.insert(columns.end(), {"S_RNTI", "D_RNTI", "IMSI", "C_ID"});
    columns_ = std::make_unique<ColumnPrinter>(writer.buffer(), columns, ColumnFormat::kJson);
  } else {
    summary_ = std::make_unique<SummaryPrinter>(writer.buffer());
  }
}

void Analysis::Message(size_t index, std::string_view source, const CapturedMessage* captured,
                       std::span<const uint8_t> octets) {
  if (filter_.Full()) return;
  facts_.index = index;
  facts_.source = source;
  facts_.frame = captured ? &captured->frame : nullptr;
  facts_.origin = captured ? &captured->origin : nullptr;
  facts_.cutOff = captured != nullptr && captured->frame.cutOff;
  decoder_.ExtractFacts(octets, facts_);
  const MessageFacts& facts = facts_;
  if (!filter_.Take(facts)) return;
  if (saver_ && captured) saver_->Save(source, *captured);
  if (stats_) return stats_->Add(facts);
  if (traces_) return traces_->Add(facts);
  if (columns_) {
    columns_->Print(facts);
  } else {
    summary_->Print(facts);
  }
  writer_.EndMessage();
}

void Analysis::Finish() {
  if (saver_) saver_->Close();
  if (traces_) {
    traces_->Finish();
    writer_.EndMessage();
  }
  if (!stats_) return;
  stats_->Finish();
  if (options_.json) {
    stats_->PrintJson(writer_.buffer(), malformed_);
  } else {
    stats_->PrintText(writer_.buffer(), malformed_);
  }
  writer_.EndMessage();
}

}  // namespace rnsap::cli
