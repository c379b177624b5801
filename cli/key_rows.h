// The keys the Key-field pass left in the key buffer, read back row by row
// through the key-field table that the host library laid out.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <span>
#include <string>
#include <string_view>
#include <utility>
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

// Reads the keys of a key buffer through the key-field table the host
// library laid out, finding each row's size class once per table.
class KeyReader {
 public:
  explicit KeyReader(KeySizeClasses sizeClasses) : sizeClasses_(std::move(sizeClasses)) {}

  // The rows whose presence bit is set, in row order, into `keys`. Throws
  // std::runtime_error for a present row without a key field of its name or
  // with a slot outside `keyBuffer`.
  void Read(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
            std::vector<KeyValue>& keys);

  const KeySizeClasses& sizeClasses() const { return sizeClasses_; }

 private:
  void FindRows(std::span<const KeyFieldRow> table);
  void ReadOctet(std::span<const KeyFieldRow> table, std::span<const uint8_t> keyBuffer,
                 size_t offset, std::vector<KeyValue>& keys) const;

  KeySizeClasses sizeClasses_;
  const KeyFieldRow* table_ = nullptr;  // the one the members below were found for
  size_t tableRows_ = 0;
  std::vector<uint32_t> rowClasses_;  // by row; 0 for a name without a key field
  // The rows whose presence bit is in each octet, by the octet's offset.
  std::vector<std::vector<uint32_t>> rowsByPresenceOctet_;
  bool octetsInRowOrder_ = true;  // whether reading them by offset keeps the row order
};

}  // namespace rnsap::cli
