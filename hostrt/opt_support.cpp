// The host runtime's kf_OptSupport library. It lays out a
// key buffer for whatever key-field table it is given: one presence bit per
// row packed into bytes at the start, then a 4-byte value slot per row, which
// holds a one-octet, two-octet or variable key alike. Its result is a knob.
#include "contract/host_services.h"
#include "hostrt/host_runtime.h"

namespace rnsap::host {
namespace {

struct OptSupportState {
  int32_t result = 1;
  uint16_t markRow = 0;
  uint32_t calls = 0;
  uint32_t lastLayoutSize = 0;
  std::span<const KeyFieldRow> lastTable;
};

OptSupportState& State() {
  static OptSupportState state;
  return state;
}

uint32_t PresenceBytes(uint32_t rows) { return (rows + 7) / 8; }

void LayOutKeyTable(KeyFieldRow* table, uint32_t rows) {
  for (uint32_t row = 0; row < rows; ++row) {
    table[row].presenceOffset = row / 8;
    table[row].presenceMask = 1u << (row % 8);
    table[row].valueOffset = PresenceBytes(rows) + row * kKeySlotBytes;
  }
}

}  // namespace

uint32_t KeyLayoutSize(uint32_t rows) { return PresenceBytes(rows) + rows * kKeySlotBytes; }

uint32_t LastKeyLayoutSize() { return State().lastLayoutSize; }

std::span<const KeyFieldRow> LastKeyTable() { return State().lastTable; }

uint32_t InitialiseOptKfeCalls() { return State().calls; }

void SetInitialiseResult(int32_t result, uint16_t markRow) {
  State().result = result;
  State().markRow = markRow;
}

void ResetOptSupport() { State() = OptSupportState{}; }

}  // namespace rnsap::host

namespace host = rnsap::host;

// Returns -1 for a table it cannot lay out, otherwise the chosen result.
extern "C" int32_t kf_InitialiseOptKFE(void* table, uint32_t rows, uint16_t* markRow) {
  host::OptSupportState& state = host::State();
  ++state.calls;
  if (table == nullptr || rows > host::kMaxKeyRows) return -1;
  auto* keyTable = static_cast<rnsap::KeyFieldRow*>(table);
  host::LayOutKeyTable(keyTable, rows);
  state.lastLayoutSize = host::KeyLayoutSize(rows);
  state.lastTable = {keyTable, rows};
  if (state.result > 1 && markRow != nullptr) *markRow = state.markRow;
  return state.result;
}
