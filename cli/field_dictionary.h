// What a host reads in the module's descriptor tables about the fields the
// passes report: which numbers are printed signed, the names of values, and
// the field id of each key field.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "tables/descriptor_formats.h"

namespace rnsap::cli {

// The field dictionary (table 4), value table (6), value pool (7) and string
// table (8), as vex_DLLGetTable hands them out.
struct DescriptorTables {
  const tables::DictionaryRow* dictionary = nullptr;
  const tables::ValueRow* values = nullptr;
  const uint32_t* valuePool = nullptr;
  const char* const* strings = nullptr;
};

class FieldDictionary {
 public:
  explicit FieldDictionary(const DescriptorTables& tables);

  // Whether the field's format shows its number signed (%d).
  bool PrintsSigned(uint32_t fieldId) const;
  // The name that the field's value list gives `value`; empty when no
  // named value of the list is `value`.
  std::string_view ValueName(uint32_t fieldId, uint32_t value) const;
  // The field id of the key field named `name`.
  std::optional<uint32_t> KeyFieldId(std::string_view name) const;

 private:
  DescriptorTables tables_;
  std::unordered_map<uint32_t, const tables::DictionaryRow*> rows_;  // by field id
  std::unordered_map<std::string, uint32_t> keyFieldIds_;            // by name
  std::vector<bool> printsSigned_;                                   // by field id
};

}  // namespace rnsap::cli
