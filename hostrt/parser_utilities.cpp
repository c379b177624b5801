// The host runtime's pu_ParserUtilities library: plain heap allocation with
// a failure knob (also set from the environment), layer rows grown on
// request, and every field report and display line the module makes handed
// to the sink the host program sets.
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "contract/host_services.h"
#include "hostrt/host_runtime.h"

namespace rnsap::host {
namespace {

// RNSAP_FAIL_ALLOCATION=N makes the Nth allocation after each reset fail
// (in rnsap-decode: of each pass), so that a host program can be run
// through a failed growth.
uint32_t FailingCallFromEnvironment() {
  const char* const call = std::getenv("RNSAP_FAIL_ALLOCATION");
  return call != nullptr ? static_cast<uint32_t>(std::strtoul(call, nullptr, 10)) : 0;
}

struct ParserUtilitiesState {
  uint32_t reportCount = 0;
  uint32_t createNewLayerInfoCalls = 0;
  uint32_t allocationCalls = 0;
  uint32_t failingAllocationCall = 0;
};

ParserUtilitiesState& State() {
  static ParserUtilitiesState state;
  return state;
}

ReportSink* reportSink = nullptr;

// Counts the call and tells whether the knob makes it fail.
bool NextAllocationFails() {
  ParserUtilitiesState& state = State();
  ++state.allocationCalls;
  return state.allocationCalls == state.failingAllocationCall;
}

// The host's reallocation, counted and failed by the knob; a failed one
// leaves `block` as it was.
void* CountedRealloc(void* block, size_t size) {
  return NextAllocationFails() ? nullptr : std::realloc(block, size);
}

// A block whose reallocation was made to fail. The module drops its pointer
// then; keeping the block reachable here spares leak checkers a report about
// memory that a real host reclaims with its own pools.
void KeepBlockAfterFailedGrowth(void* block) {
  static auto* const keptBlocks = new std::vector<void*>;
  keptBlocks->push_back(block);
}

std::string_view TextView(const char* text) {
  return text != nullptr ? std::string_view(text) : std::string_view();
}

}  // namespace

uint32_t ReportCount() { return State().reportCount; }

uint32_t CreateNewLayerInfoCalls() { return State().createNewLayerInfoCalls; }

uint32_t AllocationCalls() { return State().allocationCalls; }

void FailAllocationCall(uint32_t callNumber) { State().failingAllocationCall = callNumber; }

void ResetParserUtilities() {
  State() = ParserUtilitiesState{};
  State().failingAllocationCall = FailingCallFromEnvironment();
}

void SetReportSink(ReportSink* sink) { reportSink = sink; }

}  // namespace rnsap::host

namespace host = rnsap::host;

extern "C" {

void* pu_Malloc(uint32_t size) {
  if (host::NextAllocationFails()) return nullptr;
  return std::malloc(size);
}

void* pu_Realloc(void* block, uint32_t size) {
  void* const grown = host::CountedRealloc(block, size);
  if (grown == nullptr && block != nullptr) host::KeepBlockAfterFailedGrowth(block);
  return grown;
}

// Grows layerRows to hold row layerRowIndex, at least doubling, with new rows
// zeroed, through the counted allocation of pu_Realloc. Returns 1, or 0 when
// memory runs out (the request is then unchanged).
int32_t pu_CreateNewLayerInfo(rnsap::DecodeRequest* request) {
  ++host::State().createNewLayerInfoCalls;
  const uint32_t capacity = request->layerRows != nullptr ? request->layerRowLimit + 1 : 0;
  const uint32_t required = request->layerRowIndex + 1;
  if (required <= capacity) return 1;
  const uint32_t grown = std::max(required, 2 * capacity);
  void* rows = host::CountedRealloc(request->layerRows, grown * sizeof(rnsap::LayerBoundary));
  if (rows == nullptr) return 0;
  request->layerRows = static_cast<rnsap::LayerBoundary*>(rows);
  std::memset(request->layerRows + capacity, 0, (grown - capacity) * sizeof(rnsap::LayerBoundary));
  request->layerRowLimit = grown - 1;
  return 1;
}

// Hands the field to the sink (its memory is the module's and only valid
// during the call), then moves textRecordIndex on to the next record,
// wrapping at the end of the array.
int32_t pu_AddDecodedFieldsData(rnsap::DecodeRequest* request, uint32_t segmentCount,
                                rnsap::BitSegment* segments, const char* text,
                                uint32_t firstSegment, const char* label, uint32_t fieldId,
                                uint32_t zero, uint32_t bitOrderGroup) {
  ++host::State().reportCount;
  if (host::reportSink != nullptr) {
    const std::span<const rnsap::BitSegment> fieldSegments(segments,
                                                           segments != nullptr ? segmentCount : 0);
    const uint32_t value = request->state != nullptr ? request->state->field.value : 0;
    host::reportSink->DecodedField({host::TextView(label), host::TextView(text), fieldId,
                                    firstSegment, bitOrderGroup, fieldSegments, value, zero,
                                    request});
  }
  request->textRecordIndex = (request->textRecordIndex + 1) % host::kTextRecordCount;
  return 1;
}

int32_t pu_AddFieldsToDisplayData(rnsap::DecodeRequest* /*request*/, const char* text,
                                  uint32_t displayId) {
  ++host::State().reportCount;
  if (host::reportSink != nullptr) host::reportSink->DisplayLine(host::TextView(text), displayId);
  return 1;
}

}  // extern "C"
