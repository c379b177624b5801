// What the passes tell the host about a field must agree with the field's
// dictionary row: the Display pass names each line by the display id of the
// row (the field id of the first row with the same name), and the
// Decoded-field pass labels each field with the indentation of the row's
// format and the row's name. Both passes walk a message read for read, so
// their reports pair up one to one.
#include <gtest/gtest.h>

#include <cstdint>
#include <map>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"
#include "tests/support/bit_writer.h"
#include "tests/tables/host_tables.h"

namespace rnsap::testing {
namespace {

struct FieldReport {
  uint32_t fieldId = 0;
  std::string label;
  std::string text;
  uint32_t displayId = 0;
  std::string displayText;
};

// Runs the Decoded-field and the Display pass on `w` and pairs their reports.
std::vector<FieldReport> Walk(const BitWriter& w) {
  host::HostDecodeContext context;
  if (!context.ready()) {
    ADD_FAILURE() << "the host set-up failed";
    return {};
  }
  context.LoadMessage(w.bytes());  // whole octets: alignment counts from the end
  host::ResetHost();
  EXPECT_TRUE(vex_PreDecodeMD(&context.decode_request()));
  const std::vector<host::DecodedFieldReport> decoded = host::DecodedFields();
  context.Rewind();
  host::ResetHost();
  EXPECT_TRUE(vex_PreDecodeTO(&context.decode_request()));
  const std::vector<host::DisplayLine>& lines = host::DisplayLines();
  EXPECT_EQ(decoded.size(), lines.size()) << "the passes walked apart";
  std::vector<FieldReport> reports;
  for (size_t i = 0; i < decoded.size() && i < lines.size(); ++i) {
    reports.push_back(
        {decoded[i].fieldId, decoded[i].label, decoded[i].text, lines[i].displayId, lines[i].text});
  }
  return reports;
}

void PutRandomOctets(BitWriter& w, std::mt19937& rng, int octets) {
  for (int i = 0; i < octets; ++i) w.Put(rng() & 0xff, 8);
}

// A sub-identifier of one to three octets, each octet's first bit telling
// whether another follows.
void PutSubIdentifier(BitWriter& w, uint32_t value, int octets) {
  for (int i = octets - 1; i >= 0; --i) w.Put(i > 0, 1).Put((value >> (7 * i)) & 0x7f, 7);
}

struct PrivateIdentifier {
  bool longSize = false;
  uint32_t nation = 440;
  int nationOctets = 2;
  uint32_t company = 200043;
  int companyOctets = 3;
  uint32_t protocol = 3;
};

// A private message (procedure 15) of one IE with a global identifier; the
// body is left to the caller.
BitWriter PrivateMessage(const PrivateIdentifier& id, uint32_t ie) {
  BitWriter w = PublicHeader(0, 15, 0);  // a count of 0 is one IE
  w.Align().Put(1, 1);                   // global identifier
  w.Align();
  if (id.longSize) {
    w.Put(1, 1).Put(0, 1).Put(9, 14);
  } else {
    w.Put(0, 1).Put(9, 7);
  }
  w.Put(0, 1).Put(1, 7);  // first sub-identifier
  PutSubIdentifier(w, id.nation, id.nationOctets);
  PutSubIdentifier(w, id.company, id.companyOctets);
  w.Put(0, 1).Put(id.protocol, 7);
  w.Put(0, 1).Put(ie, 7);
  w.Put(1, 2).Align().Put(0, 1).Put(20, 7);  // criticality ignore
  return w;
}

// A public message whose extension list holds one extension.
BitWriter ExtensionMessage(uint32_t extensionId) {
  BitWriter w = PublicHeader(0, 20, 0, true);
  w.Align().Put(0, 16);  // a count of 0 is one extension
  w.Align().Put(extensionId, 16).Put(1, 2).Align().Put(0, 1).Put(20, 7);  // ignore
  return w;
}

// The header with the long forms of the transaction id and the message size.
BitWriter LongFormHeader(uint32_t ieCount) {
  BitWriter w;
  w.Put(0, 1).Put(0, 2).Align().Put(20, 8);
  w.Put(1, 2).Put(0, 2);
  w.Put(1, 1).Align().Put(0x1234, 16);
  w.Align().Put(1, 1).Put(0, 1).Put(300, 14);
  w.Put(0, 1).Put(0, 1).Align();
  return w.Put(ieCount, 16);
}

// A private message of one IE with a local identifier and the long length
// form; the body is left to the caller.
BitWriter LocalPrivateMessage() {
  BitWriter w = PublicHeader(0, 15, 0);
  w.Align().Put(0, 1).Align().Put(0x0102, 16);
  return w.Put(2, 2).Align().Put(1, 1).Put(0, 1).Put(200, 14);
}

// Messages that walk through much of the description: every IE id, every
// extension id and every private IE, with varied bits behind their frames.
std::vector<BitWriter> Corpus() {
  std::vector<BitWriter> corpus;
  std::mt19937 rng(20050201);
  for (uint32_t pduType = 0; pduType < 4; ++pduType) corpus.push_back(PublicHeader(pduType, 20, 0));
  for (int seed = 0; seed < 6; ++seed) {
    BitWriter longForms = LongFormHeader(1);
    PutIeFrame(longForms, seed, 40);
    PutRandomOctets(longForms, rng, 48);
    corpus.push_back(longForms);
    BitWriter local = LocalPrivateMessage();
    PutRandomOctets(local, rng, 48);
    corpus.push_back(local);
    for (uint32_t ie = 0; ie < 210; ++ie) {
      BitWriter w = PublicHeader(seed % 3, 20, 1);
      PutIeFrame(w, ie, 40);
      PutRandomOctets(w, rng, 48);
      corpus.push_back(w);
    }
    for (uint32_t extension = 0; extension < 42; ++extension) {
      BitWriter w = ExtensionMessage(extension);
      PutRandomOctets(w, rng, 48);
      corpus.push_back(w);
    }
    for (uint32_t ie = 0; ie < 9; ++ie) {
      for (int octets = 1; octets <= 3; ++octets) {
        PrivateIdentifier id;
        id.longSize = (ie + octets + seed) % 2 == 1;
        id.nationOctets = octets;
        id.companyOctets = 4 - octets;
        id.protocol = (ie + seed) % 5;
        BitWriter w = PrivateMessage(id, ie);
        PutRandomOctets(w, rng, 48);
        corpus.push_back(w);
      }
    }
  }
  // The IMSI of eight octets, with and without a 16th digit.
  for (const uint32_t filler : {15, 3}) {
    BitWriter w = PublicHeader(0, 20, 1);
    PutIeFrame(w, 84, 9).Put(5, 3).Align();
    for (uint32_t octet = 0; octet < 7; ++octet) w.Put(0x21 + 0x22 * octet, 8);
    w.Put(filler << 4 | 9, 8);
    corpus.push_back(w);
  }
  return corpus;
}

// The paired reports of every message of the corpus, walked once.
const std::vector<std::vector<FieldReport>>& CorpusReports() {
  static const std::vector<std::vector<FieldReport>> reports = [] {
    std::vector<std::vector<FieldReport>> all;
    for (const BitWriter& message : Corpus()) all.push_back(Walk(message));
    return all;
  }();
  return reports;
}

class DisplayIdsTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(t.complete()); }

  const HostRow& RowOf(uint32_t fieldId) {
    const HostRow* row = t.FindField(fieldId);
    EXPECT_NE(row, nullptr) << "field " << fieldId << " has no dictionary row";
    static const HostRow none{};
    return row ? *row : none;
  }

  const HostTables& t = Tables();
};

TEST_F(DisplayIdsTest, EveryLineCarriesTheDisplayIdOfItsRow) {
  std::map<uint32_t, uint32_t> displayIds;  // by field id, from the dictionary
  for (const std::vector<FieldReport>& reports : CorpusReports()) {
    for (const FieldReport& r : reports) {
      auto it = displayIds.find(r.fieldId);
      if (it == displayIds.end()) {
        const HostRow& row = RowOf(r.fieldId);
        if (row.name == nullptr) continue;
        it = displayIds.emplace(r.fieldId, t.DisplayId(row)).first;
      }
      EXPECT_EQ(r.displayId, it->second) << "field " << r.fieldId;
    }
  }
  // The corpus reaches the fields whose names are shared in odd ways.
  for (uint32_t id :
       {688,  692,  696,  698,  702,  705,  725,  737, 3216, 3223, 3226, 3244, 3248, 3250,
        3264, 3268, 3270, 2551, 2552, 3388, 2587, 709, 2562, 2918, 2920, 2923, 2925}) {
    EXPECT_TRUE(displayIds.count(id)) << "field " << id << " not reached by the corpus";
  }
}

TEST_F(DisplayIdsTest, LabelsAreTheIndentationOfTheFormatAndTheName) {
  // Where the format is indented more than the label, or the label not at all.
  const std::map<uint32_t, std::string> exceptions{{3248, "  Nation"},
                                                   {3264, "  Company"},
                                                   {3272, "  Protocol"},
                                                   {2923, "IMSI"},
                                                   {2925, "IMSI"}};
  std::set<uint32_t> checked;
  for (const std::vector<FieldReport>& reports : CorpusReports()) {
    for (const FieldReport& r : reports) {
      if (!checked.insert(r.fieldId).second) continue;
      const HostRow& row = RowOf(r.fieldId);
      if (row.name == nullptr) continue;
      const std::string format = t.Format(row);
      SCOPED_TRACE(RowName(row) + " format \"" + format + "\"");
      const auto label = FormatLabel(format);
      if (!label) {
        EXPECT_EQ(r.text, "");  // the empty format of Filler
        continue;
      }
      const auto it = exceptions.find(r.fieldId);
      const std::string expected =
          it != exceptions.end() ? it->second : std::string(label->second, ' ') + row.name;
      EXPECT_EQ(r.label, expected);
      // The text is the format's, up to its value part.
      EXPECT_EQ(r.text.substr(0, label->first.size() + 1), label->first + "=");
    }
  }
  for (const auto& [id, label] : exceptions) {
    EXPECT_TRUE(checked.count(id)) << "field " << id << " not reached by the corpus";
  }
}

}  // namespace
}  // namespace rnsap::testing
