// The Display pass: every field as a bare value text under its display id.
#include "boundary/module_api.h"
#include "contract/host_services.h"
#include "engine/message_walk.h"
#include "passes/field_text.h"
#include "passes/layer_boundary.h"

namespace rnsap {
namespace {

// The pass's own text buffer, overwritten by each field.
char outputText[256];

struct DisplaySink : UncheckedSink {
  DecodeRequest& request;

  // Kept out of line, so that the rules' frames stay small.
  [[gnu::noinline]] uint32_t OnField(DecodeState& s, const grammar::FieldInfo& info) {
    TextBuffer output(outputText, sizeof outputText);
    RenderValue(info.displayForm, info.displayNames, info.separator, s.field, output);
    pu_AddFieldsToDisplayData(&request, outputText, info.displayId);
    return 1;
  }
};

PassState displayPass;

}  // namespace
}  // namespace rnsap

uint32_t vex_PreDecodeTO(rnsap::DecodeRequest* request) {
  rnsap::DisplaySink sink{{}, *request};
  return rnsap::RunReportingPass(*request, sink, rnsap::displayPass);
}
