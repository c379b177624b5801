// Runs every message vector of tests/vectors through all four passes: the
// Decoded-field pass must report exactly the listed fields, and every pass
// must walk to the same end.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"

namespace rnsap {
namespace {

struct ExpectedField {
  uint32_t fieldId;
  std::string bits;  // "first-last" over all segments
  std::string text;
};

struct Summary {
  uint32_t position = 0;
  uint32_t bitsLeftOut = 0;
  uint32_t flags = 0;
  int32_t verdict = 0;
  // Flags after the other passes, which make no count check behind loops.
  uint32_t passFlags = 0;
  bool passFlagsGiven = false;
};

struct Vector {
  std::string where;
  std::vector<uint8_t> message;
  std::vector<ExpectedField> fields;
  Summary summary;
};

std::vector<uint8_t> ParseHex(std::istringstream& in) {
  std::vector<uint8_t> bytes;
  std::string octet;
  while (in >> octet) bytes.push_back(static_cast<uint8_t>(std::stoul(octet, nullptr, 16)));
  return bytes;
}

ExpectedField ParseField(std::istringstream& in) {
  ExpectedField f;
  in >> f.fieldId >> f.bits;
  std::string rest;
  std::getline(in, rest);
  const size_t open = rest.find('"');
  const size_t close = rest.rfind('"');
  f.text = rest.substr(open + 1, close - open - 1);
  return f;
}

Summary ParseSummary(std::istringstream& in) {
  Summary s;
  std::string item;
  while (in >> item) {
    const size_t eq = item.find('=');
    const std::string key = item.substr(0, eq);
    const long value = std::stol(item.substr(eq + 1));
    if (key == "position") s.position = static_cast<uint32_t>(value);
    if (key == "bitsLeftOut") s.bitsLeftOut = static_cast<uint32_t>(value);
    if (key == "flags") s.flags = static_cast<uint32_t>(value);
    if (key == "verdict") s.verdict = static_cast<int32_t>(value);
    if (key == "passflags") {
      s.passFlags = static_cast<uint32_t>(value);
      s.passFlagsGiven = true;
    }
  }
  if (!s.passFlagsGiven) s.passFlags = s.flags;
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
      vectors.push_back(
          {file.filename().string() + ":" + std::to_string(number), ParseHex(words), {}, {}});
    } else if (keyword == "field") {
      vectors.back().fields.push_back(ParseField(words));
    } else if (keyword == "summary") {
      vectors.back().summary = ParseSummary(words);
    } else {
      ADD_FAILURE() << file << ":" << number << ": unknown line " << keyword;
    }
  }
  return vectors;
}

std::string BitRange(const std::vector<BitSegment>& segments) {
  if (segments.empty()) return "-";
  uint32_t first = segments[0].firstBit, last = segments[0].lastBit;
  for (const BitSegment& s : segments) {
    first = std::min(first, s.firstBit);
    last = std::max(last, s.lastBit);
  }
  return std::to_string(first) + "-" + std::to_string(last);
}

class MessageVectorTest : public ::testing::TestWithParam<std::string> {
 protected:
  void Run(const Vector& v) {
    SCOPED_TRACE(v.where);
    host::HostDecodeContext context;
    context.LoadMessage(v.message);
    ASSERT_TRUE(vex_PreDecodeMV(&context.decode_request()));
    Summary walked{context.state().position, context.decode_request().bitsLeftOut,
                   context.state().flags, context.decode_request().verdict};
    walked.passFlags = v.summary.passFlags;
    EXPECT_EQ(walked.position, v.summary.position);
    EXPECT_EQ(walked.bitsLeftOut, v.summary.bitsLeftOut);
    EXPECT_EQ(walked.flags, v.summary.flags);
    EXPECT_EQ(walked.verdict, v.summary.verdict);

    host::ResetHost();
    context.Rewind();
    ASSERT_TRUE(vex_PreDecodeMD(&context.decode_request()));
    ExpectSameEnd(context, walked);
    const auto& reports = host::DecodedFields();
    ASSERT_EQ(reports.size(), v.fields.size());
    for (size_t i = 0; i < reports.size(); ++i) {
      SCOPED_TRACE("field " + std::to_string(i));
      EXPECT_EQ(reports[i].fieldId, v.fields[i].fieldId);
      EXPECT_EQ(BitRange(reports[i].segments), v.fields[i].bits);
      EXPECT_EQ(reports[i].text, v.fields[i].text);
    }

    context.Rewind();
    ASSERT_TRUE(vex_PreDecodeTO(&context.decode_request()));
    ExpectSameEnd(context, walked);
    EXPECT_EQ(host::DisplayLines().size(), v.fields.size());

    context.Rewind();
    ASSERT_EQ(KFE_vorel_rnsap_04b(&context.key_request()), 1);
    EXPECT_EQ(context.state().position, walked.position);
    EXPECT_EQ(context.key_request().bitsLeftOut, walked.bitsLeftOut);
  }

  static void ExpectSameEnd(host::HostDecodeContext& context, const Summary& walked) {
    EXPECT_EQ(context.state().position, walked.position);
    EXPECT_EQ(context.decode_request().bitsLeftOut, walked.bitsLeftOut);
    EXPECT_EQ(context.state().flags, walked.passFlags);
  }
};

TEST_P(MessageVectorTest, DecodesAsListed) {
  const std::vector<Vector> vectors = LoadVectors(GetParam());
  ASSERT_FALSE(vectors.empty());
  for (const Vector& v : vectors) Run(v);
}

std::vector<std::string> VectorFiles() {
  std::vector<std::string> files;
  for (const auto& entry : std::filesystem::directory_iterator(RNSAP_VECTOR_DIR))
    if (entry.path().extension() == ".vec") files.push_back(entry.path().string());
  std::sort(files.begin(), files.end());
  return files;
}

INSTANTIATE_TEST_SUITE_P(Vectors, MessageVectorTest, ::testing::ValuesIn(VectorFiles()),
                         [](const ::testing::TestParamInfo<std::string>& info) {
                           return std::filesystem::path(info.param).stem().string();
                         });

}  // namespace
}  // namespace rnsap
