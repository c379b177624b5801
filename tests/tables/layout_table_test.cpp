// The layout table (table 9): its records, walked from the first byte to the
// empty end record, and how each dictionary row's record describes its bits.
#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

// A count, size or base token: a number, or a run-time parameter.
struct Token {
  bool parameter = false;
  uint32_t value = 0;  // the number, or the parameter's index
  bool operator==(const Token&) const = default;
};
Token Number(uint32_t n) { return {false, n}; }
Token Param(uint32_t i) { return {true, i}; }

// Bits `first` to `last` of an element, `first` the least significant.
struct Item {
  uint32_t first = 0;
  uint32_t last = 0;
  bool range = false;  // written as a range, not as a single bit
  bool operator==(const Item&) const = default;
  uint32_t bits() const { return (first > last ? first - last : last - first) + 1; }
};
Item Bits(uint32_t first, uint32_t last) { return {first, last, first != last}; }

void PrintTo(const Token& t, std::ostream* os) {
  *os << (t.parameter ? "parameter " : "") << t.value;
}
void PrintTo(const Item& i, std::ostream* os) {
  *os << i.first;
  if (i.range) *os << " to " << i.last;
}

struct Record {
  uint32_t offset = 0;
  uint32_t length = 0;
  bool noLayout = false;  // the body FF 00 00
  std::vector<Item> items;
  Token count, size, base;
};

class Reader {
 public:
  Reader(const uint8_t* bytes, size_t end) : bytes_(bytes), end_(end) {}
  bool ok() const { return ok_; }
  size_t at() const { return at_; }
  uint8_t Byte() {
    if (at_ >= end_) {
      ok_ = false;
      return 0;
    }
    return bytes_[at_++];
  }
  uint32_t Number() {
    if (Byte() != 0x10) ok_ = false;
    uint32_t n = 0;
    for (int i = 0; i < 4; ++i) n = n << 8 | Byte();
    return n;
  }
  Token CountToken() {
    if (at_ < end_ && bytes_[at_] == 0x08) {
      Byte();
      const uint8_t index = Byte();
      if (Byte() != 0x00) ok_ = false;
      return Param(index);
    }
    return ::rnsap::testing::Number(Number());
  }
  Item BitItem() {
    if (at_ < end_ && bytes_[at_] == 0x05) {
      Byte();
      const uint32_t first = Number();
      return {first, Number(), true};
    }
    const uint32_t bit = Number();
    return {bit, bit, false};
  }

 private:
  const uint8_t* bytes_;
  size_t end_;
  size_t at_ = 0;
  bool ok_ = true;
};

// Decodes the body of the record at `offset`; nullopt if it breaks the form.
std::optional<Record> Decode(const uint8_t* layout, uint32_t offset) {
  Record r;
  r.offset = offset;
  r.length = layout[offset] | layout[offset + 1] << 8;
  const uint8_t* body = layout + offset + 2;
  if (r.length == 3 && body[0] == 0xFF && body[1] == 0x00 && body[2] == 0x00) {
    r.noLayout = true;
    return r;
  }
  Reader in(body, r.length);
  const uint8_t head[] = {0xFF, 0x02, 0x55, 0x01, 0x04};
  for (const uint8_t b : head) {
    if (in.Byte() != b) return std::nullopt;
  }
  const uint8_t items = in.Byte();
  for (uint8_t i = 0; i < items; ++i) r.items.push_back(in.BitItem());
  r.count = in.CountToken();
  r.size = Number(in.Number());
  r.base = in.CountToken();
  if (!in.ok() || in.at() != r.length || !r.base.parameter) return std::nullopt;
  return r;
}

class LayoutTableTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(t.complete());
    const uint8_t* layout = t.layout();
    uint32_t offset = 0;
    while (true) {
      ASSERT_LE(offset + 2, kMaxLayoutBytes) << "no end record";
      const uint32_t length = layout[offset] | layout[offset + 1] << 8;
      if (length == 0) break;
      ASSERT_LE(offset + 2 + length, kMaxLayoutBytes);
      const std::optional<Record> record = Decode(layout, offset);
      ASSERT_TRUE(record.has_value()) << "malformed record at " << offset;
      records_[offset] = *record;
      offset += 2 + length;
    }
    end_ = offset;
  }

  const Record& RecordOf(uint32_t fieldId) {
    const HostRow* row = t.FindField(fieldId);
    EXPECT_NE(row, nullptr) << "field " << fieldId;
    static const Record none;
    if (row == nullptr || !records_.count(row->layoutOffset)) return none;
    return records_.at(row->layoutOffset);
  }
  std::vector<uint8_t> Bytes(uint32_t offset) const {
    const uint32_t length = t.layout()[offset] | t.layout()[offset + 1] << 8;
    return {t.layout() + offset, t.layout() + offset + 2 + length};
  }

  const HostTables& t = Tables();
  std::map<uint32_t, Record> records_;
  uint32_t end_ = 0;
};

TEST_F(LayoutTableTest, RecordsRunToTheEmptyEndRecord) {
  EXPECT_FALSE(records_.empty());
  EXPECT_EQ(records_.begin()->first, 0u);
  // The end record and the two zero bytes behind it.
  for (uint32_t i = 0; i < 4; ++i) EXPECT_EQ(t.layout()[end_ + i], 0) << "byte " << end_ + i;
}

TEST_F(LayoutTableTest, EveryRecordIsDistinctAndServesARow) {
  std::set<uint32_t> used;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    EXPECT_TRUE(records_.count(row.layoutOffset))
        << RowName(row) << " points at " << row.layoutOffset << ", no record start";
    used.insert(row.layoutOffset);
  }
  std::map<std::vector<uint8_t>, uint32_t> seen;
  for (const auto& [offset, record] : records_) {
    EXPECT_TRUE(used.count(offset)) << "no row uses the record at " << offset;
    const auto [it, inserted] = seen.emplace(Bytes(offset), offset);
    EXPECT_TRUE(inserted) << "records at " << it->second << " and " << offset << " are equal";
  }
}

TEST_F(LayoutTableTest, LeadingRecordsByteForByte) {
  EXPECT_EQ(Bytes(0), (std::vector<uint8_t>{0x18, 0x00, 0xFF, 0x02, 0x55, 0x01, 0x04, 0x01, 0x10,
                                            0x00, 0x00, 0x00, 0x01, 0x10, 0x00, 0x00, 0x00, 0x01,
                                            0x10, 0x00, 0x00, 0x00, 0x01, 0x08, 0x00, 0x00}));
  EXPECT_EQ(Bytes(26),
            (std::vector<uint8_t>{0x1E, 0x00, 0xFF, 0x02, 0x55, 0x01, 0x04, 0x01, 0x05, 0x10, 0x00,
                                  0x00, 0x00, 0x02, 0x10, 0x00, 0x00, 0x00, 0x01, 0x10, 0x00, 0x00,
                                  0x00, 0x01, 0x10, 0x00, 0x00, 0x00, 0x02, 0x08, 0x00, 0x00}));
  EXPECT_EQ(Bytes(58), (std::vector<uint8_t>{0x03, 0x00, 0xFF, 0x00, 0x00}));
  EXPECT_EQ(RecordOf(682).offset, 58u);
}

TEST_F(LayoutTableTest, RecordsInFrontOfTheTransportAddressRecord) {
  // These records come first in row order and keep their offsets.
  struct Expected {
    uint32_t offset, length;
    std::vector<Item> items;
    Token count;
    uint32_t size;
    Token base;
  };
  const Expected expected[] = {
      {0, 24, {Bits(1, 1)}, Number(1), 1, Param(0)},
      {26, 30, {Bits(2, 1)}, Number(1), 2, Param(0)},
      {63, 30, {Bits(8, 1)}, Number(1), 8, Param(0)},
      {95, 30, {Bits(7, 1)}, Number(1), 7, Param(0)},
      {127, 30, {Bits(16, 1)}, Number(1), 16, Param(0)},
      {159, 30, {Bits(14, 1)}, Number(1), 14, Param(0)},
      {191, 24, {Bits(1, 1)}, Number(1), 0, Param(0)},
      {217, 24, {Bits(9, 9)}, Number(1), 0, Param(0)},
      {243, 24, {Bits(17, 17)}, Number(1), 0, Param(0)},
      {269, 52, {Bits(24, 18), Bits(16, 10), Bits(8, 2)}, Number(1), 24, Param(0)},
      {323, 41, {Bits(16, 10), Bits(8, 2)}, Number(1), 16, Param(0)},
      {366, 30, {Bits(8, 2)}, Number(1), 8, Param(0)},
      {398, 30, {Bits(6, 1)}, Number(1), 6, Param(0)},
      {430, 28, {Bits(8, 1)}, Param(0), 8, Param(1)},
      {460, 30, {Bits(4, 1)}, Number(1), 4, Param(0)},
      {492, 22, {Bits(1, 1)}, Param(0), 1, Param(1)},
      {516, 30, {Bits(8, 1)}, Number(3), 8, Param(0)},
      {548, 28, {Bits(1, 8)}, Param(0), 8, Param(1)},
      {578, 24, {Bits(1, 1)}, Number(8), 1, Param(0)},
      {604, 30, {Bits(4, 1)}, Number(4), 4, Param(0)},
      {636, 30, {Bits(5, 1)}, Number(1), 5, Param(0)},
      {668, 30, {Bits(3, 1)}, Number(1), 3, Param(0)},
      {700, 28, {Bits(4, 1)}, Param(0), 4, Param(1)},
  };
  for (const Expected& e : expected) {
    SCOPED_TRACE("record at " + std::to_string(e.offset));
    ASSERT_TRUE(records_.count(e.offset));
    const Record& r = records_.at(e.offset);
    EXPECT_EQ(r.length, e.length);
    EXPECT_EQ(r.items, e.items);
    EXPECT_EQ(r.count, e.count);
    EXPECT_EQ(r.size, Number(e.size));
    EXPECT_EQ(r.base, e.base);
  }
  // Which fields the special ones describe.
  EXPECT_EQ(RecordOf(3231).offset, 191u);
  EXPECT_EQ(RecordOf(3234).offset, 217u);
  EXPECT_EQ(RecordOf(3239).offset, 243u);
  EXPECT_EQ(RecordOf(3251).offset, 191u);
  EXPECT_EQ(RecordOf(3254).offset, 217u);
  EXPECT_EQ(RecordOf(3259).offset, 243u);
  EXPECT_EQ(RecordOf(3244).offset, 269u);
  EXPECT_EQ(RecordOf(3264).offset, 269u);
  EXPECT_EQ(RecordOf(3248).offset, 323u);
  EXPECT_EQ(RecordOf(3268).offset, 323u);
  EXPECT_EQ(RecordOf(3250).offset, 366u);
  EXPECT_EQ(RecordOf(3270).offset, 366u);
  EXPECT_EQ(RecordOf(2868).offset, 516u);
  EXPECT_EQ(RecordOf(3012).offset, 516u);
  EXPECT_EQ(RecordOf(2934).offset, 548u);
  EXPECT_EQ(RecordOf(3085).offset, 578u);
  EXPECT_EQ(RecordOf(2945).offset, 604u);
  EXPECT_EQ(RecordOf(3060).offset, 604u);
}

TEST_F(LayoutTableTest, RecordsOfTheImsiAndItsFiller) {
  const Record& filler = RecordOf(2920);
  EXPECT_EQ(filler.length, 30u);
  EXPECT_EQ(filler.items, (std::vector<Item>{Bits(60, 57)}));
  EXPECT_EQ(filler.count, Number(1));
  EXPECT_EQ(filler.size, Number(0));
  EXPECT_EQ(filler.base, Param(0));

  // Fifteen digits in eight octets, each octet's second digit first.
  const Record& digits = RecordOf(2923);
  EXPECT_EQ(digits.length, 184u);
  std::vector<Item> items;
  for (uint32_t octet = 0; octet < 8; ++octet) {
    items.push_back(Bits(8 * octet + 8, 8 * octet + 5));
    items.push_back(Bits(8 * octet + 4, 8 * octet + 1));
  }
  items.pop_back();
  EXPECT_EQ(digits.items, items);
  EXPECT_EQ(digits.count, Number(1));
  EXPECT_EQ(digits.size, Number(64));
  EXPECT_EQ(digits.base, Param(0));

  const Record& octets = RecordOf(2925);
  EXPECT_EQ(octets.length, 41u);
  EXPECT_EQ(octets.items, (std::vector<Item>{Bits(8, 5), Bits(4, 1)}));
  EXPECT_EQ(octets.count, Number(8));
  EXPECT_EQ(octets.size, Number(8));
  EXPECT_EQ(octets.base, Param(0));

  const Record& variable = RecordOf(2918);
  EXPECT_EQ(variable.count, Param(0));
  EXPECT_EQ(variable.base, Param(1));
}

TEST_F(LayoutTableTest, TransportAddressDigitsTakeBothHalvesOfEachOctet) {
  // The numbered transport layer addresses and field 3801; those that the
  // description holds so far.
  for (uint32_t id : {3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801}) {
    if (t.FindField(id) == nullptr) continue;
    const Record& r = RecordOf(id);
    EXPECT_EQ(r.length, 39u) << "field " << id;
    EXPECT_EQ(r.items, (std::vector<Item>{Bits(4, 1), Bits(8, 5)})) << "field " << id;
    EXPECT_EQ(r.count, Param(0)) << "field " << id;
    EXPECT_EQ(r.size, Number(8)) << "field " << id;
    EXPECT_EQ(r.base, Param(1)) << "field " << id;
  }
}

TEST_F(LayoutTableTest, ValueBitsAndConsumedBitsAgreeWithTheWidth) {
  // Reads that consume other than their value bits: bits between the value
  // runs, or a look at bits that a later read takes.
  const std::map<uint32_t, uint32_t> consumedBy{
      {3244, 24}, {3264, 24}, {3248, 16}, {3268, 16}, {3250, 8}, {3270, 8}, {2923, 64},
      {3231, 0},  {3234, 0},  {3239, 0},  {3251, 0},  {3254, 0}, {3259, 0}, {2920, 0}};
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    SCOPED_TRACE(RowName(row));
    ASSERT_TRUE(records_.count(row.layoutOffset));
    const Record& r = records_.at(row.layoutOffset);
    if (row.fieldId == 682) {
      EXPECT_TRUE(r.noLayout);
      continue;
    }
    ASSERT_FALSE(r.noLayout);
    ASSERT_FALSE(r.items.empty());
    if (row.widthCode == kAllOnes) {
      EXPECT_EQ(r.count, Param(0));
      EXPECT_EQ(r.base, Param(1));
      continue;
    }
    ASSERT_FALSE(r.count.parameter);
    EXPECT_EQ(r.base, Param(0));
    uint32_t itemBits = 0;
    for (const Item& item : r.items) itemBits += item.bits();
    const uint32_t width = row.widthCode & 0xffff;
    EXPECT_EQ(itemBits * r.count.value, width);
    const auto it = consumedBy.find(row.fieldId);
    EXPECT_EQ(r.count.value * r.size.value, it != consumedBy.end() ? it->second : width);
  }
}

TEST_F(LayoutTableTest, OnlyTheMirroredAddressHasARisingRange) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (!records_.count(row.layoutOffset)) continue;
    for (const Item& item : records_.at(row.layoutOffset).items) {
      if (item.range && item.first < item.last) {
        EXPECT_EQ(row.fieldId, 2934u) << "rising range " << item.first << " to " << item.last;
      }
    }
  }
}

}  // namespace
}  // namespace rnsap::testing
