// What the module tells a host about itself: the version string, the header
// record and the identity block directly behind it.
#pragma once

#include <cstddef>
#include <cstdint>

namespace rnsap {

// One word of the identity block: a pointer to a string or a number, as wide
// as a pointer.
union IdentityWord {
  const char* text;
  uintptr_t number;
};

inline constexpr size_t kIdentityWordCount = 25;
inline constexpr size_t kHeaderWordCount = 4;

// The header record followed without a gap by the identity block.
struct ModuleIdentity {
  uintptr_t header[kHeaderWordCount];
  IdentityWord words[kIdentityWordCount];
};

static_assert(sizeof(IdentityWord) == sizeof(void*));
static_assert(offsetof(ModuleIdentity, words) == kHeaderWordCount * sizeof(uintptr_t));

const char* VersionString();
const ModuleIdentity& Identity();

}  // namespace rnsap
