// The key-field table: the rows the Key-field pass hands to the host library,
// which fills in where each key lives in the key buffer.
#pragma once

#include "contract/decode_state.h"
#include "key_field_rows.h"  // generated: kKeyFieldRows

namespace rnsap::tables {

extern KeyFieldRow kKeyFieldTable[kKeyFieldRows];

}  // namespace rnsap::tables
