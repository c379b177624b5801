// What the host reads through the module's exports besides the passes: the
// entries of its two queries, the identity block, the two prototype blocks
// that it links, and the date converter. Expected texts and words are in
// expected_blocks.txt.
#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <map>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "boundary/identity.h"
#include "boundary/module_api.h"
#include "tests/support/facts.h"

namespace rnsap {
namespace {

using Query = uint32_t (*)(int32_t, const void**);

const void* Entry(Query query, int32_t index) {
  const void* out = nullptr;
  EXPECT_EQ(query(index, &out), 0u) << "index " << index;
  EXPECT_NE(out, nullptr) << "index " << index;
  return out;
}

TEST(ModuleQueriesTest, ListedIndicesHaveEntriesAndOthersFailClearingTheOutput) {
  const std::pair<Query, std::vector<int32_t>> queries[] = {
      {vex_DLLGetPtr, {1, 2, 4, 5}}, {vex_DLLGetTable, {1, 2, 4, 5, 6, 7, 8, 9}}};
  for (const auto& [query, listed] : queries) {
    for (int32_t index : {INT32_MIN, -1, 0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, INT32_MAX}) {
      if (std::find(listed.begin(), listed.end(), index) != listed.end()) {
        Entry(query, index);
        continue;
      }
      int marker = 0;
      const void* out = &marker;
      EXPECT_EQ(query(index, &out), kQueryNoEntry) << "index " << index;
      EXPECT_EQ(out, nullptr) << "index " << index;
    }
  }
}

TEST(ModuleQueriesTest, EntriesLieWhereTheHostLooksForThem) {
  const void* version = Entry(vex_DLLGetPtr, 1);
  EXPECT_EQ(Entry(vex_DLLGetTable, 1), version);
  EXPECT_STREQ(static_cast<const char*>(version), "NJ1.02.01");

  const auto* header = static_cast<const uintptr_t*>(Entry(vex_DLLGetPtr, 2));
  EXPECT_EQ(std::vector<uintptr_t>(header, header + 4), (std::vector<uintptr_t>{7, 0, 0, 0}));
  EXPECT_EQ(Entry(vex_DLLGetTable, 2), static_cast<const void*>(header + kHeaderWordCount))
      << "the identity block follows the header record";

  const auto* first = static_cast<const uint8_t*>(Entry(vex_DLLGetPtr, 4));
  const auto* second = static_cast<const uint8_t*>(Entry(vex_DLLGetPtr, 5));
  EXPECT_EQ(second, first + 124);
  EXPECT_EQ(Entry(vex_DLLGetTable, 5), static_cast<const void*>(second + 16));
}

TEST(ModuleQueriesTest, IdentityBlockNamesTheDecoder) {
  const auto* words = static_cast<const IdentityWord*>(Entry(vex_DLLGetTable, 2));
  const std::vector<testing::Fact> expected = testing::ReadFacts(RNSAP_EXPECTED_BLOCKS)["identity"];
  ASSERT_EQ(expected.size(), kIdentityWordCount);
  for (const testing::Fact& word : expected) {
    const IdentityWord& got = words[testing::Number(word[1])];
    if (!word[2].starts_with('"')) {
      EXPECT_EQ(got.number, testing::Number(word[2])) << "word " << word[1];
    } else {
      ASSERT_NE(got.text, nullptr) << "word " << word[1];
      EXPECT_EQ(got.text, word[2].substr(1, word[2].size() - 2)) << "word " << word[1];
    }
  }
}

// A prototype block as the host gets it through vex_DLLGetPtr: words little-endian.
struct Block {
  explicit Block(const std::string& pointerIndex)
      : bytes(static_cast<const uint8_t*>(Entry(vex_DLLGetPtr, std::stoi(pointerIndex)))) {}
  uint32_t Word(uint32_t at) const {
    return bytes[at] | bytes[at + 1] << 8 | bytes[at + 2] << 16 |
           static_cast<uint32_t>(bytes[at + 3]) << 24;
  }
  const uint8_t* bytes;
};

TEST(PrototypeRecordsTest, WordsTextsOctetsAndFixups) {
  const testing::Facts facts = testing::ReadFacts(RNSAP_EXPECTED_BLOCKS);
  for (const std::string kind : {"word", "text", "bytes"}) {
    for (const testing::Fact& f : facts.at(kind)) {
      SCOPED_TRACE(kind + " at " + f[2] + " of block " + f[1]);
      const Block block(f[1]);
      EXPECT_EQ(reinterpret_cast<uintptr_t>(block.bytes) % 4, 0u) << "word-aligned";
      uint32_t at = testing::Number(f[2]);
      if (kind == "word") {
        EXPECT_EQ(block.Word(at), testing::Number(f[3]));
      } else if (kind == "text") {
        EXPECT_EQ('"' + std::string(reinterpret_cast<const char*>(block.bytes + at)) + '"', f[3]);
      } else {
        std::istringstream hex(f[3]);
        for (std::string octet; hex >> octet; ++at)
          EXPECT_EQ(block.bytes[at], std::stoul(octet, nullptr, 16));
      }
    }
  }
  // The fixup list runs from the offset in word 8 to the size in word 4; each
  // pointer field it names holds a filler until the host links it.
  std::map<std::string, std::vector<std::pair<uint32_t, uint32_t>>> expected;
  for (const testing::Fact& f : facts.at("fixup"))
    expected[f[1]].emplace_back(testing::Number(f[2]), testing::Number(f[3]));
  for (const auto& [index, fixups] : expected) {
    const Block block(index);
    std::vector<std::pair<uint32_t, uint32_t>> listed;
    for (uint32_t at = block.Word(8); at + 8 <= block.Word(4); at += 8)
      listed.emplace_back(block.Word(at), block.Word(at + 4));
    EXPECT_EQ(listed, fixups) << "block " << index;
    for (const auto& [field, target] : fixups) {
      const bool text = index == "4" && field == 44;
      EXPECT_EQ(block.Word(field), text ? 0x4B4B4B4Bu : 0xA5A5A5A5u) << field;
    }
  }
}

// The UTC time of the field value, a signed count of seconds, behind "T=".
TEST(DateConvTest, AppendsTheUtcTimeOfTheFieldValue) {
  const std::pair<uint32_t, const char*> cases[] = {
      {0, "T=1970-01-01 00:00:00"},
      {86399, "T=1970-01-01 23:59:59"},
      {951782400, "T=2000-02-29 00:00:00"},
      {0x7FFFFFFF, "T=2038-01-19 03:14:07"},
      {0xFFFFFFFF, "T=1969-12-31 23:59:59"},
      {static_cast<uint32_t>(-31536000), "T=1969-01-01 00:00:00"},
      {0x80000000, "T=1901-12-13 20:45:52"}};
  for (const auto& [value, text] : cases) {
    DecodeState state{};
    state.field.value = value;
    char destination[64] = "T=";
    EXPECT_EQ(date_conv(destination, nullptr, &state), destination);
    EXPECT_STREQ(destination, text);
  }
}

}  // namespace
}  // namespace rnsap
