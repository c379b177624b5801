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
    std::memcpy(data_ + length_, text, n);
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
  char* data_;
  size_t size_;
  size_t length_;
};

// Appends the value part of `record` in `form` to `out`; `names` is the value
// list for the name forms.
void RenderValue(grammar::ValueForm form, uint16_t names, const char* separator,
                 const FieldRecord& record, TextBuffer& out);

}  // namespace rnsap
