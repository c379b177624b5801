// Runs the passes of a loaded module over messages, with the host set-up and
// the shared stand-in host libraries, which hand each report straight to a
// printer.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "cli/key_rows.h"
#include "cli/loaded_module.h"
#include "cli/options.h"
#include "cli/report.h"
#include "host/setup.h"

namespace rnsap::cli {

class MessageDecoder {
 public:
  // Throws std::runtime_error if the host set-up cannot be allocated.
  explicit MessageDecoder(const LoadedModule& module);

  // Runs `pass` over `message` afresh, handing its reports and keys to
  // `printer` as they come.
  MessageSummary Decode(Pass pass, std::span<const uint8_t> message, MessagePrinter& printer);

  // Runs the Key-field pass over `message` afresh and leaves its keys in
  // `keys`, in row order.
  MessageSummary ExtractKeys(std::span<const uint8_t> message, std::vector<KeyValue>& keys);

 private:
  void RunDecodePass(Pass pass, MessagePrinter& printer, MessageSummary& summary);
  void RunKeyPass(MessageSummary& summary, std::vector<KeyValue>& keys);
  void Load(Pass pass, std::span<const uint8_t> message, MessageSummary& summary);
  void Finish(MessageSummary& summary);

  const LoadedModule& module_;
  host::HostDecodeContext context_;
  KeySizeClasses keySizeClasses_;
};

}  // namespace rnsap::cli
