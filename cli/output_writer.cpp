#include "cli/output_writer.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace rnsap::cli {

// Room for a block and the line that fills it, so that the buffer need not grow.
OutputWriter::OutputWriter(std::FILE* out, std::FILE* errors)
    : out_(out), errors_(errors), interactive_(isatty(fileno(out)) != 0) {
  buffer_.reserve(2 * kBlockSize);
}

void OutputWriter::EndMessage() {
  if (interactive_ || buffer_.size() >= kBlockSize) Flush();
}

void OutputWriter::Flush() {
  const bool written = failure_.empty() &&
                       std::fwrite(buffer_.data(), 1, buffer_.size(), out_) == buffer_.size() &&
                       std::fflush(out_) == 0;
  if (!written && failure_.empty()) failure_ = std::strerror(errno);
  buffer_.clear();
}

}  // namespace rnsap::cli
