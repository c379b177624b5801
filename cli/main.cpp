// rnsap-decode: decodes RNSAP messages, given in hex or read from packet
// captures, with the decoder module, loaded by its file name as the protocol
// analyser loads it.
#include <fmt/format.h>

#include <cstdio>
#include <exception>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "cli/capture_run.h"
#include "cli/hex_input.h"
#include "cli/loaded_module.h"
#include "cli/message_decoder.h"
#include "cli/options.h"
#include "cli/output_writer.h"
#include "cli/parallel_decoder.h"
#include "cli/report.h"

namespace rnsap::cli {
namespace {

constexpr int kExitBadInput = 1;
constexpr int kExitUnusable = 2;
constexpr int kExitUnwritable = 3;

// Decodes and prints the messages of every source in command-line order,
// numbering them across all sources, each one printed before the next is
// read.
class DecodeRun {
 public:
  explicit DecodeRun(const Options& options)
      : options_(options),
        module_(options.modulePath),
        decoder_(module_, options.json),
        writer_(stdout, stderr),
        makePrinter_([&options, this](fmt::memory_buffer& out) {
          return options.json ? MakeJsonPrinter(out, decoder_.dictionary()) : MakeTextPrinter(out);
        }),
        printer_(MakeWritingPrinter(makePrinter_(writer_.buffer()), writer_)),
        analysis_(options.Analysing() ? std::make_unique<Analysis>(options, decoder_, writer_)
                                      : nullptr) {}

  // Returns the exit status.
  int Run() {
    bool allRead = true;
    for (const InputSource& source : options_.sources) {
      allRead &= source.kind == InputSource::Kind::kCapture ? Capture(source.text) : Hex(source);
    }
    if (analysis_) analysis_->Finish();
    writer_.Flush();
    if (writer_.failure().empty()) return allRead ? 0 : kExitBadInput;
    fmt::print(stderr, "rnsap-decode: cannot write the output: {}\n", writer_.failure());
    return kExitUnwritable;
  }

 private:
  bool Hex(const InputSource& source) {
    bool allRead = true;
    ReadHexSource(source, stdin,
                  {[&](const InputMessage& message) { Decode(message.origin, message.octets); },
                   [&](const InputError& error) {
                     allRead = false;
                     writer_.Error("{}: error: {}\n", error.origin, error.reason);
                   }});
    return allRead;
  }

  bool Capture(const std::string& given) {
    const MessageDecode decode = [&](Pass pass, std::span<const uint8_t> octets,
                                     MessagePrinter& printer) {
      return decoder_.Decode(pass, octets, printer);
    };
    CapturePrinting printing{options_.pass, decode, *printer_, writer_, options_.carriers};
    printing.analysis = analysis_.get();
    std::optional<ParallelDecoder> workers;
    if (options_.jobs != 1) {
      printing.dispatch =
          &workers.emplace(WorkerCount(options_.jobs), CaptureName(given), printing, makePrinter_);
    }
    return PrintCapture(given, printing, index_).failure.empty();
  }

  void Decode(std::string_view origin, std::span<const uint8_t> octets,
              const CapturedMessage* captured = nullptr) {
    if (analysis_) return analysis_->Message(index_++, origin, captured, octets);
    const FrameStamp* frame = captured ? &captured->frame : nullptr;
    const MessageOrigin* network = captured ? &captured->origin : nullptr;
    printer_->Begin(
        {index_++, origin, frame, network, static_cast<uint32_t>(octets.size()), options_.pass});
    printer_->End(decoder_.Decode(options_.pass, octets, *printer_));
  }

  const Options& options_;
  const LoadedModule module_;
  MessageDecoder decoder_;
  OutputWriter writer_;
  const PrinterFactory makePrinter_;
  const std::unique_ptr<MessagePrinter> printer_;
  const std::unique_ptr<Analysis> analysis_;
  size_t index_ = 0;
};

int Main(std::span<const std::string_view> arguments) {
  const ParsedOptions parsed = ParseOptions(arguments, RNSAP_DEFAULT_MODULE_PATH);
  if (!parsed.error.empty()) {
    fmt::print(stderr, "rnsap-decode: {}\n\n{}", parsed.error, Usage());
    return kExitUnusable;
  }
  if (parsed.options.help || parsed.options.version) {
    fmt::print("{}", parsed.options.help ? Usage() : std::string(VersionText()));
    return 0;
  }
  try {
    return DecodeRun(parsed.options).Run();
  } catch (const SaveFailure& failure) {
    fmt::print(stderr, "rnsap-decode: {}\n", failure.what());
    return kExitUnwritable;
  } catch (const std::exception& failure) {
    fmt::print(stderr, "rnsap-decode: {}\n", failure.what());
    return kExitUnusable;
  }
}

}  // namespace
}  // namespace rnsap::cli

int main(int argc, char** argv) {
  const std::vector<std::string_view> arguments(argv + 1, argv + argc);
  return rnsap::cli::Main(arguments);
}
