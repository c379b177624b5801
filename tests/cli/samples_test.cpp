// The shipped samples through rnsap-decode, which loads the module by its
// file name: what every pass makes of them, from the hex file and from the
// shipped capture, is what was recorded, and shows the texts of the samples'
// '# expect: "TEXT"' lines.
#include <fmt/format.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <utility>

#include "cli/hex_input.h"
#include "cli/json.h"
#include "tests/cli/capture_writer.h"
#include "tests/cli/decode_run.h"
#include "tests/support/golden_lines.h"

namespace rnsap::testing {
namespace {

struct Sample {
  size_t line;
  Lines expected;  // texts of its decoded fields
};

std::vector<Sample> ReadSamples() {
  std::vector<Sample> samples;
  Lines expected;
  const Lines lines = SplitLines(ReadAll(RNSAP_SAMPLES_FILE));
  for (size_t index = 0; index < lines.size(); ++index) {
    const std::string& line = lines[index];
    if (line.starts_with("# expect: ")) {
      const size_t open = line.find('"'), close = line.rfind('"');
      EXPECT_LT(open, close) << "unquoted: " << line;
      expected.push_back(line.substr(open + 1, close - open - 1));
      continue;
    }
    const cli::HexLine parsed = cli::ParseHexLine(line);
    EXPECT_NE(parsed.kind, cli::HexLine::Kind::kBad) << "line " << index + 1 << ": " << line;
    if (parsed.kind == cli::HexLine::Kind::kMessage)
      samples.push_back({index + 1, std::exchange(expected, {})});
  }
  EXPECT_TRUE(expected.empty()) << "expectations below the last message";
  return samples;
}

// The JSON lines of the Decoded-field and Display passes over the samples
// read from standard input, and of the Validation and Key-field passes over
// the shipped capture, are those recorded in messages.hex.jsonl: every pass
// reads each sample to its last bit. Each sample's decoded fields show the
// texts it expects.
TEST(SamplesTest, EveryPassGivesTheRecordedLines) {
  const std::string hex = ReadAll(RNSAP_SAMPLES_FILE), capture = ReadAll(RNSAP_SAMPLE_CAPTURE);
  const DecodeRun decode = RunDecode("--json", hex);
  Lines lines;
  for (const DecodeRun& run : {decode, RunDecode("--json --pass display", hex),
                               RunDecode("--json --pass validate -r -", capture),
                               RunDecode("--json --pass keys -r -", capture)}) {
    EXPECT_EQ(run.status, 0);
    EXPECT_EQ(run.err, Lines{});
    lines.insert(lines.end(), run.out.begin(), run.out.end());
  }
  ExpectLinesOfFile(lines, RNSAP_GOLDEN_CAPTURES "/messages.hex.jsonl");
  const std::vector<Sample> samples = ReadSamples();
  for (size_t index = 0; index < samples.size(); ++index) {
    const std::string msg = fmt::format(R"({{"msg":{},)", index);
    EXPECT_FALSE(samples[index].expected.empty()) << "line " << samples[index].line;
    for (const std::string& text : samples[index].expected) {
      const std::string field = R"("text":)" + cli::JsonString(text) + ',';
      EXPECT_TRUE(std::ranges::any_of(decode.out,
                                      [&](const std::string& line) {
                                        return line.starts_with(msg) &&
                                               line.find(field) != line.npos;
                                      }))
          << "line " << samples[index].line << " does not show \"" << text << '"';
    }
  }
}

// A JSON line without a header's SCCP message and ends.
std::string WithoutNetwork(std::string line) {
  const size_t network = line.find(R"(,"sccp":)");
  if (network != line.npos) line.erase(network, line.size() - 1 - network);
  return line;
}

// The JSON lines of each message of a run, without what precedes the
// source's closing quote, by message number.
std::vector<Lines> MessageBodies(const Lines& out) {
  std::vector<Lines> bodies;
  for (const std::string& line : out) {
    if (!line.starts_with(R"({"msg":)")) continue;
    const size_t msg = std::stoul(line.substr(7));
    bodies.resize(std::max(bodies.size(), msg + 1));
    bodies[msg].push_back(line.substr(line.find(R"(",)", line.find(R"("source":)")) + 2));
  }
  return bodies;
}

// What a golden capture must give: its output in JSON, without the headers'
// SCCP message and ends, and those for each message (`carriers`); the closing
// line of its text output, its standard error and its exit status.
struct CaptureExpectations {
  Lines out, carriers, err;
  std::string closing;
  int status = 0;
};

// The .expect file of `capture`: lines "frame F, time T: sample S, SCCP of
// connection N" say which frame completes which sample, in order, through
// which SCCP message of which connection (0: connectionless); "capture: "
// gives the closing line, "err: " each line on standard error, both without
// the capture's name, and "status: " the exit status if not 0. Each message
// has the JSON lines of the sample's hex, `samples`.
CaptureExpectations ReadExpectations(const std::string& capture,
                                     const std::vector<Lines>& samples) {
  CaptureExpectations expected;
  size_t messages = 0;
  for (const std::string& line : SplitLines(ReadAll(capture + ".expect"))) {
    unsigned frame = 0, sample = 0, connection = 0;
    char time[32], sccp[8];
    if (std::sscanf(line.c_str(),
                    "frame %u, time %31[0-9.]: sample %u, %7[A-Z0-9] of connection %u", &frame,
                    time, &sample, sccp, &connection) == 5) {
      expected.carriers.push_back(fmt::format(R"("sccp":"{}","connection":{},)", sccp, connection));
      EXPECT_LT(sample, samples.size()) << line;
      const std::string place = fmt::format(R"({{"msg":{},"source":{},"frame":{},"time":{},)",
                                            messages++, cli::JsonString(capture), frame, time);
      for (const std::string& body : samples.at(sample)) expected.out.push_back(place + body);
    } else if (line.starts_with("capture: ")) {
      expected.closing = "capture " + capture + ": " + line.substr(9);
    } else if (line.starts_with("status: ")) {
      expected.status = std::stoi(line.substr(8));
    } else if (line.starts_with("err: ")) {
      expected.err.push_back(capture + ": " + line.substr(5));
    } else {
      EXPECT_TRUE(line.empty() || line.starts_with('#')) << line;
    }
  }
  return expected;
}

// The captures of tests/captures, written by text2pcap, mergecap and scapy
// (scripts/captures/make_captures.py), each decoded as its .expect file says.
TEST(SamplesTest, GoldenCapturesDecodeEachMessageAtItsFrameAsItsHex) {
  const std::vector<Lines> samples =
      MessageBodies(RunDecode("--json -f '" RNSAP_SAMPLES_FILE "'").out);
  size_t captures = 0;
  for (const auto& entry : std::filesystem::directory_iterator(RNSAP_GOLDEN_CAPTURES)) {
    if (entry.path().extension() != ".expect") continue;
    const std::string capture = entry.path().parent_path() / entry.path().stem();
    SCOPED_TRACE(capture);
    ++captures;
    const CaptureExpectations expected = ReadExpectations(capture, samples);
    const DecodeRun decode = RunDecode("--json -V -r '" + capture + "'");
    const DecodeRun text = RunDecode("--pass validate -r '" + capture + "'");
    EXPECT_EQ(decode.status, expected.status);
    EXPECT_EQ(text.status, expected.status);
    ASSERT_FALSE(decode.out.empty() || text.out.empty());
    Lines out, carriers;
    for (auto line = decode.out.begin(); line + 1 < decode.out.end(); ++line) {
      out.push_back(WithoutNetwork(*line));
      const size_t sccp = line->find(R"("sccp":)");
      if (sccp != line->npos)
        carriers.push_back(line->substr(sccp, line->find(R"("from":)") - sccp));
    }
    EXPECT_EQ(out, expected.out);
    EXPECT_EQ(carriers, expected.carriers);
    EXPECT_EQ(text.out.back(), expected.closing);
    EXPECT_EQ(decode.err, expected.err);
  }
  EXPECT_EQ(captures, 8u);
}

TEST(SamplesTest, ShippedCaptureIsTheOneMakeSampleCaptureWrites) {
  EXPECT_EQ(ReadAll(RNSAP_SAMPLE_CAPTURE), SampleCapture(HexMessages(RNSAP_SAMPLES_FILE)))
      << "rewrite it with make_sample_capture";
}

}  // namespace
}  // namespace rnsap::testing
