// The keys the Key-field pass left in the key buffer, read back row by row
// through the key-field table that the host library laid out.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "contract/decode_state.h"
#include "tables/descriptor_formats.h"

namespace rnsap::cli {

// Size class of a key slot: 1 and 2 are fixed slots of that many octets, 4 a
// variable slot (u16 bits, u16 offset of the key octets, little-endian).
inline constexpr uint32_t kVariableKeySlot = 4;

// The size class of every key field of the dictionary, by its name.
using KeySizeClasses = std::map<std::string, uint32_t, std::less<>>;

// Walks the field dictionary up to its terminator row.
KeySizeClasses ReadKeySizeClasses(const tables::DictionaryRow* dictionary);

struct KeyValue {
  uint32_t row = 0;
  std::string name;
  bool variable = false;
  uint32_t number = 0;  // a fixed slot's value
  std::string hex;      // a variable slot's key octets, upper-case hex
  uint32_t bits = 0;    // a variable slot's number of key bits
};

// The number in the fixed slot of size class `sizeClass` (1 or 2) of row
// number `rowNumber`, or nothing when its presence bit is clear. Throws
// std::runtime_error for a slot outside `keyBuffer`.
std::optional<uint32_t> ReadFixedKey(const KeyFieldRow& row, uint32_t rowNumber,
                                     std::span<const uint8_t> keyBuffer, uint32_t sizeClass);

// The rows whose presence bit is set, in row order. Throws std::runtime_error
// for a present row without a key field of its name or with a slot outside
// `keyBuffer`.
std::vector<KeyValue> ReadKeys(std::span<const KeyFieldRow> table,
                               std::span<const uint8_t> keyBuffer,
                               const KeySizeClasses& sizeClasses);

}  // namespace rnsap::cli
