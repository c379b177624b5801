// What rnsap-decode reads: hex messages from arguments, files and standard
// input, and its command line.
#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <memory>
#include <string_view>
#include <vector>

#include "cli/hex_input.h"
#include "cli/options.h"
#include "tests/support/scratch_path.h"

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
  EXPECT_EQ(error(":"), "no hex digits");
  EXPECT_EQ(error(" : :\t"), "no hex digits");
}

// An argument is a message by itself: nothing in it is skipped.
TEST(ParseHexMessageTest, RefusesAnArgumentWithoutHexDigits) {
  for (const auto& [text, error] : std::vector<std::pair<std::string_view, std::string>>{
           {"", "no hex digits"},
           {"   ", "no hex digits"},
           {"::", "no hex digits"},
           {"# 00 14", "invalid character '#' at column 1"},
       }) {
    const HexLine parsed = ParseHexMessage(text);
    EXPECT_EQ(parsed.kind, HexLine::Kind::kBad) << text;
    EXPECT_EQ(parsed.error, error) << text;
  }
  EXPECT_EQ(ParseHexMessage(" 0a:0B ").octets, (Octets{0x0a, 0x0b}));
}

// What a source handed on, in order.
struct Read {
  std::vector<InputMessage> messages;
  std::vector<InputError> errors;

  HexHandlers Handlers() {
    return {[this](const InputMessage& message) { messages.push_back(message); },
            [this](const InputError& error) { errors.push_back(error); }};
  }
};

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

File Stream(std::string_view content) {
  std::FILE* file = std::tmpfile();
  std::fwrite(content.data(), 1, content.size(), file);
  std::rewind(file);
  return File(file);
}

TEST(ReadInputsTest, NamesFileLinesCountingSkippedOnesAndGoesOnAfterABadLine) {
  Read read;
  EXPECT_TRUE(ReadLines(Stream("# samples\n00 14\n\n0z\n40 15").get(), "x.hex", read.Handlers()));
  ASSERT_EQ(read.messages.size(), 2u);
  EXPECT_EQ(read.messages[0].origin, "x.hex:2");
  EXPECT_EQ(read.messages[0].octets, (Octets{0x00, 0x14}));
  EXPECT_EQ(read.messages[1].origin, "x.hex:5");
  EXPECT_EQ(read.messages[1].octets, (Octets{0x40, 0x15}));
  ASSERT_EQ(read.errors.size(), 1u);
  EXPECT_EQ(read.errors[0].origin, "x.hex:4");
  EXPECT_EQ(read.errors[0].reason, "invalid character 'z' at column 2");
}

TEST(ReadInputsTest, SkipsAByteOrderMarkInFrontOfTheFirstLineOnly) {
  Read read;
  ReadLines(Stream("\xEF\xBB\xBF"
                   "00 14\n\xEF\xBB\xBF"
                   "40\n")
                .get(),
            "<stdin>", read.Handlers());
  ASSERT_EQ(read.messages.size(), 1u);
  EXPECT_EQ(read.messages[0].octets, (Octets{0x00, 0x14}));
  ASSERT_EQ(read.errors.size(), 1u);
  EXPECT_EQ(read.errors[0].reason, "invalid character \\xEF at column 1");
}

std::string ScratchFile(std::string_view content) {
  const std::string path = testing::ScratchPath("input_test_messages.hex");
  std::ofstream(path) << content;
  return path;
}

TEST(ReadInputsTest, ReadsSourcesInCommandLineOrderAndNamesWhatCannotBeRead) {
  const std::string file = ScratchFile("\xEF\xBB\xBF# with a byte-order mark\n0c\n");
  const std::vector<InputSource> sources{
      {InputSource::Kind::kArgument, "01", 1},
      {InputSource::Kind::kFile, "/nonexistent/messages.hex", 0},
      {InputSource::Kind::kFile, ::testing::TempDir(), 0},
      {InputSource::Kind::kStandardInput, "-", 0},
      {InputSource::Kind::kArgument, "0", 2},
      {InputSource::Kind::kFile, file, 0},
      {InputSource::Kind::kArgument, "", 3},
      {InputSource::Kind::kArgument, "02:03", 4},
  };
  const File standardInput = Stream("aa\r\nbb\n");
  Read read;
  for (const InputSource& source : sources) {
    ReadHexSource(source, standardInput.get(), read.Handlers());
  }

  std::vector<std::string> origins;
  for (const InputMessage& message : read.messages) origins.push_back(message.origin);
  EXPECT_EQ(origins, (std::vector<std::string>{"argument 1", "<stdin>:1", "<stdin>:2", file + ":2",
                                               "argument 4"}));
  EXPECT_EQ(read.messages[1].octets, Octets{0xaa});
  EXPECT_EQ(read.messages[3].octets, Octets{0x0c});
  EXPECT_EQ(read.messages[4].octets, (Octets{0x02, 0x03}));
  std::vector<std::string> errors;
  for (const InputError& error : read.errors) errors.push_back(error.origin + ": " + error.reason);
  EXPECT_EQ(errors,
            (std::vector<std::string>{
                "/nonexistent/messages.hex: cannot open the file: No such file or directory",
                ::testing::TempDir() + ": cannot read the file: Is a directory",
                "argument 2: odd number of hex digits (1)",
                "argument 3: no hex digits",
            }));
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
    EXPECT_EQ(parsed.options.sources[0].argumentNumber, 1);
  }
}

TEST(ParseOptionsTest, KeepsSourcesInOrderAndCountsTheMessageArguments) {
  const ParsedOptions parsed =
      Parse({"00", "-f", "a.hex", "-", "-r", "b.pcap", "--", "--json", "-"});
  ASSERT_EQ(parsed.error, "");
  EXPECT_FALSE(parsed.options.json);
  std::vector<InputSource> sources = parsed.options.sources;
  ASSERT_EQ(sources.size(), 6u);
  EXPECT_EQ(sources[3].kind, InputSource::Kind::kCapture);
  EXPECT_EQ(sources[3].text, "b.pcap");
  sources.erase(sources.begin() + 3);
  EXPECT_EQ(sources[0].kind, InputSource::Kind::kArgument);
  EXPECT_EQ(sources[0].argumentNumber, 1);
  EXPECT_EQ(sources[1].kind, InputSource::Kind::kFile);
  EXPECT_EQ(sources[1].text, "a.hex");
  EXPECT_EQ(sources[2].kind, InputSource::Kind::kStandardInput);
  EXPECT_EQ(sources[3].kind, InputSource::Kind::kArgument);  // after "--" it is a message
  EXPECT_EQ(sources[3].text, "--json");
  EXPECT_EQ(sources[3].argumentNumber, 2);
  EXPECT_EQ(sources[4].kind, InputSource::Kind::kStandardInput);
}

TEST(ParseOptionsTest, KnowsThePassesAndRefusesWhatItDoesNotKnow) {
  EXPECT_EQ(Parse({"--pass", "validate"}).options.pass, Pass::kValidate);
  EXPECT_EQ(Parse({"--pass", "display"}).options.pass, Pass::kDisplay);
  EXPECT_EQ(Parse({"--pass", "walk"}).error, "unknown pass 'walk'");
  EXPECT_EQ(Parse({"--pass="}).error, "option --pass needs a value");
  EXPECT_EQ(Parse({"00", "--pass"}).error, "option --pass needs a value");
  EXPECT_EQ(Parse({"-f"}).error, "option -f needs a value");
  EXPECT_EQ(Parse({"-f", "", "00"}).error, "option -f needs a value");
  EXPECT_EQ(Parse({"--module="}).error, "option --module needs a value");
  EXPECT_EQ(Parse({"--jsn"}).error, "unknown option --jsn");
  EXPECT_EQ(Parse({"-x", "00"}).error, "unknown option -x");
  EXPECT_EQ(Parse({"--json=yes"}).error, "option --json takes no value");
  EXPECT_TRUE(Parse({"00", "--help"}).options.help);
  EXPECT_TRUE(Parse({"-h"}).options.help);
  EXPECT_TRUE(Parse({"--version"}).options.version);
  EXPECT_EQ(Parse({"-r"}).error, "option -r needs a value");
  EXPECT_EQ(Parse({"[00,14]"}).error, "a HEX argument in brackets is no hex message");
}

// The loader would look a bare file name up in its own directories.
TEST(ParseOptionsTest, TakesAModulePathAsAPath) {
  for (const auto& [given, loaded] : std::vector<std::pair<std::string_view, std::string>>{
           {"vorel_rnsap_04B_DLL.so", "./vorel_rnsap_04B_DLL.so"},
           {"build/m.so", "build/m.so"},
           {"/opt/m.so", "/opt/m.so"},
       }) {
    EXPECT_EQ(Parse({"--module", given}).options.modulePath, loaded) << given;
  }
}

}  // namespace
}  // namespace rnsap::cli
