// The value table (table 6) and the value pool (table 7): how the lists of
// the dictionary rows lie in the table, and the numbers they name.
#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>
#include <vector>

#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

// The pool of the whole protocol: every named number once in order of first use, the pair
// of the catch-all rows at 29 and 30, and the closing 0.
// clang-format off
constexpr uint32_t kProtocolPool[] = {
    0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15,
    16, 17, 18, 19, 20, 21, 22, 23, 24, 25, 26, 440, 200043, 50, 0, 27,
    28, 30, 31, 32, 33, 34, 35, 37, 38, 39, 40, 29, 36, 41, 42, 43,
    44, 45, 46, 47, 48, 49, 51, 52, 53, 54, 55, 56, 57, 58, 59, 60,
    61, 62, 63, 64, 65, 66, 67, 68, 69, 70, 71, 72, 73, 74, 75, 76,
    77, 78, 79, 80, 81, 82, 83, 84, 85, 86, 87, 88, 89, 90, 91, 92,
    93, 94, 95, 96, 97, 98, 99, 100, 101, 102, 103, 104, 105, 106, 107, 108,
    109, 110, 111, 112, 113, 114, 115, 116, 117, 118, 119, 120, 121, 122, 123, 124,
    125, 126, 127, 128, 129, 130, 131, 132, 133, 134, 135, 136, 137, 138, 139, 140,
    141, 142, 143, 144, 145, 146, 147, 148, 149, 150, 151, 152, 153, 154, 155, 156,
    157, 158, 159, 160, 161, 162, 163, 164, 165, 166, 167, 168, 169, 170, 171, 172,
    173, 174, 175, 176, 177, 178, 179, 180, 181, 182, 183, 184, 185, 186, 187, 188,
    189, 190, 191, 192, 193, 194, 195, 196, 197, 198, 199, 200, 201, 202, 203, 204,
    205, 255, 0,
};
// clang-format on
static_assert(std::size(kProtocolPool) == 211);

class ValueTableTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(t.complete()); }

  std::vector<ValueEntry> ListOf(uint32_t fieldId) const {
    const HostRow* row = t.FindField(fieldId);
    EXPECT_NE(row, nullptr) << "field " << fieldId;
    return row ? t.ValueList(*row) : std::vector<ValueEntry>{};
  }
  // The numbers that named-value rows name.
  std::set<uint32_t> NamedNumbers() const {
    std::set<uint32_t> numbers;
    for (size_t i = 0; i < t.valueRowCount(); ++i) {
      const HostValueRow& v = t.valueRow(i);
      if (v.valueKind == kNamedValue) numbers.insert(t.pool(v.poolIndex));
    }
    return numbers;
  }

  const HostTables& t = Tables();
};

ValueEntry Named(uint32_t value, const char* text) { return {value, text}; }
ValueEntry Other(const char* text) { return {std::nullopt, text}; }

TEST_F(ValueTableTest, ListsTileTheTableInRowOrder) {
  uint32_t next = 0;
  size_t lists = 0;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (row.valueCount == 0) {
      EXPECT_EQ(row.firstValue, kAllOnes) << RowName(row);
      continue;
    }
    ++lists;
    EXPECT_EQ(row.firstValue, next) << RowName(row);
    next = row.firstValue + row.valueCount;
  }
  EXPECT_GT(lists, 0u);
  // The all-zero row that ends the table stands right behind the last list.
  EXPECT_EQ(t.valueRowCount(), next);
}

TEST_F(ValueTableTest, CatchAllRowsStandFirstInTheirList) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      const HostValueRow& value = t.valueRow(row.firstValue + v);
      SCOPED_TRACE("value " + std::to_string(v) + " of " + RowName(row));
      EXPECT_TRUE(value.valueKind == kNamedValue || value.valueKind == kCatchAll)
          << "kind " << value.valueKind;
      EXPECT_LT(value.stringIndex, t.stringCount() - 1);
      if (value.valueKind == kCatchAll) {
        EXPECT_EQ(v, 0u);
        EXPECT_EQ(value.poolIndex, kCatchAllPoolIndex);
      }
    }
  }
}

TEST_F(ValueTableTest, PoolHoldsEveryNamedNumberOnceInOrderOfFirstUse) {
  const size_t words = t.readablePoolWords();
  ASSERT_GT(words, 31u);
  EXPECT_EQ(t.pool(29), 50u);
  EXPECT_EQ(t.pool(30), 0u);
  EXPECT_EQ(t.pool(words - 1), 0u) << "the pool ends with 0";

  // Word 30 belongs to the catch-all pair; every other word is a number of
  // its own.
  std::map<uint32_t, size_t> at;
  for (size_t i = 0; i + 1 < words; ++i) {
    if (i == 30) continue;
    const auto [it, inserted] = at.emplace(t.pool(i), i);
    EXPECT_TRUE(inserted) << "pool words " << it->second << " and " << i << " both hold "
                          << t.pool(i);
  }

  // Walking the value rows, each new pool index is the next one; the first
  // catch-all row brings the pair.
  size_t next = 0;
  std::set<uint32_t> seen;
  for (size_t i = 0; i < t.valueRowCount(); ++i) {
    const HostValueRow& v = t.valueRow(i);
    if (v.valueKind == kNamedValue) {
      EXPECT_NE(v.poolIndex, 30u) << "value row " << i;
      // The 50 of the catch-all pair is the number 50 too.
      if (t.pool(v.poolIndex) == 50) {
        EXPECT_EQ(v.poolIndex, kCatchAllPoolIndex) << "value row " << i;
      }
    }
    if (!seen.insert(v.poolIndex).second) continue;
    EXPECT_EQ(v.poolIndex, next) << "value row " << i << " names " << t.pool(v.poolIndex);
    next = v.poolIndex + (v.poolIndex == kCatchAllPoolIndex ? 2 : 1);
  }
  EXPECT_EQ(next, words - 1);
}

TEST_F(ValueTableTest, PoolIsTheProtocolsPoolForTheNumbersInUse) {
  // The pool of the whole protocol, less the numbers that no list of the
  // description names yet (255 of FACH_InitialWindowSize, for one); the
  // catch-all pair stays.
  const std::set<uint32_t> named = NamedNumbers();
  std::vector<uint32_t> expected;
  for (size_t i = 0; i + 1 < std::size(kProtocolPool); ++i) {
    if (i == 29 || i == 30 || named.count(kProtocolPool[i])) expected.push_back(kProtocolPool[i]);
  }
  expected.push_back(0);
  const size_t words = t.readablePoolWords();
  EXPECT_EQ(words, expected.size());
  for (size_t i = 0; i < words && i < expected.size(); ++i) {
    ASSERT_EQ(t.pool(i), expected[i]) << "first difference at pool word " << i;
  }
  // The ids of the IE dispatch name every number up to 205 already.
  EXPECT_GE(words, 210u);
}

TEST_F(ValueTableTest, ListsOfTheMessageFrame) {
  EXPECT_EQ(ListOf(685),
            (std::vector<ValueEntry>{Named(0, "InitiatingMessage"), Named(1, "SuccessfulOutcome"),
                                     Named(2, "UnsuccessfulOutcome"), Named(3, "Outcome")}));
  EXPECT_EQ(ListOf(697),
            (std::vector<ValueEntry>{Named(0, "tdd"), Named(1, "fdd"), Named(2, "common")}));
  const std::vector<ValueEntry> upper{Named(0, "Reject"), Named(1, "Ignore"), Named(2, "Notify")};
  for (uint32_t id : {698, 725, 737}) EXPECT_EQ(ListOf(id), upper) << "field " << id;
  EXPECT_EQ(ListOf(3216),
            (std::vector<ValueEntry>{Named(0, "reject"), Named(1, "ignore"), Named(2, "notify")}));
  // The three Procedure Code fields show the same names.
  const std::vector<ValueEntry> procedures = ListOf(688);
  ASSERT_EQ(procedures.size(), 27u);
  EXPECT_EQ(procedures[20], Named(20, "id_radioLinkSetup"));
  EXPECT_EQ(ListOf(692), procedures);
  EXPECT_EQ(ListOf(696), procedures);
}

TEST_F(ValueTableTest, ListsOfThePrivateIdentifier) {
  EXPECT_EQ(ListOf(3248), (std::vector<ValueEntry>{Named(440, "Japan")}));
  EXPECT_EQ(ListOf(3264), (std::vector<ValueEntry>{Named(200043, "vorel")}));
  EXPECT_EQ(ListOf(3272), (std::vector<ValueEntry>{Other("not defined"), Named(1, "nbap"),
                                                   Named(2, "ranap"), Named(3, "rnsap")}));
  EXPECT_EQ(ListOf(3274),
            (std::vector<ValueEntry>{
                Named(0, "SCCP_ConnectionSetupRequest"), Named(1, "SCCP_ConnectionSetupResponse"),
                Named(2, "OAM_InformationRequest"), Named(3, "OAM_InformationResponse"),
                Named(4, "TRAFFIC_CongestionIndication"), Named(5, "ResetResourceRequest"),
                Named(6, "ResetResourceResponse"), Named(7, "ExtensionInformationRequest"),
                Named(8, "ExtensionInformationResponse")}));
}

TEST_F(ValueTableTest, ExtensionIdsHaveNoNameFor29And36) {
  const std::vector<ValueEntry> expected{
      Named(0, "id_NeighbouringCellInformationValueTag"),
      Named(1, "id_MaximumDLPower"),
      Named(2, "id_FirstRLSIndicator"),
      Named(3, "id_ScramblingCodeControlIndicator"),
      Named(4, "id_IgnoreRestriction"),
      Named(5, "id_UARFCN"),
      Named(6, "id_PowerOffsetInformation25"),
      Named(7, "id_GeographicalAreaCell"),
      Named(8, "id_IntraFrequencyCellEdgeIndicator"),
      Named(9, "id_CompressedModeProhibitCellIndicator"),
      Named(10, "id_NeighbouringCellInformationValueTag2"),
      Named(11, "id_VersionNumber"),
      Named(12, "id_ServiceCombination"),
      Named(13, "id_U_RNTI"),
      Named(14, "id_WorkingProcedure"),
      Named(15, "id_UE_Version"),
      Named(16, "id_BTS_Version"),
      Named(17, "id_BTS_Type"),
      Named(18, "id_PrimaryCPICH_Power"),
      Named(19, "id_SRNC_Version"),
      Named(20, "id_DCCH_Property"),
      Named(21, "id_PropagationDelay"),
      Named(22, "id_PSCN_Transition"),
      Named(23, "id_BTS_Type2"),
      Named(24, "id_CPICH_PowerOffset"),
      Named(25, "id_UARFCNnu"),
      Named(26, "id_GA_AltitudeWithUncertaintyAltitude"),
      Named(27, "id_DRNC_Version"),
      Named(28, "id_BitRateSet"),
      Named(30, "id_ExtensionIndicator"),
      Named(31, "id_ExtensionGroupIdentity"),
      Named(32, "id_ExtensionSAC"),
      Named(33, "id_TransportChannelType"),
      Named(34, "id_IPAddressSet"),
      Named(35, "id_IPBTS_ExtensionGroupCheck"),
      Named(37, "id_ServiceType"),
      Named(38, "id_SupportedBandList"),
      Named(39, "id_Per_Cell_InformationList"),
      Named(40, "id_BandSelectionFactor"),
  };
  EXPECT_EQ(ListOf(724), expected);
  // The pool index is no number: the gaps put 30 and 37 behind the pair.
  const HostRow* row = t.FindField(724);
  ASSERT_NE(row, nullptr);
  EXPECT_EQ(t.valueRow(row->firstValue + 29).poolIndex, 33u);
  EXPECT_EQ(t.pool(36), 33u);
}

TEST_F(ValueTableTest, PriorityListsNameTheEndsAndShowTheNumber) {
  // Both priorities share one list that prints the number itself. They stand
  // in the radio link part of the description.
  const std::vector<ValueEntry> expected{Other("%u"), Named(0, "%u (lowest)"),
                                         Named(15, "%u (highest)")};
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    const std::string name = row.name;
    if (name != "AllocationRetentionPriority" && name != "FrameHandlingPriority") continue;
    EXPECT_EQ(t.ValueList(row), expected) << RowName(row);
    EXPECT_EQ(row.widthCode, 0xffff0004u) << RowName(row);
    EXPECT_EQ(t.Format(row), "  " + name + "=%-S") << RowName(row);
  }
}

}  // namespace
}  // namespace rnsap::testing
