#include "cli/hex_input.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>
#include <sstream>

namespace rnsap::cli {
namespace {

constexpr std::string_view kBlanks = " \t\r";
constexpr std::string_view kStandardInputName = "<stdin>";
constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";

bool IsOctetSeparator(char character) {
  return character == ':' || kBlanks.find(character) != std::string_view::npos;
}

int HexDigitValue(char character) {
  if (character >= '0' && character <= '9') return character - '0';
  if (character >= 'a' && character <= 'f') return character - 'a' + 10;
  if (character >= 'A' && character <= 'F') return character - 'A' + 10;
  return -1;
}

std::string Printable(char character) {
  const auto byte = static_cast<unsigned char>(character);
  if (byte >= 0x20 && byte < 0x7f) return std::string("'") + character + "'";
  char escaped[8];
  std::snprintf(escaped, sizeof escaped, "\\x%02X", byte);
  return escaped;
}

HexLine Bad(std::string error) { return {HexLine::Kind::kBad, {}, std::move(error)}; }

std::string AtColumn(size_t index) { return " at column " + std::to_string(index + 1); }

void Add(HexLine parsed, std::string origin, InputBatch& batch) {
  if (parsed.kind == HexLine::Kind::kMessage) {
    batch.messages.push_back({std::move(origin), std::move(parsed.octets)});
  } else if (parsed.kind == HexLine::Kind::kBad) {
    batch.errors.push_back({std::move(origin), std::move(parsed.error)});
  }
}

std::string SystemReason() { return std::strerror(errno); }

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};

// The whole of a file, or in `failure` why it could not be read.
struct FileContent {
  std::string text;
  std::string failure;
};

// A directory opens, but its first read fails with the system's reason.
FileContent ReadWholeFile(const std::string& name) {
  const std::unique_ptr<std::FILE, FileCloser> file(std::fopen(name.c_str(), "rb"));
  if (!file) return {{}, "cannot open the file: " + SystemReason()};
  FileContent content;
  char chunk[4096];
  while (const size_t count = std::fread(chunk, 1, sizeof chunk, file.get())) {
    content.text.append(chunk, count);
  }
  if (std::ferror(file.get())) return {{}, "cannot read the file: " + SystemReason()};
  return content;
}

void ReadFile(const std::string& name, InputBatch& batch) {
  const FileContent content = ReadWholeFile(name);
  if (!content.failure.empty()) return batch.errors.push_back({name, content.failure});
  std::istringstream lines(content.text);
  ReadLines(lines, name, batch);
}

}  // namespace

// The digits are read two to an octet.
HexLine ParseHexMessage(std::string_view text) {
  HexLine parsed{HexLine::Kind::kMessage, {}, {}};
  size_t digits = 0;
  for (size_t index = 0; index < text.size(); ++index) {
    const char character = text[index];
    const int digit = HexDigitValue(character);
    if (digit >= 0) {
      if (digits % 2 == 0) parsed.octets.push_back(0);
      parsed.octets.back() = static_cast<uint8_t>(parsed.octets.back() << 4 | digit);
      ++digits;
    } else if (!IsOctetSeparator(character)) {
      return Bad("invalid character " + Printable(character) + AtColumn(index));
    } else if (digits % 2 != 0) {
      return Bad("separator inside an octet" + AtColumn(index));
    }
  }
  if (digits % 2 != 0) return Bad("odd number of hex digits (" + std::to_string(digits) + ")");
  if (digits == 0) return Bad("no hex digits");
  return parsed;
}

HexLine ParseHexLine(std::string_view line) {
  const size_t first = line.find_first_not_of(kBlanks);
  if (first == std::string_view::npos || line[first] == '#') return {};
  return ParseHexMessage(line);
}

void ReadLines(std::istream& stream, std::string_view name, InputBatch& batch) {
  std::string line;
  for (size_t number = 1; std::getline(stream, line); ++number) {
    if (number == 1 && line.starts_with(kByteOrderMark)) line.erase(0, kByteOrderMark.size());
    Add(ParseHexLine(line), std::string(name) + ":" + std::to_string(number), batch);
  }
}

InputBatch ReadInputs(std::span<const InputSource> sources, std::istream& standardInput) {
  InputBatch batch;
  for (const InputSource& source : sources) {
    switch (source.kind) {
      case InputSource::Kind::kArgument:
        Add(ParseHexMessage(source.text), "argument " + std::to_string(source.argumentNumber),
            batch);
        break;
      case InputSource::Kind::kFile:
        ReadFile(source.text, batch);
        break;
      case InputSource::Kind::kStandardInput:
        ReadLines(standardInput, kStandardInputName, batch);
        break;
      case InputSource::Kind::kCapture:
        break;  // a capture is read frame by frame as it is decoded
    }
  }
  return batch;
}

}  // namespace rnsap::cli
