// One JSON object per output line, built member by member.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace rnsap::cli {

// `text` as a quoted JSON string. The module's texts are single-byte strings,
// so every byte from 0x80 on is written as the code point of that byte.
std::string JsonString(std::string_view text);

class JsonObject {
 public:
  JsonObject& Number(std::string_view key, int64_t value);
  JsonObject& Text(std::string_view key, std::string_view value);
  JsonObject& Bool(std::string_view key, bool value);
  // A member whose value is already JSON.
  JsonObject& Raw(std::string_view key, std::string_view json);
  std::string Close() const { return body_ + "}"; }

 private:
  void Key(std::string_view key);

  std::string body_ = "{";
};

}  // namespace rnsap::cli
