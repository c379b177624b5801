// Marks the module's exports: the only symbols a host can resolve by name.
// Exports use the C calling convention (cdecl), the compilers' default here,
// so that a 32-bit Windows host finds them under their plain names.
#pragma once

// Code outside the module sees plain declarations, bound on Windows through
// the DLL's import library.
#if defined(_WIN32) && defined(RNSAP_BUILDING_MODULE)
#define RNSAP_EXPORT __declspec(dllexport)
#elif defined(_WIN32)
#define RNSAP_EXPORT
#else
#define RNSAP_EXPORT __attribute__((visibility("default")))
#endif
