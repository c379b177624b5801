// The command line of rnsap-decode: which pass, which output form, which
// module, and where the messages come from.
#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "cli/rnsap_carriers.h"

namespace rnsap::cli {

enum class Pass { kValidate, kDecode, kDisplay, kKeys };

std::string_view PassName(Pass pass);
// The pass of a name PassName gives, or none.
std::optional<Pass> PassNamed(std::string_view name);

// What standard input is called in messages' names ("-" on the command line).
inline constexpr std::string_view kStandardInputName = "<stdin>";

// One place messages come from, in command-line order.
struct InputSource {
  enum class Kind { kArgument, kFile, kStandardInput, kCapture };
  Kind kind = Kind::kArgument;
  std::string text;        // the hex message of an argument, a file name, or "-"
  int argumentNumber = 0;  // of an argument, its place among the message arguments, from 1
};

struct Options {
  Pass pass = Pass::kDecode;
  bool json = false;
  unsigned jobs = 1;  // worker processes decoding captures; 0 for one per core
  bool help = false;
  bool version = false;
  std::string modulePath;  // a name without '/' is taken in the current directory
  RnsapCarriers carriers;
  std::vector<InputSource> sources;  // standard input alone when none was named
  // The analyst's views, from the Key-field pass alone: the packet list (the
  // default for captures unless -V or --pass asks for the full decode),
  // --fields columns, or --stats; each over the messages the filter takes.
  bool fullDecode = false;           // -V
  bool passChosen = false;           // --pass given
  std::vector<std::string> filters;  // NAME=VALUE, all of which must hold
  std::string frames;                // a frame range
  uint64_t count = 0;                // at most this many messages; 0 all
  std::vector<std::string> fields;   // columns
  std::string format = "tsv";        // of the columns: tsv, csv or json
  bool stats = false;
  bool traces = false;  // --traces, or --ue NAME=VALUE for one UE context
  std::string ue;
  std::string savePath;       // -w: the frames of the messages taken, as pcap
  double answerTimeout = 60;  // seconds of capture time a request waits for its answer

  // Whether the messages are shown by an analyst's view.
  bool Analysing() const;
};

// The options, or in `error` why the command line was refused.
struct ParsedOptions {
  Options options;
  std::string error;
};

// `arguments` are those after the program name.
ParsedOptions ParseOptions(std::span<const std::string_view> arguments,
                           std::string_view defaultModulePath);

// What --help prints.
std::string Usage();

// What --version prints.
std::string_view VersionText();

}  // namespace rnsap::cli
