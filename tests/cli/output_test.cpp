// What rnsap-decode prints: JSON strings and lines, the text form, the order
// of buffered and error lines, and the keys read back from a key buffer.
#include <gtest/gtest.h>

#include <cstdio>
#include <sstream>
#include <stdexcept>
#include <vector>

#include "cli/json.h"
#include "cli/key_rows.h"
#include "cli/output_writer.h"
#include "cli/report.h"

namespace rnsap::cli {
namespace {

TEST(JsonStringTest, EscapesWhatJsonRequiresAndKeepsTheRest) {
  EXPECT_EQ(JsonString("  C_ID=7"), R"("  C_ID=7")");
  EXPECT_EQ(JsonString(R"(%-["%x"])"), R"("%-[\"%x\"]")");
  EXPECT_EQ(JsonString("a\\b"), R"("a\\b")");
  EXPECT_EQ(JsonString("\b\f\n\r\t"), R"("\b\f\n\r\t")");
  EXPECT_EQ(JsonString(std::string_view("\x00\x01\x1f\x7f", 4)), R"("\u0000\u0001\u001f\u007f")");
  EXPECT_EQ(JsonString("caf\xe9"), R"("caf\u00e9")");
  EXPECT_EQ(JsonString(""), R"("")");
}

// -------------------------------------------------------------- reports

BitSegment Segment(uint32_t firstBit, uint32_t lastBit, uint32_t value) {
  return {value, firstBit, lastBit, 0, {0, 0}};
}

host::DecodedFieldReport Field(uint32_t fieldId, std::string label, std::string text,
                               std::vector<BitSegment> segments, uint32_t firstSegment = 0) {
  host::DecodedFieldReport field;
  field.fieldId = fieldId;
  field.label = std::move(label);
  field.text = std::move(text);
  field.segments = std::move(segments);
  field.firstSegment = firstSegment;
  field.bitOrderGroup = 8;
  return field;
}

// A message's reports as the stand-in host would hand them on.
struct Message {
  MessageHead head;
  std::vector<host::DecodedFieldReport> fields;
  std::vector<host::DisplayLine> displayLines;
  std::vector<KeyValue> keys;
  MessageSummary summary;
};

Message Outcome(Pass pass) {
  Message outcome;
  outcome.head = {.index = 3, .origin = "x.hex:7", .octets = 8, .pass = pass};
  outcome.summary = {.pass = pass, .result = 1, .bitsLeftOut = 0, .position = 65, .flags = 0x2};
  return outcome;
}

// How each JSON line of that message begins.
const std::string kHead = R"({"msg":3,"source":"x.hex:7",)";

std::vector<std::string> Lines(const Message& outcome, bool json) {
  fmt::memory_buffer out;
  const std::unique_ptr<MessagePrinter> printer =
      json ? MakeJsonPrinter(out) : MakeTextPrinter(out);
  printer->Begin(outcome.head);
  for (const host::DecodedFieldReport& field : outcome.fields) {
    printer->DecodedField({field.label, field.text, field.fieldId, field.firstSegment,
                           field.bitOrderGroup, field.segments});
  }
  for (const host::DisplayLine& line : outcome.displayLines) {
    printer->DisplayLine(line.text, line.displayId);
  }
  for (const KeyValue& key : outcome.keys) printer->Key(key);
  printer->End(outcome.summary);
  std::vector<std::string> lines;
  std::istringstream in(fmt::to_string(out));
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

// As text, with bit ranges and the label's indentation.
TEST(ReportTest, DecodedFieldsAsJsonLinesAndAsText) {
  Message outcome = Outcome(Pass::kDecode);
  outcome.fields = {
      Field(684, "PDU EXTENSION", "PDU EXTENSION=0", {Segment(1, 1, 0)}),
      Field(3012, "  PLMN_ID", "  PLMN_ID=2f044",
            {Segment(97, 104, 2), Segment(89, 96, 0xf0), Segment(81, 88, 0x44)}, 2),
      Field(682, "  Spare", "  Spare=0", {Segment(105, 104, 0)}),  // no bits, at bit 105
      Field(3248, "  Nation", "    Nation=Japan (440)",
            {Segment(98, 104, 3), Segment(106, 112, 56)}),
      Field(2923, "IMSI", "  IMSI=44", {Segment(5, 8, 4), Segment(1, 4, 4)}, 1),
  };
  const std::vector<std::string> json = Lines(outcome, true);
  ASSERT_EQ(json.size(), 6u);
  EXPECT_EQ(json[1], kHead + R"("fieldId":3012,"label":"  PLMN_ID","text":"  PLMN_ID=2f044",)"
                             R"("segments":[[97,104,2],[89,96,240],[81,88,68]],"firstSegment":2,)"
                             R"("bitOrderGroup":8})");
  EXPECT_EQ(json[5],
            kHead + R"("summary":true,"result":true,"bitsLeftOut":0,"position":65,"flags":2})");
  EXPECT_EQ(Lines(outcome, false), (std::vector<std::string>{
                                       "msg 3 (x.hex:7), 8 octets, decode",
                                       "          1  PDU EXTENSION=0",
                                       "     81-104    PLMN_ID=2f044",
                                       "    105-104    Spare=0",
                                       "     98-112    Nation=Japan (440)",
                                       "        1-8  IMSI=44",
                                       "summary: result true, bits left 0, position 65, flags 0x2",
                                   }));
}

TEST(ReportTest, ValidationAddsTheVerdictAndReportsNoFields) {
  Message outcome = Outcome(Pass::kValidate);
  outcome.summary.flags = 0x40000002;
  outcome.summary.verdict = -52;
  outcome.summary.result = 0;
  EXPECT_EQ(
      Lines(outcome, true),
      (std::vector<std::string>{kHead + R"("summary":true,"result":false,"bitsLeftOut":0,)"
                                        R"("position":65,"flags":1073741826,"verdict":-52})"}));
  EXPECT_EQ(Lines(outcome, false).back(),
            "summary: result false, bits left 0, position 65, flags 0x40000002, verdict -52");
}

TEST(ReportTest, DisplayLinesAsTextAndJson) {
  Message outcome = Outcome(Pass::kDisplay);
  outcome.displayLines = {{"RadioLinkSetupRequest", 688}, {"\"quoted\"", 3244}};
  const std::vector<std::string> text = Lines(outcome, false);
  ASSERT_EQ(text.size(), 4u);
  EXPECT_EQ(text[1], "   688  RadioLinkSetupRequest");
  EXPECT_EQ(text[2], "  3244  \"quoted\"");
  const std::vector<std::string> json = Lines(outcome, true);
  ASSERT_EQ(json.size(), 3u);
  EXPECT_EQ(json[0], kHead + R"("displayId":688,"text":"RadioLinkSetupRequest"})");
  EXPECT_EQ(json[1], kHead + R"("displayId":3244,"text":"\"quoted\""})");
}

TEST(ReportTest, KeysWithFixedAndVariableSlotsAndTheKeyPassResult) {
  Message outcome = Outcome(Pass::kKeys);
  outcome.summary.result = -3;
  outcome.keys = {{15, "C_ID", false, 1234, "", 0}, {42, "IMSI", true, 0, "0440200123456789", 60}};
  EXPECT_EQ(Lines(outcome, true),
            (std::vector<std::string>{
                kHead + R"("row":15,"name":"C_ID","value":1234})",
                kHead + R"("row":42,"name":"IMSI","value":"0440200123456789","bits":60})",
                kHead + R"("summary":true,"result":-3,"bitsLeftOut":0,"position":65,"flags":2})",
            }));
  const std::vector<std::string> text = Lines(outcome, false);
  ASSERT_EQ(text.size(), 4u);
  EXPECT_EQ(text[1], "    15  C_ID = 1234");
  EXPECT_EQ(text[2], "    42  IMSI = 0440200123456789 (60 bits)");
  EXPECT_EQ(text[3], "summary: result -3, bits left 0, position 65, flags 0x2");
}

// Lines wait in the buffer until a block is full, but an error line goes out
// behind everything formatted before it.
TEST(OutputWriterTest, WritesErrorLinesInOrderWithTheBufferedOnes) {
  std::FILE* const file = std::tmpfile();
  {
    OutputWriter writer(file, file);
    fmt::format_to(fmt::appender(writer.buffer()), "msg 0\n");
    writer.EndMessage();
    EXPECT_EQ(std::ftell(file), 0);
    writer.Error("{}: error: {}\n", "x.hex:2", "no hex digits");
    fmt::format_to(fmt::appender(writer.buffer()), "msg 1\n");
  }
  std::rewind(file);
  char text[64] = {};
  EXPECT_EQ(std::string(text, std::fread(text, 1, sizeof text, file)),
            "msg 0\nx.hex:2: error: no hex digits\nmsg 1\n");
  std::fclose(file);
}

// ------------------------------------------------------------ key rows

tables::DictionaryRow DictionaryRow(uint32_t flags, const char* name) {
  tables::DictionaryRow row{};
  row.flags = flags;
  row.name = name;
  return row;
}

TEST(KeySizeClassesTest, TakesTheKeyFieldsUpToTheTerminatorRow) {
  const std::vector<tables::DictionaryRow> dictionary{
      DictionaryRow(0x05010001, "PDU Type"), DictionaryRow(0x05000002, "IE ID"),
      DictionaryRow(0x05010002, "C_ID"),     DictionaryRow(0x05010004, "IMSI"),
      DictionaryRow(0xffffffff, "$_$LAST"),  DictionaryRow(0x05010001, "beyond the end"),
  };
  EXPECT_EQ(ReadKeySizeClasses(dictionary.data()),
            (KeySizeClasses{{"PDU Type", 1}, {"C_ID", 2}, {"IMSI", 4}}));
}

// A key buffer laid out like the host library's: presence bits, then slots.
class ReadKeysTest : public ::testing::Test {
 protected:
  ReadKeysTest() : buffer_(64, 0) {
    for (uint32_t row = 0; row < 4; ++row) {
      table_.push_back({0, 1 + 4 * row, 1u << row, "vorel_rnsap_04b", kNames[row], {0, 0, 0}});
    }
  }

  void SetPresent(uint32_t row) { buffer_[0] |= static_cast<uint8_t>(1u << row); }
  void Write(uint32_t offset, std::vector<uint8_t> octets) {
    std::copy(octets.begin(), octets.end(), buffer_.begin() + offset);
  }

  static constexpr const char* kNames[] = {"PDU Type", "C_ID", "IMSI", "RL_ID"};
  const KeySizeClasses classes_{{"PDU Type", 1}, {"C_ID", 2}, {"IMSI", 4}, {"RL_ID", 1}};
  std::vector<KeyFieldRow> table_;
  std::vector<uint8_t> buffer_;
};

TEST_F(ReadKeysTest, ReadsThePresentRowsByTheirSizeClass) {
  SetPresent(1);
  SetPresent(2);
  SetPresent(3);
  Write(1, {0xff, 0xff, 0xff, 0xff});  // slot of row 0, not present
  Write(5, {0xd2, 0x04, 0xee, 0xee});  // C_ID 1234, little-endian, two octets
  Write(9, {60, 0, 40, 0});            // IMSI: 60 bits at offset 40
  Write(13, {7, 0xee});                // RL_ID 7, one octet
  Write(40, {0x04, 0x40, 0x20, 0x01, 0x23, 0x45, 0x67, 0x89, 0xaa});
  Message outcome = Outcome(Pass::kKeys);
  outcome.keys = ReadKeys(table_, buffer_, classes_);
  EXPECT_EQ(
      Lines(outcome, false),
      (std::vector<std::string>{"msg 3 (x.hex:7), 8 octets, keys", "     1  C_ID = 1234",
                                "     2  IMSI = 0440200123456789 (60 bits)", "     3  RL_ID = 7",
                                "summary: result 1, bits left 0, position 65, flags 0x2"}));
}

TEST_F(ReadKeysTest, RefusesPresentRowsItCannotRead) {
  const auto error = [this](const KeySizeClasses& classes) -> std::string {
    try {
      ReadKeys(table_, buffer_, classes);
    } catch (const std::runtime_error& failure) {
      return failure.what();
    }
    return "no error";
  };
  SetPresent(2);
  Write(9, {16, 0, 40, 0});
  EXPECT_EQ(error({{"C_ID", 2}}), "key row 2 (IMSI) names no key field of the dictionary");
  Write(9, {16, 0, 63, 0});  // two key octets from the last octet of the buffer on
  EXPECT_EQ(error(classes_), "key row 2 (IMSI): key octets outside the key buffer");
  table_[2].valueOffset = 62;
  EXPECT_EQ(error(classes_), "key row 2 (IMSI): slot outside the key buffer");
}

}  // namespace
}  // namespace rnsap::cli
