// The string table (table 8) and the display formats the dictionary rows
// point at: one string per text, in order of first use, and every format of
// the shape its field asks for.
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>

#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

class FormatStringsTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(t.complete()); }
  const HostTables& t = Tables();
};

TEST_F(FormatStringsTest, StringsAreDistinctAndEndWithTheFinalMark) {
  ASSERT_GE(t.stringCount(), 2u);
  ASSERT_NE(t.string(t.stringCount() - 1), nullptr);
  EXPECT_STREQ(t.string(t.stringCount() - 1), kFinalString);
  std::map<std::string, size_t> first;
  for (size_t i = 0; i < t.stringCount(); ++i) {
    ASSERT_NE(t.string(i), nullptr) << "string " << i;
    const auto [at, inserted] = first.emplace(t.string(i), i);
    EXPECT_TRUE(inserted) << "strings " << at->second << " and " << i << " are both \""
                          << t.string(i) << '"';
  }
}

TEST_F(FormatStringsTest, StringsStandInOrderOfFirstUse) {
  // Row by row: the format, then the texts of the row's value list.
  size_t next = 0;
  std::set<uint32_t> used;
  auto use = [&](uint32_t index, const std::string& what) {
    if (used.insert(index).second) {
      EXPECT_EQ(index, next) << what << " brings a new string out of order";
      next = index + 1;
    }
  };
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    use(row.formatIndex, "format of " + RowName(row));
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      use(t.valueRow(row.firstValue + v).stringIndex,
          "value " + std::to_string(v) + " of " + RowName(row));
    }
  }
  // Every string but the end mark is in use.
  EXPECT_EQ(next, t.stringCount() - 1);
}

TEST_F(FormatStringsTest, EqualFormatsShareOneString) {
  const HostRow* first = nullptr;
  size_t rows = 0;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (std::string(row.name) != "Extension Ext") continue;
    if (first == nullptr) first = &row;
    ++rows;
    EXPECT_EQ(row.formatIndex, first->formatIndex) << RowName(row);
  }
  ASSERT_NE(first, nullptr);
  EXPECT_GT(rows, 1u);
  EXPECT_EQ(t.Format(*first), "  Extension Ext=%-S");
}

// The value part that the format of a field has: a few fields by their id,
// else %-S with a value list and %u without.
std::string ExpectedValuePart(const HostRow& row) {
  static const std::map<uint32_t, std::string> byField = [] {
    std::map<uint32_t, std::string> m;
    for (uint32_t id : {684, 682, 706, 2868, 3012, 3027, 2607, 3730, 3737, 3744, 3751, 3758, 3765,
                        3772, 3779, 3786, 3793, 3798}) {
      m[id] = "%x";
    }
    for (uint32_t id : {2932, 3085, 2950, 2954, 3032, 3036}) m[id] = "%b";
    // The fields read as an offset from a negative lower bound.
    for (uint32_t id : {2644, 2691, 2796, 2808, 2957, 3004, 3016, 3017, 3193, 3202}) m[id] = "%d";
    for (uint32_t id : {2918, 2923, 2925, 2606, 2945, 3060}) m[id] = "%-[\"%x\"]";
    for (uint32_t id : {3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801}) {
      m[id] = "%-[\"%X\":\"-\"]";
    }
    m[2934] = "%-[\"%u\":\".\"]";
    m[3171] = "%s";
    m[3299] = "%u octets";
    for (uint32_t id : {3248, 3264, 3272}) m[id] = "%-S (%u)";
    return m;
  }();
  const auto it = byField.find(row.fieldId);
  if (it != byField.end()) return it->second;
  return row.valueCount > 0 ? "%-S" : "%u";
}

TEST_F(FormatStringsTest, EveryFormatHasTheValuePartOfItsField) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    const std::string format = t.Format(row);
    SCOPED_TRACE(RowName(row) + " format \"" + format + "\"");
    EXPECT_EQ(format.find("%-S") != std::string::npos, row.valueCount > 0);
    EXPECT_EQ(format.find("%d") != std::string::npos, ExpectedValuePart(row) == "%d");
    if (row.fieldId == 2920) {
      EXPECT_EQ(format, "");
      continue;
    }
    const size_t eq = format.find('=');
    ASSERT_NE(eq, std::string::npos);
    EXPECT_EQ(format.substr(eq + 1), ExpectedValuePart(row));
  }
}

TEST_F(FormatStringsTest, FormatLabelIsIndentationAndName) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    const auto label = FormatLabel(t.Format(row));
    if (row.fieldId == 2920) continue;  // the empty format of Filler
    ASSERT_TRUE(label.has_value()) << RowName(row);
    const auto& [text, indentation] = *label;
    EXPECT_EQ(text.substr(indentation), row.name) << RowName(row);
    // Four blanks only where the format is wider than the label.
    const bool wide = row.fieldId == 3248 || row.fieldId == 3264 || row.fieldId == 3272;
    if (wide) {
      EXPECT_EQ(indentation, 4u) << RowName(row);
    } else {
      EXPECT_LE(indentation, 2u) << RowName(row);
    }
  }
  const std::map<uint32_t, std::string> exceptions{{3248, "    Nation=%-S (%u)"},
                                                   {3264, "    Company=%-S (%u)"},
                                                   {3272, "    Protocol=%-S (%u)"},
                                                   {2923, "  IMSI=%-[\"%x\"]"},
                                                   {2925, "  IMSI=%-[\"%x\"]"}};
  for (const auto& [id, format] : exceptions) {
    const HostRow* row = t.FindField(id);
    ASSERT_NE(row, nullptr) << "field " << id;
    EXPECT_EQ(t.Format(*row), format) << "field " << id;
  }
}

}  // namespace
}  // namespace rnsap::testing
