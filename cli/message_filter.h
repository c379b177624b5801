// Which messages an analysis looks at: conditions on the facts of a message
// (NAME=VALUE, all of which must hold), a range of frames, and a limit on the
// number of messages taken.
#pragma once

#include <cstdint>
#include <limits>
#include <string>
#include <string_view>
#include <vector>

#include "cli/fact_columns.h"
#include "cli/message_facts.h"

namespace rnsap::cli {

struct FilterSettings {
  std::vector<std::string> conditions;  // NAME=VALUE
  std::string frames;                   // "", "N", "N-", "-M" or "N-M"
  uint64_t limit = 0;                   // 0: no limit
};

class MessageFilter {
 public:
  // Throws std::invalid_argument for a condition without '=', a name that
  // is neither a column nor a key field (listing the known ones), or a frame
  // range that is not one.
  MessageFilter(const FilterSettings& settings, const std::vector<std::string>& keyNames);

  // Whether `facts` pass every condition; counts the messages taken.
  bool Take(const MessageFacts& facts);
  // Whether the limit is reached: no later message can be taken.
  bool Full() const { return limit_ != 0 && taken_ >= limit_; }

 private:
  struct Condition {
    FactColumn column;
    std::string value;
  };
  bool Holds(const MessageFacts& facts);

  std::vector<Condition> conditions_;
  uint64_t firstFrame_ = 1;
  uint64_t lastFrame_ = std::numeric_limits<uint64_t>::max();
  uint64_t limit_ = 0;
  uint64_t taken_ = 0;
  fmt::memory_buffer text_;  // of the column being tested
};

}  // namespace rnsap::cli
