// Marks the module's exports: the only symbols a host can resolve by name.
// Exports use the C calling convention (cdecl), the compilers' default here,
// so that a 32-bit Windows host finds them under their plain names.
#pragma once

#ifdef _WIN32
#define RNSAP_EXPORT __declspec(dllexport)
#else
#define RNSAP_EXPORT __attribute__((visibility("default")))
#endif
