#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <string>

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

void ExpectNoEntry(Query query, int32_t index) {
  int marker = 0;
  const void* out = &marker;
  EXPECT_EQ(query(index, &out), kQueryNoEntry) << "index " << index;
  EXPECT_EQ(out, nullptr) << "index " << index;
}

TEST(ModuleQueriesTest, IndicesWithoutEntryFailAndClearTheOutput) {
  for (const int32_t index : {0, 3, 6, 7, -1, INT32_MIN, INT32_MAX}) {
    ExpectNoEntry(vex_DLLGetPtr, index);
  }
  for (const int32_t index : {0, 3, 10, 11, -1, INT32_MIN, INT32_MAX}) {
    ExpectNoEntry(vex_DLLGetTable, index);
  }
}

TEST(ModuleQueriesTest, EveryListedIndexHasAnEntry) {
  for (const int32_t index : {1, 2, 4, 5}) Entry(vex_DLLGetPtr, index);
  for (const int32_t index : {1, 2, 4, 5, 6, 7, 8, 9}) Entry(vex_DLLGetTable, index);
}

TEST(ModuleQueriesTest, BothQueriesGiveTheSameVersionString) {
  const void* version = Entry(vex_DLLGetPtr, 1);
  EXPECT_EQ(Entry(vex_DLLGetTable, 1), version);
  EXPECT_STREQ(static_cast<const char*>(version), "NJ1.02.01");
}

TEST(ModuleQueriesTest, HeaderRecordStandsDirectlyInFrontOfTheIdentityBlock) {
  const auto* header = static_cast<const uintptr_t*>(Entry(vex_DLLGetPtr, 2));
  EXPECT_EQ(header[0], 7u);
  EXPECT_EQ(header[1], 0u);
  EXPECT_EQ(header[2], 0u);
  EXPECT_EQ(header[3], 0u);
  EXPECT_EQ(Entry(vex_DLLGetTable, 2), static_cast<const void*>(header + kHeaderWordCount));
}

TEST(ModuleQueriesTest, IdentityBlockNamesTheDecoder) {
  struct ExpectedWord {
    const char* text;
    uintptr_t number;
  };
  const ExpectedWord expected[kIdentityWordCount] = {
      {"Vorel", 0},
      {"RNSAP", 0},
      {"Vorel RNSAP 04B V3.0.0(IP)", 0},
      {"Version 3.0.0 (IP) (Feb 2005)", 0},
      {"UMTS", 0},
      {"", 0},
      {"", 0},
      {"vorel_rnsap_04B.csf", 0},
      {"", 0},
      {"Release VEXTOOLS_A.02.20", 0},
      {"Release VEXTOOLS_A.02.20", 0},
      {"143", 0},
      {"SSN", 0},
      {"Vorel UTRAN Iu Interface TS_RID007", 0},
      {"", 0},
      {"", 0},
      {nullptr, 0},
      {nullptr, 6},
      {nullptr, 4},
      {"RNSAP", 0},
      {"vorel_rnsap_04B.csf", 0},
      {nullptr, 0},
      {nullptr, 0xfffe},
      {nullptr, 0},
      {nullptr, 0},
  };
  const auto* words = static_cast<const IdentityWord*>(Entry(vex_DLLGetTable, 2));
  for (size_t word = 0; word < kIdentityWordCount; ++word) {
    if (expected[word].text != nullptr) {
      ASSERT_NE(words[word].text, nullptr) << "word " << word;
      EXPECT_STREQ(words[word].text, expected[word].text) << "word " << word;
    } else {
      EXPECT_EQ(words[word].number, expected[word].number) << "word " << word;
    }
  }
}

TEST(ModuleQueriesTest, PrototypeRecordsFollowEachOther) {
  const auto* first = static_cast<const uint8_t*>(Entry(vex_DLLGetPtr, 4));
  const auto* second = static_cast<const uint8_t*>(Entry(vex_DLLGetPtr, 5));
  EXPECT_EQ(second, first + 124);
  EXPECT_EQ(Entry(vex_DLLGetTable, 5), static_cast<const void*>(second + 16));
}

TEST(ModuleQueriesTest, FieldDictionaryStartsWithThePduExtensionBit) {
  const auto* rows = static_cast<const tables::DictionaryRow*>(Entry(vex_DLLGetTable, 4));
  EXPECT_EQ(rows[0].fieldId, 684u);
  ASSERT_NE(rows[0].name, nullptr);
  EXPECT_STREQ(rows[0].name, "PDU EXTENSION");
}

}  // namespace
}  // namespace rnsap
