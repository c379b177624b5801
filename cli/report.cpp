#include "cli/report.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <iomanip>
#include <sstream>

#include "cli/json.h"

namespace rnsap::cli {
namespace {

constexpr int kBitRangeWidth = 11;
constexpr int kIdWidth = 6;

// The bits a field covers: lowest firstBit to highest lastBit of its
// segments. A field of one bit shows that bit; a field of no width, such as
// an Align at an octet boundary, shows the bit it stands at and the one
// before, "65-64".
std::string BitRange(const std::vector<BitSegment>& segments) {
  if (segments.empty()) return "-";
  uint32_t first = segments.front().firstBit;
  uint32_t last = segments.front().lastBit;
  for (const BitSegment& segment : segments) {
    first = std::min(first, segment.firstBit);
    last = std::max(last, segment.lastBit);
  }
  if (last == first) return std::to_string(first);
  return std::to_string(first) + "-" + std::to_string(last);
}

std::string_view LeadingBlanks(std::string_view text) {
  return text.substr(0, std::min(text.find_first_not_of(' '), text.size()));
}

// The rendered text at the nesting of the field's label.
std::string IndentedText(const host::DecodedFieldReport& field) {
  const std::string_view text = field.text;
  return std::string(LeadingBlanks(field.label)) +
         std::string(text.substr(LeadingBlanks(text).size()));
}

std::string KeyValueText(const KeyValue& key) {
  if (!key.variable) return std::to_string(key.number);
  return key.hex + " (" + std::to_string(key.bits) + " bits)";
}

std::string ResultText(const MessageOutcome& outcome) {
  if (outcome.pass == Pass::kKeys) return std::to_string(outcome.result);
  return outcome.result != 0 ? "true" : "false";
}

std::string HexFlags(uint32_t flags) {
  std::ostringstream hex;
  hex << "0x" << std::hex << flags;
  return hex.str();
}

void PrintSummaryText(const MessageOutcome& outcome, std::ostream& out) {
  out << "summary: result " << ResultText(outcome) << ", bits left " << outcome.bitsLeftOut
      << ", position " << outcome.position << ", flags " << HexFlags(outcome.flags);
  if (outcome.pass == Pass::kValidate) out << ", verdict " << outcome.verdict;
  out << '\n';
}

std::string SegmentsJson(const std::vector<BitSegment>& segments) {
  std::string json = "[";
  for (const BitSegment& segment : segments) {
    if (json.size() > 1) json += ',';
    json += "[" + std::to_string(segment.firstBit) + "," + std::to_string(segment.lastBit) + "," +
            std::to_string(segment.segmentValue) + "]";
  }
  return json + "]";
}

std::string Microseconds(const FrameStamp& frame) {
  char fraction[16];
  std::snprintf(fraction, sizeof fraction, ".%06u", frame.microseconds);
  return fraction;
}

// Seconds since the epoch with the microseconds as a fraction.
std::string EpochTime(const FrameStamp& frame) {
  return std::to_string(frame.seconds) + Microseconds(frame);
}

std::string UtcTime(const FrameStamp& frame) {
  const std::time_t seconds = static_cast<std::time_t>(frame.seconds);
  std::tm broken{};
  char text[32];
  if (!gmtime_r(&seconds, &broken) ||
      std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &broken) == 0) {
    return "?";
  }
  return text + Microseconds(frame) + " UTC";
}

JsonObject MessageObject(const MessageOutcome& outcome) {
  JsonObject object;
  object.Number("msg", static_cast<int64_t>(outcome.index)).Text("source", outcome.origin);
  if (outcome.frame) {
    object.Number("frame", static_cast<int64_t>(outcome.frame->number))
        .Raw("time", EpochTime(*outcome.frame));
  }
  return object;
}

std::string FieldJson(const MessageOutcome& outcome, const host::DecodedFieldReport& field) {
  return MessageObject(outcome)
      .Number("fieldId", field.fieldId)
      .Text("label", field.label)
      .Text("text", field.text)
      .Raw("segments", SegmentsJson(field.segments))
      .Number("firstSegment", field.firstSegment)
      .Number("bitOrderGroup", field.bitOrderGroup)
      .Close();
}

std::string DisplayLineJson(const MessageOutcome& outcome, const host::DisplayLine& line) {
  return MessageObject(outcome).Number("displayId", line.displayId).Text("text", line.text).Close();
}

std::string KeyJson(const MessageOutcome& outcome, const KeyValue& key) {
  JsonObject object = MessageObject(outcome);
  object.Number("row", key.row).Text("name", key.name);
  if (!key.variable) return object.Number("value", key.number).Close();
  return object.Text("value", key.hex).Number("bits", key.bits).Close();
}

std::string SummaryJson(const MessageOutcome& outcome) {
  JsonObject object = MessageObject(outcome);
  object.Bool("summary", true);
  if (outcome.pass == Pass::kKeys) {
    object.Number("result", outcome.result);
  } else {
    object.Bool("result", outcome.result != 0);
  }
  object.Number("bitsLeftOut", outcome.bitsLeftOut)
      .Number("position", outcome.position)
      .Number("flags", outcome.flags);
  if (outcome.pass == Pass::kValidate) object.Number("verdict", outcome.verdict);
  return object.Close();
}

}  // namespace

void PrintText(const MessageOutcome& outcome, std::ostream& out) {
  if (outcome.frame) {
    out << "frame " << outcome.frame->number << ", time " << EpochTime(*outcome.frame) << " ("
        << UtcTime(*outcome.frame) << ")\n";
  }
  out << "msg " << outcome.index << " (" << outcome.origin << "), " << outcome.octets
      << (outcome.octets == 1 ? " octet, " : " octets, ") << PassName(outcome.pass) << '\n';
  for (const host::DecodedFieldReport& field : outcome.fields) {
    out << std::setw(kBitRangeWidth) << BitRange(field.segments) << "  " << IndentedText(field)
        << '\n';
  }
  for (const host::DisplayLine& line : outcome.displayLines) {
    out << std::setw(kIdWidth) << line.displayId << "  " << line.text << '\n';
  }
  for (const KeyValue& key : outcome.keys) {
    out << std::setw(kIdWidth) << key.row << "  " << key.name << " = " << KeyValueText(key) << '\n';
  }
  PrintSummaryText(outcome, out);
}

void PrintJson(const MessageOutcome& outcome, std::ostream& out) {
  for (const host::DecodedFieldReport& field : outcome.fields) {
    out << FieldJson(outcome, field) << '\n';
  }
  for (const host::DisplayLine& line : outcome.displayLines) {
    out << DisplayLineJson(outcome, line) << '\n';
  }
  for (const KeyValue& key : outcome.keys) out << KeyJson(outcome, key) << '\n';
  out << SummaryJson(outcome) << '\n';
}

void PrintCaptureCountsText(std::string_view path, const CaptureCounts& counts, std::ostream& out) {
  out << "capture " << path << ": " << counts.frames
      << (counts.frames == 1 ? " frame, " : " frames, ") << counts.rnsap << " RNSAP "
      << (counts.rnsap == 1 ? "message, " : "messages, ") << counts.skipped << " skipped, "
      << counts.malformed << " malformed\n";
}

// The JSON line is the same for every capture: its messages carry the source.
void PrintCaptureCountsJson(std::string_view /*path*/, const CaptureCounts& counts,
                            std::ostream& out) {
  out << JsonObject()
             .Bool("capture", true)
             .Number("frames", static_cast<int64_t>(counts.frames))
             .Number("rnsap", static_cast<int64_t>(counts.rnsap))
             .Number("skipped", static_cast<int64_t>(counts.skipped))
             .Number("malformed", static_cast<int64_t>(counts.malformed))
             .Close()
      << '\n';
}

}  // namespace rnsap::cli
