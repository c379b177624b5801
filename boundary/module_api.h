// What a host sees of the module: the seven exports, by name.
#pragma once

#include <cstdint>

#include "boundary/export.h"
#include "contract/decode_state.h"

extern "C" {

// Query status: 0 for success, kNoEntry for an index without an entry.
RNSAP_EXPORT uint32_t vex_DLLGetPtr(int32_t index, const void** out);
RNSAP_EXPORT uint32_t vex_DLLGetTable(int32_t index, const void** out);

// The three decode passes: 1 at every normal end, 0 when a table failed to
// grow. A full 32-bit word, so that a host reading a byte or a whole register
// gets the same answer.
RNSAP_EXPORT uint32_t vex_PreDecodeMV(rnsap::DecodeRequest* request);
RNSAP_EXPORT uint32_t vex_PreDecodeMD(rnsap::DecodeRequest* request);
RNSAP_EXPORT uint32_t vex_PreDecodeTO(rnsap::DecodeRequest* request);
RNSAP_EXPORT int32_t KFE_vorel_rnsap_04b(rnsap::KeyFieldRequest* request);

RNSAP_EXPORT char* date_conv(char* destination, void* unused, rnsap::DecodeState* state);
}

namespace rnsap {
inline constexpr uint32_t kQueryNoEntry = 0xd0410001;
inline constexpr const char* kModuleFileName = "vorel_rnsap_04B_DLL.so";
}  // namespace rnsap
