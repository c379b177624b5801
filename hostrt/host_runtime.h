// The host runtime: what the host's two libraries do for a host program.
//
// pu_ParserUtilities allocates for the module (counted, with a failure knob
// also set from the environment), grows the layer rows on request, and hands
// every field report and display line to the sink the host program sets;
// kf_OptSupport lays out a key buffer for the key-field table it is given
// and answers with a chosen result.
#pragma once

#include <cstdint>
#include <span>
#include <string_view>

#include "contract/decode_state.h"

namespace rnsap::host {

// ---- pu_ParserUtilities --------------------------------------------------

// Entries in a request's textRecords array as this host allocates it;
// pu_AddDecodedFieldsData moves textRecordIndex on modulo this count.
inline constexpr uint32_t kTextRecordCount = 16;

// A field report as the module makes it: the texts and segments are the
// module's and valid only during the call.
struct DecodedFieldView {
  std::string_view label;
  std::string_view text;
  uint32_t fieldId = 0;
  uint32_t firstSegment = 0;
  uint32_t bitOrderGroup = 0;
  std::span<const BitSegment> segments;
  uint32_t value = 0;  // the field's number, as the field record of the decode state holds it
  uint32_t zero = 0;   // the argument that is always 0
  const DecodeRequest* request = nullptr;  // of the call, textRecordIndex not yet moved on
};

// Takes each report as it is made.
class ReportSink {
 public:
  virtual ~ReportSink() = default;
  virtual void DecodedField(const DecodedFieldView& field) = 0;
  virtual void DisplayLine(std::string_view text, uint32_t displayId) = 0;
};

// Hands the reports to `sink` from now on; null only counts them. Resets
// leave the sink in place.
void SetReportSink(ReportSink* sink);

// Reports of either kind since the last reset.
uint32_t ReportCount();
uint32_t CreateNewLayerInfoCalls();

// Calls of pu_Malloc and pu_Realloc and growths of the layer rows in
// pu_CreateNewLayerInfo together since the last reset.
uint32_t AllocationCalls();
// Makes allocation call number `callNumber` (1-based, counted as
// AllocationCalls counts) fail: null from pu_Malloc and pu_Realloc, 0 and the
// rows unchanged from pu_CreateNewLayerInfo; 0 fails none.
void FailAllocationCall(uint32_t callNumber);

// Clears the counters, and sets the allocation knob from
// RNSAP_FAIL_ALLOCATION in the environment (unset: 0).
void ResetParserUtilities();

// ---- kf_OptSupport -------------------------------------------------------

// Largest key-field table kf_InitialiseOptKFE lays out; a larger one gets -1.
inline constexpr uint32_t kMaxKeyRows = 256;
// Every key row gets a slot of this many bytes, enough for any kind of key.
inline constexpr uint32_t kKeySlotBytes = 4;

// Bytes at the start of the key buffer that presence bits and slots of a
// table of `rows` rows take; key octets belong behind them.
uint32_t KeyLayoutSize(uint32_t rows);
// KeyLayoutSize of the table of the last kf_InitialiseOptKFE call, 0 before any.
uint32_t LastKeyLayoutSize();
// The key-field table of the last kf_InitialiseOptKFE call that laid one out,
// as the caller owns it (the module's table lives as long as the module is
// loaded); empty before any.
std::span<const KeyFieldRow> LastKeyTable();
uint32_t InitialiseOptKfeCalls();

// What kf_InitialiseOptKFE answers from now on; with a result above 1 it also
// leaves `markRow` in the caller's row word.
void SetInitialiseResult(int32_t result, uint16_t markRow = 0);

// Result 1, mark row 0, call count 0, no table seen.
void ResetOptSupport();

}  // namespace rnsap::host
