// What the analyst's command line cannot show: every procedure of the
// grammar has its class, statistics of a stream split in two and merged
// equal those of the whole, and saved frames read back as they were.
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <functional>
#include <regex>
#include <set>
#include <string>
#include <vector>

#include "cli/capture_input.h"
#include "cli/frame_saver.h"
#include "cli/procedure_classes.h"
#include "cli/procedure_stats.h"
#include "tests/cli/capture_writer.h"

namespace rnsap::cli {
namespace {

// The codes of the "values ProcedureCode" list of the PDU grammar.
std::set<uint32_t> GrammarProcedureCodes() {
  std::ifstream grammar(RNSAP_PDU_GRAMMAR);
  std::set<uint32_t> codes;
  bool inList = false;
  const std::regex named(R"(^\s*(\d+)\s+"id_)");
  for (std::string line; std::getline(grammar, line);) {
    if (line.starts_with("values ProcedureCode")) inList = true;
    if (inList && line.starts_with("}")) break;
    std::smatch match;
    if (inList && std::regex_search(line, match, named)) codes.insert(std::stoul(match[1]));
  }
  return codes;
}

TEST(ProcedureClassTest, EveryProcedureOfTheGrammarHasItsClass) {
  const std::set<uint32_t> codes = GrammarProcedureCodes();
  ASSERT_EQ(codes.size(), 27u);
  std::set<uint32_t> classified;
  for (const ProcedureClass& entry : kProcedureClasses) {
    EXPECT_TRUE(codes.contains(entry.code)) << entry.code << " is no procedure of the grammar";
    EXPECT_TRUE(entry.procedureClass == 1 || entry.procedureClass == 2) << entry.code;
    classified.insert(entry.code);
  }
  EXPECT_EQ(classified, codes);
}

// A stream of exchanges over three relations, in time order: requests
// answered soon, late, after the answer timeout or not at all, answers
// without a request, transaction ids used again, class 2 messages between.
struct StreamMessage {
  FrameStamp frame;
  MessageOrigin origin;
  MessageFacts facts;
};

StreamMessage Message(int64_t microseconds, uint32_t exchange, MessageKind kind, uint32_t code,
                      uint32_t transaction) {
  StreamMessage message;
  message.frame = {0, microseconds / 1000000, static_cast<uint32_t>(microseconds % 1000000) * 1000};
  message.origin.relation = exchange % 3 + 1;
  message.facts.kind = kind;
  message.facts.procedureCode = code;
  message.facts.procedure = code == 20 ? "setup" : "other";
  message.facts.transactionId = transaction;
  message.facts.cause = kind == MessageKind::kUnsuccessful ? "cause" : "";
  message.facts.flags = exchange % 11 == 0 ? 2 : 0;
  return message;
}

std::vector<StreamMessage> Stream() {
  std::vector<StreamMessage> stream;
  for (uint32_t exchange = 0; exchange < 150; ++exchange) {
    const int64_t sent = int64_t{exchange} * 700'000;
    const uint32_t code = exchange % 2 == 0 ? 20 : 16;
    const uint32_t transaction = exchange % 7;
    stream.push_back(Message(sent, exchange, MessageKind::kInitiating, code, transaction));
    const auto answer = exchange % 3 == 0 ? MessageKind::kUnsuccessful : MessageKind::kSuccessful;
    const int64_t delay = int64_t{exchange * 37 % 9} * 800'000 + exchange;
    if (exchange % 5 != 4)
      stream.push_back(Message(sent + delay, exchange, answer, code, transaction));
    if (exchange % 6 == 0) {
      stream.push_back(Message(sent + 1, exchange, MessageKind::kSuccessful, code, 100));
      stream.push_back(Message(sent + 2, exchange, MessageKind::kInitiating, 13, transaction));
    }
  }
  std::stable_sort(stream.begin(), stream.end(), [](const auto& a, const auto& b) {
    return a.frame.seconds * 1000000000 + a.frame.nanoseconds <
           b.frame.seconds * 1000000000 + b.frame.nanoseconds;
  });
  for (size_t at = 0; at < stream.size(); ++at) {
    StreamMessage& message = stream[at];
    message.frame.number = at + 1;
    message.facts.frame = &message.frame;
    message.facts.origin = &message.origin;
  }
  return stream;
}

std::string Statistics(ProcedureStats stats) {
  stats.Finish();
  fmt::memory_buffer out;
  stats.PrintJson(out, 0);
  return fmt::to_string(out);
}

TEST(ProcedureStatsTest, APartsMergedEqualTheWhole) {
  constexpr int64_t kAnswerSpan = 4'000'000;
  const std::vector<StreamMessage> stream = Stream();
  ProcedureStats whole(kAnswerSpan);
  for (const StreamMessage& message : stream) whole.Add(message.facts);
  const std::string expected = Statistics(whole);
  ASSERT_NE(expected.find("\"answered\":"), std::string::npos) << expected;
  for (size_t split = 0; split <= stream.size(); split += 13) {
    ProcedureStats first(kAnswerSpan), second(kAnswerSpan);
    for (size_t at = 0; at < stream.size(); ++at) {
      (at < split ? first : second).Add(stream[at].facts);
    }
    first.Merge(second);
    EXPECT_EQ(Statistics(first), expected) << "split at " << split;
  }
}

TEST(ResponseTimesTest, PercentilesByRankWithinABucket) {
  ResponseTimes times;
  for (const int64_t microseconds : {5, 1001000, 1001000, 2002000, 3003000, 700, 999'999'999}) {
    times.Add(microseconds);
  }
  EXPECT_EQ(times.Percentile(0), 5);
  EXPECT_EQ(times.Percentile(50), 1001000);
  EXPECT_EQ(times.Percentile(60), 2002000);
  EXPECT_EQ(times.Percentile(99), 999'999'999);
  EXPECT_EQ(times.max(), 999'999'999);
}

// Three requests wait where two may: the oldest is counted unanswered at
// once, and its answer comes without a request.
TEST(ProcedureStatsTest, RequestsPastTheWaitingLimitAreCountedUnanswered) {
  ProcedureStats stats(3'600'000'000, 2);
  for (const MessageKind kind : {MessageKind::kInitiating, MessageKind::kSuccessful}) {
    for (uint32_t transaction = 0; transaction < 3; ++transaction) {
      StreamMessage message = Message(transaction + (kind == MessageKind::kSuccessful ? 10 : 0), 0,
                                      kind, 20, transaction);
      message.facts.origin = &message.origin;
      message.facts.frame = &message.frame;
      stats.Add(message.facts);
    }
  }
  const ProcedureTally& tally = stats.procedures().at(20);
  EXPECT_EQ(tally.answeredSuccessfully, 2u);
  EXPECT_EQ(tally.unanswered, 1u);
  EXPECT_EQ(tally.unmatchedAnswers, 1u);
}

// Frames 2 and 3 saved as pcap and as pcapng, frame 3 holding two messages:
// read back, each frame once, with its octets and time.
TEST(FrameSaverTest, SavedFramesReadBackAsTheyWere) {
  const std::vector<testing::Octets> samples = testing::HexMessages(RNSAP_SAMPLES_FILE);
  const std::vector<testing::Frame> frames = {
      testing::DescribedFrame("eth ipv4 sctp data/tsn=1 m3ua udt #0", samples),
      testing::DescribedFrame("eth ipv4 sctp data/tsn=2 m3ua udt #1", samples),
      testing::DescribedFrame("eth ipv4 sctp data/tsn=3 m3ua udt #2 data/tsn=4 m3ua udt #3",
                              samples),
  };
  const std::string original = ::testing::TempDir() + "frames_to_save.pcap";
  std::ofstream(original, std::ios::binary) << testing::Capture("pcapns", "ethernet", frames);
  struct Read {
    FrameStamp stamp;
    std::vector<uint8_t> frame;
    uint32_t wireLength;
  };
  const auto readAll = [](const std::string& path,
                          const std::function<void(const CapturedMessage&)>& also) {
    std::vector<Read> read;
    ReadCapture(path,
                {[&](const CapturedMessage& message) {
                   read.push_back({message.frame,
                                   {message.captured.octets.begin(), message.captured.octets.end()},
                                   message.captured.wireLength});
                   also(message);
                 },
                 [](const CaptureNote&) {}});
    return read;
  };
  for (const std::string format : {"pcap", "pcapng"}) {
    SCOPED_TRACE(format);
    const std::string saved = ::testing::TempDir() + "frames_saved." + format;
    std::vector<Read> originals;
    {
      FrameSaver saver(saved);
      originals = readAll(original, [&](const CapturedMessage& message) {
        if (message.frame.number >= 2) saver.Save(original, message);
      });
      saver.Close();
    }
    const std::vector<Read> back = readAll(saved, [](const CapturedMessage&) {});
    ASSERT_EQ(originals.size(), 4u);
    ASSERT_EQ(back.size(), 3u);  // the messages of frames 2 and 3 (two)
    for (size_t at = 0; at < back.size(); ++at) {
      const Read& was = originals[at + 1];
      EXPECT_EQ(back[at].stamp.number, was.stamp.number - 1);
      EXPECT_EQ(back[at].stamp.seconds, was.stamp.seconds);
      EXPECT_EQ(back[at].stamp.nanoseconds, was.stamp.nanoseconds);
      EXPECT_EQ(back[at].frame, was.frame);
      EXPECT_EQ(back[at].wireLength, was.wireLength);
    }
  }
}

}  // namespace
}  // namespace rnsap::cli
