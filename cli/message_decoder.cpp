#include "cli/message_decoder.h"

#include <stdexcept>

#include "hostrt/host_runtime.h"

namespace rnsap::cli {
namespace {

// The host runtime hands reports to `sink` while this lives.
class ReportSinkScope {
 public:
  explicit ReportSinkScope(host::ReportSink& sink) { host::SetReportSink(&sink); }
  ~ReportSinkScope() { host::SetReportSink(nullptr); }
  ReportSinkScope(const ReportSinkScope&) = delete;
  ReportSinkScope& operator=(const ReportSinkScope&) = delete;
};

}  // namespace

MessageDecoder::MessageDecoder(const LoadedModule& module, bool withHeaders)
    : module_(module),
      keyReader_(ReadKeySizeClasses(module.tables().dictionary)),
      dictionary_(module.tables()),
      factReader_(dictionary_),
      withHeaders_(withHeaders) {
  if (!context_.ready()) throw std::runtime_error("cannot allocate the host's decode state");
}

std::vector<std::string> MessageDecoder::KeyNames() const {
  std::vector<std::string> names;
  for (const auto& [name, sizeClass] : keyReader_.sizeClasses()) names.push_back(name);
  return names;
}

MessageSummary MessageDecoder::Decode(Pass pass, std::span<const uint8_t> message,
                                      MessagePrinter& printer) {
  MessageSummary summary;
  Load(pass, message, summary);
  if (withHeaders_ || pass == Pass::kKeys) RunKeyPass(summary, headerFacts_.keys);
  if (withHeaders_) {
    factReader_.ReadHeader(headerFacts_);
    printer.Header(headerFacts_);
  }
  if (pass == Pass::kKeys) {
    for (const KeyValue& key : headerFacts_.keys) printer.Key(key);
  } else {
    if (withHeaders_) {
      host::ResetParserUtilities();
      context_.Rewind();
    }
    RunDecodePass(pass, printer, summary);
  }
  Finish(summary);
  return summary;
}

MessageSummary MessageDecoder::ExtractFacts(std::span<const uint8_t> message, MessageFacts& facts) {
  MessageSummary summary;
  Load(Pass::kKeys, message, summary);
  RunKeyPass(summary, facts.keys);
  Finish(summary);
  facts.flags = summary.flags;
  factReader_.ReadHeader(facts);
  return summary;
}

// Each pass starts on the runtime's counters reset, so that the allocation
// knob counts from the pass's start.
void MessageDecoder::Load(Pass pass, std::span<const uint8_t> message, MessageSummary& summary) {
  host::ResetParserUtilities();
  context_.LoadMessage(message);
  summary.pass = pass;
}

void MessageDecoder::Finish(MessageSummary& summary) {
  summary.position = context_.state().position;
  summary.flags = context_.state().flags;
}

void MessageDecoder::RunDecodePass(Pass pass, MessagePrinter& printer, MessageSummary& summary) {
  DecodeRequest& request = context_.decode_request();
  const auto run = pass == Pass::kValidate ? module_.validate
                   : pass == Pass::kDecode ? module_.decode
                                           : module_.display;
  const ReportSinkScope scope(printer);
  summary.result = run(&request) ? 1 : 0;
  summary.bitsLeftOut = request.bitsLeftOut;
  summary.verdict = request.verdict;
}

// The key-field table is the module's and lives as long as it is loaded; the
// host library saw it at the first pass and is not called again after that.
void MessageDecoder::RunKeyPass(MessageSummary& summary, std::vector<KeyValue>& keys) {
  KeyFieldRequest& request = context_.key_request();
  summary.result = module_.extractKeys(&request);
  summary.bitsLeftOut = request.bitsLeftOut;
  keyReader_.Read(host::LastKeyTable(), context_.key_buffer(), keys);
}

}  // namespace rnsap::cli
