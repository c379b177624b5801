// Marks the module's exports: the only symbols a host can resolve by name.
#pragma once

#define RNSAP_EXPORT __attribute__((visibility("default")))
