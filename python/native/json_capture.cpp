#include "python/native/json_capture.h"

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <stdexcept>

#include "cli/capture_run.h"
#include "cli/output_writer.h"
#include "cli/report.h"
#include "python/native/shared_decoder.h"

namespace rnsap::python {
namespace {

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

// A stream whose text is kept in memory until it is closed.
class MemoryStream {
 public:
  MemoryStream() : file_(open_memstream(&text_, &size_)) {
    if (!file_) throw std::runtime_error("cannot keep the notes of a capture");
  }
  ~MemoryStream() { std::free(text_); }
  MemoryStream(const MemoryStream&) = delete;
  MemoryStream& operator=(const MemoryStream&) = delete;

  std::FILE* file() { return file_.get(); }
  std::string Close() {
    file_.reset();
    return {text_, size_};
  }

 private:
  char* text_ = nullptr;
  size_t size_ = 0;
  File file_;
};

}  // namespace

JsonCaptureOutcome WriteJsonLines(const std::string& capturePath, const std::string& outputPath,
                                  cli::Pass pass) {
  const File output(std::fopen(outputPath.c_str(), "w"));
  if (!output) throw std::runtime_error("cannot write " + outputPath + ": " + std::strerror(errno));
  MemoryStream errors;
  JsonCaptureOutcome outcome;
  {
    cli::OutputWriter writer(output.get(), errors.file());
    const auto printer =
        cli::MakeWritingPrinter(cli::MakeJsonPrinter(writer.buffer(), Dictionary()), writer);
    const cli::MessageDecode decode = Decode;
    size_t index = 0;
    const cli::CaptureOutcome read =
        cli::PrintCapture(capturePath, {pass, decode, *printer, writer, {}}, index);
    outcome.counts = read.counts;
    outcome.read = read.failure.empty();
  }
  if (std::ferror(output.get()) != 0) throw std::runtime_error("cannot write " + outputPath);
  outcome.errors = errors.Close();
  return outcome;
}

}  // namespace rnsap::python
