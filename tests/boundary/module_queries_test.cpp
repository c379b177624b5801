#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstring>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "boundary/identity.h"
#include "boundary/module_api.h"
#include "tables/descriptor_formats.h"

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
  const char* const texts[kIdentityWordCount] = {"Vorel",
                                                 "RNSAP",
                                                 "Vorel RNSAP 04B V3.0.0(IP)",
                                                 "Version 3.0.0 (IP) (Feb 2005)",
                                                 "UMTS",
                                                 "",
                                                 "",
                                                 "vorel_rnsap_04B.csf",
                                                 "",
                                                 "Release VEXTOOLS_A.02.20",
                                                 "Release VEXTOOLS_A.02.20",
                                                 "143",
                                                 "SSN",
                                                 "Vorel UTRAN Iu Interface TS_RID007",
                                                 "",
                                                 "",
                                                 nullptr,
                                                 nullptr,
                                                 nullptr,
                                                 "RNSAP",
                                                 "vorel_rnsap_04B.csf"};
  const std::map<size_t, uintptr_t> numbers = {{16, 0},      {17, 6}, {18, 4}, {21, 0},
                                               {22, 0xfffe}, {23, 0}, {24, 0}};
  const auto* words = static_cast<const IdentityWord*>(Entry(vex_DLLGetTable, 2));
  for (size_t word = 0; word < kIdentityWordCount; ++word) {
    if (numbers.contains(word)) {
      EXPECT_EQ(words[word].number, numbers.at(word)) << "word " << word;
    } else {
      ASSERT_NE(words[word].text, nullptr) << "word " << word;
      EXPECT_STREQ(words[word].text, texts[word]) << "word " << word;
    }
  }
}

}  // namespace
}  // namespace rnsap
