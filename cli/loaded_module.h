// The decoder module as a host loads it: by file name, with its exports
// resolved by name and its host libraries bound to the ones of this process.
#pragma once

#include <string>

#include "boundary/module_api.h"
#include "cli/field_dictionary.h"

namespace rnsap::cli {

class LoadedModule {
 public:
  // Throws std::runtime_error when the module cannot be loaded, lacks an
  // export, or binds to host libraries other than those of this process.
  explicit LoadedModule(const std::string& path);
  ~LoadedModule();
  LoadedModule(const LoadedModule&) = delete;
  LoadedModule& operator=(const LoadedModule&) = delete;

  decltype(&vex_PreDecodeMV) validate = nullptr;
  decltype(&vex_PreDecodeMD) decode = nullptr;
  decltype(&vex_PreDecodeTO) display = nullptr;
  decltype(&KFE_vorel_rnsap_04b) extractKeys = nullptr;

  const DescriptorTables& tables() const { return tables_; }

 private:
  void* Resolve(const char* name) const;
  template <typename Function>
  void Resolve(const char* name, Function*& function) const {
    function = reinterpret_cast<Function*>(Resolve(name));
  }
  void VerifyHostLibraries() const;
  const void* Table(int32_t index) const;

  std::string path_;
  void* handle_ = nullptr;
  DescriptorTables tables_;
};

}  // namespace rnsap::cli
