#include "cli/field_dictionary.h"

#include <algorithm>

namespace rnsap::cli {
namespace {

constexpr uint32_t kDictionaryEndMark = 0xffffffff;
constexpr uint32_t kKeyFieldFlag = 0x00010000;

}  // namespace

FieldDictionary::FieldDictionary(const DescriptorTables& tables) : tables_(tables) {
  for (const tables::DictionaryRow* row = tables.dictionary; row->flags != kDictionaryEndMark;
       ++row) {
    rows_.emplace(row->fieldId, row);
    if ((row->flags & kKeyFieldFlag) != 0) keyFieldIds_.emplace(row->name, row->fieldId);
    if (std::string_view(tables.strings[row->formatIndex]).find("%d") != std::string_view::npos) {
      printsSigned_.resize(std::max<size_t>(printsSigned_.size(), row->fieldId + 1));
      printsSigned_[row->fieldId] = true;
    }
  }
}

bool FieldDictionary::PrintsSigned(uint32_t fieldId) const {
  return fieldId < printsSigned_.size() && printsSigned_[fieldId];
}

// The named values of a list in list order; the first equal one names it.
std::string_view FieldDictionary::ValueName(uint32_t fieldId, uint32_t value) const {
  const auto found = rows_.find(fieldId);
  if (found == rows_.end()) return {};
  const tables::DictionaryRow& row = *found->second;
  for (uint32_t index = 0; index < row.valueCount; ++index) {
    const tables::ValueRow& named = tables_.values[row.firstValue + index];
    if (named.valueKind == tables::kNamedValue && tables_.valuePool[named.poolIndex] == value)
      return tables_.strings[named.stringIndex];
  }
  return {};
}

std::optional<uint32_t> FieldDictionary::KeyFieldId(std::string_view name) const {
  const auto found = keyFieldIds_.find(std::string(name));
  if (found == keyFieldIds_.end()) return std::nullopt;
  return found->second;
}

}  // namespace rnsap::cli
