// The digest lines of message_digest.h from inside a Windows process: run_dll.py
// loads this DLL, the module's and the host stand-ins' into an emulated 32-bit
// x86 and calls the export with the message file's text and a line sink.
#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>

#include "tests/robustness/message_digest.h"

extern "C" __declspec(dllexport) int digest_messages(const char* text, uint32_t length,
                                                     rnsap::testing::DigestLineSink sink) {
  return rnsap::testing::DigestMessageText(std::string_view(text, length), sink);
}

// DateText into `text` of `capacity` bytes (at least 1), cut to fit.
extern "C" __declspec(dllexport) void date_text(int32_t seconds, char* text, uint32_t capacity) {
  const std::string date = rnsap::testing::DateText(seconds);
  const size_t size = std::min<size_t>(date.size(), capacity - 1);
  date.copy(text, size);
  text[size] = '\0';
}
