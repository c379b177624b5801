// Rendering of a field's value part in the display language: numbers, names
// from the field's value list, binary digits, text and element lists.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>

#include "contract/decode_state.h"
#include "engine/grammar_tables.h"

namespace rnsap {

// A character buffer filled up to its size and cut there, NUL always kept.
class TextBuffer {
 public:
  TextBuffer(char* data, size_t size) : data_(data), size_(size) { Clear(); }
  void Clear() {
    length_ = 0;
    data_[0] = '\0';
  }
  // Copies up to the NUL of `text` in one go, without measuring it first.
  void Append(const char* text);
  void Append(const char* text, size_t length) {
    const size_t n = std::min(length, size_ - 1 - length_);
    CopyShort(text, n, data_ + length_);
    length_ += n;
    data_[length_] = '\0';
  }
  // `format` takes one unsigned number.
  void AppendFormatted(const char* format, uint32_t value);
  // The number in `base` (10 or 16), as %d, %u, %x or %X would print it.
  void AppendNumber(int64_t value, int base = 10, bool upperCase = false);
  const char* c_str() const { return data_; }
  size_t length() const { return length_; }

 private:
  // Copies `n` bytes in words, the last word overlapping the one before:
  // pieces of field texts are short, too short for a call of memcpy or a
  // string instruction to pay off.
  static void CopyShort(const char* from, size_t n, char* to) {
    if (n >= 8) {
      for (size_t i = 0; i + 8 < n; i += 8) std::memcpy(to + i, from + i, 8);
      std::memcpy(to + n - 8, from + n - 8, 8);
    } else if (n >= 4) {
      std::memcpy(to, from, 4);
      std::memcpy(to + n - 4, from + n - 4, 4);
    } else if (n > 0) {  // the first, middle and last byte cover one to three
      to[0] = from[0];
      to[n / 2] = from[n / 2];
      to[n - 1] = from[n - 1];
    }
  }

  char* data_;
  size_t size_;
  size_t length_;
};

// Appends the value part of `record` in `form` to `out`; `names` is the value
// list for the name forms.
void RenderValue(grammar::ValueForm form, uint16_t names, const char* separator,
                 const FieldRecord& record, TextBuffer& out);

}  // namespace rnsap
