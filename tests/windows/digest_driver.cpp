// The digest lines of message_digest.h from inside a Windows process: run_dll.py
// loads this DLL, the module's and the host stand-ins' into an emulated 32-bit
// x86 and calls the export with the message file's text and a line sink.
#include <cstdint>
#include <string_view>

#include "tests/robustness/message_digest.h"

extern "C" __declspec(dllexport) int digest_messages(const char* text, uint32_t length,
                                                     rnsap::testing::DigestLineSink sink) {
  return rnsap::testing::DigestMessageText(std::string_view(text, length), sink);
}
