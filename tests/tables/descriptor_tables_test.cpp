// The descriptor tables as a host finds them through vex_DLLGetTable: every
// count, distribution and placed row that fixes them, as data, against what a
// walk of the tables finds; and the rules that hold over all their rows.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

constexpr uint32_t kKeyFieldOrder[] = {
    685,  688,  692,  696,  697,  698,  749,  751,  3274, 2689, 3073, 3077, 2934, 2606, 2945,
    3027, 2664, 2681, 2683, 2687, 2676, 2670, 2672, 3400, 3404, 3408, 3412, 3416, 3420, 3424,
    3428, 3432, 3436, 3440, 3444, 3448, 3452, 3456, 3460, 3462, 3054, 2799, 2750, 2754, 2758,
    2762, 2766, 2770, 2774, 2778, 2780, 2612, 2616, 2620, 2624, 2628, 2632, 2636, 2640, 2642,
    3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801, 2747, 2918, 2923, 2925,
    3056, 3060, 3466, 3470, 3474, 3478, 3482, 3486, 3490, 3494, 3498, 3502, 3506, 3510, 3514,
    3518, 3522, 3526, 3528, 3055, 3532, 3536, 3540, 3544, 3548, 3552, 3556, 3560, 3564, 3568,
    3572, 3576, 3580, 3584, 3588, 3592, 3594, 3664, 3668, 3672, 3676, 3680, 3684, 3688, 3692,
    3696, 3700, 3704, 3708, 3712, 3716, 3720, 3724, 3726, 3210, 3598, 3602, 3606, 3610, 3614,
    3618, 3622, 3626, 3630, 3634, 3638, 3642, 3646, 3650, 3654, 3658, 3660};

// Every named number once in order of first use, the catch-all pair at 29
// and 30, and the closing 0.
// clang-format off
constexpr uint32_t kPool[] = {
    0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16, 17, 18, 19, 20, 21, 22, 23, 24, 25,
    26, 440, 200043, 50, 0, 27, 28, 30, 31, 32, 33, 34, 35, 37, 38, 39, 40, 29, 36, 41, 42, 43,
    44, 45, 46, 47, 48, 49, 51, 52, 53, 54, 55, 56, 57, 58, 59, 60, 61, 62, 63, 64, 65, 66, 67,
    68, 69, 70, 71, 72, 73, 74, 75, 76, 77, 78, 79, 80, 81, 82, 83, 84, 85, 86, 87, 88, 89, 90,
    91, 92, 93, 94, 95, 96, 97, 98, 99, 100, 101, 102, 103, 104, 105, 106, 107, 108, 109, 110,
    111, 112, 113, 114, 115, 116, 117, 118, 119, 120, 121, 122, 123, 124, 125, 126, 127, 128,
    129, 130, 131, 132, 133, 134, 135, 136, 137, 138, 139, 140, 141, 142, 143, 144, 145, 146,
    147, 148, 149, 150, 151, 152, 153, 154, 155, 156, 157, 158, 159, 160, 161, 162, 163, 164,
    165, 166, 167, 168, 169, 170, 171, 172, 173, 174, 175, 176, 177, 178, 179, 180, 181, 182,
    183, 184, 185, 186, 187, 188, 189, 190, 191, 192, 193, 194, 195, 196, 197, 198, 199, 200,
    201, 202, 203, 204, 205, 255, 0};
// clang-format on

struct PlacedRow {
  size_t row;
  uint32_t flags, fieldId, keyIndex;
  const char* name;
  uint32_t valueCount, firstValue, widthCode, formatIndex;
  const char* format;
  uint32_t layoutOffset;
};
constexpr uint32_t kNone = kAllOnes;
const PlacedRow kPlacedRows[] = {
    {0, 0x05000001, 684, 0, "PDU EXTENSION", 0, kNone, 0xffff0001, 0, "PDU EXTENSION=%x", 0},
    {1, 0x05010001, 685, 1, "PDU Type", 4, 0, 0xffff0002, 1, "PDU Type=%-S", 26},
    {2, 0x05000004, 682, 0, "Spare", 0, kNone, kAllOnes, 6, "  Spare=%x", 58},
    {3, 0x05010001, 688, 2, "Procedure Code", 27, 4, 0xffff0008, 7, "Procedure Code=%-S", 63},
    {8, 0x05000001, 746, 0, "TransactionID TYPE", 2, 91, 0xffff0001, 43, "TransactionID TYPE=%-S",
     0},
    {30, 0x05000003, 3244, 0, "Nation", 0, kNone, 0xffff0015, 68, "  Nation=%u", 269},
    {31, 0x05000002, 3248, 0, "Nation", 1, 97, 0xffff000e, 69, "    Nation=%-S (%u)", 323},
    {36, 0x05000003, 3264, 0, "Company", 1, 98, 0xffff0015, 72, "    Company=%-S (%u)", 269},
    {42, 0x05010001, 3274, 9, "IE", 9, 103, 0xffff0007, 82, "  IE=%-S", 95},
    {53, 0x05000002, 724, 0, "Extension ID", 39, 119, 0xffff0010, 103, "Extension ID=%-S", 127},
    {162, 0x05000002, 736, 0, "IE ID", 206, 232, 0xffff0010, 243, "IE ID=%-S", 127},
    {370, 0x05000001, 2596, 0, "AllocationRetentionPriority", 3, 597, 0xffff0004, 655,
     "  AllocationRetentionPriority=%-S", 460},
    {619, 0x05010004, 2918, 73, "IMSI", 0, kNone, kAllOnes, 838, "  IMSI=%-[\"%x\"]", 700},
    {620, 0x05000001, 2920, 0, "Filler", 0, kNone, 0xffff0004, 839, "", 771},
    {621, 0x05010004, 2923, 74, "IMSI", 0, kNone, 0xffff003c, 838, "  IMSI=%-[\"%x\"]", 803},
    {622, 0x05010004, 2925, 75, "IMSI", 0, kNone, 0xffff0040, 838, "  IMSI=%-[\"%x\"]", 989},
    {1263, 0x05000002, 720, 0, "Number Of Extensions", 0, kNone, 0xffff0010, 1181,
     "Number Of Extensions=%u", 127},
};
constexpr uint32_t kLeadingFieldIds[] = {684, 685, 682, 688, 692, 696,
                                         697, 698, 746, 749, 751, 699};

struct FlagsCase {
  uint32_t flags;
  size_t rows, withValueList;
};
const FlagsCase kRowsByFlags[] = {
    {0x05000001, 1048, 345}, {0x05000002, 52, 3}, {0x05000003, 4, 1}, {0x05000004, 13, 0},
    {0x05010001, 113, 14},   {0x05010002, 6, 0},  {0x05010004, 28, 0}};

const std::map<uint32_t, size_t> kRowsByWidthCode{
    {0xffff0001, 805}, {0xffff0002, 43}, {0xffff0003, 20}, {0xffff0004, 63}, {0xffff0005, 97},
    {0xffff0006, 12},  {0xffff0007, 37}, {0xffff0008, 84}, {0xffff000e, 9},  {0xffff0010, 49},
    {0xffff0015, 2},   {0xffff0018, 2},  {0xffff003c, 1},  {0xffff0040, 1},  {0xffffffff, 39}};

// Rows by the blanks in front of their format.
const std::map<size_t, size_t> kRowsByIndentation{{0, 61}, {1, 12}, {2, 1188}, {4, 3}};

// The value parts of the formats: %-S in a row with a value list, %u in a row
// without, unless the row's field is listed with another part.
struct ValuePartCase {
  const char* part;
  size_t rows;
  std::set<uint32_t> fieldIds;
};
const ValuePartCase kValueParts[] = {
    {"%u", 846, {}},
    {"%-S", 360, {}},
    {"%x",
     18,
     {684, 682, 706, 2868, 3012, 3027, 2607, 3730, 3737, 3744, 3751, 3758, 3765, 3772, 3779, 3786,
      3793, 3798}},
    {"%-[\"%X\":\"-\"]", 11, {3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801}},
    {"%d", 10, {2644, 2691, 2796, 2808, 2957, 3004, 3016, 3017, 3193, 3202}},
    {"%b", 6, {2932, 3085, 2950, 2954, 3032, 3036}},
    {"%-[\"%x\"]", 6, {2918, 2923, 2925, 2606, 2945, 3060}},
    {"%-S (%u)", 3, {3248, 3264, 3272}},
    {"%u octets", 1, {3299}},
    {"%-[\"%u\":\".\"]", 1, {2934}},
    {"%s", 1, {3171}},
    {"", 1, {2920}},
};

// Value lists by field id, or shared by every listed row of a name.
struct ValueListCase {
  std::vector<uint32_t> fieldIds;
  const char* sharedByName;
  const char* list;
  size_t rows = 0;  // with that name
};
const ValueListCase kValueLists[] = {
    {{685},
     nullptr,
     R"(0 "InitiatingMessage", 1 "SuccessfulOutcome", 2 "UnsuccessfulOutcome", 3 "Outcome")"},
    {{688, 692, 696},
     nullptr,
     R"(0 "id_commonTransportChannelResourcesInitiationFDD", )"
     R"(1 "id_commonTransportChannelResourcesInitiationTDD", )"
     R"(2 "id_commonTransportChannelResourcesRelease", 3 "id_compressedModeCancellationFDD", )"
     R"(4 "id_compressedModeCommitFDD", 5 "id_compressedModePrepareFDD", )"
     R"(6 "id_downlinkPowerControl", 7 "id_downlinkSignallingTransfer", 8 "id_errorIndication", )"
     R"(9 "id_measurementFailure", 10 "id_measurementInitiation", 11 "id_measurementReporting", )"
     R"(12 "id_measurementTermination", 13 "id_pagingRequest", )"
     R"(14 "id_physicalChannelReconfiguration", 15 "id_privateMessage", )"
     R"(16 "id_radioLinkAddition", 17 "id_radioLinkDeletion", 18 "id_radioLinkFailure", )"
     R"(19 "id_radioLinkRestoration", 20 "id_radioLinkSetup", 21 "id_srnsRelocationCommit", )"
     R"(22 "id_synchronisedRadioLinkReconfigurationCancellation", )"
     R"(23 "id_synchronisedRadioLinkReconfigurationCommit", )"
     R"(24 "id_synchronisedRadioLinkReconfigurationPrepare", )"
     R"(25 "id_unSynchronisedRadioLinkReconfiguration", 26 "id_uplinkSignallingTransfer")"},
    {{697}, nullptr, R"(0 "tdd", 1 "fdd", 2 "common")"},
    {{698, 725, 737}, nullptr, R"(0 "Reject", 1 "Ignore", 2 "Notify")"},
    {{3216}, nullptr, R"(0 "reject", 1 "ignore", 2 "notify")"},
    {{746, 3279}, nullptr, R"(0 "shortTransActionId", 1 "longTransActionId")"},
    {{}, "Extension Ext", R"(0 "no extension", 1 "extension")", 201},
    {{}, "Extension Bit", R"(0 "no extension", 1 "extension")", 42},
    {{3248}, nullptr, R"(440 "Japan")"},
    {{3264}, nullptr, R"(200043 "vorel")"},
    {{3272}, nullptr, R"(other "not defined", 1 "nbap", 2 "ranap", 3 "rnsap")"},
    {{3274},
     nullptr,
     R"(0 "SCCP_ConnectionSetupRequest", 1 "SCCP_ConnectionSetupResponse", )"
     R"(2 "OAM_InformationRequest", 3 "OAM_InformationResponse", )"
     R"(4 "TRAFFIC_CongestionIndication", 5 "ResetResourceRequest", 6 "ResetResourceResponse", )"
     R"(7 "ExtensionInformationRequest", 8 "ExtensionInformationResponse")"},
    {{724},
     nullptr,
     R"(0 "id_NeighbouringCellInformationValueTag", 1 "id_MaximumDLPower", )"
     R"(2 "id_FirstRLSIndicator", 3 "id_ScramblingCodeControlIndicator", )"
     R"(4 "id_IgnoreRestriction", 5 "id_UARFCN", 6 "id_PowerOffsetInformation25", )"
     R"(7 "id_GeographicalAreaCell", 8 "id_IntraFrequencyCellEdgeIndicator", )"
     R"(9 "id_CompressedModeProhibitCellIndicator", 10 "id_NeighbouringCellInformationValueTag2", )"
     R"(11 "id_VersionNumber", 12 "id_ServiceCombination", 13 "id_U_RNTI", )"
     R"(14 "id_WorkingProcedure", 15 "id_UE_Version", 16 "id_BTS_Version", 17 "id_BTS_Type", )"
     R"(18 "id_PrimaryCPICH_Power", 19 "id_SRNC_Version", 20 "id_DCCH_Property", )"
     R"(21 "id_PropagationDelay", 22 "id_PSCN_Transition", 23 "id_BTS_Type2", )"
     R"(24 "id_CPICH_PowerOffset", 25 "id_UARFCNnu", 26 "id_GA_AltitudeWithUncertaintyAltitude", )"
     R"(27 "id_DRNC_Version", 28 "id_BitRateSet", 30 "id_ExtensionIndicator", )"
     R"(31 "id_ExtensionGroupIdentity", 32 "id_ExtensionSAC", 33 "id_TransportChannelType", )"
     R"(34 "id_IPAddressSet", 35 "id_IPBTS_ExtensionGroupCheck", 37 "id_ServiceType", )"
     R"(38 "id_SupportedBandList", 39 "id_Per_Cell_InformationList", 40 "id_BandSelectionFactor")"},
    {{2596, 2881}, nullptr, R"-(other "%u", 0 "%u (lowest)", 15 "%u (highest)")-"},
    {{2879}, nullptr, R"(0 "lowest", 15 "highest")"},
    {{2871}, nullptr, R"(255 "unlimited")"},
    {{3066}, nullptr, R"(0 "primary_scrambling_code", 1 "prymary_or_secondary_scrambling_code")"},
};

// Each layout record in the notation "length | bit items | count | size |
// base", the number of rows that use it and some of their fields.
struct LayoutCase {
  uint32_t offset;
  const char* record;
  size_t rows;
  std::vector<uint32_t> fieldIds;
};
const LayoutCase kLayoutRecords[] = {
    {0, "24 | 1 | 1 | 1 | parameter 0", 799, {684}},
    {26, "30 | 2 to 1 | 1 | 2 | parameter 0", 43, {685}},
    {58, "3 | none | - | - | -", 1, {682}},
    {63, "30 | 8 to 1 | 1 | 8 | parameter 0", 83, {688}},
    {95, "30 | 7 to 1 | 1 | 7 | parameter 0", 35, {749}},
    {127, "30 | 16 to 1 | 1 | 16 | parameter 0", 47, {751}},
    {159, "30 | 14 to 1 | 1 | 14 | parameter 0", 7, {705}},
    {191, "24 | 1 | 1 | 0 | parameter 0", 2, {3231, 3251}},
    {217, "24 | 9 | 1 | 0 | parameter 0", 2, {3234, 3254}},
    {243, "24 | 17 | 1 | 0 | parameter 0", 2, {3239, 3259}},
    {269, "52 | 24 to 18, 16 to 10, 8 to 2 | 1 | 24 | parameter 0", 2, {3244, 3264}},
    {323, "41 | 16 to 10, 8 to 2 | 1 | 16 | parameter 0", 2, {3248, 3268}},
    {366, "30 | 8 to 2 | 1 | 8 | parameter 0", 2, {3250, 3270}},
    {398, "30 | 6 to 1 | 1 | 6 | parameter 0", 12, {3015}},
    {430, "28 | 8 to 1 | parameter 0 | 8 | parameter 1", 7, {3298}},
    {460, "30 | 4 to 1 | 1 | 4 | parameter 0", 62, {2903}},
    {492, "22 | 1 | parameter 0 | 1 | parameter 1", 9, {3077}},
    {516, "30 | 8 to 1 | 3 | 8 | parameter 0", 2, {2868, 3012}},
    {548, "28 | 1 to 8 | parameter 0 | 8 | parameter 1", 1, {2934}},
    {578, "24 | 1 | 8 | 1 | parameter 0", 1, {3085}},
    {604, "30 | 4 to 1 | 4 | 4 | parameter 0", 2, {2945, 3060}},
    {636, "30 | 5 to 1 | 1 | 5 | parameter 0", 97, {2681}},
    {668, "30 | 3 to 1 | 1 | 3 | parameter 0", 20, {2676}},
    {700, "28 | 4 to 1 | parameter 0 | 4 | parameter 1", 10, {2918, 2612}},
    {730,
     "39 | 4 to 1, 8 to 5 | parameter 0 | 8 | parameter 1",
     11,
     {3733, 3740, 3747, 3754, 3761, 3768, 3775, 3782, 3789, 3796, 3801}},
    {771, "30 | 60 to 57 | 1 | 0 | parameter 0", 1, {2920}},
    {803,
     "184 | 8 to 5, 4 to 1, 16 to 13, 12 to 9, 24 to 21, 20 to 17, 32 to 29, 28 to 25, 40 to 37, "
     "36 to 33, 48 to 45, 44 to 41, 56 to 53, 52 to 49, 64 to 61 | 1 | 64 | parameter 0",
     1,
     {2923}},
    {989, "41 | 8 to 5, 4 to 1 | 8 | 8 | parameter 0", 1, {2925}},
};
constexpr uint32_t kLayoutEndRecord = 1032;

// Reads that consume other bits than their value bits: gaps between the
// value bits, or a look at bits that a later read takes.
const std::map<uint32_t, uint32_t> kConsumedBits{
    {3244, 24}, {3264, 24}, {3248, 16}, {3268, 16}, {3250, 8}, {3270, 8}, {2923, 64},
    {3231, 0},  {3234, 0},  {3239, 0},  {3251, 0},  {3254, 0}, {3259, 0}, {2920, 0}};

// ------------------------------------------------------------ reading helpers

// Reports the first place where two sequences part.
template <typename T>
void ExpectSameSequence(const std::vector<T>& got, const std::vector<T>& expected,
                        const std::string& what) {
  EXPECT_EQ(got.size(), expected.size()) << what;
  for (size_t i = 0; i < got.size() && i < expected.size(); ++i) {
    if (got[i] != expected[i]) {
      ADD_FAILURE() << what << " part at " << i << ": " << ::testing::PrintToString(got[i])
                    << ", expected " << ::testing::PrintToString(expected[i]);
      return;
    }
  }
}

std::string Trimmed(const std::string& s) {
  const size_t first = s.find_first_not_of(" \n");
  return first == std::string::npos ? "" : s.substr(first, s.find_last_not_of(" \n") - first + 1);
}

// One layout record, rendered in the notation of kLayoutRecords ("malformed"
// if it breaks the token grammar), and the numbers of its bits.
struct LayoutRecord {
  std::string text;
  uint32_t length = 0;
  uint32_t itemBits = 0;
  bool countIsParameter = false;
  uint32_t count = 0;
  uint32_t size = 0;
};

class LayoutRecordReader {
 public:
  explicit LayoutRecordReader(const uint8_t* record) : body_(record + 2) {
    r_.length = record[0] | record[1] << 8;
  }

  LayoutRecord Read() {
    r_.text = std::to_string(r_.length) + " | ";
    if (r_.length == 3 && body_[0] == 0xFF && body_[1] == 0 && body_[2] == 0) {
      r_.text += "none | - | - | -";
      return r_;
    }
    for (const uint8_t head : {0xFF, 0x02, 0x55, 0x01, 0x04}) Expect(head);
    const uint8_t itemCount = Byte();
    for (uint8_t i = 0; i < itemCount; ++i) r_.text += (i > 0 ? ", " : "") + Item();
    r_.countIsParameter = Next(0x08);
    r_.text += " | " + (r_.countIsParameter ? Parameter() : std::to_string(r_.count = Number()));
    r_.size = Number();
    r_.text += " | " + std::to_string(r_.size) + " | " + Parameter();
    if (!ok_ || at_ != r_.length) r_.text = "malformed";
    return r_;
  }

 private:
  uint8_t Byte() {
    ok_ = ok_ && at_ < r_.length;
    return ok_ ? body_[at_++] : 0;
  }
  void Expect(uint8_t byte) { ok_ = Byte() == byte && ok_; }
  bool Next(uint8_t byte) const { return at_ < r_.length && body_[at_] == byte; }
  uint32_t Number() {
    Expect(0x10);
    uint32_t n = 0;
    for (int i = 0; i < 4; ++i) n = n << 8 | Byte();
    return n;
  }
  std::string Parameter() {
    Expect(0x08);
    const uint8_t index = Byte();
    Expect(0x00);
    return "parameter " + std::to_string(index);
  }
  // A range "first to last" or a single bit.
  std::string Item() {
    const bool range = Next(0x05);
    if (range) Byte();
    const uint32_t first = Number();
    const uint32_t last = range ? Number() : first;
    r_.itemBits += (first > last ? first - last : last - first) + 1;
    return std::to_string(first) + (range ? " to " + std::to_string(last) : "");
  }

  const uint8_t* body_;
  LayoutRecord r_;
  uint32_t at_ = 0;
  bool ok_ = true;
};

class DescriptorTablesTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(t.complete());
    for (uint32_t offset = 0;;) {
      const uint32_t length = t.layout()[offset] | t.layout()[offset + 1] << 8;
      if (length == 0) break;
      ASSERT_LE(offset + 4 + length, kMaxLayoutBytes) << "no end record";
      records_[offset] = LayoutRecordReader(t.layout() + offset).Read();
      layoutEnd_ = offset += 2 + length;
    }
  }

  template <typename Key, typename KeyOf>
  std::map<Key, size_t> Tally(KeyOf keyOf) const {
    std::map<Key, size_t> tally;
    for (size_t i = 0; i < t.rowCount(); ++i) ++tally[keyOf(t.row(i))];
    return tally;
  }
  template <typename Pick>
  size_t CountRows(Pick pick) const {
    return Tally<bool>(pick)[true];
  }
  static std::string ValuePart(const std::string& format) {
    return format.substr(format.find('=') + 1);
  }

  const HostTables& t = Tables();
  std::map<uint32_t, LayoutRecord> records_;  // by offset
  uint32_t layoutEnd_ = 0;
};

// ------------------------------------------------------------ counts

TEST_F(DescriptorTablesTest, Counts) {
  std::set<std::string> names, lists;
  std::set<uint32_t> formats;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    names.insert(t.row(i).name);
    formats.insert(t.row(i).formatIndex);
    if (t.row(i).valueCount > 0) lists.insert(t.ValueListText(t.row(i)));
  }
  size_t catchAll = 0;
  for (size_t i = 0; i < t.valueRowCount(); ++i) catchAll += t.valueRow(i).valueKind == kCatchAll;
  const struct {
    const char* what;
    size_t got, expected;
  } counts[] = {
      {"dictionary rows", t.rowCount(), 1264},
      {"key rows", CountRows([](const HostRow& r) { return r.keyIndex != 0; }), 147},
      {"distinct names, display ids", names.size(), 587},
      {"rows with a value list", CountRows([](const HostRow& r) { return r.valueCount > 0; }), 363},
      {"distinct value lists", lists.size(), 104},
      {"value rows", t.valueRowCount(), 1200},
      {"catch-all value rows", catchAll, 3},
      {"pool words", t.readablePoolWords(), 211},
      {"strings, the end mark included", t.stringCount(), 1183},
      {"distinct formats", formats.size(), 600},
      {"layout records", records_.size(), 28},
      {"layout bytes", layoutEnd_ + 4, 1036},
  };
  for (const auto& c : counts) EXPECT_EQ(c.got, c.expected) << c.what;
}

TEST_F(DescriptorTablesTest, Distributions) {
  std::map<uint32_t, size_t> byFlags, listsByFlags, byLayout;
  std::map<std::string, size_t> byValuePart;
  for (const FlagsCase& c : kRowsByFlags) {
    byFlags[c.flags] = c.rows;
    if (c.withValueList > 0) listsByFlags[c.flags] = c.withValueList;
  }
  for (const ValuePartCase& c : kValueParts) byValuePart[c.part] = c.rows;
  for (const LayoutCase& c : kLayoutRecords) byLayout[c.offset] = c.rows;
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.flags; }), byFlags);
  auto withList = Tally<uint32_t>([](const HostRow& r) { return r.valueCount ? r.flags : 0; });
  withList.erase(0);
  EXPECT_EQ(withList, listsByFlags) << "rows with a value list";
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.widthCode; }), kRowsByWidthCode);
  EXPECT_EQ(Tally<size_t>([&](const HostRow& r) {
              const std::string format = t.Format(r);
              return std::min(format.find_first_not_of(' '), format.size());
            }),
            kRowsByIndentation);
  EXPECT_EQ(Tally<std::string>([&](const HostRow& r) { return ValuePart(t.Format(r)); }),
            byValuePart);
  EXPECT_EQ(Tally<uint32_t>([](const HostRow& r) { return r.layoutOffset; }), byLayout);
}

// ------------------------------------------------------------ the dictionary

TEST_F(DescriptorTablesTest, RowsAtTheirPlaces) {
  for (const PlacedRow& e : kPlacedRows) {
    SCOPED_TRACE("row " + std::to_string(e.row));
    ASSERT_LT(e.row, t.rowCount());
    const HostRow& row = t.row(e.row);
    EXPECT_EQ(row.flags, e.flags);
    EXPECT_EQ(row.fieldId, e.fieldId);
    EXPECT_EQ(row.keyIndex, e.keyIndex);
    EXPECT_STREQ(row.name, e.name);
    EXPECT_EQ(row.valueCount, e.valueCount);
    EXPECT_EQ(row.firstValue, e.firstValue);
    EXPECT_EQ(row.widthCode, e.widthCode);
    EXPECT_EQ(row.formatIndex, e.formatIndex);
    EXPECT_EQ(t.Format(row), e.format);
    EXPECT_EQ(row.layoutOffset, e.layoutOffset);
  }
  for (size_t i = 0; i < std::size(kLeadingFieldIds); ++i) {
    EXPECT_EQ(t.row(i).fieldId, kLeadingFieldIds[i]) << "row " << i;
  }
}

TEST_F(DescriptorTablesTest, KeyFieldsInKeyIndexOrder) {
  std::vector<uint32_t> keys;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    if (row.keyIndex == 0) continue;
    keys.push_back(row.fieldId);
    EXPECT_EQ(row.keyIndex, keys.size()) << RowName(row) << ": key indices run in row order";
  }
  ExpectSameSequence(keys,
                     std::vector<uint32_t>(std::begin(kKeyFieldOrder), std::end(kKeyFieldOrder)),
                     "key fields");
}

TEST_F(DescriptorTablesTest, NamesInTheOrderOfTheirFirstRowWithTheirIds) {
  std::vector<std::string> order;
  std::map<std::string, std::vector<uint32_t>> ids;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    std::vector<uint32_t>& of = ids[t.row(i).name];
    if (of.empty()) order.push_back(t.row(i).name);
    of.push_back(t.row(i).fieldId);
  }
  std::vector<std::string> got;
  for (const std::string& name : order) {
    const std::vector<uint32_t>& of = ids[name];
    std::string entry = "`" + name + "`";
    for (size_t i = 0; i < of.size() && (of.size() <= 4 || i == 0); ++i) {
      entry += " " + std::to_string(of[i]);
    }
    if (of.size() > 4) entry += " +" + std::to_string(of.size() - 1);
    got.push_back(entry);
  }
  std::vector<std::string> expected;
  std::ifstream file(RNSAP_DICTIONARY_NAMES);
  ASSERT_TRUE(file) << RNSAP_DICTIONARY_NAMES;
  std::string names, line;
  while (std::getline(file, line)) {
    if (!line.starts_with('#')) names += line + ' ';
  }
  for (size_t at = 0, end; (end = names.find(';', at)) != std::string::npos; at = end + 1) {
    expected.push_back(Trimmed(names.substr(at, end - at)));
  }
  ExpectSameSequence(got, expected, "names");
}

TEST_F(DescriptorTablesTest, ColumnsThatHoldInEveryRow) {
  std::set<uint32_t> ids;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    SCOPED_TRACE("row " + std::to_string(i) + ": " + RowName(row));
    EXPECT_TRUE(ids.insert(row.fieldId).second) << "a second row of the field";
    // Kind, key flag and the octets that the value needs.
    const uint32_t bits = row.widthCode & 0xffff;
    const uint32_t sizeClass = row.widthCode == kAllOnes || bits > 24 ? 4
                               : bits > 16                            ? 3
                               : bits > 8                             ? 2
                                                                      : 1;
    EXPECT_EQ(row.flags, 0x05000000u | (row.keyIndex != 0 ? 0x10000 : 0) | sizeClass);
    for (const uint32_t word : row.reservedA) EXPECT_EQ(word, kAllOnes);
    for (const uint32_t word : row.reservedB) EXPECT_EQ(word, kAllOnes);
    // One pool of names in row order, each name followed by its second copy.
    EXPECT_EQ(row.altName, row.name + std::strlen(row.name) + 1);
    if (i + 1 < t.rowCount()) {
      EXPECT_EQ(t.row(i + 1).name, row.altName + std::strlen(row.altName) + 1);
    }
    EXPECT_STREQ(row.altName, row.fieldId == 3226 ? "Private IE ID SIZE" : row.name);
  }
  EXPECT_EQ(*ids.begin(), 682u);
  EXPECT_EQ(*ids.rbegin(), 3801u);
  size_t gaps = 0;
  for (auto it = ids.begin(); std::next(it) != ids.end(); ++it) gaps += *std::next(it) > *it + 1;
  EXPECT_EQ(gaps, 1024u) << "runs of unused ids";
}

TEST_F(DescriptorTablesTest, EndRowAndTheZeroWordBehindIt) {
  const HostEndRow& end = t.endRow();
  EXPECT_EQ(end.mark, kAllOnes);
  EXPECT_EQ(end.lastId, 0x0000ffffu);
  ASSERT_NE(end.lastField, nullptr);
  EXPECT_STREQ(end.lastField, kLastFieldMark);
  const uint32_t words3To7[] = {0, 0xffff, 0xffff, 0xffff, kAllOnes};
  for (size_t i = 0; i < 5; ++i) EXPECT_EQ(end.words3To7[i], words3To7[i]) << "word " << i + 3;
  for (const uint32_t word : end.zero) EXPECT_EQ(word, 0u);
  EXPECT_EQ(t.wordAfterEndRow(), 0u);
#if UINTPTR_MAX == 0xffffffffu
  // Word for word, as a 32-bit reader strides through the image.
  const auto* words = reinterpret_cast<const uint32_t*>(t.rows());
  const uint32_t* endWords = words + 19 * t.rowCount();
  EXPECT_EQ(endWords[2], static_cast<uint32_t>(reinterpret_cast<uintptr_t>(end.lastField)));
  EXPECT_EQ(endWords[19], 0u);
#endif
}

// ------------------------------------------------------------ formats and strings

TEST_F(DescriptorTablesTest, EveryFormatIsIndentationNameAndTheValuePartOfItsField) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    const std::string format = t.Format(row);
    SCOPED_TRACE(RowName(row) + " format \"" + format + "\"");
    std::string part = row.valueCount > 0 ? "%-S" : "%u";
    for (const ValuePartCase& c : kValueParts) {
      if (c.fieldIds.count(row.fieldId)) part = c.part;
    }
    if (format.empty()) {
      EXPECT_EQ(part, "");
      continue;
    }
    const auto label = FormatLabel(format);
    ASSERT_TRUE(label.has_value());
    EXPECT_EQ(label->first.substr(label->second), row.name);
    EXPECT_EQ(ValuePart(format), part);
  }
}

TEST_F(DescriptorTablesTest, StringsAreDistinctInOrderOfFirstUseAndEndWithTheMark) {
  std::set<std::string> distinct;
  for (size_t i = 0; i < t.stringCount(); ++i) {
    ASSERT_NE(t.string(i), nullptr) << "string " << i;
    EXPECT_TRUE(distinct.insert(t.string(i)).second) << "string " << i << " twice";
  }
  EXPECT_STREQ(t.string(t.stringCount() - 1), kFinalString);
  // Row by row: the format, then the texts of the row's value list.
  uint32_t next = 0;
  auto use = [&](uint32_t index, const std::string& what) {
    if (index > next) ADD_FAILURE() << what << " brings string " << index << " out of order";
    next = std::max(next, index + 1);
  };
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    use(row.formatIndex, "the format of " + RowName(row));
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      use(t.valueRow(row.firstValue + v).stringIndex, "a value of " + RowName(row));
    }
  }
  EXPECT_EQ(next, t.stringCount() - 1) << "strings that no row uses";
}

// ------------------------------------------------------------ values and pool

TEST_F(DescriptorTablesTest, ValueListsTileTheTableInRowOrder) {
  uint32_t next = 0;
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    SCOPED_TRACE(RowName(row));
    if (row.valueCount == 0) {
      EXPECT_EQ(row.firstValue, kAllOnes);
      continue;
    }
    EXPECT_EQ(row.firstValue, next);
    next = row.firstValue + row.valueCount;
    for (uint32_t v = 0; v < row.valueCount; ++v) {
      const HostValueRow& value = t.valueRow(row.firstValue + v);
      if (value.valueKind == kCatchAll) {
        EXPECT_EQ(v, 0u) << "a catch-all row stands first";
        EXPECT_EQ(value.poolIndex, kCatchAllPoolIndex);
      } else {
        EXPECT_EQ(value.valueKind, kNamedValue) << "value " << v;
        EXPECT_NE(value.poolIndex, kCatchAllPoolIndex + 1) << "value " << v;
      }
    }
  }
  EXPECT_EQ(t.valueRowCount(), next) << "the all-zero row follows the last list";
}

TEST_F(DescriptorTablesTest, PoolHoldsTheNamedNumbersInOrderOfFirstUse) {
  std::vector<uint32_t> pool;
  for (size_t i = 0; i < t.readablePoolWords(); ++i) pool.push_back(t.pool(i));
  ExpectSameSequence(pool, std::vector<uint32_t>(std::begin(kPool), std::end(kPool)), "pool");
  // Walking the value rows, each new pool index is the next one; the first
  // catch-all row brings the pair.
  uint32_t next = 0;
  for (size_t i = 0; i < t.valueRowCount(); ++i) {
    const uint32_t index = t.valueRow(i).poolIndex;
    if (index > next) ADD_FAILURE() << "value row " << i << " brings pool word " << index;
    next = std::max(next, index + (index == kCatchAllPoolIndex ? 2 : 1));
  }
}

TEST_F(DescriptorTablesTest, ValueLists) {
  for (const ValueListCase& c : kValueLists) {
    size_t rows = 0;
    for (size_t i = 0; i < t.rowCount(); ++i) {
      const HostRow& row = t.row(i);
      const bool byId = std::count(c.fieldIds.begin(), c.fieldIds.end(), row.fieldId) > 0;
      const bool byName = c.sharedByName != nullptr && row.name == std::string(c.sharedByName) &&
                          row.valueCount > 0;
      if (!byId && !byName) continue;
      ++rows;
      EXPECT_EQ(t.ValueListText(row), c.list) << RowName(row);
    }
    EXPECT_EQ(rows, c.sharedByName ? c.rows : c.fieldIds.size()) << c.list;
  }
}

// ------------------------------------------------------------ layout

TEST_F(DescriptorTablesTest, LayoutRecords) {
  for (const LayoutCase& e : kLayoutRecords) {
    SCOPED_TRACE("record at " + std::to_string(e.offset));
    EXPECT_EQ(records_[e.offset].text, e.record);
    for (const uint32_t id : e.fieldIds) {
      const HostRow* row = t.FindField(id);
      ASSERT_NE(row, nullptr) << "field " << id;
      EXPECT_EQ(row->layoutOffset, e.offset) << RowName(*row);
    }
  }
  // The empty end record and two zero bytes.
  for (uint32_t i = 0; i < 4; ++i) {
    EXPECT_EQ(t.layout()[kLayoutEndRecord + i], 0) << "byte " << kLayoutEndRecord + i;
  }
}

TEST_F(DescriptorTablesTest, EachRowsRecordGivesItsWidthAndTheBitsItsReadConsumes) {
  for (size_t i = 0; i < t.rowCount(); ++i) {
    const HostRow& row = t.row(i);
    SCOPED_TRACE(RowName(row));
    ASSERT_TRUE(records_.count(row.layoutOffset)) << "no record starts at " << row.layoutOffset;
    const LayoutRecord& r = records_.at(row.layoutOffset);
    if (row.fieldId == 682) {
      EXPECT_EQ(r.itemBits, 0u) << "the alignment padding has no layout";
    } else if (row.widthCode == kAllOnes) {
      EXPECT_TRUE(r.countIsParameter) << r.text;
    } else {
      const uint32_t width = row.widthCode & 0xffff;
      EXPECT_EQ(r.itemBits * r.count, width) << r.text;
      const auto consumed = kConsumedBits.find(row.fieldId);
      EXPECT_EQ(r.size * r.count, consumed != kConsumedBits.end() ? consumed->second : width)
          << r.text;
    }
  }
}

}  // namespace
}  // namespace rnsap::testing
