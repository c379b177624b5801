// The descriptor tables as a host finds them through vex_DLLGetTable: every
// count, distribution and placed row that fixes them, as data, against what a
// walk of the tables finds; the rules that hold over all their rows; and the
// agreement of the passes' reports with the rows of their fields.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <optional>
#include <set>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "tests/passes/pass_messages.h"
#include "tests/support/facts.h"
#include "tests/support/generated_corpus.h"

namespace rnsap::testing {
namespace {

// The row layouts, declared here from the binary contract and not taken from
// the module's headers, so that a slip there shows up as a failing read.
// One dictionary row: 19 words, the name words are pointers.
struct HostRow {
  uint32_t flags;
  uint32_t fieldId;
  uint32_t keyIndex;
  const char* name;
  const char* altName;
  uint32_t valueCount;
  uint32_t firstValue;
  uint32_t widthCode;
  uint32_t formatIndex;
  uint32_t reservedA[6];
  uint32_t layoutOffset;
  uint32_t reservedB[3];
};

// The row that ends the dictionary, its third word a pointer, and the word
// behind it.
struct HostEndRow {
  uint32_t head[2];
  const char* lastField;
  uint32_t tail[17];
};

struct HostValueRow {
  uint32_t valueKind;
  uint32_t poolIndex;
  uint32_t stringIndex;
};

#if UINTPTR_MAX == 0xffffffffu
// A 32-bit host reads the image word for word: 76-byte rows.
static_assert(sizeof(HostRow) == 76);
static_assert(offsetof(HostRow, name) == 12);
static_assert(offsetof(HostRow, formatIndex) == 32);
static_assert(offsetof(HostRow, layoutOffset) == 60);
static_assert(offsetof(HostEndRow, lastField) == 8);
#endif
static_assert(sizeof(HostValueRow) == 12);

constexpr uint32_t kAllOnes = 0xffffffff;
constexpr uint32_t kNamedValue = 1;
constexpr uint32_t kCatchAll = 0x00010000;
constexpr uint32_t kCatchAllPoolIndex = 29;
constexpr const char* kFinalString = "$$_FINAL_STRING_$$";

// Bounds of the walks, far beyond the complete tables, so that a missing end
// mark ends in a failure and not in a run through memory.
constexpr size_t kMaxEntries = 4000;
constexpr size_t kMaxLayoutBytes = 4096;

const void* Table(int32_t index) {
  const void* out = nullptr;
  EXPECT_EQ(vex_DLLGetTable(index, &out), 0u) << "table " << index;
  EXPECT_NE(out, nullptr) << "table " << index;
  return out;
}

// The tables walked to their end marks; `complete` is false when a table is
// missing or a walk found no end mark.
struct HostTables {
  HostTables() {
    if (!rows || !values || !pool || !strings || !layout) return;
    while (rowCount < kMaxEntries && rows[rowCount].flags != kAllOnes) ++rowCount;
    size_t maxPoolIndex = 0;
    for (; valueRowCount < kMaxEntries; ++valueRowCount) {
      const HostValueRow& v = values[valueRowCount];
      if (v.valueKind == 0 && v.poolIndex == 0 && v.stringIndex == 0) break;
      maxPoolIndex = std::max<size_t>(maxPoolIndex, v.poolIndex);
    }
    // The pool's closing 0 stands behind the highest index a value row names.
    poolWords = maxPoolIndex + 2;
    while (stringCount < kMaxEntries) {
      const char* s = strings[stringCount++];
      if (s == nullptr || std::strcmp(s, kFinalString) == 0) break;
    }
    complete = std::max({rowCount, valueRowCount, stringCount}) < kMaxEntries;
  }

  const HostEndRow& endRow() const { return *reinterpret_cast<const HostEndRow*>(&rows[rowCount]); }
  const HostRow* FindField(uint32_t fieldId) const {
    const HostRow* row =
        std::find_if(rows, rows + rowCount, [&](const HostRow& r) { return r.fieldId == fieldId; });
    return row != rows + rowCount ? row : nullptr;
  }
  // The display id of a row: the field id of the first row of the same name.
  uint32_t DisplayId(const HostRow& row) const {
    return std::find_if(rows, rows + rowCount,
                        [&](const HostRow& r) { return std::strcmp(r.name, row.name) == 0; })
        ->fieldId;
  }
  std::string StringAt(uint32_t index) const {
    return index < stringCount ? strings[index] : "<no such string>";
  }
  std::string Format(const HostRow& row) const { return StringAt(row.formatIndex); }
  // The row's value list as `0 "text", 1 "text"`, a catch-all row as `other "text"`.
  std::string ValueListText(const HostRow& row) const {
    std::string text;
    for (uint32_t i = 0; i < row.valueCount; ++i) {
      const HostValueRow& v = values[row.firstValue + i];
      text += (i > 0 ? ", " : "") +
              (v.valueKind == kNamedValue ? std::to_string(pool[v.poolIndex]) : "other");
      text += " \"" + StringAt(v.stringIndex) + '"';
    }
    return text;
  }

  const HostRow* rows = static_cast<const HostRow*>(Table(4));
  const HostValueRow* values = static_cast<const HostValueRow*>(Table(6));
  const uint32_t* pool = static_cast<const uint32_t*>(Table(7));
  const char* const* strings = static_cast<const char* const*>(Table(8));
  const uint8_t* layout = static_cast<const uint8_t*>(Table(9));
  size_t rowCount = 0, valueRowCount = 0, stringCount = 0, poolWords = 0;
  bool complete = false;
};

const HostTables& Tables() {
  static const HostTables tables;
  return tables;
}

// The text of a format in front of its '=', and the number of blanks it
// starts with; nullopt for a format without '='.
std::optional<std::pair<std::string, size_t>> FormatLabel(const std::string& format) {
  const size_t eq = format.find('=');
  if (eq == std::string::npos) return std::nullopt;
  std::string label = format.substr(0, eq);
  return std::make_pair(label, std::min(label.find_first_not_of(' '), label.size()));
}

// How failure messages name a row.
std::string RowName(const HostRow& row) {
  return std::to_string(row.fieldId) + " \"" + row.name + "\"";
}

const std::vector<Fact>& FactsOf(const std::string& kind) {
  static const Facts facts = ReadFacts(
      std::filesystem::path(RNSAP_DICTIONARY_NAMES).replace_filename("expected_tables.txt"));
  static const std::vector<Fact> none;
  const auto it = facts.find(kind);
  EXPECT_NE(it, facts.end()) << "no facts of kind " << kind;
  return it != facts.end() ? it->second : none;
}

// The numbers of field `at` of `fact`, if it has one.
std::vector<uint32_t> Ids(const Fact& fact, size_t at) {
  std::vector<uint32_t> numbers;
  std::istringstream in(at < fact.size() ? fact[at] : "");
  for (std::string word; in >> word;) numbers.push_back(Number(word));
  return numbers;
}

// The numbers of each fact of `kind`, one after another.
std::vector<uint32_t> Numbers(const std::string& kind) {
  std::vector<uint32_t> numbers;
  for (const Fact& fact : FactsOf(kind))
    std::ranges::copy(Ids(fact, 1), std::back_inserter(numbers));
  return numbers;
}

// Field `value` of each fact of `kind` by its field 1, zeros left out but
// with `keepZeros`.
template <typename Key, typename KeyOf>
std::map<Key, size_t> ByKey(const std::string& kind, KeyOf keyOf, size_t value = 2,
                            bool keepZeros = false) {
  std::map<Key, size_t> by;
  for (const Fact& fact : FactsOf(kind)) {
    if (keepZeros || Number(fact[value]) > 0) by[keyOf(fact[1])] = Number(fact[value]);
  }
  return by;
}

// One layout record, rendered in the notation of the layout facts ("malformed"
// if it breaks the token grammar), and the numbers of its bits.
struct LayoutRecord {
  std::string text;
  uint32_t length = 0;
  uint32_t itemBits = 0;
  bool countIsParameter = false;
  uint32_t count = 0;
  uint32_t size = 0;
};

class LayoutRecordReader {
 public:
  explicit LayoutRecordReader(const uint8_t* record) : body_(record + 2) {
    r_.length = record[0] | record[1] << 8;
  }

  LayoutRecord Read() {
    r_.text = std::to_string(r_.length) + " | ";
    if (r_.length == 3 && body_[0] == 0xFF && body_[1] == 0 && body_[2] == 0) {
      r_.text += "none | - | - | -";
      return r_;
    }
    for (const uint8_t head : {0xFF, 0x02, 0x55, 0x01, 0x04}) Expect(head);
    const uint8_t itemCount = Byte();
    for (uint8_t i = 0; i < itemCount; ++i) r_.text += (i > 0 ? ", " : "") + Item();
    r_.countIsParameter = Next(0x08);
    r_.text += " | " + (r_.countIsParameter ? Parameter() : std::to_string(r_.count = Number()));
    r_.size = Number();
    r_.text += " | " + std::to_string(r_.size) + " | " + Parameter();
    if (!ok_ || at_ != r_.length) r_.text = "malformed";
    return r_;
  }

 private:
  uint8_t Byte() {
    ok_ = ok_ && at_ < r_.length;
    return ok_ ? body_[at_++] : 0;
  }
  void Expect(uint8_t byte) { ok_ = Byte() == byte && ok_; }
  bool Next(uint8_t byte) const { return at_ < r_.length && body_[at_] == byte; }
  uint32_t Number() {
    Expect(0x10);
    uint32_t n = 0;
    for (int i = 0; i < 4; ++i) n = n << 8 | Byte();
    return n;
  }
  std::string Parameter() {
    Expect(0x08);
    const uint8_t index = Byte();
    Expect(0x00);
    return "parameter " + std::to_string(index);
  }
  // A range "first to last" or a single bit.
  std::string Item() {
    const bool range = Next(0x05);
    if (range) Byte();
    const uint32_t first = Number();
    const uint32_t last = range ? Number() : first;
    r_.itemBits += (first > last ? first - last : last - first) + 1;
    return std::to_string(first) + (range ? " to " + std::to_string(last) : "");
  }

  const uint8_t* body_;
  LayoutRecord r_;
  uint32_t at_ = 0;
  bool ok_ = true;
};

class DescriptorTablesTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(t.complete);
    for (uint32_t offset = 0;;) {
      const uint32_t length = t.layout[offset] | t.layout[offset + 1] << 8;
      if (length == 0) break;
      ASSERT_LE(offset + 4 + length, kMaxLayoutBytes) << "no end record";
      records_[offset] = LayoutRecordReader(t.layout + offset).Read();
      layoutEnd_ = offset += 2 + length;
    }
  }

  template <typename Key, typename KeyOf>
  std::map<Key, size_t> Tally(KeyOf keyOf) const {
    std::map<Key, size_t> tally;
    for (size_t i = 0; i < t.rowCount; ++i) ++tally[keyOf(t.rows[i])];
    return tally;
  }
  static std::string ValuePart(const std::string& format) {
    return format.substr(format.find('=') + 1);
  }

  const HostTables& t = Tables();
  std::map<uint32_t, LayoutRecord> records_;  // by offset
  uint32_t layoutEnd_ = 0;
};

TEST_F(DescriptorTablesTest, Counts) {
  std::set<std::string> names, lists;
  std::set<uint32_t> formats;
  for (size_t i = 0; i < t.rowCount; ++i) {
    names.insert(t.rows[i].name);
    formats.insert(t.rows[i].formatIndex);
    if (t.rows[i].valueCount > 0) lists.insert(t.ValueListText(t.rows[i]));
  }
  size_t catchAll = 0;
  for (size_t i = 0; i < t.valueRowCount; ++i) catchAll += t.values[i].valueKind == kCatchAll;
  const struct {
    const char* what;
    size_t got, expected;
  } counts[] = {
      {"dictionary rows", t.rowCount, 1264},
      {"distinct names, display ids", names.size(), 587},
      {"distinct value lists", lists.size(), 104},
      {"value rows", t.valueRowCount, 1200},
      {"catch-all value rows", catchAll, 3},
      {"strings, the end mark included", t.stringCount, 1183},
      {"distinct formats", formats.size(), 600},
      {"layout records", records_.size(), 28},
      {"layout bytes", layoutEnd_ + 4, 1036},
  };
  for (const auto& c : counts) EXPECT_EQ(c.got, c.expected) << c.what;
}

TEST_F(DescriptorTablesTest, Distributions) {
  const auto number = [](const std::string& text) { return Number(text); };
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.flags; }),
            ByKey<uint32_t>("flags", number));
  auto withList = Tally<uint32_t>([](const HostRow& r) { return r.valueCount ? r.flags : 0; });
  withList.erase(0);
  EXPECT_EQ(withList, ByKey<uint32_t>("flags", number, 3)) << "rows with a value list";
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.widthCode; }),
            ByKey<uint32_t>("width", number));
  EXPECT_EQ(Tally<size_t>([&](const HostRow& r) {
              const std::string format = t.Format(r);
              return std::min(format.find_first_not_of(' '), format.size());
            }),
            ByKey<size_t>("indent", number));
  EXPECT_EQ(Tally<std::string>([&](const HostRow& r) { return ValuePart(t.Format(r)); }),
            ByKey<std::string>("part", [](const std::string& part) { return part; }));
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.layoutOffset; }),
            ByKey<uint32_t>("layout", number, 3));
}

TEST_F(DescriptorTablesTest, RowsAtTheirPlaces) {
  for (const Fact& e : FactsOf("row")) {
    SCOPED_TRACE("row " + e[1]);
    ASSERT_EQ(e.size(), 12u);
    ASSERT_LT(Number(e[1]), t.rowCount);
    const HostRow& row = t.rows[Number(e[1])];
    const uint32_t got[] = {row.flags,      row.fieldId,   row.keyIndex,    row.valueCount,
                            row.firstValue, row.widthCode, row.formatIndex, row.layoutOffset};
    const size_t at[] = {2, 3, 4, 6, 7, 8, 9, 11};
    for (size_t i = 0; i < std::size(at); ++i)
      EXPECT_EQ(got[i], Number(e[at[i]])) << "field " << at[i];
    EXPECT_EQ(row.name, e[5]);
    EXPECT_EQ(t.Format(row), e[10]);
  }
  const std::vector<uint32_t> leading = Numbers("lead");
  for (size_t i = 0; i < leading.size(); ++i) {
    EXPECT_EQ(t.rows[i].fieldId, leading[i]) << "row " << i;
  }
}

TEST_F(DescriptorTablesTest, NamesInTheOrderOfTheirFirstRowWithTheirIds) {
  std::vector<std::string> order;
  std::map<std::string, std::vector<uint32_t>> ids;
  for (size_t i = 0; i < t.rowCount; ++i) {
    std::vector<uint32_t>& of = ids[t.rows[i].name];
    if (of.empty()) order.push_back(t.rows[i].name);
    of.push_back(t.rows[i].fieldId);
  }
  std::vector<std::string> got;
  for (const std::string& name : order) {
    const std::vector<uint32_t>& of = ids[name];
    std::string entry = "`" + name + "`";
    for (size_t i = 0; i < of.size() && (of.size() <= 4 || i == 0); ++i) {
      entry += " " + std::to_string(of[i]);
    }
    if (of.size() > 4) entry += " +" + std::to_string(of.size() - 1);
    got.push_back(entry);
  }
  std::ifstream file(RNSAP_DICTIONARY_NAMES);
  ASSERT_TRUE(file) << RNSAP_DICTIONARY_NAMES;
  std::string names, line;
  while (std::getline(file, line))
    if (!line.starts_with('#')) names += line + ' ';
  std::vector<std::string> expected;
  std::istringstream entries(names);
  for (std::string entry; std::getline(entries >> std::ws, entry, ';');) expected.push_back(entry);
  EXPECT_EQ(got, expected);
}

TEST_F(DescriptorTablesTest, ColumnsThatHoldInEveryRow) {
  std::set<uint32_t> ids;
  std::vector<uint32_t> keys;  // key indices run in row order
  for (size_t i = 0; i < t.rowCount; ++i) {
    const HostRow& row = t.rows[i];
    SCOPED_TRACE("row " + std::to_string(i) + ": " + RowName(row));
    EXPECT_TRUE(ids.insert(row.fieldId).second) << "a second row of the field";
    if (row.keyIndex != 0) keys.push_back(row.fieldId);
    EXPECT_EQ(row.keyIndex, row.keyIndex != 0 ? keys.size() : 0u);
    // Kind, key flag and the octets that the value needs.
    const uint32_t bits = row.widthCode & 0xffff;
    const uint32_t sizeClass = row.widthCode == kAllOnes || bits > 24 ? 4
                               : bits > 16                            ? 3
                               : bits > 8                             ? 2
                                                                      : 1;
    EXPECT_EQ(row.flags, 0x05000000u | (row.keyIndex != 0 ? 0x10000 : 0) | sizeClass);
    for (const uint32_t word : row.reservedA) EXPECT_EQ(word, kAllOnes);
    for (const uint32_t word : row.reservedB) EXPECT_EQ(word, kAllOnes);
    // One pool of names in row order, each name followed by its second copy.
    EXPECT_EQ(row.altName, row.name + std::strlen(row.name) + 1);
    if (i + 1 < t.rowCount) {
      EXPECT_EQ(t.rows[i + 1].name, row.altName + std::strlen(row.altName) + 1);
    }
    EXPECT_STREQ(row.altName, row.fieldId == 3226 ? "Private IE ID SIZE" : row.name);
  }
  EXPECT_EQ(*ids.begin(), 682u);
  EXPECT_EQ(*ids.rbegin(), 3801u);
  size_t gaps = 0;
  for (auto it = ids.begin(); std::next(it) != ids.end(); ++it) gaps += *std::next(it) > *it + 1;
  EXPECT_EQ(gaps, 1024u) << "runs of unused ids";
  EXPECT_EQ(keys, Numbers("key"));
}

TEST_F(DescriptorTablesTest, EndRowAndTheWordBehindIt) {
  const HostEndRow& end = t.endRow();
  const Fact& expected = FactsOf("end-row").at(0);
  std::vector<uint32_t> words(std::begin(end.head), std::end(end.head));
  words.insert(words.end(), std::begin(end.tail), std::end(end.tail));
  EXPECT_EQ(words, Ids(expected, 1));
  ASSERT_NE(end.lastField, nullptr);
  EXPECT_EQ(end.lastField, expected.at(2));
#if UINTPTR_MAX == 0xffffffffu
  // Word for word, as a 32-bit reader strides through the image.
  const auto* endWords = reinterpret_cast<const uint32_t*>(&t.rows[0]) + 19 * t.rowCount;
  EXPECT_EQ(endWords[2], static_cast<uint32_t>(reinterpret_cast<uintptr_t>(end.lastField)));
#endif
}

TEST_F(DescriptorTablesTest, EveryFormatIsIndentationNameAndTheValuePartOfItsField) {
  std::map<uint32_t, std::string> parts;  // by field id
  for (const Fact& c : FactsOf("part")) {
    for (const uint32_t id : Ids(c, 3)) parts[id] = c[1];
  }
  for (size_t i = 0; i < t.rowCount; ++i) {
    const HostRow& row = t.rows[i];
    const std::string format = t.Format(row);
    SCOPED_TRACE(RowName(row) + " format \"" + format + "\"");
    const auto listed = parts.find(row.fieldId);
    const std::string part = listed != parts.end() ? listed->second
                             : row.valueCount > 0  ? "%-S"
                                                   : "%u";
    if (format.empty()) {
      EXPECT_EQ(part, "");
      continue;
    }
    const auto label = FormatLabel(format);
    ASSERT_TRUE(label.has_value());
    EXPECT_EQ(label->first.substr(label->second), row.name);
    EXPECT_EQ(ValuePart(format), part);
  }
}

TEST_F(DescriptorTablesTest, StringsAreDistinctInOrderOfFirstUseAndEndWithTheMark) {
  std::set<std::string> distinct;
  for (size_t i = 0; i < t.stringCount; ++i) {
    ASSERT_NE(t.strings[i], nullptr) << "string " << i;
    EXPECT_TRUE(distinct.insert(t.strings[i]).second) << "string " << i << " twice";
  }
  EXPECT_STREQ(t.strings[t.stringCount - 1], kFinalString);
  // Row by row: the format, then the texts of the row's value list.
  uint32_t next = 0;
  auto use = [&](uint32_t index, const std::string& what) {
    if (index > next) ADD_FAILURE() << what << " brings string " << index << " out of order";
    next = std::max(next, index + 1);
  };
  for (size_t i = 0; i < t.rowCount; ++i) {
    const HostRow& row = t.rows[i];
    use(row.formatIndex, "the format of " + RowName(row));
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      use(t.values[row.firstValue + v].stringIndex, "a value of " + RowName(row));
    }
  }
  EXPECT_EQ(next, t.stringCount - 1) << "strings that no row uses";
}

TEST_F(DescriptorTablesTest, ValueListsTileTheTableInRowOrderAndThePoolFollows) {
  uint32_t next = 0;
  for (size_t i = 0; i < t.rowCount; ++i) {
    const HostRow& row = t.rows[i];
    SCOPED_TRACE(RowName(row));
    if (row.valueCount == 0) {
      EXPECT_EQ(row.firstValue, kAllOnes);
      continue;
    }
    EXPECT_EQ(row.firstValue, next);
    next = row.firstValue + row.valueCount;
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      const HostValueRow& value = t.values[row.firstValue + v];
      if (value.valueKind == kCatchAll) {
        EXPECT_EQ(v, 0u) << "a catch-all row stands first";
        EXPECT_EQ(value.poolIndex, kCatchAllPoolIndex);
      } else {
        EXPECT_EQ(value.valueKind, kNamedValue) << "value " << v;
        EXPECT_NE(value.poolIndex, kCatchAllPoolIndex + 1) << "value " << v;
      }
    }
  }
  EXPECT_EQ(t.valueRowCount, next) << "the all-zero row follows the last list";

  // The pool holds the named numbers in order of first use: walking the value
  // rows, each new pool index is the next one; the first catch-all row brings
  // the pair.
  std::vector<uint32_t> pool;
  for (size_t i = 0; i < t.poolWords; ++i) pool.push_back(t.pool[i]);
  EXPECT_EQ(pool, Numbers("pool"));
  next = 0;
  for (size_t i = 0; i < t.valueRowCount; ++i) {
    const uint32_t index = t.values[i].poolIndex;
    if (index > next) ADD_FAILURE() << "value row " << i << " brings pool word " << index;
    next = std::max(next, index + (index == kCatchAllPoolIndex ? 2 : 1));
  }
}

TEST_F(DescriptorTablesTest, ValueLists) {
  for (const Fact& c : FactsOf("list")) {
    for (const uint32_t id : Ids(c, 1)) {
      const HostRow* row = t.FindField(id);
      ASSERT_NE(row, nullptr) << "field " << id;
      EXPECT_EQ(t.ValueListText(*row), c[2]) << RowName(*row);
    }
  }
  for (const Fact& c : FactsOf("name-list")) {
    size_t rows = 0;
    for (size_t i = 0; i < t.rowCount; ++i) {
      const HostRow& row = t.rows[i];
      if (row.name != c[1] || row.valueCount == 0) continue;
      ++rows;
      EXPECT_EQ(t.ValueListText(row), c[3]) << RowName(row);
    }
    EXPECT_EQ(rows, Number(c[2])) << c[1];
  }
}

TEST_F(DescriptorTablesTest, LayoutRecords) {
  for (const Fact& e : FactsOf("layout")) {
    SCOPED_TRACE("record at " + e[1]);
    EXPECT_EQ(records_[Number(e[1])].text, e[2]);
    for (const uint32_t id : Ids(e, 4)) {
      const HostRow* row = t.FindField(id);
      ASSERT_NE(row, nullptr) << "field " << id;
      EXPECT_EQ(row->layoutOffset, Number(e[1])) << RowName(*row);
    }
  }
  // The empty end record and two zero bytes.
  const uint32_t end = Numbers("layout-end").at(0);
  for (uint32_t i = end; i < end + 4; ++i) EXPECT_EQ(t.layout[i], 0) << "byte " << i;
}

TEST_F(DescriptorTablesTest, EachRowsRecordGivesItsWidthAndTheBitsItsReadConsumes) {
  const auto consumedBits = ByKey<uint32_t>(
      "consumed", [](const std::string& id) { return Number(id); }, 2, true);
  for (size_t i = 0; i < t.rowCount; ++i) {
    const HostRow& row = t.rows[i];
    SCOPED_TRACE(RowName(row));
    ASSERT_TRUE(records_.count(row.layoutOffset)) << "no record starts at " << row.layoutOffset;
    const LayoutRecord& r = records_.at(row.layoutOffset);
    if (row.fieldId == 682) {
      EXPECT_EQ(r.itemBits, 0u) << "the alignment padding has no layout";
    } else if (row.widthCode == kAllOnes) {
      EXPECT_TRUE(r.countIsParameter) << r.text;
    } else {
      const uint32_t width = row.widthCode & 0xffff;
      EXPECT_EQ(r.itemBits * r.count, width) << r.text;
      const auto consumed = consumedBits.find(row.fieldId);
      EXPECT_EQ(r.size * r.count, consumed != consumedBits.end() ? consumed->second : width)
          << r.text;
    }
  }
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
  ASSERT_TRUE(t.complete);
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
