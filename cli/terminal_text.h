// Text output that is safe on a terminal: the module's texts (Latin-1) and
// the names of inputs, with every control byte escaped.
#pragma once

#include <cstddef>
#include <string_view>

namespace rnsap::cli {

// Most bytes WriteTerminalText takes for a text of `size` bytes.
constexpr size_t TerminalTextBound(size_t size) { return 4 * size; }

// Writes `text` at `out` as UTF-8 and returns where it ends: bytes below
// 0x20, 0x7f and 0x80 to 0x9f (the controls of Latin-1) as "\xHH", '\' as
// "\\", the Latin-1 letters and signs from 0xa0 on as their UTF-8 encoding,
// the rest as they are.
char* WriteTerminalText(std::string_view text, char* out);

}  // namespace rnsap::cli
