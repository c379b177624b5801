#include "cli/hex_input.h"

#include <fmt/format.h>
#include <sys/types.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <optional>

namespace rnsap::cli {
namespace {

constexpr std::string_view kBlanks = " \t\r";
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

void HandOn(HexLine parsed, std::string origin, const HexHandlers& handlers) {
  if (parsed.kind == HexLine::Kind::kMessage) {
    handlers.message({std::move(origin), std::move(parsed.octets)});
  } else if (parsed.kind == HexLine::Kind::kBad) {
    handlers.error({std::move(origin), std::move(parsed.error)});
  }
}

std::string SystemReason() { return std::strerror(errno); }

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};

// One line of a stream at a time, in a buffer that grows to the longest.
class LineReader {
 public:
  explicit LineReader(std::FILE* stream) : stream_(stream) {}
  ~LineReader() { std::free(line_); }
  LineReader(const LineReader&) = delete;
  LineReader& operator=(const LineReader&) = delete;

  // The next line with its newline, or nothing at the end or on a failure.
  std::optional<std::string_view> Next() {
    const ssize_t length = getline(&line_, &capacity_, stream_);
    if (length < 0) return std::nullopt;
    return std::string_view(line_, static_cast<size_t>(length));
  }

 private:
  std::FILE* stream_;
  char* line_ = nullptr;
  size_t capacity_ = 0;
};

// The magic number a pcap file (microsecond or nanosecond stamps, either byte
// order) or a pcapng file starts with.
class CaptureMagic {
 public:
  // Takes the stream's octets a line at a time; true once they start as a
  // capture does.
  bool Seen(std::string_view rawLine) {
    if (head_.size() >= kSize) return false;
    head_ += rawLine.substr(0, kSize - head_.size());
    if (head_.size() < kSize) return false;
    constexpr std::string_view kMagics[] = {"\xD4\xC3\xB2\xA1", "\xA1\xB2\xC3\xD4",
                                            "\x4D\x3C\xB2\xA1", "\xA1\xB2\x3C\x4D",
                                            "\x0A\x0D\x0D\x0A"};
    return std::find(std::begin(kMagics), std::end(kMagics), head_) != std::end(kMagics);
  }

 private:
  static constexpr size_t kSize = 4;
  std::string head_;
};

// Reads `stream` line by line, naming each "NAME:LINE", and hands each line
// on before the next is read; a stream that starts as a capture is refused,
// naming -r with `given`, the name the user gave. A UTF-8 byte-order mark in
// front of the first line is skipped. Returns false when a read failed, with
// errno set.
bool ReadLines(std::FILE* stream, std::string_view name, std::string_view given,
               const HexHandlers& handlers) {
  LineReader reader(stream);
  CaptureMagic magic;
  for (size_t number = 1; std::optional<std::string_view> line = reader.Next(); ++number) {
    if (magic.Seen(*line)) {
      handlers.error(
          {std::string(name), fmt::format("this looks like a capture: use -r {}", given)});
      return true;
    }
    if (line->ends_with('\n')) line->remove_suffix(1);
    if (number == 1 && line->starts_with(kByteOrderMark))
      line->remove_prefix(kByteOrderMark.size());
    HandOn(ParseHexLine(*line), fmt::format("{}:{}", name, number), handlers);
  }
  return std::ferror(stream) == 0;
}

// A directory opens, but its first read fails with the system's reason.
void ReadFile(const std::string& name, const HexHandlers& handlers) {
  const std::unique_ptr<std::FILE, FileCloser> file(std::fopen(name.c_str(), "rb"));
  if (!file) return handlers.error({name, "cannot open the file: " + SystemReason()});
  if (!ReadLines(file.get(), name, name, handlers)) {
    handlers.error({name, "cannot read the file: " + SystemReason()});
  }
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

void ReadHexSource(const InputSource& source, std::FILE* standardInput,
                   const HexHandlers& handlers) {
  switch (source.kind) {
    case InputSource::Kind::kArgument:
      HandOn(ParseHexMessage(source.text), "argument " + std::to_string(source.argumentNumber),
             handlers);
      break;
    case InputSource::Kind::kFile:
      ReadFile(source.text, handlers);
      break;
    case InputSource::Kind::kStandardInput:
      ReadLines(standardInput, kStandardInputName, source.text, handlers);
      break;
    case InputSource::Kind::kCapture:
      break;  // a capture is read frame by frame as it is decoded
  }
}

}  // namespace rnsap::cli
