// The sample messages the project ships: each must decode to its end in all
// four passes, and the Decoded-field pass must report every text that the
// sample's '# expect: "TEXT"' lines name.
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "boundary/module_api.h"
#include "cli/hex_input.h"
#include "host/recorder.h"
#include "host/setup.h"

namespace rnsap {
namespace {

constexpr std::string_view kExpectPrefix = "# expect: ";

struct Sample {
  std::string origin;  // FILE:LINE
  std::vector<uint8_t> octets;
  std::vector<std::string> expectedTexts;
};

// The text between the first and the last double quote of an expectation.
std::string QuotedText(const std::string& line) {
  const size_t open = line.find('"');
  const size_t close = line.rfind('"');
  EXPECT_TRUE(open != std::string::npos && close > open) << "unquoted: " << line;
  return open < close ? line.substr(open + 1, close - open - 1) : line;
}

// The messages of the file, each with the expectations written above it.
std::vector<Sample> ReadSamples() {
  std::ifstream file(RNSAP_SAMPLES_FILE);
  std::vector<Sample> samples;
  std::vector<std::string> expected;
  std::string line;
  for (int number = 1; std::getline(file, line); ++number) {
    if (line.starts_with(kExpectPrefix)) {
      expected.push_back(QuotedText(line));
      continue;
    }
    const cli::HexLine parsed = cli::ParseHexLine(line);
    EXPECT_NE(parsed.kind, cli::HexLine::Kind::kBad) << "line " << number << ": " << line;
    if (parsed.kind != cli::HexLine::Kind::kMessage) continue;
    samples.push_back(
        {"messages.hex:" + std::to_string(number), parsed.octets, std::exchange(expected, {})});
  }
  EXPECT_TRUE(expected.empty()) << "expectations below the last message";
  return samples;
}

// How a pass ended: its result, the bits it left and where it stopped.
struct PassEnd {
  int64_t result = 0;
  uint32_t bitsLeftOut = 0;
  uint32_t position = 0;
  bool operator==(const PassEnd&) const = default;
};

std::ostream& operator<<(std::ostream& out, const PassEnd& end) {
  return out << "result " << end.result << ", bitsLeftOut " << end.bitsLeftOut << ", position "
             << end.position;
}

PassEnd DecodePassEnd(uint32_t (*pass)(DecodeRequest*), host::HostDecodeContext& context) {
  const uint32_t result = pass(&context.decode_request());
  return {result, context.decode_request().bitsLeftOut, context.state().position};
}

PassEnd KeyField(host::HostDecodeContext& context) {
  const int32_t result = KFE_vorel_rnsap_04b(&context.key_request());
  return {result, context.key_request().bitsLeftOut, context.state().position};
}

using Pass = PassEnd (*)(host::HostDecodeContext&);

template <uint32_t (*kPass)(DecodeRequest*)>
PassEnd Decode(host::HostDecodeContext& context) {
  return DecodePassEnd(kPass, context);
}

constexpr std::pair<std::string_view, Pass> kPasses[] = {
    {"Validation", Decode<vex_PreDecodeMV>},
    {"Decoded-field", Decode<vex_PreDecodeMD>},
    {"Display", Decode<vex_PreDecodeTO>},
    {"Key-field", KeyField},
};

PassEnd RunPass(host::HostDecodeContext& context, Pass pass, const Sample& sample) {
  host::ResetHost();
  context.LoadMessage(sample.octets);
  return pass(context);
}

TEST(SampleMessagesTest, EveryPassReadsEachSampleToItsLastBit) {
  host::HostDecodeContext context;
  const std::vector<Sample> samples = ReadSamples();
  ASSERT_FALSE(samples.empty());
  for (const Sample& sample : samples) {
    const PassEnd end{1, 0, static_cast<uint32_t>(8 * sample.octets.size() + 1)};
    for (const auto& [name, pass] : kPasses) {
      EXPECT_EQ(RunPass(context, pass, sample), end) << sample.origin << ", " << name << " pass";
    }
  }
}

TEST(SampleMessagesTest, DecodedFieldsShowTheExpectedTexts) {
  host::HostDecodeContext context;
  for (const Sample& sample : ReadSamples()) {
    EXPECT_FALSE(sample.expectedTexts.empty()) << sample.origin << " expects nothing";
    RunPass(context, Decode<vex_PreDecodeMD>, sample);
    const auto& fields = host::DecodedFields();
    for (const std::string& text : sample.expectedTexts) {
      EXPECT_TRUE(
          std::ranges::any_of(fields, [&](const auto& field) { return field.text == text; }))
          << sample.origin << " does not show \"" << text << '"';
    }
  }
}

}  // namespace
}  // namespace rnsap
