// The recording stand-in that tests, benchmarks and fuzz targets inspect: a
// report sink over the host runtime that keeps every field report and display
// line the module makes, installed from the start.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "hostrt/host_runtime.h"

namespace rnsap::host {

// Bytes of a TextRecord that the module marks before each field report.
inline constexpr uint32_t kMarkedTextRecordBytes = 3;

struct DecodedFieldReport {
  std::string label;
  std::string text;
  uint32_t fieldId = 0;
  uint32_t firstSegment = 0;
  uint32_t bitOrderGroup = 0;
  uint32_t zero = 0;
  uint32_t value = 0;  // the field record's number at the report
  std::vector<BitSegment> segments;
  uint32_t textRecordIndex = 0;  // the record the module marked for this field
  std::array<uint8_t, kMarkedTextRecordBytes> textRecordBytes{};
};

struct DisplayLine {
  std::string text;
  uint32_t displayId = 0;
};

// Whether reports are kept for reading back (the recorder is the runtime's
// sink), or only counted by the runtime (so that a benchmark reads the
// module's own cost apart from the recorder's). Resets leave it.
enum class ReportMode { kRecord, kCount };
void SetReportMode(ReportMode mode);

const std::vector<DecodedFieldReport>& DecodedFields();
const std::vector<DisplayLine>& DisplayLines();

// Clears the records, and the runtime's counters as ResetParserUtilities does.
void ResetRecorder();

inline void ResetHost() {
  ResetRecorder();
  ResetOptSupport();
}

}  // namespace rnsap::host
