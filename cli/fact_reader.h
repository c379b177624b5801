// Reads the facts of messages with the Key-field pass of a loaded module.
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "cli/message_decoder.h"
#include "cli/message_facts.h"
#include "cli/value_names.h"

namespace rnsap::cli {

class FactReader {
 public:
  FactReader(const LoadedModule& module, MessageDecoder& decoder);

  // The facts of `octets`, valid until the next call.
  const MessageFacts& Read(size_t index, std::string_view source, const FrameStamp* frame,
                           const MessageOrigin* origin, std::span<const uint8_t> octets);

  const ValueNames& valueNames() const { return names_; }
  // The names of the key fields, as filters and columns know them.
  const std::vector<std::string>& keyNames() const { return keyNames_; }

 private:
  void ReadHeader();

  MessageDecoder& decoder_;
  ValueNames names_;
  std::vector<std::string> keyNames_;
  MessageFacts facts_;
};

}  // namespace rnsap::cli
