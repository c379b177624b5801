// Runs the four passes over every message of a generated corpus and over
// deterministic mutations of each (bit flips, truncations, random octets) and
// prints one line per message: each pass's result, position, bits left, flags
// and verdict, a hash of the record and texts it left behind, and a hash of
// everything it reported. Built in the native and
// the 32-bit tree, the two outputs must be the same line for line.
//
// Usage: pass_digest <generated_messages.txt>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "tests/stand_in/recorder.h"
#include "hostrt/setup.h"
#include "tests/support/generated_corpus.h"
#include "tests/support/record_snapshot.h"

namespace {

using rnsap::DecodeState;
namespace host = rnsap::host;

// FNV-1a over the values fed to it, each as its little-endian bytes, so that
// the hash does not depend on the word size or the layout of a structure.
class Hash {
 public:
  Hash& Add(uint32_t value) {
    for (int shift = 0; shift < 32; shift += 8) AddByte(static_cast<uint8_t>(value >> shift));
    return *this;
  }
  Hash& Add(std::span<const uint8_t> bytes) {
    Add(static_cast<uint32_t>(bytes.size()));
    for (uint8_t byte : bytes) AddByte(byte);
    return *this;
  }
  Hash& Add(const std::string& text) {
    return Add(std::span(reinterpret_cast<const uint8_t*>(text.data()), text.size()));
  }
  uint64_t value() const { return value_; }

 private:
  void AddByte(uint8_t byte) { value_ = (value_ ^ byte) * 0x100000001b3u; }
  uint64_t value_ = 0xcbf29ce484222325u;
};

// The words of the state and request that a pass leaves.
std::string Outcome(uint32_t result, const DecodeState& state, uint32_t bitsLeftOut) {
  char text[80];
  std::snprintf(text, sizeof text, "r%u p%u b%u o%u f%x w%u", result, state.position,
                state.bitsLeft, bitsLeftOut, state.flags, state.width);
  return text;
}

// Field reports, display lines and closed layer rows; the fourth word of a
// segment is left out, as loops leave it as the array held it.
uint64_t ReportsHash(const host::HostDecodeContext& context) {
  Hash hash;
  for (const host::DecodedFieldReport& field : host::DecodedFields()) {
    hash.Add(field.fieldId).Add(field.label).Add(field.text).Add(field.firstSegment);
    hash.Add(field.bitOrderGroup).Add(field.zero).Add(field.textRecordIndex);
    hash.Add(field.textRecordBytes);
    for (const rnsap::BitSegment& segment : field.segments)
      hash.Add(segment.segmentValue).Add(segment.firstBit).Add(segment.lastBit);
  }
  for (const host::DisplayLine& line : host::DisplayLines())
    hash.Add(line.displayId).Add(line.text);
  for (const rnsap::LayerBoundary& row : context.closed_layer_rows())
    hash.Add(row.firstBit).Add(row.lastBit).Add(row.layerValue).Add(row.tag);
  return hash.value();
}

// A hash of what a pass left in the record, its texts and arrays.
std::string RecordHash(const DecodeState& state) {
  const uint64_t hash = Hash().Add(rnsap::testing::RecordSnapshot(state)).value();
  char text[24];
  std::snprintf(text, sizeof text, " s%016llx", static_cast<unsigned long long>(hash));
  return text;
}

std::string DigestOf(host::HostDecodeContext& context, std::span<const uint8_t> message,
                     uint32_t bits) {
  context.LoadMessage(message, bits);
  host::ResetHost();
  std::string line;
  for (auto pass : {vex_PreDecodeMV, vex_PreDecodeMD, vex_PreDecodeTO}) {
    context.Rewind();
    rnsap::testing::FillRecord(context.state());
    const uint32_t result = pass(&context.decode_request());
    line += Outcome(result, context.state(), context.decode_request().bitsLeftOut) + " v" +
            std::to_string(context.decode_request().verdict) + RecordHash(context.state()) + " | ";
  }
  char reports[32];
  std::snprintf(reports, sizeof reports, "h%016llx | ",
                static_cast<unsigned long long>(ReportsHash(context)));
  line += reports;

  context.Rewind();
  rnsap::testing::FillRecord(context.state());
  const int32_t keys = KFE_vorel_rnsap_04b(&context.key_request());
  const uint16_t keyEnd = context.key_request().keyOffset;
  const uint64_t keyHash = Hash().Add(context.key_buffer().first(keyEnd)).value();
  char keyText[40];
  std::snprintf(keyText, sizeof keyText, " k%016llx", static_cast<unsigned long long>(keyHash));
  return line +
         Outcome(static_cast<uint32_t>(keys), context.state(), context.key_request().bitsLeftOut) +
         RecordHash(context.state()) + keyText;
}

// xorshift32: the same numbers on every platform.
class Random {
 public:
  explicit Random(uint32_t seed) : state_(seed * 2654435761u + 1) {}
  uint32_t Below(uint32_t bound) { return bound == 0 ? 0 : Next() % bound; }

 private:
  uint32_t Next() {
    state_ ^= state_ << 13;
    state_ ^= state_ >> 17;
    state_ ^= state_ << 5;
    return state_;
  }
  uint32_t state_;
};

struct Mutant {
  const char* kind;
  std::vector<uint8_t> octets;
  uint32_t bits;
};

constexpr int kBitFlips = 3;
constexpr int kTruncations = 2;
constexpr int kOctetRuns = 2;
constexpr uint32_t kLongestOctetRun = 4;

std::vector<Mutant> MutantsOf(const std::vector<uint8_t>& message, uint32_t index) {
  Random random(index);
  const uint32_t bits = static_cast<uint32_t>(8 * message.size());
  std::vector<Mutant> mutants{{"generated", message, bits}};
  for (int i = 0; i < kBitFlips && bits > 0; ++i) {
    Mutant& flipped = mutants.emplace_back(Mutant{"flip", message, bits});
    const uint32_t bit = random.Below(bits);
    flipped.octets[bit / 8] ^= static_cast<uint8_t>(0x80 >> bit % 8);
  }
  for (int i = 0; i < kTruncations; ++i) mutants.push_back({"cut", message, random.Below(bits)});
  for (int i = 0; i < kOctetRuns && !message.empty(); ++i) {
    Mutant& overwritten = mutants.emplace_back(Mutant{"octets", message, bits});
    uint32_t at = random.Below(static_cast<uint32_t>(message.size()));
    for (uint32_t n = 1 + random.Below(kLongestOctetRun); n > 0 && at < message.size(); --n)
      overwritten.octets[at++] = static_cast<uint8_t>(random.Below(256));
  }
  return mutants;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: %s <generated_messages.txt>\n", argv[0]);
    return 2;
  }
  const std::vector<std::vector<uint8_t>> messages = rnsap::testing::ReadGeneratedMessages(argv[1]);
  if (messages.empty()) {
    std::fprintf(stderr, "no messages in %s\n", argv[1]);
    return 1;
  }
  host::HostDecodeContext context;
  if (!context.ready()) return 1;
  for (uint32_t index = 0; index < messages.size(); ++index) {
    for (const Mutant& mutant : MutantsOf(messages[index], index)) {
      std::printf("%u %s %u: %s\n", index, mutant.kind, mutant.bits,
                  DigestOf(context, mutant.octets, mutant.bits).c_str());
    }
  }
  return 0;
}
