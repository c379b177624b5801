// What the passes tell the host about a field must agree with the field's
// dictionary row: the Display pass names each line by the display id of the
// row (the field id of the first row with the same name), and the
// Decoded-field pass labels each field with the indentation of the row's
// format and the row's name. Both passes walk a message read for read, so
// their reports pair up one to one; the generated messages reach every field.
#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"
#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

// The display id and label a field's reports must carry, from its row.
struct RowView {
  uint32_t displayId = 0;
  std::optional<std::string> label;  // none for a format without '=' (Filler)
  std::string textStart;             // the format up to its value part
};

RowView ViewOf(const HostTables& t, uint32_t fieldId) {
  // Where the format is indented more than the label, or the label not at all.
  static const std::map<uint32_t, std::string> kLabelExceptions{{3248, "  Nation"},
                                                                {3264, "  Company"},
                                                                {3272, "  Protocol"},
                                                                {2923, "IMSI"},
                                                                {2925, "IMSI"}};
  const HostRow* row = t.FindField(fieldId);
  if (row == nullptr) return {};
  RowView view{t.DisplayId(*row), std::nullopt, ""};
  if (const auto label = FormatLabel(t.Format(*row))) {
    const auto exception = kLabelExceptions.find(fieldId);
    view.label = exception != kLabelExceptions.end() ? exception->second
                                                     : std::string(label->second, ' ') + row->name;
    view.textStart = label->first + "=";
  }
  return view;
}

TEST(DisplayIdsTest, ReportsCarryTheDisplayIdAndLabelOfTheirRow) {
  const HostTables& t = Tables();
  ASSERT_TRUE(t.complete());
  std::map<uint32_t, RowView> views;
  PassHost host;
  for (const auto& message : ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS)) {
    host.Load(message, static_cast<uint32_t>(8 * message.size()));
    ASSERT_TRUE(vex_PreDecodeMD(&host.request()));
    const std::vector<host::DecodedFieldReport> decoded = host::DecodedFields();
    host.context().Rewind();
    host::ResetParserUtilities();
    ASSERT_TRUE(vex_PreDecodeTO(&host.request()));
    const std::vector<host::DisplayLine>& lines = host::DisplayLines();
    ASSERT_EQ(decoded.size(), lines.size()) << "the passes walked apart";
    for (size_t i = 0; i < lines.size(); ++i) {
      const uint32_t id = decoded[i].fieldId;
      auto view = views.find(id);
      if (view == views.end()) view = views.emplace(id, ViewOf(t, id)).first;
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
