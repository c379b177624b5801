// Copies of literals into a character buffer of the host, held back until
// the host can look: a run of copies, each with its NUL, leaves in the buffer
// the last copy and, behind its NUL, the tails of longer earlier ones. Only
// copies longer than every later one still show, so those are all that is
// kept, and writing them out oldest first gives the buffer's exact bytes.
#pragma once

#include <cstdint>
#include <cstring>

namespace rnsap {

template <uint32_t kBufferSize>
class DeferredText {
 public:
  // `size` counts the NUL; every literal fits the buffer.
  void Copy(const char* text, uint32_t size) {
    if (count_ != 0 && copies_[count_ - 1].text == text) return;  // the bytes stay as they are
    while (count_ != 0 && copies_[count_ - 1].size <= size) --count_;
    copies_[count_++] = {text, size};
  }

  bool pending() const { return count_ != 0; }

  void WriteTo(char* buffer) {
    for (uint32_t i = 0; i < count_; ++i) std::memcpy(buffer, copies_[i].text, copies_[i].size);
    count_ = 0;
  }

 private:
  struct Literal {
    const char* text;
    uint32_t size;
  };
  // The sizes shown fall strictly from the oldest to the newest.
  Literal copies_[kBufferSize];
  uint32_t count_ = 0;
};

}  // namespace rnsap
