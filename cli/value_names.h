// The names the module's value lists give to the values of a field, read
// from its value table, value pool and string table.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "cli/loaded_module.h"

namespace rnsap::cli {

class ValueNames {
 public:
  // Reads the value list of every dictionary row that has one; the first
  // row of a name gives the list of that name.
  explicit ValueNames(const LoadedModule& module);

  // The name of `value` in the list of the field `field`: the first named
  // value equal to it, else the list's catch-all text; "" when the field
  // has no list or the list names nothing for the value.
  std::string_view Name(std::string_view field, uint32_t value) const;

  // Every value a list names, in list order.
  struct NamedValue {
    uint32_t value = 0;
    std::string_view name;
  };
  struct ValueList {
    std::vector<NamedValue> named;
    std::string_view catchAll;
  };
  const ValueList* List(std::string_view field) const;

 private:
  std::map<std::string, ValueList, std::less<>> lists_;
};

}  // namespace rnsap::cli
