// What rnsap-decode reads: hex messages from arguments, files and standard
// input, and its command line.
#include <fmt/format.h>
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

// A parsed line in short: "skipped", its octets in hex, or its error.
std::string Parsed(const HexLine& parsed) {
  if (parsed.kind == HexLine::Kind::kSkipped) return "skipped";
  if (parsed.kind == HexLine::Kind::kBad) return parsed.octets.empty() ? parsed.error : "octets";
  std::string hex;
  for (const uint8_t octet : parsed.octets) hex += fmt::format("{:02x}", octet);
  return hex;
}

// Blanks and colons between octets in either case; empty and comment lines
// skipped in a file, but an argument is a message by itself.
TEST(ParseHexLineTest, ReadsOctetsSkipsCommentsAndNamesWhatIsWrong) {
  for (const auto& [line, parsed] : std::vector<std::pair<std::string_view, std::string>>{
           {"00144abf", "00144abf"},
           {"00 14 4A BF", "00144abf"},
           {"00:14:4a:bf", "00144abf"},
           {"\t00  14:4a BF \r", "00144abf"},
           {"00 :14: 4A bF", "00144abf"},
           {"", "skipped"},
           {"   \t\r", "skipped"},
           {"# a comment", "skipped"},
           {"   # indented 00 14", "skipped"},
           {"00 14 4", "odd number of hex digits (5)"},
           {"00 1g", "invalid character 'g' at column 5"},
           {"0x14", "invalid character 'x' at column 2"},
           {"00 14 # trailing comment", "invalid character '#' at column 7"},
           {"00\x01", "invalid character \\x01 at column 3"},
           {"0 014", "separator inside an octet at column 2"},
           {"00:1:4", "separator inside an octet at column 5"},
           {":", "no hex digits"},
           {" : :\t", "no hex digits"},
       }) {
    EXPECT_EQ(Parsed(ParseHexLine(line)), parsed) << line;
  }
  for (const auto& [text, parsed] : std::vector<std::pair<std::string_view, std::string>>{
           {"", "no hex digits"},
           {"   ", "no hex digits"},
           {"::", "no hex digits"},
           {"# 00 14", "invalid character '#' at column 1"},
           {" 0a:0B ", "0a0b"},
       }) {
    EXPECT_EQ(Parsed(ParseHexMessage(text)), parsed) << text;
  }
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

// The parsed command line in short: its error, or the pass (validate, decode,
// display, keys as 0 to 3), the flags, the module and each source as its
// kind (argument, file, standard input, capture as a to d), text and number.
std::string Parsed(std::vector<std::string_view> arguments) {
  const ParsedOptions parsed = ParseOptions(arguments, "/build/vorel_rnsap_04B_DLL.so");
  if (!parsed.error.empty()) return parsed.error;
  const Options& o = parsed.options;
  std::string text = "pass " + std::to_string(static_cast<int>(o.pass)) + (o.json ? " json" : "") +
                     (o.help ? " help" : "") + (o.version ? " version" : "") + " " + o.modulePath;
  for (const InputSource& source : o.sources) {
    text += std::string(" ") + "abcd"[static_cast<int>(source.kind)] + ":" + source.text;
    if (source.argumentNumber != 0) text += ":" + std::to_string(source.argumentNumber);
  }
  return text;
}

// Standard input as text by default; values separate or after an equals
// sign; help and version cut the rest short; sources in order, after "--"
// messages; a bare module name as a path in the current directory, since the
// loader would look it up on its own.
TEST(ParseOptionsTest, ReadsTheCommandLineAndNamesWhatItDoesNotKnow) {
  for (const auto& [arguments, parsed] :
       std::vector<std::pair<std::vector<std::string_view>, std::string>>{
           {{}, "pass 1 /build/vorel_rnsap_04B_DLL.so c:-"},
           {{"--pass", "keys", "--module", "/m.so", "--json", "00"}, "pass 3 json /m.so a:00:1"},
           {{"--pass=keys", "--module=/m.so", "--json", "00"}, "pass 3 json /m.so a:00:1"},
           {{"00", "-f", "a.hex", "-", "-r", "b.pcap", "--", "--json", "-"},
            "pass 1 /build/vorel_rnsap_04B_DLL.so a:00:1 b:a.hex c:- d:b.pcap a:--json:2 c:-"},
           {{"--pass", "validate", "-"}, "pass 0 /build/vorel_rnsap_04B_DLL.so c:-"},
           {{"--pass", "display", "00"}, "pass 2 /build/vorel_rnsap_04B_DLL.so a:00:1"},
           {{"00", "--help"}, "pass 1 help "},
           {{"-h"}, "pass 1 help "},
           {{"--version"}, "pass 1 version "},
           {{"--module", "vorel_rnsap_04B_DLL.so"}, "pass 1 ./vorel_rnsap_04B_DLL.so c:-"},
           {{"--module", "build/m.so"}, "pass 1 build/m.so c:-"},
           {{"--pass", "walk"}, "unknown pass 'walk'"},
           {{"--pass="}, "option --pass needs a value"},
           {{"00", "--pass"}, "option --pass needs a value"},
           {{"-f"}, "option -f needs a value"},
           {{"-f", "", "00"}, "option -f needs a value"},
           {{"--module="}, "option --module needs a value"},
           {{"--jsn"}, "unknown option --jsn"},
           {{"-x", "00"}, "unknown option -x"},
           {{"--json=yes"}, "option --json takes no value"},
           {{"-r"}, "option -r needs a value"},
           {{"[00,14]"}, "a HEX argument in brackets is no hex message"},
       }) {
    EXPECT_EQ(Parsed(arguments), parsed) << ::testing::PrintToString(arguments);
  }
}

}  // namespace
}  // namespace rnsap::cli
