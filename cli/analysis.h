// The analyst's run over a stream of messages: the facts of each from the
// Key-field pass, the filter, and one view of those taken: the packet list,
// chosen fields as columns, procedure statistics or UE traces.
#pragma once

#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "cli/capture_input.h"
#include "cli/frame_saver.h"
#include "cli/message_decoder.h"
#include "cli/message_facts.h"
#include "cli/message_filter.h"
#include "cli/message_list.h"
#include "cli/options.h"
#include "cli/output_writer.h"
#include "cli/procedure_stats.h"
#include "cli/ue_traces.h"

namespace rnsap::cli {

class Analysis {
 public:
  // Throws std::invalid_argument for a filter or field the facts lack.
  Analysis(const Options& options, MessageDecoder& decoder, OutputWriter& writer);

  // `captured` is null for a hex message.
  void Message(size_t index, std::string_view source, const CapturedMessage* captured,
               std::span<const uint8_t> octets);
  // A capture was read to its end.
  void Capture(const CaptureCounts& counts) { malformed_ += counts.malformed; }
  // All sources were read: prints the statistics or the traces.
  void Finish();

 private:
  const Options& options_;
  OutputWriter& writer_;
  MessageDecoder& decoder_;
  const std::vector<std::string> keyNames_;
  MessageFacts facts_;
  MessageFilter filter_;
  std::unique_ptr<SummaryPrinter> summary_;
  std::unique_ptr<ColumnPrinter> columns_;
  std::unique_ptr<ProcedureStats> stats_;
  std::unique_ptr<UeTraces> traces_;
  std::unique_ptr<FrameSaver> saver_;
  uint64_t malformed_ = 0;
};

}  // namespace rnsap::cli
