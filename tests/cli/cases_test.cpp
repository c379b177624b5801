// rnsap-decode as a user runs it, case by case from cases.txt: its
// arguments and input, and the output lines, error lines and exit status
// expected. The head of cases.txt tells the form of a case.
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <span>
#include <tuple>

#include "tests/cli/capture_writer.h"
#include "tests/cli/decode_run.h"

namespace rnsap::testing {
namespace {

// A case: where it starts and its comment, and its values by key, in order.
struct Case {
  std::string name;
  std::map<std::string, Lines> values;

  const Lines& operator[](const std::string& key) const {
    static const Lines kNone;
    const auto found = values.find(key);
    return found == values.end() ? kNone : found->second;
  }
};

// Cases are separated by blank lines; a block without "run:" is commentary.
std::vector<Case> ReadCases() {
  static const std::set<std::string> kKeys{"env",    "run", "stdin", "file",   "pcap", "pcapns",
                                           "pcapng", "cut", "frame", "status", "out",  "err"};
  const Lines lines = SplitLines(ReadAll(RNSAP_CASES_FILE));
  std::vector<Case> cases;
  for (size_t index = 0; index < lines.size(); ++index) {
    const std::string& line = lines[index];
    if (line.empty()) continue;
    if (index == 0 || lines[index - 1].empty())
      cases.push_back({"cases.txt:" + std::to_string(index + 1), {}});
    if (line.starts_with('#')) {
      cases.back().name += line.substr(1);
      continue;
    }
    const std::string key = line.substr(0, line.find(':'));
    if (!kKeys.contains(key)) ADD_FAILURE() << "cases.txt:" << index + 1 << ": no key: " << line;
    cases.back().values[key].push_back(line.substr(std::min(key.size() + 2, line.size())));
  }
  std::erase_if(cases, [](const Case& test) { return test["run"].empty(); });
  return cases;
}

// The lines, each with its newline; unescaped, a "\xHH" stands for that byte.
std::string Joined(const Lines& lines, bool unescaped = false) {
  std::string text;
  for (const std::string& line : lines) {
    for (size_t at = 0; at < line.size(); ++at) {
      const bool escape = unescaped && line.compare(at, 2, "\\x") == 0;
      text += escape ? static_cast<char>(std::stoi(line.substr(at + 2, 2), nullptr, 16)) : line[at];
      at += escape ? 3 : 0;
    }
    text += '\n';
  }
  return text;
}

// $FILE (the case's file), $SAMPLES, $CAPTURE and $TMP as paths, quoted for
// the shell in arguments.
std::string Substituted(std::string text, const std::string& file, bool quoted) {
  const std::pair<std::string, std::string> names[] = {{"$FILE", file},
                                                       {"$SAMPLES", RNSAP_SAMPLES_FILE},
                                                       {"$CAPTURE", RNSAP_SAMPLE_CAPTURE},
                                                       {"$TMP", ::testing::TempDir()}};
  for (const auto& [name, path] : names) {
    for (size_t at; (at = text.find(name)) != text.npos;)
      text.replace(at, name.size(), quoted ? "'" + path + "'" : path);
  }
  return text;
}

// Whether `lines` match `pattern` line by line: "..." stands for any lines,
// a line ending in "..." for any line that starts with what precedes it.
bool Matches(std::span<const std::string> lines, std::span<const std::string> pattern) {
  if (pattern.empty()) return lines.empty();
  if (pattern[0] == "...") {
    for (size_t skipped = 0; skipped <= lines.size(); ++skipped)
      if (Matches(lines.subspan(skipped), pattern.subspan(1))) return true;
    return false;
  }
  if (lines.empty()) return false;
  const std::string_view want = pattern[0];
  const bool same = want.ends_with("...") ? lines[0].starts_with(want.substr(0, want.size() - 3))
                                          : lines[0] == want;
  return same && Matches(lines.subspan(1), pattern.subspan(1));
}

void ExpectLines(const char* stream, const Lines& lines, const Lines& pattern,
                 const std::string& file) {
  Lines expected;
  for (const std::string& line : pattern) expected.push_back(Substituted(line, file, false));
  EXPECT_TRUE(Matches(lines, expected)) << stream << ":\n"
                                        << Joined(lines) << "expected:\n"
                                        << Joined(expected);
}

// $FILE is the case's file: its hex lines, or its frames as a capture of the
// format given, cut short if the case says so.
void RunCase(const Case& test, const std::string& format) {
  static const std::vector<Octets> samples = HexMessages(RNSAP_SAMPLES_FILE);
  const std::string file = ScratchPath("case." + (format.empty() ? "hex" : format));
  std::string content = Joined(test["file"], true);
  if (!format.empty()) {
    std::vector<Frame> frames;
    for (const std::string& frame : test["frame"]) frames.push_back(DescribedFrame(frame, samples));
    content = Capture(format, test[format][0], frames);
    content.resize(content.size() - (test["cut"].empty() ? 0 : std::stoul(test["cut"][0])));
  }
  std::ofstream(file, std::ios::binary) << content;
  const std::string arguments = Substituted(test["run"][0], file, true);
  const DecodeRun run =
      RunDecode(arguments, Joined(test["stdin"], true), test["env"].empty() ? "" : test["env"][0]);
  EXPECT_EQ(run.status, test["status"].empty() ? 0 : std::stoi(test["status"][0]));
  ExpectLines("standard output", run.out, test["out"], file);
  ExpectLines("standard error", run.err, test["err"], file);
  // Worker processes print the full decode as one process prints it (the
  // allocation knob of an env line counts the allocations of one process).
  const bool fullDecode =
      arguments.find("-V") != std::string::npos || arguments.find("--pass") != std::string::npos;
  if (!format.empty() && test["env"].empty() && fullDecode) {
    const DecodeRun parallel = RunDecode("-j 3 " + arguments, Joined(test["stdin"], true), "");
    EXPECT_EQ(std::tie(parallel.status, parallel.out, parallel.err),
              std::tie(run.status, run.out, run.err));
  }
}

// A capture case runs once for each format it is given in.
TEST(CommandLineTest, EveryCaseOfCasesTxt) {
  const std::vector<Case> cases = ReadCases();
  ASSERT_FALSE(cases.empty());
  for (const Case& test : cases) {
    Lines formats;
    for (const std::string format : {"pcap", "pcapns", "pcapng"}) {
      if (!test[format].empty()) formats.push_back(format);
    }
    for (const std::string& format : formats.empty() ? Lines{""} : formats) {
      SCOPED_TRACE(test.name + (format.empty() ? "" : " (" + format + ")"));
      RunCase(test, format);
    }
  }
}

}  // namespace
}  // namespace rnsap::testing
