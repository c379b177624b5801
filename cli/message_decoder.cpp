#include "cli/message_decoder.h"

#include <stdexcept>

#include "host/recorder.h"

namespace rnsap::cli {

MessageDecoder::MessageDecoder(const LoadedModule& module)
    : module_(module), keySizeClasses_(ReadKeySizeClasses(module.dictionary())) {
  if (!context_.ready()) throw std::runtime_error("cannot allocate the host's decode state");
}

MessageOutcome MessageDecoder::Decode(Pass pass, std::span<const uint8_t> message) {
  host::ResetParserUtilities();
  context_.LoadMessage(message);
  MessageOutcome outcome;
  outcome.pass = pass;
  outcome.octets = static_cast<uint32_t>(message.size());
  if (pass == Pass::kKeys) {
    RunKeyPass(outcome);
  } else {
    RunDecodePass(pass, outcome);
  }
  outcome.position = context_.state().position;
  outcome.flags = context_.state().flags;
  return outcome;
}

void MessageDecoder::RunDecodePass(Pass pass, MessageOutcome& outcome) {
  DecodeRequest& request = context_.decode_request();
  const auto run = pass == Pass::kValidate ? module_.validate
                   : pass == Pass::kDecode ? module_.decode
                                           : module_.display;
  outcome.result = run(&request) ? 1 : 0;
  outcome.bitsLeftOut = request.bitsLeftOut;
  outcome.verdict = request.verdict;
  outcome.fields = host::DecodedFields();
  outcome.displayLines = host::DisplayLines();
}

// The key-field table is the module's and lives as long as it is loaded; the
// host library saw it at the first pass and is not called again after that.
void MessageDecoder::RunKeyPass(MessageOutcome& outcome) {
  KeyFieldRequest& request = context_.key_request();
  outcome.result = module_.extractKeys(&request);
  outcome.bitsLeftOut = request.bitsLeftOut;
  outcome.keys = ReadKeys(host::LastKeyTable(), context_.key_buffer(), keySizeClasses_);
}

}  // namespace rnsap::cli
