// JSON strings of the module's texts, for output lines built member by member.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace rnsap::cli {

// Most bytes WriteJsonString takes for a text of `size` bytes.
constexpr size_t JsonStringBound(size_t size) { return 6 * size + 2; }

// Writes `text` at `out` as a quoted JSON string and returns where it ends.
// The module's texts are single-byte strings, so every byte from 0x80 on is
// written as the code point of that byte.
char* WriteJsonString(std::string_view text, char* out);
// The same without the quotes.
char* WriteJsonEscaped(std::string_view text, char* out);

std::string JsonString(std::string_view text);

}  // namespace rnsap::cli
