// Runs one pass of the loaded module over one message, with the host
// runtime's reports going to a printer.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "cli/fact_reader.h"
#include "cli/field_dictionary.h"
#include "cli/key_rows.h"
#include "cli/loaded_module.h"
#include "cli/message_facts.h"
#include "cli/options.h"
#include "cli/report.h"
#include "hostrt/setup.h"

namespace rnsap::cli {

class MessageDecoder {
 public:
  // With `withHeaders` each message's header goes to the printer first,
  // from a Key-field pass run ahead of the pass asked for. Throws
  // std::runtime_error if the host set-up cannot be allocated.
  MessageDecoder(const LoadedModule& module, bool withHeaders);

  // The field dictionary of the module's tables.
  const FieldDictionary& dictionary() const { return dictionary_; }
  // The names of the key fields, as filters and columns know them.
  std::vector<std::string> KeyNames() const;

  // Runs `pass` over `message` afresh, handing its reports and keys to
  // `printer` as they come.
  MessageSummary Decode(Pass pass, std::span<const uint8_t> message, MessagePrinter& printer);

  // Runs the Key-field pass over `message` afresh and fills in what its keys
  // tell in `facts`: the keys, the flags, procedure, kind, transaction id and
  // cause. The frame and source of `facts` are the caller's.
  MessageSummary ExtractFacts(std::span<const uint8_t> message, MessageFacts& facts);

 private:
  void Load(Pass pass, std::span<const uint8_t> message, MessageSummary& summary);
  void RunDecodePass(Pass pass, MessagePrinter& printer, MessageSummary& summary);
  void RunKeyPass(MessageSummary& summary, std::vector<KeyValue>& keys);
  void Finish(MessageSummary& summary);

  const LoadedModule& module_;
  host::HostDecodeContext context_;
  KeyReader keyReader_;
  const FieldDictionary dictionary_;
  const FactReader factReader_;
  MessageFacts headerFacts_;  // of the message being decoded, with headers
  const bool withHeaders_;
};

}  // namespace rnsap::cli
