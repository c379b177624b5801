// The keys the Key-field pass left in the key buffer, read back row by row
// through the key-field table that the host library laid out.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <span>
#include <string>
#include <string_view>
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
  std::string_view name;  // the key-field table's, alive while the module is loaded
  bool variable = false;
  uint32_t number = 0;  // a fixed slot's value
  std::string hex;      // a variable slot's key octets, upper-case hex
  uint32_t bits = 0;    // a variable slot's number of key bits
};

// The rows whose presence bit is set, in row order, into `keys`. Throws
// std::runtime_error for a present row without a key field of its name or
// with a slot outside `keyBuffer`.
void ReadKeys(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
              const KeySizeClasses& sizeClasses, std::vector<KeyValue>& keys);

}  // namespace rnsap::cli
