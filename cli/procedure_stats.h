// Procedure statistics over a stream of message facts: the messages of each
// kind per procedure, requests matched with their answers, response times,
// causes, and flagged and cut-off messages. A partial result of one part of
// a capture can be merged with that of the part behind it, and the sum equals
// the statistics of the whole.
#pragma once

#include <fmt/format.h>

#include <array>
#include <cstdint>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <tuple>
#include <vector>

#include "cli/message_facts.h"

namespace rnsap::cli {

// Response times in microseconds, in buckets of a 1024th of their power of
// two, each with its count and its least time: a percentile is the least
// time of its bucket, exact where a bucket holds one time, and memory does
// not grow with the count.
class ResponseTimes {
 public:
  void Add(int64_t microseconds);
  void Merge(const ResponseTimes& other);
  uint64_t count() const { return count_; }
  int64_t max() const { return max_; }
  // A time at or below which `percent` of the times lie, within a 1024th.
  int64_t Percentile(double percent) const;

 private:
  struct Bucket {
    uint64_t count = 0;
    int64_t least = 0;
  };
  std::vector<Bucket> buckets_;
  uint64_t count_ = 0;
  int64_t max_ = 0;
};

struct ProcedureTally {
  std::string name;
  std::array<uint64_t, 4> kinds{};  // by MessageKind
  uint64_t answeredSuccessfully = 0, answeredUnsuccessfully = 0;
  uint64_t unanswered = 0, unmatchedAnswers = 0;
  ResponseTimes responses;
  std::map<std::string, uint64_t> causes;
};

class ProcedureStats {
 public:
  // A request waits `answerSpanMicroseconds` of capture time for its answer
  // and is counted unanswered after that, or sooner when `waitingLimit`
  // later requests wait; as many answers without a request are kept for a
  // merge with the part before.
  explicit ProcedureStats(int64_t answerSpanMicroseconds, size_t waitingLimit = 1 << 18)
      : span_(answerSpanMicroseconds), waitingLimit_(waitingLimit) {}

  void Add(const MessageFacts& facts);
  // Adds the statistics of the part of the capture that follows this one.
  void Merge(const ProcedureStats& later);
  // Counts the requests still waiting as unanswered.
  void Finish();

  void PrintText(fmt::memory_buffer& out, uint64_t malformed) const;
  void PrintJson(fmt::memory_buffer& out, uint64_t malformed) const;

  const std::map<uint32_t, ProcedureTally>& procedures() const { return procedures_; }

 private:
  // Signalling relation or SCCP connection, procedure code, transaction id.
  using Exchange = std::tuple<uint64_t, uint32_t, uint32_t>;
  struct Waiting {
    Exchange exchange;
    int64_t time = 0;
  };

  void Expire(int64_t now);
  void ExpireOldest();
  void Wait(const Exchange& exchange, int64_t time);
  void Answer(const Exchange& exchange, int64_t time, MessageKind kind, ProcedureTally& tally);
  ProcedureTally& Tally(uint32_t code, std::string_view name);

  int64_t span_;
  size_t waitingLimit_;
  std::map<uint32_t, ProcedureTally> procedures_;
  std::map<Exchange, int64_t> pending_;  // request time by exchange
  std::deque<Waiting> byTime_;           // the requests in the order they came
  // Answers without a request that came within the span of the first message:
  // the part before may hold their request.
  std::vector<std::tuple<Exchange, int64_t, MessageKind>> earlyAnswers_;
  std::optional<int64_t> firstTime_;
  int64_t lastTime_ = 0;
  uint64_t messages_ = 0, withoutProcedure_ = 0, flagged_ = 0, cutOff_ = 0;
};

}  // namespace rnsap::cli
