// The descriptor tables as a host finds them through vex_DLLGetTable, entry
// for entry against tables.dump; and the agreement of the passes' reports
// with the rows of their fields.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"
#include "tests/support/golden_lines.h"
#include "tests/support/table_dump.h"

namespace rnsap::testing {
namespace {

const void* Table(int32_t index) {
  const void* out = nullptr;
  EXPECT_EQ(vex_DLLGetTable(index, &out), 0u) << "table " << index;
  EXPECT_NE(out, nullptr) << "table " << index;
  return out;
}

const HostRow* Rows() { return static_cast<const HostRow*>(Table(4)); }
const HostValueRow* Values() { return static_cast<const HostValueRow*>(Table(6)); }
const char* const* Strings() { return static_cast<const char* const*>(Table(8)); }

DumpLines TablesDump() {
  DumpLines dump = DumpRows(Rows());
  for (const DumpLines& part :
       {DumpValues(Values()), DumpPool(static_cast<const uint32_t*>(Table(7)), PoolWords(Values())),
        DumpStrings(Strings()), DumpLayout(static_cast<const uint8_t*>(Table(9)))})
    dump.insert(dump.end(), part.begin(), part.end());
  return dump;
}

TEST(DescriptorTablesTest, TablesAreTheDumpedOnes) {
  ExpectLinesOfFile(TablesDump(), RNSAP_EXPECTED_TABLES);
}

// The text of a format in front of its '=', and the number of blanks it
// starts with; nullopt for a format without '='.
std::optional<std::pair<std::string, size_t>> FormatLabel(const std::string& format) {
  const size_t eq = format.find('=');
  if (eq == std::string::npos) return std::nullopt;
  std::string label = format.substr(0, eq);
  return std::make_pair(label, std::min(label.find_first_not_of(' '), label.size()));
}

// What the passes tell the host about a field must agree with the field's
// dictionary row: the Display pass names each line by the display id of the
// row (the field id of the first row with the same name), and the
// Decoded-field pass labels each field with the indentation of the row's
// format and the row's name. Both passes walk a message read for read, so
// their reports pair up one to one; the generated messages reach every field.

// The display id and label a field's reports must carry, from its row.
struct RowView {
  uint32_t displayId = 0;
  std::optional<std::string> label;  // none for a format without '=' (Filler)
  std::string textStart;             // the format up to its value part
};

RowView ViewOf(uint32_t fieldId) {
  // Where the format is indented more than the label, or the label not at all.
  static const std::map<uint32_t, std::string> kLabelExceptions{{3248, "  Nation"},
                                                                {3264, "  Company"},
                                                                {3272, "  Protocol"},
                                                                {2923, "IMSI"},
                                                                {2925, "IMSI"}};
  const HostRow* rows = Rows();
  const HostRow* end = rows + RowCount(rows);
  const HostRow* row =
      std::find_if(rows, end, [&](const HostRow& r) { return r.fieldId == fieldId; });
  if (row == end) return {};
  // The display id: the field id of the first row of the same name.
  const uint32_t displayId = std::find_if(rows, end, [&](const HostRow& r) {
                               return std::strcmp(r.name, row->name) == 0;
                             })->fieldId;
  RowView view{displayId, std::nullopt, ""};
  if (const auto label = FormatLabel(Strings()[row->formatIndex])) {
    const auto exception = kLabelExceptions.find(fieldId);
    view.label = exception != kLabelExceptions.end() ? exception->second
                                                     : std::string(label->second, ' ') + row->name;
    view.textStart = label->first + "=";
  }
  return view;
}

TEST(DisplayIdsTest, ReportsCarryTheDisplayIdAndLabelOfTheirRow) {
  std::map<uint32_t, RowView> views;
  PassHost host;
  for (const auto& message : ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS)) {
    host.Load(message, static_cast<uint32_t>(8 * message.size()));
    ASSERT_TRUE(vex_PreDecodeMD(&host.request()));
    const std::vector<host::DecodedFieldReport> decoded = host::DecodedFields();
    host.context().Rewind();
    host::ResetRecorder();
    ASSERT_TRUE(vex_PreDecodeTO(&host.request()));
    const std::vector<host::DisplayLine>& lines = host::DisplayLines();
    ASSERT_EQ(decoded.size(), lines.size()) << "the passes walked apart";
    for (size_t i = 0; i < lines.size(); ++i) {
      const uint32_t id = decoded[i].fieldId;
      auto view = views.find(id);
      if (view == views.end()) view = views.emplace(id, ViewOf(id)).first;
      SCOPED_TRACE("field " + std::to_string(id));
      ASSERT_NE(view->second.displayId, 0u) << "no dictionary row";
      EXPECT_EQ(lines[i].displayId, view->second.displayId);
      if (view->second.label) {
        EXPECT_EQ(decoded[i].label, *view->second.label);
        EXPECT_TRUE(decoded[i].text.starts_with(view->second.textStart)) << decoded[i].text;
      } else {
        EXPECT_EQ(decoded[i].text, "");
      }
    }
  }
  // The fields whose names or labels are shared in odd ways.
  for (uint32_t id :
       {688,  692,  696,  698,  702,  705,  725,  737,  3216, 3223, 3226, 3244, 3248, 3250,
        3264, 3268, 3270, 3272, 2551, 2552, 3388, 2587, 709,  2562, 2918, 2920, 2923, 2925}) {
    EXPECT_TRUE(views.count(id)) << "field " << id << " not reached by the corpus";
  }
}

}  // namespace
}  // namespace rnsap::testing
