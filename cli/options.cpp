#include "cli/options.h"

#include <array>
#include <optional>
#include <utility>

namespace rnsap::cli {
namespace {

constexpr std::array<std::pair<std::string_view, Pass>, 4> kPassNames = {{
    {"validate", Pass::kValidate},
    {"decode", Pass::kDecode},
    {"display", Pass::kDisplay},
    {"keys", Pass::kKeys},
}};

std::optional<Pass> PassNamed(std::string_view name) {
  for (const auto& [passName, pass] : kPassNames) {
    if (passName == name) return pass;
  }
  return std::nullopt;
}

// Walks the arguments once, collecting options and sources.
class OptionParser {
 public:
  OptionParser(std::span<const std::string_view> arguments, std::string_view defaultModulePath)
      : arguments_(arguments) {
    parsed_.options.modulePath = defaultModulePath;
  }

  ParsedOptions Parse() {
    while (next_ < arguments_.size() && parsed_.error.empty()) TakeArgument();
    if (parsed_.options.sources.empty()) AddSource(InputSource::Kind::kStandardInput, "-");
    return std::move(parsed_);
  }

 private:
  void TakeArgument() {
    const std::string_view argument = arguments_[next_++];
    const bool isOption = !optionsEnded_ && argument.size() > 1 && argument.front() == '-';
    if (!isOption) {
      AddMessageArgument(argument);
    } else if (argument == "--") {
      optionsEnded_ = true;
    } else {
      TakeOption(argument);
    }
  }

  void AddMessageArgument(std::string_view argument) {
    if (argument == "-") {
      AddSource(InputSource::Kind::kStandardInput, argument);
    } else {
      AddSource(InputSource::Kind::kArgument, argument);
    }
  }

  void TakeOption(std::string_view argument) {
    const size_t equals = argument.find('=');
    const std::string_view name = argument.substr(0, equals);
    const std::optional<std::string_view> inlineValue =
        equals == std::string_view::npos ? std::nullopt
                                         : std::optional(argument.substr(equals + 1));
    if (name == "--json" || name == "-h" || name == "--help") {
      TakeFlag(name, inlineValue.has_value());
    } else if (name == "--pass" || name == "--module" || name == "-f") {
      TakeValuedOption(name, inlineValue);
    } else {
      Fail("unknown option " + std::string(argument));
    }
  }

  void TakeFlag(std::string_view name, bool hasValue) {
    if (hasValue) return Fail("option " + std::string(name) + " takes no value");
    if (name == "--json") {
      parsed_.options.json = true;
    } else {
      parsed_.options.help = true;
    }
  }

  void TakeValuedOption(std::string_view name, std::optional<std::string_view> inlineValue) {
    if (!inlineValue && next_ == arguments_.size()) {
      return Fail("option " + std::string(name) + " needs a value");
    }
    const std::string_view value = inlineValue ? *inlineValue : arguments_[next_++];
    if (value.empty()) return Fail("option " + std::string(name) + " needs a value");
    if (name == "--module") {
      SetModulePath(value);
    } else if (name == "-f") {
      AddSource(InputSource::Kind::kFile, value);
    } else {
      SetPass(value);
    }
  }

  // The loader searches its own directories for a bare file name; the user
  // means the file in the current directory.
  void SetModulePath(std::string_view path) {
    const bool bareName = path.find('/') == std::string_view::npos;
    parsed_.options.modulePath = (bareName ? "./" : "") + std::string(path);
  }

  void SetPass(std::string_view value) {
    const std::optional<Pass> pass = PassNamed(value);
    if (!pass) return Fail("unknown pass '" + std::string(value) + "'");
    parsed_.options.pass = *pass;
  }

  void AddSource(InputSource::Kind kind, std::string_view text) {
    const int argumentNumber = kind == InputSource::Kind::kArgument ? ++messageArguments_ : 0;
    parsed_.options.sources.push_back({kind, std::string(text), argumentNumber});
  }

  void Fail(std::string reason) { parsed_.error = std::move(reason); }

  std::span<const std::string_view> arguments_;
  size_t next_ = 0;
  bool optionsEnded_ = false;
  int messageArguments_ = 0;
  ParsedOptions parsed_;
};

}  // namespace

std::string_view PassName(Pass pass) {
  for (const auto& [name, namedPass] : kPassNames) {
    if (namedPass == pass) return name;
  }
  return {};
}

ParsedOptions ParseOptions(std::span<const std::string_view> arguments,
                           std::string_view defaultModulePath) {
  return OptionParser(arguments, defaultModulePath).Parse();
}

std::string_view Usage() {
  return "usage: rnsap-decode [--pass validate|decode|display|keys] [--json]\n"
         "                    [--module PATH] [-f FILE]... [-] [HEX]...\n"
         "\n"
         "Decodes RNSAP messages of the Vorel dialect with the decoder module.\n"
         "Each HEX argument is one message; -f FILE and - (standard input) give\n"
         "one message per line. Blanks and ':' may stand between octets; empty\n"
         "lines and lines starting with '#' are skipped. Without messages on the\n"
         "command line, standard input is read.\n"
         "\n"
         "  --pass NAME    the pass to run (default decode)\n"
         "  --json         one JSON object per line instead of text\n"
         "  --module PATH  the module to load instead of the built one\n"
         "  -f FILE        read messages from FILE\n"
         "\n"
         "Each message is named by where it came from: FILE:LINE, <stdin>:LINE,\n"
         "or 'argument N' for the Nth HEX argument (\"source\" in JSON). Its\n"
         "summary gives the pass's result: true or false for validate, decode and\n"
         "display; for keys the number the pass returns, 1 at a normal end, 0 when\n"
         "a key could not be packed or a table could not grow, below 0 the refusal\n"
         "of the host's key-field library.\n"
         "\n"
         "Exit status: 0, or 1 if any input was bad, or 2 if the command line\n"
         "or the module could not be used.\n";
}

}  // namespace rnsap::cli
