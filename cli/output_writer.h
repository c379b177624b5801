// Where rnsap-decode's lines go: formatted into one buffer and written to
// standard output in blocks, with error lines in order behind them.
#pragma once

#include <fmt/format.h>

#include <cstdio>
#include <string>
#include <string_view>
#include <utility>

namespace rnsap::cli {

class OutputWriter {
 public:
  // Writes to `out` a block at a time, or after every message when `out` is
  // a terminal; error lines go to `errors`.
  OutputWriter(std::FILE* out, std::FILE* errors);
  ~OutputWriter() { Flush(); }
  OutputWriter(const OutputWriter&) = delete;
  OutputWriter& operator=(const OutputWriter&) = delete;

  // Where the lines of a message are formatted.
  fmt::memory_buffer& buffer() { return buffer_; }

  // A line is complete: writes the buffer out once it holds a block, so that
  // the buffer stays the size of a block however many lines a message has.
  void EndLine() {
    if (buffer_.size() >= kBlockSize) Flush();
  }
  // The lines of a message are complete: writes them out when the block is
  // full or a reader is watching.
  void EndMessage();
  // Lines formatted elsewhere, behind those in the buffer: many lines are
  // written as they stand rather than copied into the buffer.
  void Write(std::string_view lines);
  void Flush();

  // Why standard output could not be written, or "" while it could; from the
  // first failure on, the lines are dropped.
  const std::string& failure() const { return failure_; }

  // One line on the error stream, behind everything formatted before it.
  template <typename... Args>
  void Error(fmt::format_string<Args...> format, Args&&... args) {
    Flush();
    fmt::print(errors_, format, std::forward<Args>(args)...);
  }

 private:
  void Put(std::string_view lines);

  // Large enough that the write calls cost little beside the formatting of
  // a block's lines.
  static constexpr size_t kBlockSize = 1024 * 1024;

  std::FILE* out_;
  std::FILE* errors_;
  bool interactive_;
  fmt::memory_buffer buffer_;
  std::string failure_;
};

}  // namespace rnsap::cli
