// The digest lines (message_digest.h). A message's line holds each pass's
// result, position, bits left, flags and verdict, a hash of the record and
// texts it left behind, and a hash of everything it reported; the mutations
// are bit flips, truncations and random octets, the same on every platform.
#include "tests/robustness/message_digest.h"

#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "boundary/identity.h"
#include "boundary/module_api.h"
#include "hostrt/setup.h"
#include "tests/stand_in/recorder.h"
#include "tests/support/generated_corpus.h"
#include "tests/support/record_snapshot.h"
#include "tests/support/table_dump.h"

namespace rnsap::testing {
namespace {

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
  // The hash behind `tag`, in 16 hex digits.
  std::string Text(char tag) const {
    char text[24];
    std::snprintf(text, sizeof text, "%c%016llx", tag, static_cast<unsigned long long>(value_));
    return text;
  }

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
Hash ReportsHash(const host::HostDecodeContext& context) {
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
  return hash;
}

// A hash of what a pass left in the record, its texts and arrays.
std::string RecordHash(const DecodeState& state) {
  return ' ' + Hash().Add(RecordSnapshot(state)).Text('s');
}

std::string DigestOf(host::HostDecodeContext& context, std::span<const uint8_t> message,
                     uint32_t bits) {
  context.LoadMessage(message, bits);
  host::ResetHost();
  std::string line;
  for (auto pass : {vex_PreDecodeMV, vex_PreDecodeMD, vex_PreDecodeTO}) {
    context.Rewind();
    FillRecord(context.state());
    const uint32_t result = pass(&context.decode_request());
    line += Outcome(result, context.state(), context.decode_request().bitsLeftOut) + " v" +
            std::to_string(context.decode_request().verdict) + RecordHash(context.state()) + " | ";
  }
  line += ReportsHash(context).Text('h') + " | ";

  context.Rewind();
  FillRecord(context.state());
  const int32_t keys = KFE_vorel_rnsap_04b(&context.key_request());
  const uint16_t keyEnd = context.key_request().keyOffset;
  return line +
         Outcome(static_cast<uint32_t>(keys), context.state(), context.key_request().bitsLeftOut) +
         RecordHash(context.state()) + ' ' +
         Hash().Add(context.key_buffer().first(keyEnd)).Text('k');
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

// ---- queries and date_conv -------------------------------------------------

using Query = uint32_t (*)(int32_t, const void**);

// The numbers of the identity block are below this; its texts lie above it
// in any address space.
constexpr uintptr_t kLowestTextAddress = 0x10000;

Hash& AddText(Hash& hash, const char* text) {
  return text ? hash.Add(std::string(text)) : hash.Add(kAllOnes);
}

// Words of the header and identity block, a text word by its text.
void AddIdentityWords(Hash& hash, const uintptr_t* words, size_t count) {
  for (size_t i = 0; i < count; ++i) {
    if (words[i] < kLowestTextAddress)
      hash.Add(static_cast<uint32_t>(words[i]));
    else
      AddText(hash, reinterpret_cast<const char*>(words[i]));
  }
}

void AddLines(Hash& hash, const DumpLines& lines) {
  for (const std::string& line : lines) hash.Add(line);
}

void AddBytes(Hash& hash, const void* bytes, size_t size) {
  hash.Add(std::span(static_cast<const uint8_t*>(bytes), size));
}

constexpr size_t kFirstPrototypeBytes = 124, kSecondPrototypeBytes = 220, kHeadBytes = 16;

// The content of an entry, read as a host reads it: texts behind their
// pointers, tables to their end marks.
void AddPointerEntry(Hash& hash, int32_t index, const void* entry) {
  if (index == 1) AddText(hash, static_cast<const char*>(entry));
  if (index == 2)
    AddIdentityWords(hash, static_cast<const uintptr_t*>(entry),
                     kHeaderWordCount + kIdentityWordCount);
  if (index == 4) AddBytes(hash, entry, kFirstPrototypeBytes);
  if (index == 5) AddBytes(hash, entry, kSecondPrototypeBytes);
}

// The tables by their dumps, walked to their end marks.
void AddTableEntry(Hash& hash, int32_t index, const void* entry) {
  if (index == 1) AddText(hash, static_cast<const char*>(entry));
  if (index == 2) AddIdentityWords(hash, static_cast<const uintptr_t*>(entry), kIdentityWordCount);
  if (index == 4) AddLines(hash, DumpRows(static_cast<const HostRow*>(entry)));
  if (index == 5) AddBytes(hash, entry, kSecondPrototypeBytes - kHeadBytes);
  if (index == 6) AddLines(hash, DumpValues(static_cast<const HostValueRow*>(entry)));
  if (index == 7) {
    const auto* values = static_cast<const HostValueRow*>(HostTable(6));
    AddLines(hash, DumpPool(static_cast<const uint32_t*>(entry), PoolWords(values)));
  }
  if (index == 8) AddLines(hash, DumpStrings(static_cast<const char* const*>(entry)));
  if (index == 9) AddLines(hash, DumpLayout(static_cast<const uint8_t*>(entry)));
}

// One line per query and index: the status, whether the output word was
// cleared, and the hash of what it points to.
std::vector<std::string> QueryLines() {
  std::vector<std::string> lines;
  const std::pair<const char*, Query> queries[] = {{"pointer", vex_DLLGetPtr},
                                                   {"table", vex_DLLGetTable}};
  for (const auto& [name, query] : queries) {
    for (int32_t index : {INT32_MIN, -1, 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, INT32_MAX}) {
      int marker = 0;
      const void* entry = &marker;
      const uint32_t status = query(index, &entry);
      char line[64];
      Hash hash;
      if (entry) (query == vex_DLLGetPtr ? AddPointerEntry : AddTableEntry)(hash, index, entry);
      std::snprintf(line, sizeof line, "query %s %d: status %x, %s, ", name, index, status,
                    entry ? "entry" : "null");
      lines.push_back(line + hash.Text('h'));
    }
  }
  return lines;
}

// date_conv behind "T=" for times from 1970 on: the edges of a day and of a
// leap day, the last second a signed 32-bit count holds, and a spread between.
std::vector<std::string> DateLines() {
  std::vector<int32_t> times = {0,         1,         59,         86399,    86400,
                                951782400, 951868799, 1234567890, INT32_MAX};
  for (int32_t step = 1; step < 128; ++step) times.push_back(step * 0x01000000 + step * 4099);
  std::vector<std::string> lines;
  for (int32_t time : times)
    lines.push_back("date " + std::to_string(time) + ": " + DateText(time));
  return lines;
}

}  // namespace

std::string DateText(int32_t seconds) {
  DecodeState state{};
  state.field.value = static_cast<uint32_t>(seconds);
  char text[64] = "T=";
  return date_conv(text, nullptr, &state);
}

int DigestMessageText(std::string_view messageText, DigestLineSink sink) {
  const std::vector<std::vector<uint8_t>> messages = MessagesOfText(messageText);
  host::HostDecodeContext context;
  if (messages.empty() || !context.ready()) return 1;
  for (const std::string& line : QueryLines()) sink(line.c_str());
  for (const std::string& line : DateLines()) sink(line.c_str());
  for (uint32_t index = 0; index < messages.size(); ++index) {
    for (const Mutant& mutant : MutantsOf(messages[index], index)) {
      const std::string line = std::to_string(index) + ' ' + mutant.kind + ' ' +
                               std::to_string(mutant.bits) + ": " +
                               DigestOf(context, mutant.octets, mutant.bits);
      sink(line.c_str());
    }
  }
  return 0;
}

}  // namespace rnsap::testing
