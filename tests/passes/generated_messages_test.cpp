// Runs the messages that generator/message_gen.py wrote from the protocol
// description through all four passes. Each message comes with the walk the
// generator made of it: the Decoded-field pass must report exactly those
// fields, the Display pass a line for each, both as the fields' dictionary
// rows tell, and every pass must end where the walk ends, with its flags,
// leave the field record as the Decoded-field pass leaves it, and give the
// message back as it was.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <map>
#include <optional>
#include <set>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "boundary/module_api.h"
#include "engine/grammar_tables.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"
#include "tests/support/record_snapshot.h"
#include "tests/support/table_dump.h"

namespace rnsap {
namespace {

using testing::BitRange;
using testing::HostRow;
using testing::HostRows;
using testing::HostStrings;
using testing::RowCount;

struct GeneratedMessage {
  std::string title;  // the comment above it, and its line in the corpus
  std::vector<uint8_t> octets;
  std::vector<std::pair<uint32_t, std::string>> fields;  // id, "first-last" or "-"
  std::set<std::pair<std::string, uint32_t>> reached;    // dispatch table, id
  uint32_t position = 0;
  uint32_t bitsLeftOut = 0;
  uint32_t validationFlags = 0;  // the Validation pass also checks loop counts
  uint32_t flags = 0;
};

std::vector<GeneratedMessage> LoadCorpus() {
  std::vector<GeneratedMessage> corpus;
  std::ifstream in(RNSAP_MESSAGE_CORPUS);
  std::string line, comment;
  for (int number = 1; std::getline(in, line); ++number) {
    std::istringstream words(line);
    std::string keyword, word;
    words >> keyword;
    if (keyword == "#") {
      comment = line.substr(2);
    } else if (keyword == "message") {
      words >> word;
      GeneratedMessage& m = corpus.emplace_back();
      m.title = comment + " (line " + std::to_string(number) + ")";
      m.octets = testing::HexOctets(word);
    } else if (keyword == "field") {
      uint32_t id = 0;
      words >> id >> word;
      corpus.back().fields.emplace_back(id, word);
    } else if (keyword == "reach") {
      uint32_t id = 0;
      words >> word >> id;
      corpus.back().reached.emplace(word, id);
    } else if (keyword == "end") {
      GeneratedMessage& m = corpus.back();
      std::sscanf(line.c_str(), "end position=%u bitsLeftOut=%u flags=%u passFlags=%u", &m.position,
                  &m.bitsLeftOut, &m.validationFlags, &m.flags);
    }
  }
  return corpus;
}

const std::vector<GeneratedMessage>& Corpus() {
  static const std::vector<GeneratedMessage> corpus = LoadCorpus();
  return corpus;
}

// The walk of the Decoded-field reports: field ids and bits covered.
std::vector<std::pair<uint32_t, std::string>> DecodedWalk() {
  std::vector<std::pair<uint32_t, std::string>> walk;
  for (const host::DecodedFieldReport& f : host::DecodedFields())
    walk.emplace_back(f.fieldId, BitRange(f.segments));
  return walk;
}

// The text of a format in front of its '=', and the number of blanks it
// starts with; nullopt for a format without '='.
std::optional<std::pair<std::string, size_t>> FormatLabel(const std::string& format) {
  const size_t eq = format.find('=');
  if (eq == std::string::npos) return std::nullopt;
  std::string label = format.substr(0, eq);
  return std::make_pair(label, std::min(label.find_first_not_of(' '), label.size()));
}

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
  const HostRow* rows = HostRows();
  const HostRow* end = rows + RowCount(rows);
  const HostRow* row =
      std::find_if(rows, end, [&](const HostRow& r) { return r.fieldId == fieldId; });
  if (row == end) return {};
  // The display id: the field id of the first row of the same name.
  const uint32_t displayId = std::find_if(rows, end, [&](const HostRow& r) {
                               return std::strcmp(r.name, row->name) == 0;
                             })->fieldId;
  RowView view{displayId, std::nullopt, ""};
  if (const auto label = FormatLabel(HostStrings()[row->formatIndex])) {
    const auto exception = kLabelExceptions.find(fieldId);
    view.label = exception != kLabelExceptions.end() ? exception->second
                                                     : std::string(label->second, ' ') + row->name;
    view.textStart = label->first + "=";
  }
  return view;
}

// What the passes tell the host about a field must agree with the field's
// dictionary row: the Display pass names each line by the display id of the
// row (the field id of the first row with the same name), and the
// Decoded-field pass labels each field with the indentation of the row's
// format and the row's name. Both passes walk a message read for read, so
// their reports pair up one to one.
void ExpectReportsOfTheirRows(const std::vector<host::DecodedFieldReport>& decoded,
                              std::map<uint32_t, RowView>& views) {
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

TEST(GeneratedMessagesTest, EveryPassWalksEachMessageAsGenerated) {
  ASSERT_FALSE(Corpus().empty()) << "no messages in " << RNSAP_MESSAGE_CORPUS;
  testing::PassHost host;
  ASSERT_TRUE(host.ready());
  std::map<uint32_t, RowView> views;  // of the fields reached, by field id
  std::vector<host::DecodedFieldReport> decoded;
  for (size_t index = 0; index < Corpus().size(); ++index) {
    const GeneratedMessage& m = Corpus()[index];
    SCOPED_TRACE("message " + std::to_string(index) + ": " + m.title);
    host.Load(m.octets, static_cast<uint32_t>(8 * m.octets.size()));
    std::map<std::string, std::vector<uint8_t>> records;  // by pass
    for (const testing::Pass pass : testing::kAllPasses) {
      host::ResetRecorder();
      host.context().Rewind();
      testing::FillRecord(host.state());
      ASSERT_EQ(testing::RunPass(pass, host.context()), 1);
      records[testing::NameOf(pass)] = testing::RecordSnapshot(host.state());
      EXPECT_EQ(host.state().position, m.position);
      EXPECT_EQ(testing::BitsLeftOut(pass, host.context()), m.bitsLeftOut);
      EXPECT_EQ(host.state().flags,
                pass == testing::Pass::kValidation ? m.validationFlags : m.flags);
      EXPECT_TRUE(host.BufferRestored());
      if (pass == testing::Pass::kDecodedField) {
        EXPECT_EQ(DecodedWalk(), m.fields);
        decoded = host::DecodedFields();
      } else if (pass == testing::Pass::kDisplay) {
        ExpectReportsOfTheirRows(decoded, views);
      }
    }
    for (const auto& [pass, record] : records)
      EXPECT_TRUE(record == records["Decoded-field"]) << pass << " pass leaves another record";
  }
  // The fields whose names or labels are shared in odd ways.
  for (uint32_t id :
       {688,  692,  696,  698,  702,  705,  725,  737,  3216, 3223, 3226, 3244, 3248, 3250,
        3264, 3268, 3270, 3272, 2551, 2552, 3388, 2587, 709,  2562, 2918, 2920, 2923, 2925}) {
    EXPECT_TRUE(views.count(id)) << "field " << id << " not reached by the corpus";
  }
}

// A dispatch branch that no generated message passes through is a branch
// whose messages the generator could not write.
TEST(GeneratedMessagesTest, CoverEveryDispatchBranch) {
  static const char* const kTables[] = {"ie", "extension", "private"};
  std::set<std::pair<std::string, uint32_t>> reached;
  for (const GeneratedMessage& m : Corpus()) reached.insert(m.reached.begin(), m.reached.end());
  for (uint32_t t = 0; t < 3; ++t) {
    const grammar::DispatchTable& table = grammar::kDispatchTables[t];
    for (uint32_t id = 0; id < table.size; ++id) {
      if (table.branches[id] >= 0) {
        EXPECT_TRUE(reached.count({kTables[t], id}))
            << "no message reaches " << kTables[t] << " " << id;
      }
    }
  }
}

}  // namespace
}  // namespace rnsap
