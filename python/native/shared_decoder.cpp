#include "python/native/shared_decoder.h"

#include <memory>
#include <mutex>
#include <stdexcept>

#include "cli/loaded_module.h"
#include "cli/message_decoder.h"

namespace rnsap::python {
namespace {

struct Loaded {
  explicit Loaded(const std::string& path) : module(path), decoder(module, true) {}
  const cli::LoadedModule module;
  cli::MessageDecoder decoder;
};

// Everything below is guarded by the one mutex; a loaded module stays loaded
// until the process ends.
std::mutex guard;
std::string defaultPath;
std::string loadedPath;
std::unique_ptr<Loaded> loaded;

Loaded& LoadLocked(const std::string& path) {
  if (!loaded) {
    loaded = std::make_unique<Loaded>(path);
    loadedPath = path;
  } else if (path != loadedPath) {
    throw std::runtime_error("cannot load " + path + ": the module of " + loadedPath +
                             " is loaded, and a process loads one module");
  }
  return *loaded;
}

}  // namespace

void SetDefaultModulePath(const std::string& path) {
  const std::lock_guard lock(guard);
  defaultPath = path;
}

void LoadModule(const std::string& path) {
  const std::lock_guard lock(guard);
  LoadLocked(path);
}

std::string LoadedModulePath() {
  const std::lock_guard lock(guard);
  return loadedPath;
}

const cli::FieldDictionary& Dictionary() {
  const std::lock_guard lock(guard);
  return (loaded ? *loaded : LoadLocked(defaultPath)).decoder.dictionary();
}

cli::MessageSummary Decode(cli::Pass pass, std::span<const uint8_t> message,
                           cli::MessagePrinter& printer) {
  const std::lock_guard lock(guard);
  Loaded& module = loaded ? *loaded : LoadLocked(defaultPath);
  return module.decoder.Decode(pass, message, printer);
}

}  // namespace rnsap::python
