#include "tests/stand_in/recorder.h"

#include <algorithm>

namespace rnsap::host {
namespace {

// The bytes the module marked in the record at textRecordIndex, if the array has that record.
std::array<uint8_t, kMarkedTextRecordBytes> MarkedTextRecordBytes(const DecodeRequest& request) {
  std::array<uint8_t, kMarkedTextRecordBytes> bytes{};
  if (request.textRecords != nullptr && request.textRecordIndex < kTextRecordCount) {
    std::copy_n(request.textRecords[request.textRecordIndex].bytes, bytes.size(), bytes.begin());
  }
  return bytes;
}

class Recorder final : public ReportSink {
 public:
  Recorder() { SetReportSink(this); }

  void DecodedField(const DecodedFieldView& field) override {
    decodedFields.push_back({.label = std::string(field.label),
                             .text = std::string(field.text),
                             .fieldId = field.fieldId,
                             .firstSegment = field.firstSegment,
                             .bitOrderGroup = field.bitOrderGroup,
                             .zero = field.zero,
                             .value = field.value,
                             .segments = {field.segments.begin(), field.segments.end()},
                             .textRecordIndex = field.request->textRecordIndex,
                             .textRecordBytes = MarkedTextRecordBytes(*field.request)});
  }

  void DisplayLine(std::string_view text, uint32_t displayId) override {
    displayLines.push_back({std::string(text), displayId});
  }

  std::vector<DecodedFieldReport> decodedFields;
  std::vector<host::DisplayLine> displayLines;
};

Recorder& TheRecorder() {
  static Recorder recorder;
  return recorder;
}

// Recording from the start, before any test touches the recorder.
[[maybe_unused]] const Recorder& installed = TheRecorder();

}  // namespace

void SetReportMode(ReportMode mode) {
  SetReportSink(mode == ReportMode::kRecord ? &TheRecorder() : nullptr);
}

const std::vector<DecodedFieldReport>& DecodedFields() { return TheRecorder().decodedFields; }

const std::vector<DisplayLine>& DisplayLines() { return TheRecorder().displayLines; }

void ResetRecorder() {
  TheRecorder().decodedFields.clear();
  TheRecorder().displayLines.clear();
  ResetParserUtilities();
}

}  // namespace rnsap::host
