#include "python/native/decoded_message.h"

#include <utility>

#include "python/native/shared_decoder.h"

namespace rnsap::python {
namespace {

// Keeps each report of a pass in the message.
class MessageCollector final : public cli::MessagePrinter {
 public:
  MessageCollector(DecodedMessage& message, const cli::FieldDictionary& dictionary)
      : message_(message), dictionary_(dictionary) {}

  void Begin(const cli::MessageHead& /*head*/) override {}
  void Header(const cli::MessageFacts& /*facts*/) override {}
  void DecodedField(const host::DecodedFieldView& field) override {
    const size_t depth = cli::LeadingBlanks(field.label).size();
    message_.fields.push_back({field.fieldId,
                               std::string(field.label.substr(depth)),
                               static_cast<uint32_t>(depth),
                               std::string(field.text),
                               cli::FieldNumber(field, dictionary_),
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
  const cli::FieldDictionary& dictionary_;
};

}  // namespace

DecodedMessage DecodeMessage(cli::Pass pass, std::vector<uint8_t> octets) {
  DecodedMessage message;
  message.pass = pass;
  message.octets = std::move(octets);
  MessageCollector collector(message, Dictionary());
  message.summary = Decode(pass, message.octets, collector);
  return message;
}

}  // namespace rnsap::python
