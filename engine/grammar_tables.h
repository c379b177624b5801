// The types of the compiled grammar: the field reads with their shapes and
// conversions, the rules' names, and per field what the reporting sinks need.
// The contents are generated from the protocol description (grammar/*.rg) at
// build time: the tables here, and the rules as code (grammar_walk.h).
#pragma once

#include <cstdint>

namespace rnsap::grammar {

inline constexpr uint16_t kNoSlot = 0xffff;
inline constexpr uint16_t kNoNames = 0xffff;
inline constexpr int16_t kNoBranch = -1;
inline constexpr int16_t kEmptyBranch = -2;

enum class Shape : uint8_t {
  kRun,             // one run of `width` bits
  kOctets,          // octet loop forward
  kOctetsBack,      // octet loop backward
  kOctetsMirrored,  // octet loop forward, each octet's first wire bit least significant
  kBits,            // bit loop forward
  kBitsBack,        // bit loop backward
  kNibbles,         // half-octets in wire order
  kDigitPairs,      // per octet its second half-octet, then its first
  kGroups,          // fixed runs, skipping the bits between
  kPeek,            // look-ahead of `width` bits at `offset`, consuming nothing
};

enum class Conversion : uint8_t {
  kPlain,   // the variable takes the value
  kCount,   // the variable takes the value + 1
  kLength,  // the value is raised by 1 and the variable takes it
};

struct Group {
  uint8_t from;  // offsets from the read's position, inclusive
  uint8_t to;
};

struct ReadPlan {
  uint16_t field;  // index into kFields
  Shape shape;
  Conversion conversion;
  uint16_t keepSlot;
  uint16_t bitmapSlot;  // presence bits: the rule's option bitmap
  uint16_t width;       // runs and peeks: bits; digit pairs: digits kept (0: all)
  uint16_t offset;      // peeks: bits ahead; groups: first group
  uint16_t groupCount;
  int32_t adjust;  // added to the value once it is built
  const char* label;
  uint16_t labelLength;
};

struct Rule {
  const char* literal;
  uint16_t literalLength;
};

// How a field's value part is rendered.
enum class ValueForm : uint8_t {
  kUnsigned,          // %u
  kSigned,            // %d
  kHex,               // %x
  kBinary,            // %b
  kText,              // %s
  kNames,             // %-S
  kNamesAndNumber,    // %-S (%u)
  kUnsignedOctets,    // %u octets
  kElementsUpperHex,  // %-["%X":"sep"]
  kElementsLowerHex,  // %-["%x"]
  kElementsDecimal,   // %-["%u":"sep"]
  kEmpty,             // no text at all
};

// Which segment holds the field's first bit in message order.
enum class FirstSegment : uint8_t { kFirst, kLast, kSecond };

struct ValueName {
  uint32_t value;
  const char* text;
  uint16_t length;  // of the text
  bool hasNumber;   // the text holds %u
};

struct ValueNames {
  uint32_t first;  // index into kValueNames
  uint16_t count;
  bool ascending;        // the values in strictly ascending order
  const char* catchAll;  // null: none
  bool catchAllHasNumber;
};

struct FieldInfo {
  uint32_t fieldId;
  uint32_t displayId;
  const char* prefix;  // the format in front of the value part, '=' included
  uint16_t prefixLength;
  ValueForm form;
  ValueForm displayForm;
  const char* separator;  // element lists
  uint16_t names;
  uint16_t displayNames;
  FirstSegment firstSegment;
  int16_t keyRow;   // row of the key-field table, -1 for none
  uint8_t keySize;  // 1 or 2 octets, or 4 for a variable slot
};

struct DispatchTable {
  const int16_t* branches;  // rule index, kNoBranch or kEmptyBranch, by id
  uint32_t size;
};

enum DispatchKind : uint32_t { kDispatchIe, kDispatchExtension, kDispatchPrivate };

extern const FieldInfo kFields[];
extern const ValueName kValueNames[];
extern const ValueNames kValueLists[];
extern const DispatchTable kDispatchTables[3];

}  // namespace rnsap::grammar

#include "grammar_constants.h"  // generated: kVariableCount, kFieldCount, kSpareField
