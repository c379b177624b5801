// Writes one output line at the end of a buffer: room for the longest the
// line can be is made once, and its pieces are copied and formatted straight
// into that room. A debug build checks that they stay within it.
#pragma once

#include <fmt/compile.h>
#include <fmt/format.h>

#include <cassert>
#include <cstring>
#include <limits>
#include <string_view>

#include "cli/json.h"
#include "cli/terminal_text.h"

namespace rnsap::cli {

class LineWriter {
 public:
  // Most bytes a number written by Number takes, sign included.
  static constexpr size_t kNumberBound = std::numeric_limits<uint64_t>::digits10 + 2;

  // Makes room for `bound` bytes behind the content of `out`.
  LineWriter(fmt::memory_buffer& out, size_t bound) : out_(out), start_(out.size()) {
    out_.resize(start_ + bound);
    cursor_ = out_.data() + start_;
  }
  // Keeps what was written.
  ~LineWriter() { out_.resize(static_cast<size_t>(cursor_ - out_.data())); }
  LineWriter(const LineWriter&) = delete;
  LineWriter& operator=(const LineWriter&) = delete;

  LineWriter& Text(std::string_view text) {
    assert(text.size() <= room());
    std::memcpy(cursor_, text.data(), text.size());
    cursor_ += text.size();
    return *this;
  }
  LineWriter& Text(const fmt::memory_buffer& text) { return Text({text.data(), text.size()}); }
  LineWriter& Char(char character) {
    assert(room() >= 1);
    *cursor_++ = character;
    return *this;
  }
  // `text` right-aligned in `width` bytes, as std::setw pads.
  LineWriter& RightAligned(std::string_view text, size_t width) {
    if (text.size() < width) {
      assert(width - text.size() <= room());
      std::memset(cursor_, ' ', width - text.size());
      cursor_ += width - text.size();
    }
    return Text(text);
  }
  // Formats with a compiled format string, FMT_COMPILE("..."); a debug build
  // checks the bound afterwards, by which time a wrong one has been passed.
  template <typename Format, typename... Args>
  LineWriter& Formatted(const Format& format, const Args&... args) {
    cursor_ = fmt::format_to(cursor_, format, args...);
    assert(cursor_ <= end());
    return *this;
  }
  template <typename Integer>
  LineWriter& Number(Integer value) {
    return Formatted(FMT_COMPILE("{}"), value);
  }
  // Takes JsonStringBound(text.size()) bytes at most.
  LineWriter& Json(std::string_view text) {
    assert(JsonStringBound(text.size()) <= room());
    cursor_ = WriteJsonString(text, cursor_);
    return *this;
  }
  // Takes TerminalTextBound(text.size()) bytes at most.
  LineWriter& Terminal(std::string_view text) {
    assert(TerminalTextBound(text.size()) <= room());
    cursor_ = WriteTerminalText(text, cursor_);
    return *this;
  }

 private:
  char* end() const { return out_.data() + out_.size(); }
  size_t room() const { return static_cast<size_t>(end() - cursor_); }

  fmt::memory_buffer& out_;
  size_t start_;
  char* cursor_ = nullptr;
};

}  // namespace rnsap::cli
