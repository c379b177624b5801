#include "cli/json.h"

#include <cstdio>

namespace rnsap::cli {
namespace {

// The short escapes JSON has; 0 for a byte without one.
char ShortEscape(unsigned char byte) {
  switch (byte) {
    case '"':
      return '"';
    case '\\':
      return '\\';
    case '\b':
      return 'b';
    case '\f':
      return 'f';
    case '\n':
      return 'n';
    case '\r':
      return 'r';
    case '\t':
      return 't';
    default:
      return 0;
  }
}

void AppendEscaped(unsigned char byte, std::string& out) {
  if (const char escape = ShortEscape(byte)) {
    out += '\\';
    out += escape;
  } else if (byte < 0x20 || byte >= 0x7f) {
    char code[8];
    std::snprintf(code, sizeof code, "\\u%04x", byte);
    out += code;
  } else {
    out += static_cast<char>(byte);
  }
}

}  // namespace

std::string JsonString(std::string_view text) {
  std::string out = "\"";
  for (const char character : text) AppendEscaped(static_cast<unsigned char>(character), out);
  return out + "\"";
}

JsonObject& JsonObject::Number(std::string_view key, int64_t value) {
  return Raw(key, std::to_string(value));
}

JsonObject& JsonObject::Text(std::string_view key, std::string_view value) {
  return Raw(key, JsonString(value));
}

JsonObject& JsonObject::Bool(std::string_view key, bool value) {
  return Raw(key, value ? "true" : "false");
}

JsonObject& JsonObject::Raw(std::string_view key, std::string_view json) {
  Key(key);
  body_ += json;
  return *this;
}

void JsonObject::Key(std::string_view key) {
  if (body_.size() > 1) body_ += ',';
  body_ += JsonString(key);
  body_ += ':';
}

}  // namespace rnsap::cli
