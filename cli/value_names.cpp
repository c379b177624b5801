#include "cli/value_names.h"

namespace rnsap::cli {
namespace {

constexpr uint32_t kDictionaryEndMark = 0xffffffff;
constexpr int32_t kValueTable = 6;
constexpr int32_t kValuePool = 7;
constexpr int32_t kStringTable = 8;

}  // namespace

ValueNames::ValueNames(const LoadedModule& module) {
  const auto* values = static_cast<const tables::ValueRow*>(module.Table(kValueTable));
  const auto* pool = static_cast<const uint32_t*>(module.Table(kValuePool));
  const auto* strings = static_cast<const char* const*>(module.Table(kStringTable));
  for (const tables::DictionaryRow* row = module.dictionary(); row->flags != kDictionaryEndMark;
       ++row) {
    if (row->valueCount == 0 || row->firstValue == tables::kNoValueList) continue;
    const auto [list, made] = lists_.try_emplace(row->name);
    if (!made) continue;
    for (uint32_t at = row->firstValue; at < row->firstValue + row->valueCount; ++at) {
      const tables::ValueRow& value = values[at];
      const std::string_view name = strings[value.stringIndex];
      if (value.valueKind == tables::kCatchAll) {
        list->second.catchAll = name;
      } else {
        list->second.named.push_back({pool[value.poolIndex], name});
      }
    }
  }
}

const ValueNames::ValueList* ValueNames::List(std::string_view field) const {
  const auto found = lists_.find(field);
  return found == lists_.end() ? nullptr : &found->second;
}

std::string_view ValueNames::Name(std::string_view field, uint32_t value) const {
  const ValueList* list = List(field);
  if (list == nullptr) return {};
  for (const NamedValue& named : list->named) {
    if (named.value == value) return named.name;
  }
  return list->catchAll;
}

}  // namespace rnsap::cli
