// rnsap-decode as a user runs it: the built executable, which loads the
// module by its file name, checked against direct calls of the passes
// recorded through the stand-in host libraries.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "cli/hex_input.h"
#include "cli/json.h"
#include "host/recorder.h"
#include "host/setup.h"

namespace rnsap {
namespace {

using Lines = std::vector<std::string>;

struct ProcessRun {
  int status = -1;
  Lines out;
  std::string err;
};

std::string ScratchFile(const std::string& what) {
  const std::string test = ::testing::UnitTest::GetInstance()->current_test_info()->name();
  return ::testing::TempDir() + "rnsap_decode_" + test + "_" + what;
}

std::string ReadAll(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path).rdbuf();
  return text.str();
}

Lines SplitLines(const std::string& text) {
  Lines lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

// Runs rnsap-decode with `arguments` (shell words) and `input` on stdin.
ProcessRun RunDecode(const std::string& arguments, const std::string& input = "") {
  const std::string in = ScratchFile("in"), out = ScratchFile("out"), err = ScratchFile("err");
  std::ofstream(in) << input;
  const std::string command = std::string("'") + RNSAP_DECODE_PATH + "' " + arguments + " <'" + in +
                              "' >'" + out + "' 2>'" + err + "'";
  const int status = std::system(command.c_str());
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, SplitLines(ReadAll(out)), ReadAll(err)};
}

std::vector<std::vector<uint8_t>> SampleMessages() {
  std::vector<std::vector<uint8_t>> messages;
  for (const std::string& line : SplitLines(ReadAll(RNSAP_SAMPLES_FILE))) {
    const cli::HexLine parsed = cli::ParseHexLine(line);
    if (parsed.kind == cli::HexLine::Kind::kMessage) messages.push_back(parsed.octets);
  }
  return messages;
}

// ------------------------------------------- the same, called directly

std::string Segments(const std::vector<BitSegment>& segments) {
  std::string json;
  for (const BitSegment& segment : segments) {
    if (!json.empty()) json += ",";
    json += "[" + std::to_string(segment.firstBit) + "," + std::to_string(segment.lastBit) + "," +
            std::to_string(segment.segmentValue) + "]";
  }
  return "[" + json + "]";
}

std::string Msg(size_t index) { return "{\"msg\":" + std::to_string(index); }

std::string FieldLine(size_t index, const host::DecodedFieldReport& field) {
  return Msg(index) + ",\"fieldId\":" + std::to_string(field.fieldId) +
         ",\"label\":" + cli::JsonString(field.label) + ",\"text\":" + cli::JsonString(field.text) +
         ",\"segments\":" + Segments(field.segments) +
         ",\"firstSegment\":" + std::to_string(field.firstSegment) +
         ",\"bitOrderGroup\":" + std::to_string(field.bitOrderGroup) + "}";
}

std::string DisplayLine(size_t index, const host::DisplayLine& line) {
  return Msg(index) + ",\"displayId\":" + std::to_string(line.displayId) +
         ",\"text\":" + cli::JsonString(line.text) + "}";
}

std::string SummaryLine(size_t index, host::HostDecodeContext& context) {
  return Msg(index) + ",\"summary\":true,\"result\":true,\"bitsLeftOut\":" +
         std::to_string(context.decode_request().bitsLeftOut) +
         ",\"position\":" + std::to_string(context.state().position) +
         ",\"flags\":" + std::to_string(context.state().flags) + "}";
}

// What `--json` should print for the samples: the reports of `pass`, called
// directly on each message, with a summary behind each message's lines.
Lines DirectLines(uint32_t (*pass)(DecodeRequest*)) {
  host::HostDecodeContext context;
  Lines lines;
  const std::vector<std::vector<uint8_t>> messages = SampleMessages();
  for (size_t index = 0; index < messages.size(); ++index) {
    host::ResetHost();
    context.LoadMessage(messages[index]);
    EXPECT_TRUE(pass(&context.decode_request()));
    for (const auto& field : host::DecodedFields()) lines.push_back(FieldLine(index, field));
    for (const auto& line : host::DisplayLines()) lines.push_back(DisplayLine(index, line));
    lines.push_back(SummaryLine(index, context));
  }
  return lines;
}

TEST(EndToEndTest, DecodedFieldsAreThoseTheModuleReportsWhenCalledDirectly) {
  const ProcessRun run = RunDecode(std::string("--json -f '") + RNSAP_SAMPLES_FILE + "'");
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(run.err, "");
  const Lines expected = DirectLines(vex_PreDecodeMD);
  ASSERT_GT(expected.size(), SampleMessages().size());
  EXPECT_EQ(run.out, expected);
}

TEST(EndToEndTest, DisplayLinesAreThoseTheModuleReportsWhenCalledDirectly) {
  const ProcessRun run = RunDecode("--pass display --json -", ReadAll(RNSAP_SAMPLES_FILE));
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(run.out, DirectLines(vex_PreDecodeTO));
}

bool Contains(const Lines& lines, const std::string& line) {
  return std::find(lines.begin(), lines.end(), line) != lines.end();
}

TEST(EndToEndTest, KeysAreReadBackBySizeClass) {
  const ProcessRun run = RunDecode("--pass keys --json", ReadAll(RNSAP_SAMPLES_FILE));
  EXPECT_EQ(run.status, 0) << run.err;
  // The scalar sample (message 2) and the 15-digit IMSI (message 3).
  EXPECT_TRUE(Contains(run.out, R"({"msg":2,"row":7,"name":"LongTransActionId","value":300})"));
  EXPECT_TRUE(
      Contains(run.out, R"({"msg":2,"row":17,"name":"S_RNTI","value":"0ABCDE","bits":24})"));
  EXPECT_TRUE(Contains(run.out, R"({"msg":2,"row":15,"name":"C_ID","value":1234})"));
  EXPECT_TRUE(Contains(run.out,
                       R"({"msg":3,"row":42,"name":"IMSI","value":"0440200123456789","bits":60})"));
  EXPECT_TRUE(Contains(run.out, R"({"msg":3,"row":3,"name":"Procedure Code","value":13})"));
  EXPECT_TRUE(Contains(run.out, R"({"msg":3,"row":30,"name":"LAC","value":6699})"));
}

TEST(EndToEndTest, BadLinesAreNamedAndTheOthersStillDecoded) {
  const std::string file = ScratchFile("messages.hex");
  std::ofstream(file) << "# two messages, one bad\n00 14 40 50 03 00 00 00\n0014 4\n";
  const ProcessRun run =
      RunDecode("--pass validate --json -f '" + file + "' zz '00:14:40:50:03:00:00:00'");
  EXPECT_EQ(run.status, 1);
  EXPECT_NE(run.err.find(file + ":3: error: odd number of hex digits (5)"), std::string::npos)
      << run.err;
  EXPECT_NE(run.err.find("argument 6: error: invalid character 'z' at column 1"), std::string::npos)
      << run.err;
  const std::string summary =
      R"(,"summary":true,"result":true,"bitsLeftOut":0,"position":65,"flags":0,"verdict":0})";
  EXPECT_EQ(run.out, (Lines{Msg(0) + summary, Msg(1) + summary}));
}

TEST(EndToEndTest, TextFormNamesEachMessageAndSummarisesIt) {
  const ProcessRun run = RunDecode("'00 14 40 50 03 00 00 00'");
  EXPECT_EQ(run.status, 0);
  ASSERT_EQ(run.out.size(), 17u);
  EXPECT_EQ(run.out.front(), "msg 0 (argument 1), 8 octets, decode");
  EXPECT_EQ(run.out[4], "       9-16  Procedure Code=id_radioLinkSetup");
  EXPECT_EQ(run.out.back(), "summary: result true, bits left 0, position 65, flags 0x0");
}

TEST(EndToEndTest, RefusesAModuleItCannotLoadAndABadCommandLine) {
  ProcessRun run = RunDecode("--module /nonexistent/vorel_rnsap_04B_DLL.so 00");
  EXPECT_EQ(run.status, 2);
  EXPECT_NE(run.err.find("cannot load /nonexistent/vorel_rnsap_04B_DLL.so"), std::string::npos)
      << run.err;
  EXPECT_TRUE(run.out.empty());

  run = RunDecode("--pass walk 00");
  EXPECT_EQ(run.status, 2);
  EXPECT_EQ(run.err.rfind("rnsap-decode: unknown pass 'walk'\n", 0), 0u) << run.err;
}

}  // namespace
}  // namespace rnsap
