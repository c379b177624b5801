// The digest lines of a message file: what the module's queries and date
// converter answer, then one line per message and per mutation of it with what
// each pass left and reported. Built natively (pass_digest), for 32 bits and
// into the Windows driver DLL, the lines must be the same everywhere.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace rnsap::testing {

// Receives each digest line, without its line end.
using DigestLineSink = void (*)(const char* line);

// date_conv of `seconds` behind "T=", as the digest lines show it.
std::string DateText(int32_t seconds);

// Digests the messages of `messageText` (a generated corpus or a plain file
// of hex messages). Returns 0, or 1 when the text holds no message or the
// host's set-up failed (nothing is digested then).
int DigestMessageText(std::string_view messageText, DigestLineSink sink);

}  // namespace rnsap::testing
