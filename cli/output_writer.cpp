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

void OutputWriter::Write(std::string_view lines) {
  if (lines.size() < kBlockSize / 16 && buffer_.size() + lines.size() < kBlockSize) {
    return buffer_.append(lines.data(), lines.data() + lines.size());
  }
  Flush();
  Put(lines);
}

void OutputWriter::Flush() {
  Put({buffer_.data(), buffer_.size()});
  buffer_.clear();
}

void OutputWriter::Put(std::string_view lines) {
  const bool written = failure_.empty() &&
                       std::fwrite(lines.data(), 1, lines.size(), out_) == lines.size() &&
                       std::fflush(out_) == 0;
  if (!written && failure_.empty()) failure_ = std::strerror(errno);
}

}  // namespace rnsap::cli
