// The Decoded-field pass: every field with its bit runs, label, id and a
// ready text of the form label, '=', value.
#include "boundary/module_api.h"
#include "contract/host_services.h"
#include "engine/message_walk.h"
#include "passes/field_text.h"
#include "passes/layer_boundary.h"

namespace rnsap {
namespace {

uint32_t FirstSegment(grammar::FirstSegment rule, const FieldRecord& record) {
  switch (rule) {
    case grammar::FirstSegment::kLast:  // a backward loop; 0xffffffff when it read nothing
      return record.readCount - 1;
    case grammar::FirstSegment::kSecond:
      return 1;
    case grammar::FirstSegment::kFirst:
      break;
  }
  return 0;
}

// The pass's own text buffer, overwritten by each field.
char outputText[256];

struct DecodedFieldSink : UncheckedSink {
  DecodeRequest& request;
  const BitOrderStack& bitOrder;

  // Kept out of line, so that the rules' frames stay small.
  [[gnu::noinline]] uint32_t OnField(DecodeState& s, const grammar::FieldInfo& info) {
    const FieldRecord& record = s.field;
    uint8_t* marks = request.textRecords[request.textRecordIndex].bytes;
    marks[0] = request.tag;
    marks[1] = 0;
    if (&info != &grammar::kFields[grammar::kSpareField]) marks[2] = 0;  // Spare marks two

    TextBuffer output(outputText, sizeof outputText);
    if (info.form != grammar::ValueForm::kEmpty) {
      output.Append(info.prefix, info.prefixLength);
      RenderValue(info.form, info.names, info.separator, record, output);
    }
    pu_AddDecodedFieldsData(&request, record.segmentCount, record.segments, outputText,
                            FirstSegment(info.firstSegment, record), record.label, record.fieldId,
                            0, bitOrder.TopGroupBits());
    return 1;
  }
};

PassState decodedFieldPass;

}  // namespace
}  // namespace rnsap

uint32_t vex_PreDecodeMD(rnsap::DecodeRequest* request) {
  rnsap::DecodedFieldSink sink{{}, *request, rnsap::decodedFieldPass.bitOrder};
  return rnsap::RunReportingPass(*request, sink, rnsap::decodedFieldPass);
}
