// The calls the module makes into the host's two libraries,
// pu_ParserUtilities and kf_OptSupport. The host (or the project's stand-ins)
// provides them; the module relies on nothing else of the host.
#pragma once

#include <cstdint>

#include "contract/decode_state.h"

extern "C" {

// Block of `size` bytes, or null.
void* pu_Malloc(uint32_t size);
// `block` resized to `size` bytes with its contents kept, or null.
void* pu_Realloc(void* block, uint32_t size);
// Makes row request->layerRowIndex of request->layerRows writable.
int32_t pu_CreateNewLayerInfo(rnsap::DecodeRequest* request);
// One decoded field: its segments, rendered text, label and id.
int32_t pu_AddDecodedFieldsData(rnsap::DecodeRequest* request, uint32_t segmentCount,
                                rnsap::BitSegment* segments, const char* text,
                                uint32_t firstSegment, const char* label, uint32_t fieldId,
                                uint32_t zero, uint32_t bitOrderGroup);
// One display line: the bare value text under its display id.
int32_t pu_AddFieldsToDisplayData(rnsap::DecodeRequest* request, const char* text,
                                  uint32_t displayId);
// Lays out the key buffer for `table` of `rows` rows; may leave a row number in *markRow.
int32_t kf_InitialiseOptKFE(void* table, uint32_t rows, uint16_t* markRow);
}
