// The decoder module as a host loads it: by file name, with its exports
// resolved by name and its host libraries bound to the ones of this process.
#pragma once

#include <cstdint>
#include <string>

#include "boundary/module_api.h"
#include "tables/descriptor_formats.h"

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

  // The field dictionary, table 4.
  const tables::DictionaryRow* dictionary() const { return dictionary_; }

  // The descriptor table `index` as vex_DLLGetTable gives it; throws
  // std::runtime_error if the module gives none.
  const void* Table(int32_t index) const;

 private:
  void* Resolve(const char* name) const;
  template <typename Function>
  void Resolve(const char* name, Function*& function) const {
    function = reinterpret_cast<Function*>(Resolve(name));
  }
  void VerifyHostLibraries() const;
  void ReadDictionary();

  std::string path_;
  void* handle_ = nullptr;
  const tables::DictionaryRow* dictionary_ = nullptr;
};

}  // namespace rnsap::cli
