#include "cli/loaded_module.h"

#include <dlfcn.h>

#include <array>
#include <stdexcept>

namespace rnsap::cli {
namespace {

constexpr int32_t kFieldDictionaryTable = 4;
constexpr int32_t kValueTable = 6;
constexpr int32_t kValuePoolTable = 7;
constexpr int32_t kStringTable = 8;

// A call into each host library, by the soname the module needs it under.
struct HostLibraryCall {
  const char* soname;
  const char* symbol;
};

constexpr std::array<HostLibraryCall, 2> kHostLibraryCalls = {{
    {"libpu_ParserUtilities.so", "pu_AddDecodedFieldsData"},
    {"libkf_OptSupport.so", "kf_InitialiseOptKFE"},
}};

std::string LoaderError() {
  const char* error = dlerror();
  return error != nullptr ? error : "unknown loader error";
}

// The definition of `symbol` in the library of this process that carries
// `soname`, or null when no such library is loaded.
void* SymbolOfLoadedLibrary(const HostLibraryCall& call) {
  void* library = dlopen(call.soname, RTLD_NOW | RTLD_NOLOAD);
  if (library == nullptr) return nullptr;
  void* symbol = dlsym(library, call.symbol);
  dlclose(library);
  return symbol;
}

}  // namespace

LoadedModule::LoadedModule(const std::string& path) : path_(path) {
  handle_ = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL);
  if (handle_ == nullptr) throw std::runtime_error("cannot load " + path + ": " + LoaderError());
  try {
    Resolve("vex_PreDecodeMV", validate);
    Resolve("vex_PreDecodeMD", decode);
    Resolve("vex_PreDecodeTO", display);
    Resolve("KFE_vorel_rnsap_04b", extractKeys);
    VerifyHostLibraries();
    tables_ = {static_cast<const tables::DictionaryRow*>(Table(kFieldDictionaryTable)),
               static_cast<const tables::ValueRow*>(Table(kValueTable)),
               static_cast<const uint32_t*>(Table(kValuePoolTable)),
               static_cast<const char* const*>(Table(kStringTable))};
  } catch (...) {
    dlclose(handle_);
    throw;
  }
}

LoadedModule::~LoadedModule() { dlclose(handle_); }

void* LoadedModule::Resolve(const char* name) const {
  void* symbol = dlsym(handle_, name);
  if (symbol == nullptr) throw std::runtime_error(path_ + " does not export " + name);
  return symbol;
}

// What the module reports must reach the host libraries of this process.
void LoadedModule::VerifyHostLibraries() const {
  for (const HostLibraryCall& call : kHostLibraryCalls) {
    const void* ownDefinition = SymbolOfLoadedLibrary(call);
    if (ownDefinition == nullptr || ownDefinition != dlsym(handle_, call.symbol)) {
      throw std::runtime_error(path_ + " does not call " + call.symbol + " of this host's " +
                               call.soname);
    }
  }
}

const void* LoadedModule::Table(int32_t index) const {
  auto* getTable = reinterpret_cast<decltype(&vex_DLLGetTable)>(Resolve("vex_DLLGetTable"));
  const void* table = nullptr;
  if (getTable(index, &table) != 0 || table == nullptr) {
    throw std::runtime_error(path_ + " gives no descriptor table " + std::to_string(index));
  }
  return table;
}

}  // namespace rnsap::cli
