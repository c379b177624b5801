// rnsap-decode: decodes hex RNSAP messages with the decoder module, loaded by
// its file name as the protocol analyser loads it.
#include <exception>
#include <iostream>
#include <span>
#include <string_view>
#include <vector>

#include "cli/hex_input.h"
#include "cli/loaded_module.h"
#include "cli/message_decoder.h"
#include "cli/options.h"
#include "cli/report.h"

namespace rnsap::cli {
namespace {

constexpr int kExitBadInput = 1;
constexpr int kExitUnusable = 2;

void DecodeAll(const Options& options, const std::vector<InputMessage>& messages) {
  const LoadedModule module(options.modulePath);
  MessageDecoder decoder(module);
  const auto print = options.json ? PrintJson : PrintText;
  for (size_t index = 0; index < messages.size(); ++index) {
    MessageOutcome outcome = decoder.Decode(options.pass, messages[index].octets);
    outcome.index = index;
    outcome.origin = messages[index].origin;
    print(outcome, std::cout);
  }
}

int Main(std::span<const std::string_view> arguments) {
  const ParsedOptions parsed = ParseOptions(arguments, RNSAP_DEFAULT_MODULE_PATH);
  if (!parsed.error.empty()) {
    std::cerr << "rnsap-decode: " << parsed.error << "\n\n" << Usage();
    return kExitUnusable;
  }
  if (parsed.options.help) {
    std::cout << Usage();
    return 0;
  }
  const InputBatch batch = ReadInputs(parsed.options.sources, std::cin);
  for (const InputError& error : batch.errors) {
    std::cerr << error.origin << ": error: " << error.reason << '\n';
  }
  try {
    DecodeAll(parsed.options, batch.messages);
  } catch (const std::exception& failure) {
    std::cerr << "rnsap-decode: " << failure.what() << '\n';
    return kExitUnusable;
  }
  return batch.errors.empty() ? 0 : kExitBadInput;
}

}  // namespace
}  // namespace rnsap::cli

int main(int argc, char** argv) {
  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  return rnsap::cli::Main(arguments);
}
