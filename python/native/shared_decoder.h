// The decoder module as one process holds it: loaded once, by file name, and
// run by one thread at a time, since a pass may not overlap another one and
// the module and the host libraries keep state of their own.
#pragma once

#include <cstdint>
#include <span>
#include <string>

#include "cli/options.h"
#include "cli/report.h"

namespace rnsap::python {

// Where the module is loaded from when no one asked for another file first.
void SetDefaultModulePath(const std::string& path);

// Loads the module at `path` unless it is loaded. Throws std::runtime_error
// when it cannot be loaded, or when a module of another file already is.
void LoadModule(const std::string& path);

// The file of the loaded module, or "" before it is loaded.
std::string LoadedModulePath();

// The field dictionary of the module, loading it first if need be.
const cli::FieldDictionary& Dictionary();

// Runs `pass` over `message`, after the Key-field pass that gives its header, loading the module
// first if need be; waits while another thread runs a pass.
cli::MessageSummary Decode(cli::Pass pass, std::span<const uint8_t> message,
                           cli::MessagePrinter& printer);

}  // namespace rnsap::python
