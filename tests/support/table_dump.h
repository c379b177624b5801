// The descriptor tables as a host reads them through vex_DLLGetTable, written
// out one entry a line: each table walked to its end mark, texts behind their
// pointers. The row layouts are declared here from the binary contract, not
// taken from the module's headers, so that a slip there shows up as a
// different dump.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

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

using DumpLines = std::vector<std::string>;

constexpr uint32_t kAllOnes = 0xffffffff;
constexpr const char* kFinalString = "$$_FINAL_STRING_$$";
// Bounds of the walks, far beyond the complete tables, so that a missing end
// mark shows as a dump that runs on and not as a run through memory.
constexpr size_t kMaxTableEntries = 4000;
constexpr size_t kMaxLayoutBytes = 4096;

// The entry of vex_DLLGetTable at `index`, null where it has none.
inline const void* HostTable(int32_t index) {
  const void* entry = nullptr;
  vex_DLLGetTable(index, &entry);
  return entry;
}

inline const HostRow* HostRows() { return static_cast<const HostRow*>(HostTable(4)); }
inline const HostValueRow* HostValues() { return static_cast<const HostValueRow*>(HostTable(6)); }
inline const char* const* HostStrings() { return static_cast<const char* const*>(HostTable(8)); }

inline std::string Quoted(const char* text) {
  return text ? '"' + std::string(text) + '"' : "null";
}

inline std::string Hex(uint32_t word) {
  char text[12];
  std::snprintf(text, sizeof text, "%x", word);
  return text;
}

// Rows before the end row.
inline size_t RowCount(const HostRow* rows) {
  size_t count = 0;
  while (count < kMaxTableEntries && rows[count].flags != kAllOnes) ++count;
  return count;
}

// Value rows before the all-zero one.
inline size_t ValueRowCount(const HostValueRow* values) {
  size_t count = 0;
  for (; count < kMaxTableEntries; ++count) {
    const HostValueRow& v = values[count];
    if (v.valueKind == 0 && v.poolIndex == 0 && v.stringIndex == 0) break;
  }
  return count;
}

// The pool's closing 0 stands behind the highest index a value row names.
inline size_t PoolWords(const HostValueRow* values) {
  uint32_t highest = 0;
  for (size_t i = 0; i < ValueRowCount(values); ++i)
    highest = std::max(highest, values[i].poolIndex);
  return highest + 2;
}

// Each row's words, its names with their offsets in the one pool of names
// (from the first row's name), the reserved words where not all ones; then
// the end row.
inline DumpLines DumpRows(const HostRow* rows) {
  DumpLines lines;
  const size_t count = RowCount(rows);
  const auto named = [&](const char* what, const char* name) {
    return std::string(what) + Quoted(name) + " @" + std::to_string(name - rows[0].name);
  };
  for (size_t i = 0; i < count; ++i) {
    const HostRow& r = rows[i];
    std::string line = "row " + std::to_string(i) + ": flags " + Hex(r.flags) + " id " +
                       std::to_string(r.fieldId) + " key " + std::to_string(r.keyIndex) +
                       named(" name ", r.name) + named(" alt ", r.altName) + " values " +
                       std::to_string(r.valueCount) + " from " + Hex(r.firstValue) + " width " +
                       Hex(r.widthCode) + " format " + std::to_string(r.formatIndex) + " layout " +
                       std::to_string(r.layoutOffset);
    std::vector<uint32_t> reserved(std::begin(r.reservedA), std::end(r.reservedA));
    reserved.insert(reserved.end(), std::begin(r.reservedB), std::end(r.reservedB));
    if (std::ranges::any_of(reserved, [](uint32_t word) { return word != kAllOnes; }))
      for (const uint32_t word : reserved) line += ' ' + Hex(word);
    lines.push_back(line);
  }
  const HostEndRow& end = reinterpret_cast<const HostEndRow&>(rows[count]);
  std::string line = "end row:";
  for (const uint32_t word : end.head) line += ' ' + Hex(word);
  line += ' ' + Quoted(end.lastField);
  for (const uint32_t word : end.tail) line += ' ' + Hex(word);
  lines.push_back(line);
  return lines;
}

// The value rows and the all-zero one.
inline DumpLines DumpValues(const HostValueRow* values) {
  DumpLines lines;
  for (size_t i = 0; i <= ValueRowCount(values); ++i)
    lines.push_back("value " + std::to_string(i) + ": kind " + Hex(values[i].valueKind) + " pool " +
                    std::to_string(values[i].poolIndex) + " string " +
                    std::to_string(values[i].stringIndex));
  return lines;
}

inline DumpLines DumpPool(const uint32_t* pool, size_t words) {
  DumpLines lines;
  for (size_t i = 0; i < words; ++i)
    lines.push_back("pool " + std::to_string(i) + ": " + std::to_string(pool[i]));
  return lines;
}

// The strings to the end mark.
inline DumpLines DumpStrings(const char* const* strings) {
  DumpLines lines;
  for (size_t i = 0; i < kMaxTableEntries; ++i) {
    lines.push_back("string " + std::to_string(i) + ": " + Quoted(strings[i]));
    if (!strings[i] || std::strcmp(strings[i], kFinalString) == 0) break;
  }
  return lines;
}

// Each layout record's octets, its two-octet length first, to the empty
// end record and the two zero octets behind it.
inline DumpLines DumpLayout(const uint8_t* layout) {
  DumpLines lines;
  for (uint32_t offset = 0; offset + 4 <= kMaxLayoutBytes;) {
    const uint32_t length = layout[offset] | layout[offset + 1] << 8;
    const uint32_t size =
        length == 0 ? 4 : std::min<uint32_t>(2 + length, kMaxLayoutBytes - offset);
    std::string line = "layout " + std::to_string(offset) + ":";
    for (uint32_t i = 0; i < size; ++i) line += ' ' + Hex(layout[offset + i]);
    lines.push_back(line);
    if (length == 0) break;
    offset += size;
  }
  return lines;
}

}  // namespace rnsap::testing
