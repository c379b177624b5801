// Binary formats of the descriptor tables the host reads. On a 32-bit build
// every size is exact; on a 64-bit build the pointer words are native pointers.
#pragma once

#include <cstdint>

namespace rnsap::tables {

struct DictionaryRow {
  uint32_t flags;  // 0x05 << 24 | key flag << 16 | size class
  uint32_t fieldId;
  uint32_t keyIndex;
  const char* name;
  const char* altName;
  uint32_t valueCount;
  uint32_t firstValue;
  uint32_t widthCode;
  uint32_t formatIndex;
  uint32_t reserved0[6];
  uint32_t layoutOffset;
  uint32_t reserved1[3];
};

// The row that ends the dictionary; its third word is a pointer.
struct DictionaryEnd {
  uint32_t mark;
  uint32_t lastId;
  const char* lastField;
  uint32_t word3;
  uint32_t word4;
  uint32_t word5;
  uint32_t word6;
  uint32_t word7;
  uint32_t zero[11];
};

struct ValueRow {
  uint32_t valueKind;  // kNamedValue or kCatchAll
  uint32_t poolIndex;
  uint32_t stringIndex;
};

inline constexpr uint32_t kNamedValue = 1;
inline constexpr uint32_t kCatchAll = 0x00010000;
inline constexpr uint32_t kNoValueList = 0xffffffff;
inline constexpr uint32_t kVariableWidth = 0xffffffff;

#if UINTPTR_MAX == 0xffffffffu
static_assert(sizeof(DictionaryRow) == 76);
static_assert(sizeof(DictionaryEnd) == 76);
#endif
static_assert(sizeof(ValueRow) == 12);

}  // namespace rnsap::tables
