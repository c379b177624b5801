#include "cli/hex_input.h"

#include <cstdio>
#include <fstream>

namespace rnsap::cli {
namespace {

constexpr std::string_view kBlanks = " \t\r";
constexpr std::string_view kStandardInputName = "<stdin>";

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

// Reads the digits of a line that is not skipped, two to an octet.
HexLine ParseOctets(std::string_view line) {
  HexLine parsed{HexLine::Kind::kMessage, {}, {}};
  size_t digits = 0;
  for (size_t index = 0; index < line.size(); ++index) {
    const char character = line[index];
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
  return parsed;
}

void AddLine(std::string_view line, std::string origin, InputBatch& batch) {
  HexLine parsed = ParseHexLine(line);
  if (parsed.kind == HexLine::Kind::kMessage) {
    batch.messages.push_back({std::move(origin), std::move(parsed.octets)});
  } else if (parsed.kind == HexLine::Kind::kBad) {
    batch.errors.push_back({std::move(origin), std::move(parsed.error)});
  }
}

void ReadFile(const std::string& name, InputBatch& batch) {
  std::ifstream file(name);
  if (!file) {
    batch.errors.push_back({name, "cannot open the file"});
    return;
  }
  ReadLines(file, name, batch);
}

}  // namespace

HexLine ParseHexLine(std::string_view line) {
  const size_t first = line.find_first_not_of(kBlanks);
  if (first == std::string_view::npos || line[first] == '#') return {};
  return ParseOctets(line);
}

void ReadLines(std::istream& stream, std::string_view name, InputBatch& batch) {
  std::string line;
  for (size_t number = 1; std::getline(stream, line); ++number) {
    AddLine(line, std::string(name) + ":" + std::to_string(number), batch);
  }
}

InputBatch ReadInputs(std::span<const InputSource> sources, std::istream& standardInput) {
  InputBatch batch;
  for (const InputSource& source : sources) {
    switch (source.kind) {
      case InputSource::Kind::kArgument:
        AddLine(source.text, "argument " + std::to_string(source.argumentNumber), batch);
        break;
      case InputSource::Kind::kFile:
        ReadFile(source.text, batch);
        break;
      case InputSource::Kind::kStandardInput:
        ReadLines(standardInput, kStandardInputName, batch);
        break;
    }
  }
  return batch;
}

}  // namespace rnsap::cli
