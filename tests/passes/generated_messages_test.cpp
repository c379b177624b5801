// Runs the messages that generator/message_gen.py wrote from the protocol
// description through all four passes. Each message comes with the walk the
// generator made of it: the Decoded-field pass must report exactly those
// fields (the Display pass's lines, one per field, are the descriptor tables
// test's), and every pass must end where the walk ends, with its flags, leave
// the field record as the Decoded-field pass leaves it, and give the message
// back as it was.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "boundary/module_api.h"
#include "engine/grammar_tables.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"
#include "tests/support/record_snapshot.h"

namespace rnsap {
namespace {

using testing::BitRange;

struct GeneratedMessage {
  std::string title;  // the comment above it, and its line in the corpus
  std::vector<uint8_t> octets;
  std::vector<std::pair<uint32_t, std::string>> fields;  // id, "first-last" or "-"
  std::set<std::pair<std::string, uint32_t>> reached;    // dispatch table, id
  uint32_t position = 0;
  uint32_t bitsLeftOut = 0;
  uint32_t validationFlags = 0;  // the Validation pass also checks loop counts
  uint32_t flags = 0;
};

std::vector<GeneratedMessage> LoadCorpus() {
  std::vector<GeneratedMessage> corpus;
  std::ifstream in(RNSAP_MESSAGE_CORPUS);
  std::string line, comment;
  for (int number = 1; std::getline(in, line); ++number) {
    std::istringstream words(line);
    std::string keyword, word;
    words >> keyword;
    if (keyword == "#") {
      comment = line.substr(2);
    } else if (keyword == "message") {
      words >> word;
      GeneratedMessage& m = corpus.emplace_back();
      m.title = comment + " (line " + std::to_string(number) + ")";
      m.octets = testing::HexOctets(word);
    } else if (keyword == "field") {
      uint32_t id = 0;
      words >> id >> word;
      corpus.back().fields.emplace_back(id, word);
    } else if (keyword == "reach") {
      uint32_t id = 0;
      words >> word >> id;
      corpus.back().reached.emplace(word, id);
    } else if (keyword == "end") {
      GeneratedMessage& m = corpus.back();
      std::sscanf(line.c_str(), "end position=%u bitsLeftOut=%u flags=%u passFlags=%u", &m.position,
                  &m.bitsLeftOut, &m.validationFlags, &m.flags);
    }
  }
  return corpus;
}

const std::vector<GeneratedMessage>& Corpus() {
  static const std::vector<GeneratedMessage> corpus = LoadCorpus();
  return corpus;
}

// Where the Decoded-field reports first leave the generated walk; empty when
// they follow it.
std::string DecodedDeparture(const GeneratedMessage& m) {
  const auto& decoded = host::DecodedFields();
  for (size_t i = 0; i < m.fields.size() && i < decoded.size(); ++i) {
    const auto& [id, bits] = m.fields[i];
    if (decoded[i].fieldId != id || BitRange(decoded[i].segments) != bits)
      return "field " + std::to_string(i) + ": expected " + std::to_string(id) + " " + bits +
             ", decoded " + std::to_string(decoded[i].fieldId) + " " +
             BitRange(decoded[i].segments);
  }
  if (decoded.size() != m.fields.size())
    return std::to_string(decoded.size()) + " fields decoded of " + std::to_string(m.fields.size());
  return "";
}

TEST(GeneratedMessagesTest, EveryPassWalksEachMessageAsGenerated) {
  ASSERT_FALSE(Corpus().empty()) << "no messages in " << RNSAP_MESSAGE_CORPUS;
  testing::PassHost host;
  ASSERT_TRUE(host.ready());
  for (size_t index = 0; index < Corpus().size(); ++index) {
    const GeneratedMessage& m = Corpus()[index];
    SCOPED_TRACE("message " + std::to_string(index) + ": " + m.title);
    host.Load(m.octets, static_cast<uint32_t>(8 * m.octets.size()));
    std::map<std::string, std::vector<uint8_t>> records;  // by pass
    for (const testing::Pass pass : testing::kAllPasses) {
      host::ResetRecorder();
      host.context().Rewind();
      testing::FillRecord(host.state());
      ASSERT_EQ(testing::RunPass(pass, host.context()), 1);
      records[testing::NameOf(pass)] = testing::RecordSnapshot(host.state());
      EXPECT_EQ(host.state().position, m.position);
      EXPECT_EQ(testing::BitsLeftOut(pass, host.context()), m.bitsLeftOut);
      EXPECT_EQ(host.state().flags,
                pass == testing::Pass::kValidation ? m.validationFlags : m.flags);
      EXPECT_TRUE(host.BufferRestored());
      if (pass == testing::Pass::kDecodedField) {
        EXPECT_EQ(DecodedDeparture(m), "");
      }
    }
    for (const auto& [pass, record] : records)
      EXPECT_TRUE(record == records["Decoded-field"]) << pass << " pass leaves another record";
  }
}

// A dispatch branch that no generated message passes through is a branch
// whose messages the generator could not write.
TEST(GeneratedMessagesTest, CoverEveryDispatchBranch) {
  static const char* const kTables[] = {"ie", "extension", "private"};
  std::set<std::pair<std::string, uint32_t>> reached;
  for (const GeneratedMessage& m : Corpus()) reached.insert(m.reached.begin(), m.reached.end());
  for (uint32_t t = 0; t < 3; ++t) {
    const grammar::DispatchTable& table = grammar::kDispatchTables[t];
    for (uint32_t id = 0; id < table.size; ++id) {
      if (table.branches[id] >= 0) {
        EXPECT_TRUE(reached.count({kTables[t], id}))
            << "no message reaches " << kTables[t] << " " << id;
      }
    }
  }
}

}  // namespace
}  // namespace rnsap
