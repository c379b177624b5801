#include "cli/key_rows.h"

#include <stdexcept>

namespace rnsap::cli {
namespace {

constexpr uint32_t kDictionaryEndMark = 0xffffffff;
constexpr uint32_t kKeyFieldFlag = 0x00010000;
constexpr uint32_t kSizeClassMask = 0x0000ffff;

std::string Describe(const KeyFieldRow& row, uint32_t rowNumber) {
  return "key row " + std::to_string(rowNumber) + " (" + row.keyName + ")";
}

// Reads the little-endian number of `count` octets at `offset`.
uint32_t LittleEndianAt(std::span<const uint8_t> octets, uint32_t offset, uint32_t count) {
  uint32_t value = 0;
  for (uint32_t i = count; i-- > 0;) value = value << 8 | octets[offset + i];
  return value;
}

// The octets of a row's slot or key; `part` names them in the error.
std::span<const uint8_t> OctetsAt(std::span<const uint8_t> keyBuffer, size_t offset, size_t count,
                                  const KeyFieldRow& row, uint32_t rowNumber,
                                  std::string_view part) {
  if (offset + count > keyBuffer.size()) {
    throw std::runtime_error(Describe(row, rowNumber) + ": " + std::string(part) +
                             " outside the key buffer");
  }
  return keyBuffer.subspan(offset, count);
}

std::string UpperHex(std::span<const uint8_t> octets) {
  static constexpr char kDigits[] = "0123456789ABCDEF";
  std::string hex;
  for (const uint8_t octet : octets) {
    hex += kDigits[octet >> 4];
    hex += kDigits[octet & 0xf];
  }
  return hex;
}

bool IsPresent(const KeyFieldRow& row, std::span<const uint8_t> keyBuffer) {
  const uint8_t mask = static_cast<uint8_t>(row.presenceMask);
  return row.presenceOffset < keyBuffer.size() && (keyBuffer[row.presenceOffset] & mask) != 0;
}

uint32_t SizeClassOf(const KeyFieldRow& row, uint32_t rowNumber, const KeySizeClasses& classes) {
  const auto found = classes.find(row.keyName);
  if (found == classes.end()) {
    throw std::runtime_error(Describe(row, rowNumber) + " names no key field of the dictionary");
  }
  return found->second;
}

void ReadVariableSlot(std::span<const uint8_t> slot, std::span<const uint8_t> keyBuffer,
                      const KeyFieldRow& row, KeyValue& key) {
  key.variable = true;
  key.bits = LittleEndianAt(slot, 0, 2);
  const uint32_t keyOffset = LittleEndianAt(slot, 2, 2);
  key.hex =
      UpperHex(OctetsAt(keyBuffer, keyOffset, (key.bits + 7) / 8, row, key.row, "key octets"));
}

KeyValue ReadKey(const KeyFieldRow& row, uint32_t rowNumber, std::span<const uint8_t> keyBuffer,
                 const KeySizeClasses& classes) {
  const uint32_t sizeClass = SizeClassOf(row, rowNumber, classes);
  const uint32_t slotOctets = sizeClass;  // a variable slot takes four octets too
  const std::span<const uint8_t> slot =
      OctetsAt(keyBuffer, row.valueOffset, slotOctets, row, rowNumber, "slot");
  KeyValue key{rowNumber, row.keyName, false, 0, {}, 0};
  if (sizeClass == kVariableKeySlot) {
    ReadVariableSlot(slot, keyBuffer, row, key);
  } else {
    key.number = LittleEndianAt(slot, 0, slotOctets);
  }
  return key;
}

}  // namespace

KeySizeClasses ReadKeySizeClasses(const tables::DictionaryRow* dictionary) {
  KeySizeClasses classes;
  for (const tables::DictionaryRow* row = dictionary; row->flags != kDictionaryEndMark; ++row) {
    if ((row->flags & kKeyFieldFlag) != 0) classes[row->name] = row->flags & kSizeClassMask;
  }
  return classes;
}

void ReadKeys(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
              const KeySizeClasses& sizeClasses, std::vector<KeyValue>& keys) {
  keys.clear();
  for (uint32_t rowNumber = 0; rowNumber < table.size(); ++rowNumber) {
    const KeyFieldRow& row = table[rowNumber];
    if (IsPresent(row, keyBuffer)) keys.push_back(ReadKey(row, rowNumber, keyBuffer, sizeClasses));
  }
}

}  // namespace rnsap::cli
