// rnsap-decode: decodes RNSAP messages, given in hex or read from packet
// captures, with the decoder module, loaded by its file name as the protocol
// analyser loads it.
#include <exception>
#include <iostream>
#include <span>
#include <string_view>
#include <vector>

#include "cli/capture_input.h"
#include "cli/hex_input.h"
#include "cli/loaded_module.h"
#include "cli/message_decoder.h"
#include "cli/options.h"
#include "cli/report.h"

namespace rnsap::cli {
namespace {

constexpr int kExitBadInput = 1;
constexpr int kExitUnusable = 2;

// Decodes and prints the messages of every source in command-line order,
// numbering them across all sources.
class DecodeRun {
 public:
  explicit DecodeRun(const Options& options)
      : options_(options), module_(options.modulePath), decoder_(module_) {}

  // Returns whether every input could be read.
  bool Run() {
    bool allRead = true;
    for (const InputSource& source : options_.sources) {
      allRead &= source.kind == InputSource::Kind::kCapture ? Capture(source.text) : Hex(source);
    }
    return allRead;
  }

 private:
  bool Hex(const InputSource& source) {
    const InputBatch batch = ReadInputs(std::span(&source, 1), std::cin);
    for (const InputError& error : batch.errors) {
      std::cerr << error.origin << ": error: " << error.reason << '\n';
    }
    for (const InputMessage& message : batch.messages) Decode(message.origin, message.octets);
    return batch.errors.empty();
  }

  bool Capture(const std::string& path) {
    const CaptureOutcome outcome = ReadCapture(
        path, {[&](const CapturedMessage& message) { Decode(path, message.octets, message.frame); },
               [&](const CaptureNote& note) {
                 std::cerr << path << ": frame " << note.frame << ": note: " << note.reason << '\n';
               }});
    if (outcome.heldFragments != 0) {
      std::cerr << path << ": note: " << outcome.heldFragments
                << " SCTP fragments of messages the capture does not complete\n";
    }
    if (!outcome.failure.empty()) std::cerr << path << ": error: " << outcome.failure << '\n';
    if (outcome.opened) {
      (options_.json ? PrintCaptureCountsJson : PrintCaptureCountsText)(path, outcome.counts,
                                                                        std::cout);
    }
    return outcome.failure.empty();
  }

  void Decode(const std::string& origin, std::span<const uint8_t> octets,
              std::optional<FrameStamp> frame = std::nullopt) {
    MessageOutcome outcome = decoder_.Decode(options_.pass, octets);
    outcome.index = index_++;
    outcome.origin = origin;
    outcome.frame = frame;
    (options_.json ? PrintJson : PrintText)(outcome, std::cout);
  }

  const Options& options_;
  const LoadedModule module_;
  MessageDecoder decoder_;
  size_t index_ = 0;
};

int Main(std::span<const std::string_view> arguments) {
  const ParsedOptions parsed = ParseOptions(arguments, RNSAP_DEFAULT_MODULE_PATH);
  if (!parsed.error.empty()) {
    std::cerr << "rnsap-decode: " << parsed.error << "\n\n" << Usage();
    return kExitUnusable;
  }
  if (parsed.options.help || parsed.options.version) {
    std::cout << (parsed.options.help ? Usage() : std::string(VersionText()));
    return 0;
  }
  try {
    return DecodeRun(parsed.options).Run() ? 0 : kExitBadInput;
  } catch (const std::exception& failure) {
    std::cerr << "rnsap-decode: " << failure.what() << '\n';
    return kExitUnusable;
  }
}

}  // namespace
}  // namespace rnsap::cli

int main(int argc, char** argv) {
  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  return rnsap::cli::Main(arguments);
}
