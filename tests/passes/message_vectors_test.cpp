// Runs every message vector of tests/vectors through all four passes: the
// Decoded-field pass must report exactly the listed fields, with their marks
// in the text records, the Display pass their value texts, and every pass
// must walk to the listed end and close its layer row there.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iomanip>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"

namespace rnsap {
namespace {

using testing::BitRange;

constexpr uint32_t kSpare = 682;
constexpr uint8_t kTag = 0xA7;
constexpr uint8_t kUntouched = 0xEE;
constexpr uint32_t kLayerValue = 0x12345678;

struct ExpectedField {
  uint32_t fieldId = 0;
  std::string bits;  // "first-last" over all segments
  std::string text;
  uint32_t firstSegment = 0;
  std::string shows;  // the Display pass's text
};

// What the Validation pass leaves: position, bitsLeftOut, flags, verdict, and
// passflags, the flags of the other passes, which make no count check behind
// loops, where they differ.
using Summary = std::map<std::string, long>;

// A key the Key-field pass must leave: a fixed slot's leading bytes
// (little-endian), or a variable slot's bit count and the octets it points
// at; `absent` where the row's presence bit stays clear.
struct ExpectedKey {
  uint32_t row = 0;
  bool present = true;
  std::vector<uint8_t> slot;
  long bits = -1;  // a variable slot
  long at = -1;    // where its octets lie behind the first key offset
  std::vector<uint8_t> octets;
};

struct Vector {
  std::string where;
  std::vector<uint8_t> message;
  std::vector<ExpectedField> fields;
  Summary summary;
  std::vector<ExpectedKey> keys;
};

// `ID FIRST-LAST "TEXT" [first N] [shows "TEXT"]`: the Display pass shows the
// value part of the text unless the line says otherwise.
ExpectedField ParseField(std::istringstream& in) {
  ExpectedField f;
  in >> f.fieldId >> f.bits >> std::quoted(f.text);
  const size_t eq = f.text.find('=');
  f.shows = eq == std::string::npos ? "<no value part>" : f.text.substr(eq + 1);
  std::string option;
  while (in >> option) {
    if (option == "first") {
      in >> f.firstSegment;
    } else if (option == "shows") {
      in >> std::quoted(f.shows);
    } else {
      ADD_FAILURE() << "unknown option " << option;
    }
  }
  return f;
}

// `ROW absent`, `ROW HEX` or `ROW bits=B at=A octets=HEX`.
ExpectedKey ParseKey(std::istringstream& in) {
  ExpectedKey k;
  in >> k.row;
  for (std::string item; in >> item;) {
    const std::string value = item.substr(item.find('=') + 1);
    if (item == "absent")
      k.present = false;
    else if (item.starts_with("bits="))
      k.bits = std::stol(value);
    else if (item.starts_with("at="))
      k.at = std::stol(value);
    else if (item.starts_with("octets="))
      k.octets = testing::HexOctets(value);
    else
      k.slot = testing::HexOctets(item);
  }
  return k;
}

Summary ParseSummary(std::istringstream& in) {
  Summary s;
  std::string item;
  while (in >> item) s[item.substr(0, item.find('='))] = std::stol(item.substr(item.find('=') + 1));
  if (!s.contains("passflags")) s["passflags"] = s["flags"];
  return s;
}

std::vector<Vector> LoadVectors(const std::filesystem::path& file) {
  std::vector<Vector> vectors;
  std::ifstream in(file);
  std::string line;
  for (int number = 1; std::getline(in, line); ++number) {
    std::istringstream words(line);
    std::string keyword;
    if (!(words >> keyword) || keyword[0] == '#') continue;
    if (keyword == "message") {
      std::string hex;
      std::getline(words, hex);
      vectors.emplace_back().message = testing::HexOctets(hex);
      vectors.back().where = file.filename().string() + ":" + std::to_string(number);
    } else if (keyword == "field") {
      vectors.back().fields.push_back(ParseField(words));
    } else if (keyword == "key") {
      vectors.back().keys.push_back(ParseKey(words));
    } else if (keyword == "summary") {
      vectors.back().summary = ParseSummary(words);
    } else {
      ADD_FAILURE() << file << ":" << number << ": unknown line " << keyword;
    }
  }
  return vectors;
}

class MessageVectorTest : public ::testing::Test {
 protected:
  void Run(const Vector& v) {
    SCOPED_TRACE(v.where);
    host::HostDecodeContext context;
    context.LoadMessage(v.message);
    DecodeRequest& request = context.decode_request();
    ASSERT_TRUE(vex_PreDecodeMV(&request));
    EXPECT_EQ(request.verdict, v.summary.at("verdict"));
    ExpectEnd(context, v, request.bitsLeftOut, v.summary.at("flags"));

    for (const auto pass : {vex_PreDecodeMD, vex_PreDecodeTO}) {
      StartReportingPass(context);
      ASSERT_TRUE(pass(&request));
      ExpectEnd(context, v, request.bitsLeftOut, v.summary.at("passflags"));
      ExpectClosedLayerRow(context, v.summary.at("position"));
      if (pass == vex_PreDecodeMD) ExpectDecodedFields(v.fields);
    }
    const auto& lines = host::DisplayLines();
    ASSERT_EQ(lines.size(), v.fields.size());
    for (size_t i = 0; i < lines.size(); ++i) EXPECT_EQ(lines[i].text, v.fields[i].shows) << i;

    context.Rewind();
    const uint16_t firstKeyOffset = context.key_request().keyOffset;
    ASSERT_EQ(KFE_vorel_rnsap_04b(&context.key_request()), 1);
    ExpectEnd(context, v, context.key_request().bitsLeftOut, v.summary.at("passflags"));
    for (const ExpectedKey& k : v.keys) ExpectKey(context.key_request(), k, firstKeyOffset);
  }

  static void ExpectKey(const KeyFieldRequest& request, const ExpectedKey& k,
                        uint16_t firstKeyOffset) {
    SCOPED_TRACE("key row " + std::to_string(k.row));
    ASSERT_LT(k.row, host::LastKeyTable().size());
    const KeyFieldRow& row = host::LastKeyTable()[k.row];
    const uint8_t* buffer = request.keyBuffer;
    EXPECT_EQ((buffer[row.presenceOffset] & row.presenceMask) != 0, k.present);
    const uint8_t* slot = buffer + row.valueOffset;
    EXPECT_EQ(std::vector<uint8_t>(slot, slot + k.slot.size()), k.slot);
    if (k.bits < 0) return;
    EXPECT_EQ(slot[0] | slot[1] << 8, k.bits);
    const uint32_t offset = slot[2] | slot[3] << 8;
    EXPECT_EQ(offset, firstKeyOffset + k.at);
    EXPECT_EQ(request.keyOffset, offset + k.octets.size()) << "the last key octets";
    const uint8_t* octets = buffer + offset;
    EXPECT_EQ(std::vector<uint8_t>(octets, octets + k.octets.size()), k.octets);
  }

  static void StartReportingPass(host::HostDecodeContext& context) {
    host::ResetRecorder();
    context.Rewind();
    DecodeRequest& request = context.decode_request();
    for (uint32_t i = 0; i < host::kTextRecordCount; ++i)
      std::memset(request.textRecords[i].bytes, kUntouched, kTextRecordSize);
    request.tag = kTag;
    request.layerValue = kLayerValue;
  }

  static void ExpectEnd(host::HostDecodeContext& context, const Vector& v, uint32_t bitsLeftOut,
                        long flags) {
    const DecodeState& state = context.state();
    EXPECT_EQ(state.position, static_cast<uint32_t>(v.summary.at("position")));
    EXPECT_EQ(bitsLeftOut, static_cast<uint32_t>(v.summary.at("bitsLeftOut")));
    EXPECT_EQ(state.flags, static_cast<uint32_t>(flags));
    EXPECT_EQ(state.stackTop, state.stackBase);
    EXPECT_TRUE(std::equal(v.message.begin(), v.message.end(), state.buffer));
  }

  static void ExpectClosedLayerRow(host::HostDecodeContext& context, long position) {
    const DecodeRequest& request = context.decode_request();
    ASSERT_EQ(request.layerRowIndex, 1u);
    const LayerBoundary& row = request.layerRows[0];
    EXPECT_EQ(row.firstBit, 1u);
    EXPECT_EQ(row.lastBit, static_cast<uint32_t>(position - 1));
    EXPECT_EQ(row.layerValue, kLayerValue);
    EXPECT_EQ(row.tag, kTag);
  }

  static void ExpectDecodedFields(const std::vector<ExpectedField>& fields) {
    const auto& reports = host::DecodedFields();
    ASSERT_EQ(reports.size(), fields.size());
    std::array<uint8_t, host::kTextRecordCount> thirdBytes;
    thirdBytes.fill(kUntouched);
    for (size_t i = 0; i < reports.size(); ++i) {
      SCOPED_TRACE("field " + std::to_string(i));
      const host::DecodedFieldReport& report = reports[i];
      EXPECT_EQ(report.fieldId, fields[i].fieldId);
      EXPECT_EQ(BitRange(report.segments), fields[i].bits);
      EXPECT_EQ(report.text, fields[i].text);
      EXPECT_EQ(report.firstSegment, fields[i].firstSegment);
      EXPECT_EQ(report.bitOrderGroup, 8u);
      EXPECT_EQ(report.zero, 0u);
      // Spare marks two bytes: the third keeps what the record held.
      const uint32_t record = i % host::kTextRecordCount;
      if (report.fieldId != kSpare) thirdBytes[record] = 0;
      EXPECT_EQ(report.textRecordIndex, record);
      EXPECT_EQ(report.textRecordBytes, (std::array<uint8_t, 3>{kTag, 0, thirdBytes[record]}));
    }
  }
};

TEST_F(MessageVectorTest, EveryVectorDecodesAsListed) {
  size_t files = 0;
  for (const auto& entry : std::filesystem::directory_iterator(RNSAP_VECTOR_DIR)) {
    if (entry.path().extension() != ".vec") continue;
    const std::vector<Vector> vectors = LoadVectors(entry.path());
    EXPECT_FALSE(vectors.empty()) << entry.path();
    for (const Vector& v : vectors) Run(v);
    ++files;
  }
  EXPECT_EQ(files, 9u);
}

}  // namespace
}  // namespace rnsap
