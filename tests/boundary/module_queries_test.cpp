#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include "boundary/identity.h"
#include "boundary/module_api.h"
#include "tables/descriptor_formats.h"
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

  const auto* rows = static_cast<const tables::DictionaryRow*>(Entry(vex_DLLGetTable, 4));
  EXPECT_EQ(rows[0].fieldId, 684u);
  EXPECT_STREQ(rows[0].name, "PDU EXTENSION");
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

}  // namespace
}  // namespace rnsap
