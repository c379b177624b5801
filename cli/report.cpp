#include "cli/report.h"

#include <fmt/compile.h>

#include <algorithm>
#include <ctime>
#include <utility>

#include "cli/json.h"
#include "cli/line_writer.h"

namespace rnsap::cli {
namespace {

using Buffer = fmt::memory_buffer;

// Room for the fixed part of a line: its member names and punctuation, and
// `numbers` numbers.
constexpr size_t FixedBound(size_t numbers) { return 96 + numbers * LineWriter::kNumberBound; }

std::string_view Plural(uint64_t count, std::string_view one, std::string_view many) {
  return count == 1 ? one : many;
}

std::string_view BoolText(bool value) { return value ? "true" : "false"; }

// The fraction of the second to as many digits as the capture's resolution
// gives: none, and no point, for whole seconds.
template <typename Out>
Out FormatFraction(Out out, const FrameStamp& frame) {
  constexpr uint32_t kDivisors[] = {1'000'000'000, 100'000'000, 10'000'000, 1'000'000, 100'000,
                                    10'000,        1'000,       100,        10,        1};
  const uint8_t digits = std::min<uint8_t>(frame.fractionDigits, 9);
  if (digits == 0) return out;
  return fmt::format_to(out, FMT_COMPILE(".{:0{}}"), frame.nanoseconds / kDivisors[digits], digits);
}

void WriteEpochTime(const FrameStamp& frame, LineWriter& line) {
  char text[2 * LineWriter::kNumberBound];
  char* end = fmt::format_to(text, FMT_COMPILE("{}"), frame.seconds);
  end = FormatFraction(end, frame);
  line.Text({text, static_cast<size_t>(end - text)});
}

// The UTC date and time of frame stamps. Frames mostly share their second
// with the one before, so the text of the last second is kept.
class UtcClock {
 public:
  void Append(const FrameStamp& frame, Buffer& out) {
    if (frame.seconds != seconds_ || size_ == 0) Format(frame.seconds);
    if (size_ == 0) return out.push_back('?');
    out.append(std::string_view(text_, size_));
    FormatFraction(fmt::appender(out), frame);
    out.append(std::string_view(" UTC"));
  }

 private:
  void Format(int64_t seconds) {
    const std::time_t time = static_cast<std::time_t>(seconds);
    std::tm broken{};
    seconds_ = seconds;
    size_ = gmtime_r(&time, &broken)
                ? std::strftime(text_, sizeof text_, "%Y-%m-%d %H:%M:%S", &broken)
                : 0;
  }

  int64_t seconds_ = 0;
  char text_[32];
  size_t size_ = 0;
};

// The bits a field covers: lowest firstBit to highest lastBit of its
// segments. A field of one bit shows that bit; a field of no width, such as
// an Align at an octet boundary, shows the bit it stands at and the one
// before, "65-64".
class BitRange {
 public:
  explicit BitRange(std::span<const BitSegment> segments) {
    if (segments.empty()) {
      *end_++ = '-';
      return;
    }
    uint32_t first = segments.front().firstBit;
    uint32_t last = segments.front().lastBit;
    for (const BitSegment& segment : segments) {
      first = std::min(first, segment.firstBit);
      last = std::max(last, segment.lastBit);
    }
    end_ = fmt::format_to(end_, FMT_COMPILE("{}"), first);
    if (last != first) end_ = fmt::format_to(end_, FMT_COMPILE("-{}"), last);
  }

  std::string_view text() const { return {text_, static_cast<size_t>(end_ - text_)}; }

 private:
  char text_[2 * LineWriter::kNumberBound + 1];
  char* end_ = text_;
};

class TextPrinter final : public MessagePrinter {
 public:
  explicit TextPrinter(Buffer& out) : out_(out) {}

  void Begin(const MessageHead& head) override {
    if (head.frame != nullptr) {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE("frame {}, time {}"), head.frame->number,
                     head.frame->seconds);
      FormatFraction(fmt::appender(out_), *head.frame);
      out_.append(std::string_view(" ("));
      clock_.Append(*head.frame, out_);
      out_.append(std::string_view(")\n"));
    }
    LineWriter(out_, FixedBound(2) + TerminalTextBound(head.origin.size()))
        .Text("msg ")
        .Number(head.index)
        .Text(" (")
        .Terminal(head.origin)
        .Formatted(FMT_COMPILE("), {} {}, {}\n"), head.octets,
                   Plural(head.octets, "octet", "octets"), PassName(head.pass));
  }

  // The header is for programs; a reader finds the same in the fields.
  void Header(const MessageFacts& /*facts*/) override {}

  // The rendered text at the nesting of the field's label.
  void DecodedField(const host::DecodedFieldView& field) override {
    const std::string_view indent = LeadingBlanks(field.label);
    const std::string_view text = field.text.substr(LeadingBlanks(field.text).size());
    LineWriter(out_, FixedBound(2) + indent.size() + TerminalTextBound(text.size()))
        .RightAligned(BitRange(field.segments).text(), kBitRangeWidth)
        .Text("  ")
        .Text(indent)
        .Terminal(text)
        .Char('\n');
  }

  void DisplayLine(std::string_view text, uint32_t displayId) override {
    LineWriter(out_, FixedBound(1) + TerminalTextBound(text.size()))
        .Formatted(FMT_COMPILE("{:>6}  "), displayId)
        .Terminal(text)
        .Char('\n');
  }

  void Key(const KeyValue& key) override {
    LineWriter(out_, FixedBound(1) + TerminalTextBound(key.name.size()))
        .Formatted(FMT_COMPILE("{:>6}  "), key.row)
        .Terminal(key.name)
        .Text(" = ");
    if (key.variable) {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE("{} ({} bits)\n"), key.hex, key.bits);
    } else {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE("{}\n"), key.number);
    }
  }

  void End(const MessageSummary& summary) override {
    if (summary.pass == Pass::kKeys) {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE("summary: result {}"), summary.result);
    } else {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE("summary: result {}"),
                     BoolText(summary.result != 0));
    }
    fmt::format_to(fmt::appender(out_), FMT_COMPILE(", bits left {}, position {}, flags {:#x}"),
                   summary.bitsLeftOut, summary.position, summary.flags);
    if (summary.pass == Pass::kValidate) {
      fmt::format_to(fmt::appender(out_), FMT_COMPILE(", verdict {}"), summary.verdict);
    }
    out_.push_back('\n');
  }

  void Capture(std::string_view path, const CaptureCounts& counts) override {
    LineWriter(out_, FixedBound(0) + TerminalTextBound(path.size()))
        .Text("capture ")
        .Terminal(path);
    fmt::format_to(fmt::appender(out_),
                   ": {} {}, {} RNSAP {}, {} skipped, {} malformed, {} duplicate, {} evicted, {} "
                   "incomplete, {} unattributed\n",
                   counts.frames, Plural(counts.frames, "frame", "frames"), counts.rnsap,
                   Plural(counts.rnsap, "message", "messages"), counts.skipped, counts.malformed,
                   counts.duplicates, counts.evicted, counts.incomplete, counts.unattributed);
  }

 private:
  static constexpr size_t kBitRangeWidth = 11;

  Buffer& out_;
  UtcClock clock_;
};

// Every line of a message starts with the same members, formatted once.
class JsonPrinter final : public MessagePrinter {
 public:
  JsonPrinter(Buffer& out, const FieldDictionary& dictionary)
      : out_(out), dictionary_(dictionary) {}

  void Begin(const MessageHead& head) override {
    network_ = head.network;
    head_.clear();
    LineWriter line(head_, FixedBound(4) + JsonStringBound(head.origin.size()));
    line.Text("{\"msg\":").Number(head.index).Text(",\"source\":").Json(head.origin);
    if (head.frame != nullptr) {
      line.Text(",\"frame\":").Number(head.frame->number).Text(",\"time\":");
      WriteEpochTime(*head.frame, line);
    }
  }

  // Null for a procedure code, name or transaction id the message did not reach.
  void Header(const MessageFacts& facts) override {
    LineWriter line(out_, head_.size() + FixedBound(2) + JsonStringBound(facts.procedure.size()) +
                              JsonStringBound(facts.kindName.size()));
    line.Text(head_).Text(",\"header\":true,\"procedure\":");
    NameOrNull(facts.procedure, line).Text(",\"procedureCode\":");
    NumberOrNull(facts.procedureCode, line).Text(",\"kind\":");
    NameOrNull(facts.kindName, line).Text(",\"transactionId\":");
    NumberOrNull(facts.transactionId, line);
    if (network_ != nullptr) Network(*network_, line);
    line.Text("}\n");
  }

  void DecodedField(const host::DecodedFieldView& field) override {
    constexpr size_t kSegmentBound = 4 + 3 * LineWriter::kNumberBound;
    const std::string_view indent = LeadingBlanks(field.label);
    LineWriter line(out_, head_.size() + FixedBound(5) + JsonStringBound(field.label.size()) +
                              JsonStringBound(field.text.size()) +
                              field.segments.size() * kSegmentBound);
    line.Text(head_)
        .Text(",\"fieldId\":")
        .Number(field.fieldId)
        .Text(",\"label\":")
        .Json(field.label.substr(indent.size()))
        .Text(",\"depth\":")
        .Number(indent.size())
        .Text(",\"text\":")
        .Json(field.text)
        .Text(",\"value\":");
    if (const std::optional<int64_t> number = FieldNumber(field, dictionary_)) {
      line.Number(*number);
    } else {
      line.Text("null");
    }
    line.Text(",\"segments\":[");
    for (const BitSegment& segment : field.segments) {
      if (&segment != field.segments.data()) line.Char(',');
      line.Formatted(FMT_COMPILE("[{},{},{}]"), segment.firstBit, segment.lastBit,
                     segment.segmentValue);
    }
    line.Text("],\"firstSegment\":")
        .Number(field.firstSegment)
        .Text(",\"bitOrderGroup\":")
        .Number(field.bitOrderGroup)
        .Text("}\n");
  }

  void DisplayLine(std::string_view text, uint32_t displayId) override {
    LineWriter(out_, head_.size() + FixedBound(1) + JsonStringBound(text.size()))
        .Text(head_)
        .Text(",\"displayId\":")
        .Number(displayId)
        .Text(",\"text\":")
        .Json(text)
        .Text("}\n");
  }

  void Key(const KeyValue& key) override {
    LineWriter line(out_, head_.size() + FixedBound(2) + JsonStringBound(key.name.size()) +
                              JsonStringBound(key.hex.size()));
    line.Text(head_).Text(",\"row\":").Number(key.row).Text(",\"name\":").Json(key.name);
    if (key.variable) {
      line.Text(",\"value\":").Json(key.hex).Text(",\"bits\":").Number(key.bits);
    } else {
      line.Text(",\"value\":").Number(key.number);
    }
    line.Text("}\n");
  }

  void End(const MessageSummary& summary) override {
    LineWriter line(out_, head_.size() + FixedBound(5));
    line.Text(head_).Text(",\"summary\":true,\"result\":");
    if (summary.pass == Pass::kKeys) {
      line.Number(summary.result);
    } else {
      line.Text(BoolText(summary.result != 0));
    }
    line.Text(",\"bitsLeftOut\":")
        .Number(summary.bitsLeftOut)
        .Text(",\"position\":")
        .Number(summary.position)
        .Text(",\"flags\":")
        .Number(summary.flags);
    if (summary.pass == Pass::kValidate) line.Text(",\"verdict\":").Number(summary.verdict);
    line.Text("}\n");
  }

  void Capture(std::string_view path, const CaptureCounts& counts) override {
    LineWriter(out_, FixedBound(8) + 128 + JsonStringBound(path.size()))
        .Text("{\"capture\":true,\"source\":")
        .Json(path)
        .Text(",\"frames\":")
        .Number(counts.frames)
        .Text(",\"rnsap\":")
        .Number(counts.rnsap)
        .Text(",\"skipped\":")
        .Number(counts.skipped)
        .Text(",\"malformed\":")
        .Number(counts.malformed)
        .Text(",\"duplicates\":")
        .Number(counts.duplicates)
        .Text(",\"evicted\":")
        .Number(counts.evicted)
        .Text(",\"incomplete\":")
        .Number(counts.incomplete)
        .Text(",\"unattributed\":")
        .Number(counts.unattributed)
        .Text("}\n");
  }

 private:
  static LineWriter& NameOrNull(std::string_view name, LineWriter& line) {
    return name.empty() ? line.Text("null") : line.Json(name);
  }

  static LineWriter& NumberOrNull(std::optional<uint32_t> number, LineWriter& line) {
    return number ? line.Number(*number) : line.Text("null");
  }

  // The SCCP message and connection, and the two ends.
  static void Network(const MessageOrigin& network, LineWriter& line) {
    line.Text(",\"sccp\":\"")
        .Text(SccpMessageKindName(network.sccpKind))
        .Text("\",\"connection\":")
        .Number(network.connection);
    Endpoint(",\"from\":{", network.opc, network, network.source, line);
    Endpoint(",\"to\":{", network.dpc, network, network.destination, line);
  }

  // The point code, and the IP address and port where there is IP.
  static void Endpoint(std::string_view opening, uint32_t pointCode, const MessageOrigin& network,
                       const NetworkEndpoint& endpoint, LineWriter& line) {
    line.Text(opening);
    if (network.hasPointCodes) line.Text("\"pointCode\":").Number(pointCode);
    if (endpoint.ipVersion != 0) {
      line.Text(network.hasPointCodes ? "," : "")
          .Text("\"ip\":\"")
          .Text(IpAddressText(endpoint))
          .Text("\",\"port\":")
          .Number(endpoint.port);
    }
    line.Char('}');
  }

  Buffer& out_;
  const FieldDictionary& dictionary_;
  Buffer head_;
  const MessageOrigin* network_ = nullptr;
};

class WritingPrinter final : public MessagePrinter {
 public:
  WritingPrinter(std::unique_ptr<MessagePrinter> printer, OutputWriter& writer)
      : printer_(std::move(printer)), writer_(writer) {}

  void Begin(const MessageHead& head) override { printer_->Begin(head); }
  void Header(const MessageFacts& facts) override {
    printer_->Header(facts);
    writer_.EndLine();
  }
  void DecodedField(const host::DecodedFieldView& field) override {
    printer_->DecodedField(field);
    writer_.EndLine();
  }
  void DisplayLine(std::string_view text, uint32_t displayId) override {
    printer_->DisplayLine(text, displayId);
    writer_.EndLine();
  }
  void Key(const KeyValue& key) override {
    printer_->Key(key);
    writer_.EndLine();
  }
  void End(const MessageSummary& summary) override {
    printer_->End(summary);
    writer_.EndMessage();
  }
  void Capture(std::string_view path, const CaptureCounts& counts) override {
    printer_->Capture(path, counts);
    writer_.EndLine();
  }

 private:
  const std::unique_ptr<MessagePrinter> printer_;
  OutputWriter& writer_;
};

}  // namespace

std::unique_ptr<MessagePrinter> MakeTextPrinter(Buffer& out) {
  return std::make_unique<TextPrinter>(out);
}

std::string_view LeadingBlanks(std::string_view text) {
  return text.substr(0, std::min(text.find_first_not_of(' '), text.size()));
}

std::optional<int64_t> FieldNumber(const host::DecodedFieldView& field,
                                   const FieldDictionary& dictionary) {
  // The bits the segments cover; an Align at a boundary covers none.
  uint32_t bits = 0;
  for (const BitSegment& segment : field.segments) {
    if (segment.lastBit >= segment.firstBit) bits += segment.lastBit - segment.firstBit + 1;
  }
  if (bits > 32) return std::nullopt;
  if (dictionary.PrintsSigned(field.fieldId)) return static_cast<int32_t>(field.value);
  return field.value;
}
std::unique_ptr<MessagePrinter> MakeJsonPrinter(Buffer& out, const FieldDictionary& dictionary) {
  return std::make_unique<JsonPrinter>(out, dictionary);
}

std::unique_ptr<MessagePrinter> MakeWritingPrinter(std::unique_ptr<MessagePrinter> printer,
                                                   OutputWriter& writer) {
  return std::make_unique<WritingPrinter>(std::move(printer), writer);
}

}  // namespace rnsap::cli
