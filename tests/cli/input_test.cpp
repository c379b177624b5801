// What rnsap-decode reads: hex messages from arguments, files and standard
// input, and its command line.
#include <gtest/gtest.h>

#include <sstream>
#include <string_view>
#include <vector>

#include "cli/hex_input.h"
#include "cli/options.h"

namespace rnsap::cli {
namespace {

using Octets = std::vector<uint8_t>;

TEST(ParseHexLineTest, AcceptsBlanksAndColonsBetweenOctetsInEitherCase) {
  const Octets expected{0x00, 0x14, 0x4a, 0xBF};
  for (const std::string_view line :
       {"00144abf", "00 14 4A BF", "00:14:4a:bf", "\t00  14:4a BF \r", "00 :14: 4A bF"}) {
    const HexLine parsed = ParseHexLine(line);
    ASSERT_EQ(parsed.kind, HexLine::Kind::kMessage) << line;
    EXPECT_EQ(parsed.octets, expected) << line;
  }
}

TEST(ParseHexLineTest, SkipsEmptyAndCommentLines) {
  for (const std::string_view line : {"", "   \t\r", "# a comment", "   # indented 00 14"}) {
    EXPECT_EQ(ParseHexLine(line).kind, HexLine::Kind::kSkipped) << line;
  }
}

TEST(ParseHexLineTest, NamesWhatIsWrongWithABadLine) {
  const auto error = [](std::string_view line) {
    const HexLine parsed = ParseHexLine(line);
    EXPECT_EQ(parsed.kind, HexLine::Kind::kBad) << line;
    EXPECT_TRUE(parsed.octets.empty()) << line;
    return parsed.error;
  };
  EXPECT_EQ(error("00 14 4"), "odd number of hex digits (5)");
  EXPECT_EQ(error("00 1g"), "invalid character 'g' at column 5");
  EXPECT_EQ(error("0x14"), "invalid character 'x' at column 2");
  EXPECT_EQ(error("00 14 # trailing comment"), "invalid character '#' at column 7");
  EXPECT_EQ(error("00\x01"), "invalid character \\x01 at column 3");
  EXPECT_EQ(error("0 014"), "separator inside an octet at column 2");
  EXPECT_EQ(error("00:1:4"), "separator inside an octet at column 5");
}

TEST(ReadInputsTest, NamesFileLinesCountingSkippedOnesAndGoesOnAfterABadLine) {
  std::istringstream file("# samples\n00 14\n\n0z\n40 15\n");
  InputBatch batch;
  ReadLines(file, "x.hex", batch);
  ASSERT_EQ(batch.messages.size(), 2u);
  EXPECT_EQ(batch.messages[0].origin, "x.hex:2");
  EXPECT_EQ(batch.messages[0].octets, (Octets{0x00, 0x14}));
  EXPECT_EQ(batch.messages[1].origin, "x.hex:5");
  EXPECT_EQ(batch.messages[1].octets, (Octets{0x40, 0x15}));
  ASSERT_EQ(batch.errors.size(), 1u);
  EXPECT_EQ(batch.errors[0].origin, "x.hex:4");
  EXPECT_EQ(batch.errors[0].reason, "invalid character 'z' at column 2");
}

TEST(ReadInputsTest, ReadsSourcesInCommandLineOrder) {
  const std::vector<InputSource> sources{
      {InputSource::Kind::kArgument, "01", 2},
      {InputSource::Kind::kFile, "/nonexistent/messages.hex", 4},
      {InputSource::Kind::kStandardInput, "-", 5},
      {InputSource::Kind::kArgument, "0", 6},
      {InputSource::Kind::kArgument, "02:03", 7},
  };
  std::istringstream standardInput("aa\r\nbb\n");
  const InputBatch batch = ReadInputs(sources, standardInput);

  std::vector<std::string> origins;
  for (const InputMessage& message : batch.messages) origins.push_back(message.origin);
  EXPECT_EQ(origins,
            (std::vector<std::string>{"argument 2", "<stdin>:1", "<stdin>:2", "argument 7"}));
  EXPECT_EQ(batch.messages[1].octets, Octets{0xaa});
  EXPECT_EQ(batch.messages[3].octets, (Octets{0x02, 0x03}));
  ASSERT_EQ(batch.errors.size(), 2u);
  EXPECT_EQ(batch.errors[0].origin, "/nonexistent/messages.hex");
  EXPECT_EQ(batch.errors[0].reason, "cannot open the file");
  EXPECT_EQ(batch.errors[1].origin, "argument 6");
}

// ---------------------------------------------------------------- options

ParsedOptions Parse(std::vector<std::string_view> arguments) {
  return ParseOptions(arguments, "/build/vorel_rnsap_04B_DLL.so");
}

TEST(ParseOptionsTest, DecodesStandardInputAsTextByDefault) {
  const ParsedOptions parsed = Parse({});
  ASSERT_EQ(parsed.error, "");
  EXPECT_EQ(parsed.options.pass, Pass::kDecode);
  EXPECT_FALSE(parsed.options.json);
  EXPECT_FALSE(parsed.options.help);
  EXPECT_EQ(parsed.options.modulePath, "/build/vorel_rnsap_04B_DLL.so");
  ASSERT_EQ(parsed.options.sources.size(), 1u);
  EXPECT_EQ(parsed.options.sources[0].kind, InputSource::Kind::kStandardInput);
}

TEST(ParseOptionsTest, TakesOptionValuesSeparateOrAfterAnEqualsSign) {
  for (const auto& arguments :
       {std::vector<std::string_view>{"--pass", "keys", "--module", "/m.so", "--json", "00"},
        std::vector<std::string_view>{"--pass=keys", "--module=/m.so", "--json", "00"}}) {
    const ParsedOptions parsed = Parse(arguments);
    ASSERT_EQ(parsed.error, "");
    EXPECT_EQ(parsed.options.pass, Pass::kKeys);
    EXPECT_EQ(parsed.options.modulePath, "/m.so");
    EXPECT_TRUE(parsed.options.json);
    ASSERT_EQ(parsed.options.sources.size(), 1u);
    EXPECT_EQ(parsed.options.sources[0].text, "00");
    EXPECT_EQ(parsed.options.sources[0].argumentNumber, static_cast<int>(arguments.size()));
  }
}

TEST(ParseOptionsTest, KeepsSourcesInOrderWithTheirPositions) {
  const ParsedOptions parsed = Parse({"00", "-f", "a.hex", "-", "--", "--json", "-"});
  ASSERT_EQ(parsed.error, "");
  EXPECT_FALSE(parsed.options.json);
  const std::vector<InputSource>& sources = parsed.options.sources;
  ASSERT_EQ(sources.size(), 5u);
  EXPECT_EQ(sources[0].kind, InputSource::Kind::kArgument);
  EXPECT_EQ(sources[0].argumentNumber, 1);
  EXPECT_EQ(sources[1].kind, InputSource::Kind::kFile);
  EXPECT_EQ(sources[1].text, "a.hex");
  EXPECT_EQ(sources[2].kind, InputSource::Kind::kStandardInput);
  EXPECT_EQ(sources[3].kind, InputSource::Kind::kArgument);  // after "--" it is a message
  EXPECT_EQ(sources[3].text, "--json");
  EXPECT_EQ(sources[3].argumentNumber, 6);
  EXPECT_EQ(sources[4].kind, InputSource::Kind::kStandardInput);
}

TEST(ParseOptionsTest, KnowsThePassesAndRefusesWhatItDoesNotKnow) {
  EXPECT_EQ(Parse({"--pass", "validate"}).options.pass, Pass::kValidate);
  EXPECT_EQ(Parse({"--pass", "display"}).options.pass, Pass::kDisplay);
  EXPECT_EQ(Parse({"--pass", "walk"}).error, "unknown pass 'walk'");
  EXPECT_EQ(Parse({"--pass="}).error, "unknown pass ''");
  EXPECT_EQ(Parse({"00", "--pass"}).error, "option --pass needs a value");
  EXPECT_EQ(Parse({"-f"}).error, "option -f needs a value");
  EXPECT_EQ(Parse({"--jsn"}).error, "unknown option --jsn");
  EXPECT_EQ(Parse({"-x", "00"}).error, "unknown option -x");
  EXPECT_EQ(Parse({"--json=yes"}).error, "option --json takes no value");
  EXPECT_TRUE(Parse({"00", "--help"}).options.help);
  EXPECT_TRUE(Parse({"-h"}).options.help);
}

}  // namespace
}  // namespace rnsap::cli
