#include "cli/options.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <array>
#include <charconv>
#include <cstdint>
#include <map>
#include <optional>
#include <ranges>
#include <tuple>
#include <utility>

namespace rnsap::cli {
namespace {

// Beyond any machine's cores; bounds the processes and pipes -j starts.
constexpr unsigned kMostJobs = 256;

constexpr std::string_view kVersion = "rnsap-decode 1.1.0\n";

constexpr std::array<std::pair<std::string_view, Pass>, 4> kPassNames = {{
    {"validate", Pass::kValidate},
    {"decode", Pass::kDecode},
    {"display", Pass::kDisplay},
    {"keys", Pass::kKeys},
}};

// Numbers from 0 to `max` separated by ','.
std::optional<std::vector<uint32_t>> NumberList(std::string_view text, uint32_t max) {
  std::vector<uint32_t> numbers;
  for (size_t start = 0; start <= text.size();) {
    const size_t end = std::min(text.find(',', start), text.size());
    uint32_t number = 0;
    const auto [stop, error] = std::from_chars(text.data() + start, text.data() + end, number);
    if (error != std::errc() || stop != text.data() + end || number > max) return std::nullopt;
    numbers.push_back(number);
    start = end + 1;
  }
  return numbers;
}

constexpr const char* kDescription =
    "Decodes RNSAP messages of the Vorel dialect with the decoder module.\n"
    "Each HEX argument is one message; -f FILE and - (standard input) give\n"
    "one message per line. Blanks and ':' may stand between octets; empty\n"
    "lines and lines starting with '#' are skipped. -r CAPTURE reads a pcap\n"
    "or pcapng file and decodes the RNSAP messages in it (SCCP subsystem 143\n"
    "over M3UA/SCTP on Ethernet, Linux cooked or raw IP, or over MTP2/MTP3;\n"
    "--ssn, --sctp-port and --ppid name others, as lists such as 143,142),\n"
    "one line per message unless -V or --pass asks for the full decode.\n"
    "-f - and -r - read standard input, as hex lines or as a capture.\n"
    "Without messages on the command line, standard input is read.";

constexpr const char* kFooter =
    "Each message is named by where it came from: FILE:LINE, <stdin>:LINE,\n"
    "'argument N' for the Nth HEX argument, or the capture file (\"source\" in\n"
    "JSON); a message from a capture also gives its frame and time. Its\n"
    "summary gives the pass's result: true or false for validate, decode and\n"
    "display; for keys the number the pass returns, 1 at a normal end, 0 when\n"
    "a key could not be packed or a table could not grow, below 0 the refusal\n"
    "of the host's key-field library. A capture ends with a line counting its\n"
    "frames, RNSAP messages, skipped and malformed frames.\n"
    "\n"
    "Exit status: 0, or 1 if any input was bad or a capture could not be\n"
    "read, 2 if the command line or the module could not be used, 3 if the\n"
    "output could not be written.";

// The options as CLI11 sees them. A valued option takes the next argument,
// whatever it is, as its value.
class CommandLine {
 public:
  CommandLine() {
    app_.description(kDescription);
    app_.footer(kFooter);
    app_.set_help_flag("-h,--help", "print this help and exit");
    app_.set_version_flag("--version", std::string(kVersion), "print the version and exit");
    app_.allow_extras();
    pass_ = Valued("--pass", "NAME",
                   "the pass to run: validate, decode, display or keys (default decode)");
    json_ = app_.add_flag("--json")->description("one JSON object per line instead of text");
    module_ = Valued("--module", "PATH", "the module to load instead of the built one");
    file_ =
        Valued("-f", "FILE", "read hex messages from FILE, one per line (- for standard input)");
    capture_ = Valued("-r", "CAPTURE",
                      "read the RNSAP messages of a pcap or pcapng file (- for standard input)");
    jobs_ = Valued("-j", "N", "decode captures in full with N worker processes (0: one per core)");
    subsystems_ =
        Valued("--ssn", "LIST", "SCCP subsystems taken as RNSAP in captures (default 143)");
    ports_ = Valued("--sctp-port", "LIST",
                    "SCTP ports whose DATA of payload protocol 0 is M3UA (default 2905)");
    payloadProtocols_ = Valued("--ppid", "LIST", "SCTP payload protocol ids of M3UA (default 3)");
    fullDecode_ = app_.add_flag("-V")->description(
        "show captured messages in full (the chosen pass) instead of one line each");
    filter_ = Valued("--filter", "NAME=VALUE",
                     "take only messages whose field NAME is VALUE (repeatable, all must hold)");
    frames_ = Valued("--frames", "N-M", "take only messages of frames N to M (N-, -M, N)");
    count_ = Valued("-c", "COUNT", "stop after COUNT messages taken");
    fields_ = Valued("--fields", "LIST", "print the comma-separated fields as columns");
    format_ = Valued("--format", "FORM", "columns as tsv (default), csv or json");
    stats_ = app_.add_flag("--stats")->description("print procedure statistics");
    traces_ = app_.add_flag("--traces")->description("print the messages of each UE context");
    save_ = Valued(
        "-w", "FILE",
        "also write the frames of the messages taken to FILE (pcapng if named .pcapng, else pcap)");
    ue_ = Valued("--ue", "NAME=VALUE",
                 "print the UE context of connection, S_RNTI, D_RNTI or IMSI VALUE");
    answerTimeout_ = Valued("--answer-timeout", "SECONDS",
                            "capture time a request waits for its answer (default 60)");
    messages_ = app_.add_option("HEX", "a message in hex, or - for standard input")
                    ->expected(0, CLI::detail::expected_max_vector_size)
                    ->allow_extra_args();
  }

  CLI::App& app() { return app_; }

  ParsedOptions Read(std::string_view defaultModulePath) {
    ParsedOptions parsed;
    parsed.options.modulePath = defaultModulePath;
    parsed.error = FirstUnknownOption();
    if (parsed.error.empty()) parsed.error = BracketedArgument();
    if (parsed.error.empty()) parsed.error = ReadValues(parsed.options);
    if (parsed.error.empty()) parsed.error = ReadCarriers(parsed.options.carriers);
    if (parsed.error.empty()) ReadSources(parsed.options);
    if (parsed.error.empty() && parsed.options.jobs != 1 && parsed.options.Analysing()) {
      parsed.error = "option -j decodes captures in full only (-V or --pass)";
    }
    return parsed;
  }

 private:
  CLI::Option* Valued(const std::string& name, const std::string& valueName,
                      const std::string& help) {
    return app_.add_option(name, help)
        ->type_name(valueName)
        ->expected(1)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  }

  // CLI11 leaves the unknown options behind, and the "--" that ended the
  // options.
  std::string FirstUnknownOption() const {
    for (const std::string& argument : app_.remaining()) {
      if (argument != "--") return "unknown option " + argument;
    }
    return "";
  }

  // CLI11 reads a HEX argument in brackets, "[a,b]", as a list of values;
  // each argument must stay one message.
  std::string BracketedArgument() const {
    const auto& order = app_.parse_order();
    const auto given = std::count(order.begin(), order.end(), messages_);
    if (messages_->results().size() == static_cast<size_t>(given)) return "";
    return "a HEX argument in brackets is no hex message";
  }

  std::string ReadValues(Options& options) const {
    for (const std::string& value : json_->results()) {
      if (value != "true") return "option --json takes no value";
    }
    options.json = json_->count() > 0;
    if (const std::string error = ReadAnalysis(options); !error.empty()) return error;
    for (CLI::Option* option :
         {pass_, module_, file_, capture_, subsystems_, ports_, payloadProtocols_, filter_, frames_,
          count_, fields_, format_, answerTimeout_, ue_, save_, jobs_}) {
      for (const std::string& value : option->results()) {
        if (value.empty()) return "option " + option->get_name() + " needs a value";
      }
    }
    if (!module_->empty()) options.modulePath = ModulePath(module_->results().back());
    if (!jobs_->empty() &&
        (!ReadNumber(jobs_->results().back(), options.jobs) || options.jobs > kMostJobs)) {
      return "option -j takes a number of worker processes from 0 to " + std::to_string(kMostJobs);
    }
    if (pass_->empty()) return "";
    const std::optional<Pass> pass = PassNamed(pass_->results().back());
    if (!pass) return "unknown pass '" + pass_->results().back() + "'";
    options.pass = *pass;
    options.passChosen = true;
    return "";
  }

  // Each list given replaces its default.
  std::string ReadCarriers(RnsapCarriers& carriers) const {
    using List = std::vector<uint32_t> RnsapCarriers::*;
    const std::tuple<CLI::Option*, List, uint32_t> lists[] = {
        {subsystems_, &RnsapCarriers::subsystems, UINT8_MAX},
        {ports_, &RnsapCarriers::m3uaPorts, UINT16_MAX},
        {payloadProtocols_, &RnsapCarriers::m3uaPayloadProtocols, UINT32_MAX}};
    for (const auto& [option, list, max] : lists) {
      if (option->empty()) continue;
      const std::string& text = option->results().back();
      const std::optional<std::vector<uint32_t>> numbers = NumberList(text, max);
      if (!numbers) {
        return "option " + option->get_name() + " takes numbers from 0 to " + std::to_string(max) +
               " separated by ',', not '" + text + "'";
      }
      carriers.*list = *numbers;
    }
    return "";
  }

  std::string ReadAnalysis(Options& options) const {
    for (const CLI::Option* flag : {fullDecode_, stats_, traces_}) {
      for (const std::string& value : flag->results()) {
        if (value != "true") return "option " + flag->get_name() + " takes no value";
      }
    }
    options.fullDecode = fullDecode_->count() > 0;
    options.stats = stats_->count() > 0;
    if (!ue_->empty()) options.ue = ue_->results().back();
    if (!save_->empty()) options.savePath = save_->results().back();
    options.traces = traces_->count() > 0 || !options.ue.empty();
    options.filters = filter_->results();
    if (!frames_->empty()) options.frames = frames_->results().back();
    for (const std::string& list : fields_->results()) {
      for (const auto part : std::views::split(list, ',')) {
        options.fields.emplace_back(part.begin(), part.end());
      }
    }
    if (!format_->empty()) options.format = format_->results().back();
    if (options.json) options.format = "json";
    if (options.format != "tsv" && options.format != "csv" && options.format != "json") {
      return "unknown column format '" + options.format + "'";
    }
    if (!count_->empty() && !ReadNumber(count_->results().back(), options.count)) {
      return "option -c needs a whole number";
    }
    if (!answerTimeout_->empty() &&
        !ReadNumber(answerTimeout_->results().back(), options.answerTimeout)) {
      return "option --answer-timeout needs a number of seconds";
    }
    return "";
  }

  template <typename Number>
  static bool ReadNumber(const std::string& text, Number& number) {
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size() && number >= 0;
  }

  // The loader searches its own directories for a bare file name; the user
  // means the file in the current directory.
  static std::string ModulePath(const std::string& path) {
    return (path.find('/') == std::string::npos ? "./" : "") + path;
  }

  // The sources in the order they were given: each occurrence of an option
  // in the parse order stands for that option's next value.
  void ReadSources(Options& options) const {
    std::map<const CLI::Option*, size_t> taken;
    for (const CLI::Option* option : app_.parse_order()) {
      AddSource(option, option->results().at(taken[option]++), options);
    }
    if (options.sources.empty()) AddSource(messages_, "-", options);
  }

  void AddSource(const CLI::Option* option, const std::string& value, Options& options) const {
    using Kind = InputSource::Kind;
    if (option != file_ && option != capture_ && option != messages_) return;
    const Kind kind = option == capture_ ? Kind::kCapture
                      : value == "-"     ? Kind::kStandardInput
                      : option == file_  ? Kind::kFile
                                         : Kind::kArgument;
    const int argumentNumber = kind == Kind::kArgument ? ++messageArguments_ : 0;
    options.sources.push_back({kind, value, argumentNumber});
  }

  CLI::App app_{"", "rnsap-decode"};
  CLI::Option* pass_ = nullptr;
  CLI::Option* json_ = nullptr;
  CLI::Option* module_ = nullptr;
  CLI::Option* file_ = nullptr;
  CLI::Option* capture_ = nullptr;
  CLI::Option* jobs_ = nullptr;
  CLI::Option* subsystems_ = nullptr;
  CLI::Option* ports_ = nullptr;
  CLI::Option* payloadProtocols_ = nullptr;
  CLI::Option* messages_ = nullptr;
  CLI::Option* fullDecode_ = nullptr;
  CLI::Option* filter_ = nullptr;
  CLI::Option* frames_ = nullptr;
  CLI::Option* count_ = nullptr;
  CLI::Option* fields_ = nullptr;
  CLI::Option* format_ = nullptr;
  CLI::Option* stats_ = nullptr;
  CLI::Option* traces_ = nullptr;
  CLI::Option* ue_ = nullptr;
  CLI::Option* save_ = nullptr;
  CLI::Option* answerTimeout_ = nullptr;
  mutable int messageArguments_ = 0;
};

}  // namespace

bool Options::Analysing() const {
  if (stats || traces || !fields.empty() || !savePath.empty()) return true;
  const bool anyCapture = std::any_of(sources.begin(), sources.end(), [](const InputSource& s) {
    return s.kind == InputSource::Kind::kCapture;
  });
  const bool selecting = !filters.empty() || !frames.empty() || count != 0;
  return !fullDecode && !passChosen && (anyCapture || selecting);
}

std::optional<Pass> PassNamed(std::string_view name) {
  for (const auto& [passName, pass] : kPassNames) {
    if (passName == name) return pass;
  }
  return std::nullopt;
}

std::string_view PassName(Pass pass) {
  for (const auto& [name, namedPass] : kPassNames) {
    if (namedPass == pass) return name;
  }
  return {};
}

ParsedOptions ParseOptions(std::span<const std::string_view> arguments,
                           std::string_view defaultModulePath) {
  CommandLine commandLine;
  // CLI11 takes the arguments last first.
  std::vector<std::string> reversed(arguments.rbegin(), arguments.rend());
  ParsedOptions parsed;
  try {
    commandLine.app().parse(reversed);
    return commandLine.Read(defaultModulePath);
  } catch (const CLI::CallForHelp&) {
    parsed.options.help = true;
  } catch (const CLI::CallForVersion&) {
    parsed.options.version = true;
  } catch (const CLI::ArgumentMismatch&) {
    // Only a valued option at the end of the command line lacks its value.
    const std::string_view last = arguments.back();
    parsed.error = "option " + std::string(last.substr(0, last.find('='))) + " needs a value";
  } catch (const CLI::ParseError& error) {
    parsed.error = error.what();
  }
  return parsed;
}

std::string Usage() {
  CommandLine commandLine;
  return commandLine.app().help();
}

std::string_view VersionText() { return kVersion; }

}  // namespace rnsap::cli
