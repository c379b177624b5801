// Runs the passes of a loaded module over messages, with the host set-up and
// the shared host runtime libraries, which hand each report straight to a
// printer.
#pragma once

#include <cstdint>
#include <span>

#include "cli/field_dictionary.h"
#include "cli/key_rows.h"
#include "cli/loaded_module.h"
#include "cli/message_header.h"
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

  // Runs `pass` over `message` afresh, handing its reports and keys to
  // `printer` as they come.
  MessageSummary Decode(Pass pass, std::span<const uint8_t> message, MessagePrinter& printer);

 private:
  void RunDecodePass(Pass pass, MessagePrinter& printer, MessageSummary& summary);
  void RunKeyPass(MessageSummary& summary);

  const LoadedModule& module_;
  host::HostDecodeContext context_;
  KeySizeClasses keySizeClasses_;
  const FieldDictionary dictionary_;
  MessageHeaderReader headerReader_;
  const bool withHeaders_;
};

}  // namespace rnsap::cli
