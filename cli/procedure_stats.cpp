#include "cli/procedure_stats.h"

#include <algorithm>
#include <bit>
#include <cmath>

#include "cli/json.h"
#include "cli/procedure_classes.h"

namespace rnsap::cli {
namespace {

constexpr int kSubBucketBits = 10;
constexpr int64_t kSubBuckets = int64_t{1} << kSubBucketBits;

size_t BucketOf(int64_t microseconds) {
  const uint64_t value = static_cast<uint64_t>(std::max<int64_t>(microseconds, 0));
  if (value < kSubBuckets) return value;
  const int power = std::bit_width(value) - 1;
  const uint64_t sub = value >> (power - kSubBucketBits);
  return static_cast<size_t>((power - kSubBucketBits + 1) * kSubBuckets + (sub - kSubBuckets));
}

std::string Milliseconds(int64_t microseconds) {
  return fmt::format("{}.{:03}", microseconds / 1000, microseconds % 1000);
}

uint64_t Answered(const ProcedureTally& tally) {
  return tally.answeredSuccessfully + tally.answeredUnsuccessfully;
}

}  // namespace

void ResponseTimes::Add(int64_t microseconds) {
  const size_t bucket = BucketOf(microseconds);
  if (bucket >= buckets_.size()) buckets_.resize(bucket + 1);
  Bucket& into = buckets_[bucket];
  into.least = into.count == 0 ? microseconds : std::min(into.least, microseconds);
  ++into.count;
  ++count_;
  max_ = std::max(max_, microseconds);
}

void ResponseTimes::Merge(const ResponseTimes& other) {
  if (other.buckets_.size() > buckets_.size()) buckets_.resize(other.buckets_.size());
  for (size_t at = 0; at < other.buckets_.size(); ++at) {
    const Bucket& from = other.buckets_[at];
    if (from.count == 0) continue;
    Bucket& into = buckets_[at];
    into.least = into.count == 0 ? from.least : std::min(into.least, from.least);
    into.count += from.count;
  }
  count_ += other.count_;
  max_ = std::max(max_, other.max_);
}

int64_t ResponseTimes::Percentile(double percent) const {
  const auto rank = static_cast<uint64_t>(std::ceil(percent / 100 * static_cast<double>(count_)));
  uint64_t seen = 0;
  for (size_t at = 0; at < buckets_.size(); ++at) {
    seen += buckets_[at].count;
    if (seen >= std::max<uint64_t>(rank, 1)) return buckets_[at].least;
  }
  return max_;
}

ProcedureTally& ProcedureStats::Tally(uint32_t code, std::string_view name) {
  ProcedureTally& tally = procedures_[code];
  if (tally.name.empty()) tally.name = name;
  return tally;
}

void ProcedureStats::Add(const MessageFacts& facts) {
  const int64_t now = facts.microseconds();
  if (!firstTime_) firstTime_ = now;
  lastTime_ = now;
  ++messages_;
  flagged_ += facts.flagged() ? 1 : 0;
  cutOff_ += facts.cutOff ? 1 : 0;
  Expire(now);
  if (!facts.procedureCode || !facts.kind) {
    ++withoutProcedure_;
    return;
  }
  ProcedureTally& tally = Tally(*facts.procedureCode, facts.procedure);
  ++tally.kinds[static_cast<size_t>(*facts.kind)];
  if (!facts.cause.empty()) ++tally.causes[std::string(facts.cause)];
  if (ClassOfProcedure(*facts.procedureCode) != 1) return;
  const uint64_t relation = facts.origin == nullptr         ? 0
                            : facts.origin->connection != 0 ? facts.origin->connection << 32
                                                            : facts.origin->relation;
  const Exchange exchange{relation, *facts.procedureCode, facts.transactionId.value_or(0)};
  if (*facts.kind == MessageKind::kInitiating) {
    Wait(exchange, now);
  } else if (*facts.kind != MessageKind::kOutcome) {
    Answer(exchange, now, *facts.kind, tally);
  }
}

void ProcedureStats::Answer(const Exchange& exchange, int64_t time, MessageKind kind,
                            ProcedureTally& tally) {
  const auto request = pending_.find(exchange);
  if (request == pending_.end()) {
    ++tally.unmatchedAnswers;
    if (time - *firstTime_ <= span_ && earlyAnswers_.size() < waitingLimit_) {
      earlyAnswers_.emplace_back(exchange, time, kind);
    }
    return;
  }
  (kind == MessageKind::kSuccessful ? tally.answeredSuccessfully : tally.answeredUnsuccessfully)++;
  tally.responses.Add(time - request->second);
  pending_.erase(request);
}

void ProcedureStats::Expire(int64_t now) {
  while (!byTime_.empty() && now - byTime_.front().time > span_) ExpireOldest();
}

void ProcedureStats::ExpireOldest() {
  const Waiting& oldest = byTime_.front();
  const auto request = pending_.find(oldest.exchange);
  if (request != pending_.end() && request->second == oldest.time) {
    ++procedures_[std::get<1>(oldest.exchange)].unanswered;
    pending_.erase(request);
  }
  byTime_.pop_front();
}

void ProcedureStats::Wait(const Exchange& exchange, int64_t time) {
  const auto [at, made] = pending_.insert_or_assign(exchange, time);
  procedures_[std::get<1>(exchange)].unanswered += made ? 0 : 1;  // a request sent again
  byTime_.push_back({exchange, time});
  if (byTime_.size() > waitingLimit_) ExpireOldest();
}

void ProcedureStats::Merge(const ProcedureStats& later) {
  if (!later.firstTime_) return;
  for (const auto& [code, theirs] : later.procedures_) {
    ProcedureTally& ours = Tally(code, theirs.name);
    for (size_t kind = 0; kind < ours.kinds.size(); ++kind) ours.kinds[kind] += theirs.kinds[kind];
    ours.answeredSuccessfully += theirs.answeredSuccessfully;
    ours.answeredUnsuccessfully += theirs.answeredUnsuccessfully;
    ours.unanswered += theirs.unanswered;
    ours.unmatchedAnswers += theirs.unmatchedAnswers;
    ours.responses.Merge(theirs.responses);
    for (const auto& [cause, count] : theirs.causes) ours.causes[cause] += count;
  }
  if (!firstTime_) firstTime_ = later.firstTime_;
  for (const auto& [exchange, time, kind] : later.earlyAnswers_) {
    Expire(time);
    ProcedureTally& tally = procedures_[std::get<1>(exchange)];
    if (pending_.contains(exchange)) {
      --tally.unmatchedAnswers;
      Answer(exchange, time, kind, tally);
    } else if (time - *firstTime_ <= span_ && earlyAnswers_.size() < waitingLimit_) {
      earlyAnswers_.emplace_back(exchange, time, kind);
    }
  }
  Expire(later.lastTime_);
  lastTime_ = later.lastTime_;
  // Our requests still waiting came before theirs.
  for (const Waiting& waiting : later.byTime_) {
    const auto request = later.pending_.find(waiting.exchange);
    if (request != later.pending_.end() && request->second == waiting.time) {
      Wait(waiting.exchange, waiting.time);
    }
  }
  messages_ += later.messages_;
  withoutProcedure_ += later.withoutProcedure_;
  flagged_ += later.flagged_;
  cutOff_ += later.cutOff_;
}

void ProcedureStats::Finish() {
  for (const auto& [exchange, time] : pending_) ++procedures_[std::get<1>(exchange)].unanswered;
  pending_.clear();
  byTime_.clear();
}

void ProcedureStats::PrintText(fmt::memory_buffer& out, uint64_t malformed) const {
  const auto to = fmt::appender(out);
  fmt::format_to(to,
                 "{:<52} {:>4} {:>6} {:>6} {:>6} {:>6} {:>6} {:>6} {:>6} {:>9} {:>9} {:>9} {:>9}\n",
                 "procedure", "code", "init", "succ", "unsucc", "outc", "answd", "unansw",
                 "unmatch", "p50 ms", "p90 ms", "p99 ms", "max ms");
  for (const auto& [code, tally] : procedures_) {
    const ResponseTimes& times = tally.responses;
    const auto cell = [&](double percent) {
      return times.count() == 0 ? std::string("-") : Milliseconds(times.Percentile(percent));
    };
    fmt::format_to(
        to, "{:<52} {:>4} {:>6} {:>6} {:>6} {:>6} {:>6} {:>6} {:>6} {:>9} {:>9} {:>9} {:>9}\n",
        tally.name, code, tally.kinds[0], tally.kinds[1], tally.kinds[2], tally.kinds[3],
        Answered(tally), tally.unanswered, tally.unmatchedAnswers, cell(50), cell(90), cell(99),
        times.count() == 0 ? std::string("-") : Milliseconds(times.max()));
  }
  for (const auto& [code, tally] : procedures_) {
    for (const auto& [cause, count] : tally.causes) {
      fmt::format_to(to, "cause {} {}: {}\n", tally.name, cause, count);
    }
  }
  fmt::format_to(to,
                 "messages {}, without procedure {}, flagged {}, cut off {}, malformed frames {}\n",
                 messages_, withoutProcedure_, flagged_, cutOff_, malformed);
}

void ProcedureStats::PrintJson(fmt::memory_buffer& out, uint64_t malformed) const {
  const auto to = fmt::appender(out);
  uint64_t answered = 0, unanswered = 0, unmatched = 0;
  for (const auto& [code, tally] : procedures_) {
    const ResponseTimes& times = tally.responses;
    fmt::format_to(to,
                   "{{\"stats\":\"procedure\",\"procedure\":{},\"code\":{},\"initiating\":{},"
                   "\"successful\":{},\"unsuccessful\":{},\"outcome\":{},\"answered\":{},"
                   "\"answeredSuccessfully\":{},\"answeredUnsuccessfully\":{},"
                   "\"unanswered\":{},\"unmatchedAnswers\":{},\"responseMs\":",
                   JsonString(tally.name), code, tally.kinds[0], tally.kinds[1], tally.kinds[2],
                   tally.kinds[3], Answered(tally), tally.answeredSuccessfully,
                   tally.answeredUnsuccessfully, tally.unanswered, tally.unmatchedAnswers);
    if (times.count() == 0) {
      fmt::format_to(to, "null}}\n");
    } else {
      fmt::format_to(to, "{{\"p50\":{},\"p90\":{},\"p99\":{},\"max\":{}}}}}\n",
                     Milliseconds(times.Percentile(50)), Milliseconds(times.Percentile(90)),
                     Milliseconds(times.Percentile(99)), Milliseconds(times.max()));
    }
    answered += Answered(tally);
    unanswered += tally.unanswered;
    unmatched += tally.unmatchedAnswers;
  }
  for (const auto& [code, tally] : procedures_) {
    for (const auto& [cause, count] : tally.causes) {
      fmt::format_to(to, "{{\"stats\":\"cause\",\"procedure\":{},\"cause\":{},\"count\":{}}}\n",
                     JsonString(tally.name), JsonString(cause), count);
    }
  }
  fmt::format_to(to,
                 "{{\"stats\":\"capture\",\"messages\":{},\"withoutProcedure\":{},\"answered\":{},"
                 "\"unanswered\":{},\"unmatchedAnswers\":{},\"flagged\":{},\"cutOff\":{},"
                 "\"malformed\":{}}}\n",
                 messages_, withoutProcedure_, answered, unanswered, unmatched, flagged_, cutOff_,
                 malformed);
}

}  // namespace rnsap::cli
