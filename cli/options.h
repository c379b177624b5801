// The command line of rnsap-decode: which pass, which output form, which
// module, and where the messages come from.
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "cli/rnsap_carriers.h"

namespace rnsap::cli {

enum class Pass { kValidate, kDecode, kDisplay, kKeys };

std::string_view PassName(Pass pass);

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
  bool help = false;
  bool version = false;
  std::string modulePath;  // a name without '/' is taken in the current directory
  RnsapCarriers carriers;
  std::vector<InputSource> sources;  // standard input alone when none was named
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
