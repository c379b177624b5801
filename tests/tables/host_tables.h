// The descriptor tables as a host reads them: fetched through vex_DLLGetTable,
// walked to their end marks, pointers followed. The row layouts are declared
// here on their own, from the binary contract, and not taken from the
// module's headers, so that a slip there shows up as a failing read.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>
#include <string>
#include <utility>

#include "boundary/module_api.h"

namespace rnsap::testing {

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

// The row that ends the dictionary; its third word is a pointer.
struct HostEndRow {
  uint32_t mark;
  uint32_t lastId;
  const char* lastField;
  uint32_t words3To7[5];
  uint32_t zero[11];
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
static_assert(sizeof(HostEndRow) == 76);
static_assert(offsetof(HostEndRow, lastField) == 8);
#endif
static_assert(sizeof(HostValueRow) == 12);

inline constexpr uint32_t kAllOnes = 0xffffffff;
inline constexpr uint32_t kNamedValue = 1;
inline constexpr uint32_t kCatchAll = 0x00010000;
inline constexpr uint32_t kCatchAllPoolIndex = 29;
inline constexpr const char* kLastFieldMark = "$_$LAST_FIELD$_$";
inline constexpr const char* kFinalString = "$$_FINAL_STRING_$$";

// Bounds of the walks, far beyond the complete tables, so that a missing end
// mark ends in a failure and not in a run through memory.
inline constexpr size_t kMaxEntries = 4000;
inline constexpr size_t kMaxLayoutBytes = 4096;

class HostTables {
 public:
  HostTables() {
    rows_ = static_cast<const HostRow*>(Table(4));
    values_ = static_cast<const HostValueRow*>(Table(6));
    pool_ = static_cast<const uint32_t*>(Table(7));
    strings_ = static_cast<const char* const*>(Table(8));
    layout_ = static_cast<const uint8_t*>(Table(9));
    if (!rows_ || !values_ || !pool_ || !strings_ || !layout_) return;
    while (rowCount_ < kMaxEntries && rows_[rowCount_].flags != kAllOnes) ++rowCount_;
    for (; valueRowCount_ < kMaxEntries; ++valueRowCount_) {
      const HostValueRow& v = values_[valueRowCount_];
      if (v.valueKind == 0 && v.poolIndex == 0 && v.stringIndex == 0) break;
      maxPoolIndex_ = std::max<size_t>(maxPoolIndex_, v.poolIndex);
    }
    while (stringCount_ < kMaxEntries) {
      const char* s = strings_[stringCount_++];
      if (s == nullptr || std::strcmp(s, kFinalString) == 0) break;
    }
    complete_ = std::max({rowCount_, valueRowCount_, stringCount_}) < kMaxEntries;
  }

  // False when a table is missing or one of the walks found no end mark.
  bool complete() const { return complete_; }

  size_t rowCount() const { return rowCount_; }
  const HostRow& row(size_t i) const { return rows_[i]; }
  const HostEndRow& endRow() const {
    return *reinterpret_cast<const HostEndRow*>(&rows_[rowCount_]);
  }
  // The word behind the end row.
  uint32_t wordAfterEndRow() const {
    uint32_t word;
    std::memcpy(&word, reinterpret_cast<const uint8_t*>(&endRow()) + sizeof(HostEndRow), 4);
    return word;
  }
  const HostRow* FindField(uint32_t fieldId) const {
    for (size_t i = 0; i < rowCount_; ++i) {
      if (rows_[i].fieldId == fieldId) return &rows_[i];
    }
    return nullptr;
  }
  // The display id of a row: the field id of the first row of the same name.
  uint32_t DisplayId(const HostRow& row) const {
    for (size_t i = 0; i < rowCount_; ++i) {
      if (std::strcmp(rows_[i].name, row.name) == 0) return rows_[i].fieldId;
    }
    return 0;
  }

  // Value rows before the all-zero terminator row.
  size_t valueRowCount() const { return valueRowCount_; }
  const HostValueRow& valueRow(size_t i) const { return values_[i]; }

  // Pool words up to the one behind the highest index that a value row names:
  // that is where the pool's closing 0 stands.
  size_t readablePoolWords() const { return maxPoolIndex_ + 2; }
  uint32_t pool(size_t i) const { return pool_[i]; }

  // Strings up to and including the end mark.
  size_t stringCount() const { return stringCount_; }
  const char* string(size_t i) const { return strings_[i]; }
  std::string StringAt(uint32_t index) const {
    return index < stringCount_ ? strings_[index] : "<no such string>";
  }
  std::string Format(const HostRow& row) const { return StringAt(row.formatIndex); }

  // The row's value list as `0 "text", 1 "text"`, a catch-all row as `other "text"`.
  std::string ValueListText(const HostRow& row) const {
    std::string text;
    for (uint32_t i = 0; i < row.valueCount; ++i) {
      const HostValueRow& v = values_[row.firstValue + i];
      if (i > 0) text += ", ";
      text += v.valueKind == kNamedValue ? std::to_string(pool_[v.poolIndex]) : "other";
      text += " \"" + StringAt(v.stringIndex) + '"';
    }
    return text;
  }

  const uint8_t* layout() const { return layout_; }

 private:
  static const void* Table(int32_t index) {
    const void* out = nullptr;
    EXPECT_EQ(vex_DLLGetTable(index, &out), 0u) << "table " << index;
    EXPECT_NE(out, nullptr) << "table " << index;
    return out;
  }

  const HostRow* rows_ = nullptr;
  const HostValueRow* values_ = nullptr;
  const uint32_t* pool_ = nullptr;
  const char* const* strings_ = nullptr;
  const uint8_t* layout_ = nullptr;
  size_t rowCount_ = 0;
  size_t valueRowCount_ = 0;
  size_t stringCount_ = 0;
  size_t maxPoolIndex_ = 0;
  bool complete_ = false;
};

inline const HostTables& Tables() {
  static const HostTables tables;
  return tables;
}

// The text of a format in front of its '=', and the number of blanks it
// starts with; nullopt for a format without '='.
inline std::optional<std::pair<std::string, size_t>> FormatLabel(const std::string& format) {
  const size_t eq = format.find('=');
  if (eq == std::string::npos) return std::nullopt;
  std::string label = format.substr(0, eq);
  const size_t blanks = label.find_first_not_of(' ');
  return std::make_pair(label, blanks == std::string::npos ? label.size() : blanks);
}

// How failure messages name a row.
inline std::string RowName(const HostRow& row) {
  return std::to_string(row.fieldId) + " \"" + row.name + "\"";
}

}  // namespace rnsap::testing
