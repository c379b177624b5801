#include "python/native/decoded_message.h"

#include <utility>

#include "python/native/shared_decoder.h"

namespace rnsap::python {
namespace {

// Keeps each report of a pass in the message.
class MessageCollector final : public cli::MessagePrinter {
 public:
  explicit MessageCollector(DecodedMessage& message) : message_(message) {}

  void Begin(const cli::MessageHead& /*head*/) override {}
  void DecodedField(const host::DecodedFieldView& field) override {
    message_.fields.push_back({field.fieldId,
                               std::string(field.label),
                               std::string(field.text),
                               {field.segments.begin(), field.segments.end()},
                               field.firstSegment,
                               field.bitOrderGroup});
  }
  void DisplayLine(std::string_view text, uint32_t displayId) override {
    message_.lines.push_back({displayId, std::string(text)});
  }
  void Key(const cli::KeyValue& key) override { message_.keys.push_back(key); }
  void End(const cli::MessageSummary& /*summary*/) override {}
  void Capture(std::string_view /*path*/, const cli::CaptureCounts& /*counts*/) override {}

 private:
  DecodedMessage& message_;
};

}  // namespace

DecodedMessage DecodeMessage(cli::Pass pass, std::vector<uint8_t> octets) {
  DecodedMessage message;
  message.pass = pass;
  message.octets = std::move(octets);
  MessageCollector collector(message);
  message.summary = Decode(pass, message.octets, collector);
  return message;
}

}  // namespace rnsap::python
