// UE traces over a stream of message facts: the messages of one UE context,
// tied together by its SCCP connection and by its S-RNTI, D-RNTI or IMSI
// where the connection changes, printed as a timeline per context.
#pragma once

#include <fmt/format.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "cli/message_facts.h"

namespace rnsap::cli {

class UeTraces {
 public:
  // Prints into `out` only the contexts that `selector` ("NAME=VALUE" of
  // connection, S_RNTI, D_RNTI or IMSI; "" all of them). At most
  // `contextLimit` contexts are held: the one unused longest is printed to
  // make room. A context keeps its first `messageLimit` messages and counts
  // the rest.
  UeTraces(fmt::memory_buffer& out, std::string selector, size_t contextLimit = 65536,
           size_t messageLimit = 4096);

  void Add(const MessageFacts& facts);
  // Prints the contexts still held, in the order they began.
  void Finish();

 private:
  struct Step {
    uint64_t frame = 0;
    int64_t microseconds = 0;
    std::string_view procedure;
    std::string_view kind;  // the PDU Type's value name
    std::optional<uint32_t> transactionId;
    std::string_view cause;
  };
  struct Context {
    std::vector<std::string> identifiers;
    std::vector<Step> steps;
    uint64_t dropped = 0;
    uint64_t lastUse = 0;
  };

  uint64_t Join(const std::vector<std::string>& identifiers);
  void Absorb(uint64_t into, uint64_t from);
  void PrintAndForget(uint64_t number);

  fmt::memory_buffer& out_;
  std::string selector_;
  size_t contextLimit_, messageLimit_;
  std::map<uint64_t, Context> contexts_;  // by number, in the order they began
  std::map<std::string, uint64_t> byIdentifier_;
  uint64_t nextNumber_ = 1, uses_ = 0;
};

}  // namespace rnsap::cli
