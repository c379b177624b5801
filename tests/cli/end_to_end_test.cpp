// rnsap-decode as a user runs it: the built executable, which loads the
// module by its file name, checked against direct calls of the passes
// recorded through the stand-in host libraries.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "cli/hex_input.h"
#include "cli/json.h"
#include "host/recorder.h"
#include "host/setup.h"
#include "tests/cli/capture_writer.h"
#include "tests/support/scratch_path.h"

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
  return testing::ScratchPath(test + "_" + what);
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

// The sample messages, each named by its line as read under `name`.
std::vector<cli::InputMessage> SampleMessages(std::string_view name) {
  std::vector<cli::InputMessage> messages;
  const Lines lines = SplitLines(ReadAll(RNSAP_SAMPLES_FILE));
  for (size_t index = 0; index < lines.size(); ++index) {
    const cli::HexLine parsed = cli::ParseHexLine(lines[index]);
    if (parsed.kind != cli::HexLine::Kind::kMessage) continue;
    messages.push_back({std::string(name) + ":" + std::to_string(index + 1), parsed.octets});
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

std::string Msg(size_t index, const std::string& source) {
  return "{\"msg\":" + std::to_string(index) + ",\"source\":" + cli::JsonString(source);
}

std::string FieldLine(const std::string& msg, const host::DecodedFieldReport& field) {
  return msg + ",\"fieldId\":" + std::to_string(field.fieldId) +
         ",\"label\":" + cli::JsonString(field.label) + ",\"text\":" + cli::JsonString(field.text) +
         ",\"segments\":" + Segments(field.segments) +
         ",\"firstSegment\":" + std::to_string(field.firstSegment) +
         ",\"bitOrderGroup\":" + std::to_string(field.bitOrderGroup) + "}";
}

std::string DisplayLine(const std::string& msg, const host::DisplayLine& line) {
  return msg + ",\"displayId\":" + std::to_string(line.displayId) +
         ",\"text\":" + cli::JsonString(line.text) + "}";
}

std::string SummaryLine(const std::string& msg, host::HostDecodeContext& context) {
  return msg + ",\"summary\":true,\"result\":true,\"bitsLeftOut\":" +
         std::to_string(context.decode_request().bitsLeftOut) +
         ",\"position\":" + std::to_string(context.state().position) +
         ",\"flags\":" + std::to_string(context.state().flags) + "}";
}

// What `--json` should print for the samples: the reports of `pass`, called
// directly on each message, with a summary behind each message's lines, the
// samples read under `name`.
Lines DirectLines(uint32_t (*pass)(DecodeRequest*), std::string_view name) {
  host::HostDecodeContext context;
  Lines lines;
  const std::vector<cli::InputMessage> messages = SampleMessages(name);
  for (size_t index = 0; index < messages.size(); ++index) {
    const std::string msg = Msg(index, messages[index].origin);
    host::ResetHost();
    context.LoadMessage(messages[index].octets);
    EXPECT_TRUE(pass(&context.decode_request()));
    for (const auto& field : host::DecodedFields()) lines.push_back(FieldLine(msg, field));
    for (const auto& line : host::DisplayLines()) lines.push_back(DisplayLine(msg, line));
    lines.push_back(SummaryLine(msg, context));
  }
  return lines;
}

TEST(EndToEndTest, DecodedFieldsAreThoseTheModuleReportsWhenCalledDirectly) {
  const ProcessRun run = RunDecode(std::string("--json -f '") + RNSAP_SAMPLES_FILE + "'");
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(run.err, "");
  const Lines expected = DirectLines(vex_PreDecodeMD, RNSAP_SAMPLES_FILE);
  ASSERT_GT(expected.size(), SampleMessages(RNSAP_SAMPLES_FILE).size());
  EXPECT_EQ(run.out, expected);
}

TEST(EndToEndTest, DisplayLinesAreThoseTheModuleReportsWhenCalledDirectly) {
  const ProcessRun run = RunDecode("--pass display --json -", ReadAll(RNSAP_SAMPLES_FILE));
  EXPECT_EQ(run.status, 0) << run.err;
  EXPECT_EQ(run.out, DirectLines(vex_PreDecodeTO, "<stdin>"));
}

bool Contains(const Lines& lines, const std::string& line) {
  return std::find(lines.begin(), lines.end(), line) != lines.end();
}

TEST(EndToEndTest, KeysAreReadBackBySizeClass) {
  const ProcessRun run = RunDecode("--pass keys --json", ReadAll(RNSAP_SAMPLES_FILE));
  EXPECT_EQ(run.status, 0) << run.err;
  const std::vector<cli::InputMessage> samples = SampleMessages("<stdin>");
  const auto line = [&samples](size_t index, const std::string& rest) {
    return Msg(index, samples[index].origin) + rest;
  };
  // The scalar sample (message 2) and the 15-digit IMSI (message 3).
  for (const std::string& expected : {
           line(2, R"(,"row":7,"name":"LongTransActionId","value":300})"),
           line(2, R"(,"row":17,"name":"S_RNTI","value":"0ABCDE","bits":24})"),
           line(2, R"(,"row":15,"name":"C_ID","value":1234})"),
           line(2, R"(,"summary":true,"result":1,"bitsLeftOut":0,"position":265,"flags":0})"),
           line(3, R"(,"row":42,"name":"IMSI","value":"0440200123456789","bits":60})"),
           line(3, R"(,"row":3,"name":"Procedure Code","value":13})"),
           line(3, R"(,"row":30,"name":"LAC","value":6699})"),
       }) {
    EXPECT_TRUE(Contains(run.out, expected)) << expected;
  }
}

TEST(EndToEndTest, BadLinesAreNamedAndTheOthersStillDecoded) {
  const std::string file = ScratchFile("messages.hex");
  std::ofstream(file) << "# two messages, one bad\n00 14 40 50 03 00 00 00\n0014 4\n";
  const ProcessRun run =
      RunDecode("--pass validate --json -f '" + file + "' zz '00:14:40:50:03:00:00:00'");
  EXPECT_EQ(run.status, 1);
  EXPECT_NE(run.err.find(file + ":3: error: odd number of hex digits (5)"), std::string::npos)
      << run.err;
  EXPECT_NE(run.err.find("argument 1: error: invalid character 'z' at column 1"), std::string::npos)
      << run.err;
  const std::string summary =
      R"(,"summary":true,"result":true,"bitsLeftOut":0,"position":65,"flags":0,"verdict":0})";
  EXPECT_EQ(run.out, (Lines{Msg(0, file + ":2") + summary, Msg(1, "argument 2") + summary}));
}

size_t MessagesPrinted(const Lines& out) {
  return std::count_if(out.begin(), out.end(),
                       [](const std::string& line) { return line.starts_with("msg "); });
}

// What a user may hand over by mistake is named with its reason and skipped;
// the rest is decoded. An argument, even an empty one, stands for a message,
// so standard input is not read. A bare module name is one in the current
// directory, not a library the loader would find on its own. The text form
// names each message and summarises it.
TEST(EndToEndTest, ExitStatusesErrorsAndMessagesPrintedForEachCommandLine) {
  const std::string header = "00 14 40 50 03 00 00 00\n";
  struct Case {
    std::string arguments, input;
    int status;
    std::string error;  // its start, if it ends in "..."
    size_t messages;
    Lines lines = {};  // among those printed
  };
  for (const Case& run : std::vector<Case>{
           {"-f '" + ::testing::TempDir() + "'", "", 1,
            ::testing::TempDir() + ": error: cannot read the file: Is a directory\n", 0},
           {"-f /nonexistent/m.hex", "", 1,
            "/nonexistent/m.hex: error: cannot open the file: No such file or directory\n", 0},
           {"''", header, 1, "argument 1: error: no hex digits\n", 0},
           {"- 00", header + " : \n", 1, "<stdin>:2: error: no hex digits\n", 2},
           {"", "\xEF\xBB\xBF" + header, 0, "", 1},
           {"--module /nonexistent/vorel_rnsap_04B_DLL.so 00", "", 2,
            "rnsap-decode: cannot load /nonexistent/vorel_rnsap_04B_DLL.so: ...", 0},
           {"--module libc.so.6 00", "", 2, "rnsap-decode: cannot load ./libc.so.6: ...", 0},
           {"--pass walk 00", "", 2, "rnsap-decode: unknown pass 'walk'\n...", 0},
           {"--help", "", 0, "", 0, {"Usage: rnsap-decode [OPTIONS] [HEX...]"}},
           {"--version", "", 0, "", 0, {"rnsap-decode 1.1.0"}},
           {"'00 14 40 50 03 00 00 00'",
            "",
            0,
            "",
            1,
            {"msg 0 (argument 1), 8 octets, decode",
             "       9-16  Procedure Code=id_radioLinkSetup",
             "summary: result true, bits left 0, position 65, flags 0x0"}},
       }) {
    const ProcessRun ran = RunDecode(run.arguments, run.input);
    EXPECT_EQ(ran.status, run.status) << run.arguments;
    if (run.error.ends_with("...")) {
      EXPECT_TRUE(ran.err.starts_with(run.error.substr(0, run.error.size() - 3))) << ran.err;
    } else {
      EXPECT_EQ(ran.err, run.error) << run.arguments;
    }
    EXPECT_EQ(MessagesPrinted(ran.out), run.messages) << run.arguments;
    for (const std::string& line : run.lines) EXPECT_TRUE(Contains(ran.out, line)) << line;
  }
}

// ---------------------------------------------------------- captures

// The shipped capture is the one the test support writes from the samples.
TEST(EndToEndTest, SampleCaptureHoldsTheSampleMessages) {
  std::vector<testing::Octets> messages;
  for (const cli::InputMessage& message : SampleMessages("")) messages.push_back(message.octets);
  EXPECT_EQ(ReadAll(RNSAP_SAMPLE_CAPTURE), testing::SampleCapture(messages))
      << "rewrite it with make_sample_capture";
}

// Each pass gives the same lines for the messages of the capture as for the
// same messages in hex, but for where they came from.
TEST(EndToEndTest, CaptureMessagesDecodeAsTheirHex) {
  const std::regex capturePlace(R"("source":"[^"]*","frame":\d+,"time":\d+\.\d{6},)");
  const std::regex hexPlace(R"("source":"[^"]*",)");
  for (const std::string pass : {"validate", "decode", "display", "keys"}) {
    const ProcessRun fromCapture =
        RunDecode("--json --pass " + pass + " -r '" + RNSAP_SAMPLE_CAPTURE + "'");
    const ProcessRun fromHex =
        RunDecode("--json --pass " + pass + " -f '" + RNSAP_SAMPLES_FILE + "'");
    EXPECT_EQ(fromCapture.status, 0) << fromCapture.err;
    EXPECT_EQ(fromCapture.err, "");
    ASSERT_FALSE(fromCapture.out.empty());
    const size_t samples = SampleMessages("").size();  // and one frame to another subsystem
    EXPECT_EQ(fromCapture.out.back(), R"({"capture":true,"frames":)" + std::to_string(samples + 1) +
                                          R"(,"rnsap":)" + std::to_string(samples) +
                                          R"(,"skipped":1,"malformed":0})");
    Lines capture(fromCapture.out.begin(), fromCapture.out.end() - 1), hex;
    for (std::string& line : capture) line = std::regex_replace(line, capturePlace, "");
    for (const std::string& line : fromHex.out)
      hex.push_back(std::regex_replace(line, hexPlace, ""));
    EXPECT_EQ(capture, hex) << pass;
  }
}

// Bundled messages share their frame; the fragmented one is the completing
// frame's.
TEST(EndToEndTest, CaptureMessagesCarryTheirFrameAndTime) {
  const ProcessRun json = RunDecode(std::string("--json -r '") + RNSAP_SAMPLE_CAPTURE + "'");
  std::vector<std::string> places;
  const std::regex place(
      R"(^\{"msg":(\d+),"source":"[^"]*","frame":(\d+),"time":([0-9.]+),"summary")");
  for (const std::string& line : json.out) {
    std::smatch match;
    if (std::regex_search(line, match, place))
      places.push_back(match[1].str() + "@" + match[2].str() + " " + match[3].str());
  }
  const size_t samples = SampleMessages("").size();
  ASSERT_EQ(places.size(), samples);
  places.resize(8);  // the framings that differ; one UDT a frame follows
  EXPECT_EQ(places, (std::vector<std::string>{"0@1 1700000000.000000", "1@2 1700000001.001000",
                                              "2@3 1700000002.002000", "3@3 1700000002.002000",
                                              "4@6 1700000005.005000", "5@7 1700000006.006000",
                                              "6@8 1700000007.007000", "7@9 1700000008.008000"}));
  const ProcessRun text =
      RunDecode(std::string("--pass validate -r '") + RNSAP_SAMPLE_CAPTURE + "'");
  ASSERT_EQ(text.out.size(), 3 * samples + 1);  // frame, message and summary lines, and the close
  EXPECT_EQ(text.out[0], "frame 1, time 1700000000.000000 (2023-11-14 22:13:20.000000 UTC)");
  EXPECT_EQ(text.out[1], std::string("msg 0 (") + RNSAP_SAMPLE_CAPTURE + "), 8 octets, validate");
  EXPECT_EQ(text.out.back(),
            std::string("capture ") + RNSAP_SAMPLE_CAPTURE + ": " + std::to_string(samples + 1) +
                " frames, " + std::to_string(samples) + " RNSAP messages, 1 skipped, 0 malformed");
}

TEST(EndToEndTest, NotesMalformedFramesAndRefusesAnUnreadableCapture) {
  const std::string capture = ScratchFile("malformed.pcap");
  testing::WriteFile(capture, testing::Pcap(testing::kMtp3, {{testing::Octets{0x83, 1}},
                                                             {testing::Octets{0x83, 1, 2, 3, 4}}}));
  ProcessRun run = RunDecode("--json -r '" + capture + "'");
  EXPECT_EQ(run.status, 0);
  EXPECT_EQ(run.err, capture + ": frame 1: note: MTP3: needs 4 octets at offset 1, 1 left\n" +
                         capture + ": frame 2: note: SCCP: needs 1 octets at offset 0, 0 left\n");
  EXPECT_EQ(run.out, Lines{R"({"capture":true,"frames":2,"rnsap":0,"skipped":0,"malformed":2})"});

  run = RunDecode(std::string("-r '") + RNSAP_SAMPLES_FILE + "' 00");
  EXPECT_EQ(run.status, 1);
  EXPECT_EQ(run.err, std::string(RNSAP_SAMPLES_FILE) +
                         ": error: cannot read the capture: unknown file format\n");
  EXPECT_EQ(MessagesPrinted(run.out), 1u);
}

}  // namespace
}  // namespace rnsap
