// The field dictionary (table 4) as a host walks it: row shape, the end row,
// the columns every row shares, and the rows whose place and content the
// description fixes.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <set>
#include <string>

#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

// The key fields in key-index order.
constexpr uint32_t kKeyFieldOrder[] = {
    685,  688,  692,  696,  697,  698,  749,  751,  3274, 2689, 3073, 3077, 2934, 2606, 2945,
    3027, 2664, 2681, 2683, 2687, 2676, 2670, 2672, 3400, 3404, 3408, 3412, 3416, 3420, 3424,
    3428, 3432, 3436, 3440, 3444, 3448, 3452, 3456, 3460, 3462, 3054, 2799, 2750, 2754, 2758,
    2762, 2766, 2770, 2774, 2778, 2780, 2612, 2616, 2620, 2624, 2628, 2632, 2636, 2640, 2642,
    3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801, 2747, 2918, 2923, 2925,
    3056, 3060, 3466, 3470, 3474, 3478, 3482, 3486, 3490, 3494, 3498, 3502, 3506, 3510, 3514,
    3518, 3522, 3526, 3528, 3055, 3532, 3536, 3540, 3544, 3548, 3552, 3556, 3560, 3564, 3568,
    3572, 3576, 3580, 3584, 3588, 3592, 3594, 3664, 3668, 3672, 3676, 3680, 3684, 3688, 3692,
    3696, 3700, 3704, 3708, 3712, 3716, 3720, 3724, 3726, 3210, 3598, 3602, 3606, 3610, 3614,
    3618, 3622, 3626, 3630, 3634, 3638, 3642, 3646, 3650, 3654, 3658, 3660};
static_assert(std::size(kKeyFieldOrder) == 147);

// Rows up to this one (IE ID, 736) come before any branch of the IE dispatch
// and keep their place however much grammar is added behind them.
constexpr size_t kLastFixedRow = 162;

class FieldDictionaryTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(t.complete());
    ASSERT_GT(t.rowCount(), kLastFixedRow);
    ASSERT_LE(t.rowCount(), 1264u);
  }
  const HostTables& t = Tables();
};

TEST_F(FieldDictionaryTest, EndRowAndTheZeroWordBehindIt) {
  const HostEndRow& end = t.endRow();
  EXPECT_EQ(end.mark, kAllOnes);
  EXPECT_EQ(end.lastId, 0x0000ffffu);
  ASSERT_NE(end.lastField, nullptr);
  EXPECT_STREQ(end.lastField, kLastFieldMark);
  EXPECT_EQ(end.words3To7[0], 0u);
  EXPECT_EQ(end.words3To7[1], 0x0000ffffu);
  EXPECT_EQ(end.words3To7[2], 0x0000ffffu);
  EXPECT_EQ(end.words3To7[3], 0x0000ffffu);
  EXPECT_EQ(end.words3To7[4], kAllOnes);
  for (const uint32_t word : end.zero) EXPECT_EQ(word, 0u);
  EXPECT_EQ(t.wordAfterEndRow(), 0u);
#if UINTPTR_MAX == 0xffffffffu
  // Word for word, as a 32-bit reader strides through the image.
  const auto* words = reinterpret_cast<const uint32_t*>(t.rows());
  const uint32_t* endWords = words + 19 * t.rowCount();
  EXPECT_EQ(endWords[0], kAllOnes);
  EXPECT_EQ(endWords[2], static_cast<uint32_t>(reinterpret_cast<uintptr_t>(end.lastField)));
  EXPECT_EQ(endWords[19], 0u);
#endif
}

TEST_F(FieldDictionaryTest, FieldIdsAreUniqueAndInRange) {
  std::set<uint32_t> seen;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    EXPECT_GE(row.fieldId, 682u) << "row " << i;
    EXPECT_LE(row.fieldId, 3801u) << "row " << i;
    EXPECT_TRUE(seen.insert(row.fieldId).second) << "field " << row.fieldId << " twice";
  }
}

TEST_F(FieldDictionaryTest, FlagsHoldKindKeyFlagAndSizeClass) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    SCOPED_TRACE("row " + std::to_string(i) + ": " + RowName(row));
    EXPECT_EQ(row.flags >> 24, 0x05u);
    EXPECT_EQ((row.flags >> 16) & 0xff, row.keyIndex != 0 ? 1u : 0u);
    const uint32_t sizeClass = row.flags & 0xffff;
    if (row.widthCode == kAllOnes) {
      EXPECT_EQ(sizeClass, 4u);
      continue;
    }
    const uint32_t bits = row.widthCode & 0xffff;
    const uint32_t expected = bits <= 8 ? 1 : bits <= 16 ? 2 : bits <= 24 ? 3 : 4;
    EXPECT_EQ(sizeClass, expected);
    if (row.keyIndex != 0) {
      EXPECT_NE(sizeClass, 3u) << "a key field without a slot kind";
    }
  }
}

TEST_F(FieldDictionaryTest, WidthCodesNameOnlyTheWidthsTheProtocolHas) {
  const std::set<uint32_t> widths{1, 2, 3, 4, 5, 6, 7, 8, 14, 16, 21, 24, 60, 64};
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (row.widthCode == kAllOnes) continue;
    EXPECT_EQ(row.widthCode >> 16, 0xffffu) << RowName(row);
    EXPECT_TRUE(widths.count(row.widthCode & 0xffff))
        << RowName(row) << " is " << (row.widthCode & 0xffff) << " bits wide";
  }
}

TEST_F(FieldDictionaryTest, KeyIndicesCountTheKeyFieldsInRowOrder) {
  uint32_t keys = 0;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (row.keyIndex != 0) {
      EXPECT_EQ(row.keyIndex, ++keys) << RowName(row);
    }
  }
  // A row is a key row exactly when its field is a key field; their order
  // is that of the list only once the whole description is there.
  const std::set<uint32_t> known(std::begin(kKeyFieldOrder), std::end(kKeyFieldOrder));
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    EXPECT_EQ(row.keyIndex != 0, known.count(row.fieldId) == 1) << RowName(row);
  }
  // Up to IE ID every key field is already in place, under its final index.
  for (size_t i = 0; i <= kLastFixedRow; ++i) {
    const HostRow& row = t.row(i);
    const auto* at = std::find(std::begin(kKeyFieldOrder), std::end(kKeyFieldOrder), row.fieldId);
    const uint32_t expected =
        at == std::end(kKeyFieldOrder) ? 0 : static_cast<uint32_t>(at - kKeyFieldOrder + 1);
    EXPECT_EQ(row.keyIndex, expected) << RowName(row);
  }
}

TEST_F(FieldDictionaryTest, ReservedWordsAreAllOnes) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    for (const uint32_t word : row.reservedA) EXPECT_EQ(word, kAllOnes) << RowName(row);
    for (const uint32_t word : row.reservedB) EXPECT_EQ(word, kAllOnes) << RowName(row);
  }
}

TEST_F(FieldDictionaryTest, NamesLieInOnePoolEachFollowedByItsSecondCopy) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    ASSERT_NE(row.name, nullptr) << "row " << i;
    ASSERT_NE(row.altName, nullptr) << "row " << i;
    EXPECT_GT(std::strlen(row.name), 0u) << "row " << i;
    EXPECT_EQ(row.altName, row.name + std::strlen(row.name) + 1) << RowName(row);
    if (i + 1 < t.rowCount()) {
      EXPECT_EQ(t.row(i + 1).name, row.altName + std::strlen(row.altName) + 1) << RowName(row);
    }
    if (row.fieldId == 3226) {
      EXPECT_STREQ(row.name, "Private IE ID SIZE ");
      EXPECT_STREQ(row.altName, "Private IE ID SIZE");
    } else {
      EXPECT_STREQ(row.altName, row.name);
    }
  }
}

TEST_F(FieldDictionaryTest, RowsWhosePlaceIsFixed) {
  struct Telling {
    size_t row;
    uint32_t flags, fieldId, keyIndex;
    const char* name;
    uint32_t valueCount, firstValue, widthCode, formatIndex;
    const char* format;
    uint32_t layoutOffset;
  };
  const Telling telling[] = {
      {0, 0x05000001, 684, 0, "PDU EXTENSION", 0, kAllOnes, 0xffff0001, 0, "PDU EXTENSION=%x", 0},
      {1, 0x05010001, 685, 1, "PDU Type", 4, 0, 0xffff0002, 1, "PDU Type=%-S", 26},
      {2, 0x05000004, 682, 0, "Spare", 0, kAllOnes, kAllOnes, 6, "  Spare=%x", 58},
      {3, 0x05010001, 688, 2, "Procedure Code", 27, 4, 0xffff0008, 7, "Procedure Code=%-S", 63},
      {8, 0x05000001, 746, 0, "TransactionID TYPE", 2, 91, 0xffff0001, 43, "TransactionID TYPE=%-S",
       0},
      {30, 0x05000003, 3244, 0, "Nation", 0, kAllOnes, 0xffff0015, 68, "  Nation=%u", 269},
      {31, 0x05000002, 3248, 0, "Nation", 1, 97, 0xffff000e, 69, "    Nation=%-S (%u)", 323},
      {36, 0x05000003, 3264, 0, "Company", 1, 98, 0xffff0015, 72, "    Company=%-S (%u)", 269},
      {42, 0x05010001, 3274, 9, "IE", 9, 103, 0xffff0007, 82, "  IE=%-S", 95},
      {53, 0x05000002, 724, 0, "Extension ID", 39, 119, 0xffff0010, 103, "Extension ID=%-S", 127},
      {162, 0x05000002, 736, 0, "IE ID", 206, 232, 0xffff0010, 243, "IE ID=%-S", 127},
  };
  for (const Telling& e : telling) {
    SCOPED_TRACE("row " + std::to_string(e.row));
    const HostRow& row = t.row(e.row);
    EXPECT_EQ(row.flags, e.flags);
    EXPECT_EQ(row.fieldId, e.fieldId);
    EXPECT_EQ(row.keyIndex, e.keyIndex);
    EXPECT_STREQ(row.name, e.name);
    EXPECT_EQ(row.valueCount, e.valueCount);
    EXPECT_EQ(row.firstValue, e.firstValue);
    EXPECT_EQ(row.widthCode, e.widthCode);
    EXPECT_EQ(row.formatIndex, e.formatIndex);
    EXPECT_EQ(t.Format(row), e.format);
    EXPECT_EQ(row.layoutOffset, e.layoutOffset);
  }
  // The rows in front of the first IE branch, in order.
  const uint32_t leading[] = {684, 685, 682, 688, 692, 696, 697, 698, 746, 749, 751, 699};
  for (size_t i = 0; i < std::size(leading); ++i) EXPECT_EQ(t.row(i).fieldId, leading[i]);
}

TEST_F(FieldDictionaryTest, MessageExtensionCountIsTheLastRow) {
  const HostRow& last = t.row(t.rowCount() - 1);
  EXPECT_EQ(last.flags, 0x05000002u);
  EXPECT_EQ(last.fieldId, 720u);
  EXPECT_EQ(last.keyIndex, 0u);
  EXPECT_STREQ(last.name, "Number Of Extensions");
  EXPECT_EQ(last.valueCount, 0u);
  EXPECT_EQ(last.firstValue, kAllOnes);
  EXPECT_EQ(last.widthCode, 0xffff0010u);
  EXPECT_EQ(t.Format(last), "Number Of Extensions=%u");
  // Its format is used nowhere before, so it is the last string in use.
  EXPECT_EQ(last.formatIndex, t.stringCount() - 2);
  EXPECT_EQ(last.layoutOffset, 127u);
}

TEST_F(FieldDictionaryTest, ImsiRowsAndTheFillerBetweenThem) {
  const HostRow* imsi = t.FindField(2918);
  ASSERT_NE(imsi, nullptr);
  const size_t at = t.RowIndex(*imsi);
  ASSERT_LT(at + 3, t.rowCount());
  const HostRow& filler = t.row(at + 1);
  const HostRow& digits15 = t.row(at + 2);
  const HostRow& octets8 = t.row(at + 3);
  EXPECT_EQ(filler.fieldId, 2920u);
  EXPECT_EQ(digits15.fieldId, 2923u);
  EXPECT_EQ(octets8.fieldId, 2925u);

  EXPECT_EQ(imsi->flags, 0x05010004u);
  EXPECT_EQ(imsi->widthCode, kAllOnes);
  EXPECT_EQ(digits15.flags, 0x05010004u);
  EXPECT_EQ(digits15.widthCode, 0xffff003cu);
  EXPECT_EQ(octets8.flags, 0x05010004u);
  EXPECT_EQ(octets8.widthCode, 0xffff0040u);
  for (const HostRow* row : {imsi, &digits15, &octets8}) {
    EXPECT_STREQ(row->name, "IMSI");
    EXPECT_EQ(row->valueCount, 0u);
    EXPECT_EQ(row->firstValue, kAllOnes);
    EXPECT_EQ(row->formatIndex, imsi->formatIndex);
    EXPECT_EQ(t.Format(*row), "  IMSI=%-[\"%x\"]");
  }
  EXPECT_EQ(imsi->keyIndex + 1, digits15.keyIndex);
  EXPECT_EQ(digits15.keyIndex + 1, octets8.keyIndex);

  // The filler is a real row with an empty format.
  EXPECT_EQ(filler.flags, 0x05000001u);
  EXPECT_EQ(filler.keyIndex, 0u);
  EXPECT_STREQ(filler.name, "Filler");
  EXPECT_EQ(filler.widthCode, 0xffff0004u);
  EXPECT_EQ(filler.valueCount, 0u);
  EXPECT_EQ(t.Format(filler), "");
}

}  // namespace
}  // namespace rnsap::testing
