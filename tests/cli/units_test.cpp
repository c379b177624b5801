// What the parts of rnsap-decode do that its command line cannot show: the
// JSON escapes, a line beyond its bound in a debug build, the summaries of
// failed passes, output held back until a block is full, and the key fields
// of a dictionary or key rows unlike the module's, the age order of the
// capture reader's held state.
#include <gtest/gtest.h>

#include <cstdio>
#include <stdexcept>

#include "cli/aged_map.h"
#include "cli/json.h"
#include "cli/key_rows.h"
#include "cli/line_writer.h"
#include "cli/output_writer.h"
#include "cli/report.h"

namespace rnsap::cli {
namespace {

TEST(JsonStringTest, EscapesWhatJsonRequiresAndKeepsTheRest) {
  EXPECT_EQ(JsonString(R"(  %-["%x"] a\b)"), R"("  %-[\"%x\"] a\\b")");
  EXPECT_EQ(JsonString("\b\f\n\r\t"), R"("\b\f\n\r\t")");
  EXPECT_EQ(JsonString(std::string_view("\x00\x01\x1f\x7f", 4)), R"("\u0000\u0001\u001f\u007f")");
  EXPECT_EQ(JsonString("pate brisee or pate bris\xe9"), R"("pate brisee or pate bris\u00e9")");
  EXPECT_EQ(JsonString(""), R"("")");
}

// The capture reader evicts the entry used least recently, by Use or Emplace.
TEST(AgedMapTest, TakesTheLeastRecentlyUsedFirst) {
  AgedMap<int, int> map;
  for (const int key : {1, 2, 3, 4}) map.Emplace(key) = 10 * key;
  EXPECT_EQ(*map.Use(1), 10);
  map.Emplace(3);
  map.Emplace(3);
  EXPECT_EQ(map.Use(9), nullptr);
  map.Erase(4);
  std::vector<std::pair<int, int>> taken;
  while (!map.empty()) taken.push_back(map.TakeOldest());
  EXPECT_EQ(taken, (std::vector<std::pair<int, int>>{{2, 20}, {1, 10}, {3, 30}}));
}

#ifndef NDEBUG
TEST(LineWriterDeathTest, ADebugBuildStopsALineBeyondItsBound) {
  const auto overrun = [](auto write) {
    fmt::memory_buffer out;
    write(LineWriter(out, 2));
  };
  EXPECT_DEATH(overrun([](LineWriter&& line) { line.Text("abc"); }), "room");
  EXPECT_DEATH(overrun([](LineWriter&& line) { line.Number(123); }), "end");
  EXPECT_DEATH(overrun([](LineWriter&& line) { line.Terminal("a"); }), "room");
}
#endif

// A pass that could not grow a table, and the host's key library refusing.
TEST(ReportTest, SummariesOfFailedPasses) {
  const MessageSummary validate{.pass = Pass::kValidate,
                                .result = 0,
                                .bitsLeftOut = 8,
                                .position = 9,
                                .flags = 0x40000002,
                                .verdict = -52};
  const MessageSummary keys{.pass = Pass::kKeys, .result = -3, .position = 1, .flags = 2};
  tables::DictionaryRow dictionaryEnd{};
  dictionaryEnd.flags = 0xffffffff;
  const FieldDictionary dictionary({.dictionary = &dictionaryEnd});
  fmt::memory_buffer out;
  for (const bool json : {false, true}) {
    for (const MessageSummary& summary : {validate, keys}) {
      const std::unique_ptr<MessagePrinter> printer =
          json ? MakeJsonPrinter(out, dictionary) : MakeTextPrinter(out);
      printer->Begin({.index = 3, .origin = "x.hex:7", .octets = 1, .pass = summary.pass});
      printer->End(summary);
    }
  }
  EXPECT_EQ(fmt::to_string(out),
            "msg 3 (x.hex:7), 1 octet, validate\n"
            "summary: result false, bits left 8, position 9, flags 0x40000002, verdict -52\n"
            "msg 3 (x.hex:7), 1 octet, keys\n"
            "summary: result -3, bits left 0, position 1, flags 0x2\n"
            R"({"msg":3,"source":"x.hex:7","summary":true,"result":false,"bitsLeftOut":8,)"
            R"("position":9,"flags":1073741826,"verdict":-52})"
            "\n"
            R"({"msg":3,"source":"x.hex:7","summary":true,"result":-3,"bitsLeftOut":0,)"
            R"("position":1,"flags":2})"
            "\n");
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

// Key fields by name, up to the terminator row.
TEST(KeySizeClassesTest, TakesTheKeyFieldsUpToTheTerminatorRow) {
  const std::pair<uint32_t, const char*> rows[] = {
      {0x05010002, "C_ID"}, {0x05000001, "IE ID"}, {0xffffffff, "$_$LAST"}, {0x05010001, "Beyond"}};
  std::vector<tables::DictionaryRow> dictionary(std::size(rows));
  for (size_t row = 0; row < dictionary.size(); ++row)
    std::tie(dictionary[row].flags, dictionary[row].name) = rows[row];
  EXPECT_EQ(ReadKeySizeClasses(dictionary.data()), (KeySizeClasses{{"C_ID", 2}}));
}

// Row 0 of a key buffer: presence bit 1 in octet 0, its slot at octet 1.
TEST(ReadKeysTest, RefusesPresentRowsItCannotRead) {
  std::vector<KeyFieldRow> table{{0, 1, 1, "vorel_rnsap_04b", "IMSI", {0, 0, 0}}};
  const std::vector<uint8_t> buffer{1, 16, 0, 7, 0, 0, 0, 0};  // 16 key bits at octet 7
  const auto error = [&](const KeySizeClasses& classes) -> std::string {
    try {
      std::vector<KeyValue> keys;
      KeyReader(classes).Read(table, buffer, keys);
    } catch (const std::runtime_error& failure) {
      return failure.what();
    }
    return "no error";
  };
  EXPECT_EQ(error({{"C_ID", 2}}), "key row 0 (IMSI) names no key field of the dictionary");
  EXPECT_EQ(error({{"IMSI", 4}}), "key row 0 (IMSI): key octets outside the key buffer");
  table[0].valueOffset = 5;
  EXPECT_EQ(error({{"IMSI", 4}}), "key row 0 (IMSI): slot outside the key buffer");
}

}  // namespace
}  // namespace rnsap::cli
