#include "cli/key_rows.h"

#include <algorithm>
#include <cstring>
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

void ReadVariableSlot(std::span<const uint8_t> slot, std::span<const uint8_t> keyBuffer,
                      const KeyFieldRow& row, KeyValue& key) {
  key.variable = true;
  key.bits = LittleEndianAt(slot, 0, 2);
  const uint32_t keyOffset = LittleEndianAt(slot, 2, 2);
  key.hex =
      UpperHex(OctetsAt(keyBuffer, keyOffset, (key.bits + 7) / 8, row, key.row, "key octets"));
}

KeyValue ReadKey(const KeyFieldRow& row, uint32_t rowNumber, std::span<const uint8_t> keyBuffer,
                 uint32_t sizeClass) {
  if (sizeClass == 0) {
    throw std::runtime_error(Describe(row, rowNumber) + " names no key field of the dictionary");
  }
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

// The presence octets are scanned a word at a time: most are 0.
void KeyReader::Read(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
                     std::vector<KeyValue>& keys) {
  if (table.data() != table_ || table.size() != tableRows_) FindRows(table);
  keys.clear();
  const size_t octets = std::min(keyBuffer.size(), rowsByPresenceOctet_.size());
  size_t offset = 0;
  for (uint64_t word = 0; offset + sizeof word <= octets; offset += sizeof word) {
    std::memcpy(&word, keyBuffer.data() + offset, sizeof word);
    if (word == 0) continue;
    for (size_t at = offset; at < offset + sizeof word; ++at) ReadOctet(table, keyBuffer, at, keys);
  }
  for (; offset < octets; ++offset) ReadOctet(table, keyBuffer, offset, keys);
  if (!octetsInRowOrder_) {
    std::sort(keys.begin(), keys.end(), [](auto& a, auto& b) { return a.row < b.row; });
  }
}

void KeyReader::ReadOctet(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
                          size_t offset, std::vector<KeyValue>& keys) const {
  const uint8_t presence = keyBuffer[offset];
  if (presence == 0) return;
  for (const uint32_t rowNumber : rowsByPresenceOctet_[offset]) {
    const KeyFieldRow& row = table[rowNumber];
    if ((presence & static_cast<uint8_t>(row.presenceMask)) != 0) {
      keys.push_back(ReadKey(row, rowNumber, keyBuffer, rowClasses_[rowNumber]));
    }
  }
}

void KeyReader::FindRows(std::span<const KeyFieldRow> table) {
  table_ = table.data();
  tableRows_ = table.size();
  rowClasses_.clear();
  rowsByPresenceOctet_.clear();
  octetsInRowOrder_ = true;
  uint32_t lastOffset = 0;
  for (uint32_t rowNumber = 0; rowNumber < table.size(); ++rowNumber) {
    const KeyFieldRow& row = table[rowNumber];
    const auto found = sizeClasses_.find(row.keyName);
    rowClasses_.push_back(found == sizeClasses_.end() ? 0 : found->second);
    if (row.presenceOffset >= rowsByPresenceOctet_.size()) {
      rowsByPresenceOctet_.resize(row.presenceOffset + 1);
    }
    rowsByPresenceOctet_[row.presenceOffset].push_back(rowNumber);
    octetsInRowOrder_ = octetsInRowOrder_ && row.presenceOffset >= lastOffset;
    lastOffset = row.presenceOffset;
  }
}

}  // namespace rnsap::cli
