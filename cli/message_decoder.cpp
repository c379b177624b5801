#include "cli/message_decoder.h"

#include <stdexcept>

#include "host/recorder.h"

namespace rnsap::cli {
namespace {

// The stand-in host hands reports to `sink` while this lives.
class ReportSinkScope {
 public:
  explicit ReportSinkScope(host::ReportSink& sink) { host::SetReportSink(&sink); }
  ~ReportSinkScope() { host::SetReportSink(nullptr); }
  ReportSinkScope(const ReportSinkScope&) = delete;
  ReportSinkScope& operator=(const ReportSinkScope&) = delete;
};

}  // namespace

MessageDecoder::MessageDecoder(const LoadedModule& module)
    : module_(module), keySizeClasses_(ReadKeySizeClasses(module.dictionary())) {
  if (!context_.ready()) throw std::runtime_error("cannot allocate the host's decode state");
}

MessageSummary MessageDecoder::Decode(Pass pass, std::span<const uint8_t> message,
                                      MessagePrinter& printer) {
  if (pass == Pass::kKeys) {
    std::vector<KeyValue> keys;
    const MessageSummary summary = ExtractKeys(message, keys);
    for (const KeyValue& key : keys) printer.Key(key);
    return summary;
  }
  MessageSummary summary;
  Load(pass, message, summary);
  RunDecodePass(pass, printer, summary);
  Finish(summary);
  return summary;
}

MessageSummary MessageDecoder::ExtractKeys(std::span<const uint8_t> message,
                                           std::vector<KeyValue>& keys) {
  MessageSummary summary;
  Load(Pass::kKeys, message, summary);
  RunKeyPass(summary, keys);
  Finish(summary);
  return summary;
}

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
  ReadKeys(host::LastKeyTable(), context_.key_buffer(), keySizeClasses_, keys);
}

}  // namespace rnsap::cli
