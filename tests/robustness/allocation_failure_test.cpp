// Every allocation a pass makes, made to fail in turn: the pass gives up at
// once with the flag of the table that could not grow, writes no bitsLeftOut
// and closes no layer row, keeps what it reported, and leaves the buffer as
// far as the walk had got with it, without a crash or a leak; the host's
// arrays serve the next message.
#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "hostrt/setup.h"
#include "tests/passes/pass_messages.h"
#include "tests/stand_in/recorder.h"
#include "tests/support/generated_corpus.h"

namespace rnsap {
namespace {

// First capacities of one entry: every pass grows the layer table once at its
// start (a reporting pass of a further layer the host's layer rows before
// that) and the position stack as the rules nest, the first time for the
// outermost rule, before the buffer is reversed.
constexpr host::HostDecodeCapacities kOneEntryEach{
    .positionStack = 1, .layerTable = 1, .layerRows = 1};
constexpr uint32_t kFurtherLayerRow = 1;
constexpr uint32_t kMemoryFlags = ERR_LAYER | ERR_NO_MEMORY_STACK | ERR_NO_MEMORY_SEGMENTS;

// The host's layer rows grow ahead of the layer table in a reporting pass.
uint32_t LayerGrowths(testing::Pass pass) {
  return pass == testing::Pass::kDecodedField || pass == testing::Pass::kDisplay ? 2 : 1;
}

// The message as the walk's reversal leaves it: every whole octet mirrored.
std::vector<uint8_t> Reversed(std::vector<uint8_t> octets) {
  for (uint8_t& octet : octets) {
    uint8_t mirrored = 0;
    for (int bit = 0; bit < 8; ++bit)
      mirrored |= static_cast<uint8_t>(((octet >> bit) & 1) << (7 - bit));
    octet = mirrored;
  }
  return octets;
}

// What one run of a pass with allocation call `failingCall` failing left, and
// what the pass then made of the message loaded afresh.
struct FailedRun {
  int32_t result = 0;
  uint32_t flags = 0;
  bool bitsLeftOutWritten = false;  // of either request
  std::vector<uint8_t> buffer;
  uint32_t allocationCalls = 0;
  uint32_t stackCapacity = 0;
  uint32_t layerRowIndex = 0;
  std::vector<std::string> reports;  // field texts and display lines
  int32_t nextResult = 0;
};

FailedRun RunWithFailure(testing::Pass pass, const std::vector<uint8_t>& message,
                         uint32_t failingCall) {
  host::HostDecodeContext context(kOneEntryEach);
  EXPECT_TRUE(context.ready());
  context.LoadMessage(message);
  context.decode_request().layerRowIndex = kFurtherLayerRow;
  host::ResetHost();
  host::FailAllocationCall(failingCall);
  context.decode_request().bitsLeftOut = context.key_request().bitsLeftOut = testing::kUnwritten;
  FailedRun run;
  run.result = testing::RunPass(pass, context);
  const uint8_t* buffer = context.state().buffer;
  run.flags = context.state().flags;
  run.bitsLeftOutWritten = context.decode_request().bitsLeftOut != testing::kUnwritten ||
                           context.key_request().bitsLeftOut != testing::kUnwritten;
  run.buffer = {buffer, buffer + message.size()};
  run.allocationCalls = host::AllocationCalls();
  run.stackCapacity = context.state().stackCapacity;
  run.layerRowIndex = context.decode_request().layerRowIndex;
  for (const host::DecodedFieldReport& field : host::DecodedFields())
    run.reports.push_back(field.text);
  for (const host::DisplayLine& line : host::DisplayLines()) run.reports.push_back(line.text);
  context.LoadMessage(message);
  host::ResetRecorder();
  run.nextResult = testing::RunPass(pass, context);
  return run;
}

// Runs `pass` over `message` with each of its allocations failing in turn;
// returns how many of them grew the segments.
uint32_t SweepAllocationFailures(testing::Pass pass, const std::vector<uint8_t>& message) {
  SCOPED_TRACE(testing::NameOf(pass) + " pass");
  const uint32_t layerGrowths = LayerGrowths(pass);
  const FailedRun unfailed = RunWithFailure(pass, message, 0);
  EXPECT_EQ(unfailed.result, 1);
  const uint32_t stackGrowths = static_cast<uint32_t>(std::countr_zero(unfailed.stackCapacity));
  EXPECT_GE(unfailed.allocationCalls, layerGrowths + stackGrowths);
  uint32_t stackFailures = 0, segmentFailures = 0;
  for (uint32_t call = 1; call <= unfailed.allocationCalls; ++call) {
    SCOPED_TRACE("allocation " + std::to_string(call));
    const FailedRun run = RunWithFailure(pass, message, call);
    EXPECT_EQ(run.result, 0);
    EXPECT_FALSE(run.bitsLeftOutWritten);
    EXPECT_EQ(run.layerRowIndex, kFurtherLayerRow) << "a layer row closed";
    EXPECT_EQ(run.allocationCalls, call) << "the pass went on after the failure";
    EXPECT_EQ(run.nextResult, 1) << "the message loaded afresh";
    EXPECT_TRUE(run.reports.size() <= unfailed.reports.size() &&
                std::equal(run.reports.begin(), run.reports.end(), unfailed.reports.begin()))
        << "reports that the run without failure does not begin with";
    const uint32_t memoryFlags = run.flags & kMemoryFlags;
    EXPECT_EQ(memoryFlags == ERR_LAYER, call <= layerGrowths) << std::hex << run.flags;
    stackFailures += memoryFlags == ERR_NO_MEMORY_STACK;
    segmentFailures += memoryFlags == ERR_NO_MEMORY_SEGMENTS;
    if (memoryFlags == ERR_NO_MEMORY_SEGMENTS && LayerGrowths(pass) == 2) {
      EXPECT_FALSE(run.reports.empty()) << "the fields before the failed one stay reported";
    }
    EXPECT_EQ(run.buffer, call <= layerGrowths + 1 ? message : Reversed(message));
  }
  EXPECT_EQ(stackFailures, stackGrowths);
  EXPECT_EQ(segmentFailures, unfailed.allocationCalls - layerGrowths - stackGrowths);
  return segmentFailures;
}

// Two bit strings of 250 and 300 bits (IE 85): segments grow twice, each time
// to the exact need.
std::vector<uint8_t> LongBitStrings() {
  testing::BitWriter w = testing::PublicHeader(0, 20, 2);
  for (uint32_t bits : {250u, 300u}) {
    testing::PutIeFrame(w, 85, (bits + 7) / 8 + 3).Align();
    w.Put(1, 1).Put(0, 1).Put(bits, 14);
    for (uint32_t i = 0; i < bits; ++i) w.Put(i % 3 == 0, 1);
  }
  w.Align();
  return w.bytes();
}

// The longest generated messages, which nest their rules the deepest.
std::vector<std::vector<uint8_t>> LongestGeneratedMessages(size_t count) {
  auto messages = testing::ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS);
  std::ranges::stable_sort(messages, std::ranges::greater{}, &std::vector<uint8_t>::size);
  messages.resize(std::min(count, messages.size()));
  return messages;
}

TEST(AllocationFailureTest, EveryPassGivesUpOnEachFailedGrowthOfLongSegments) {
  for (const testing::Pass pass : testing::kAllPasses)
    EXPECT_EQ(SweepAllocationFailures(pass, LongBitStrings()), 2u);
}

TEST(AllocationFailureTest, EveryPassGivesUpOnEachFailedGrowthOfGeneratedMessages) {
  const auto messages = LongestGeneratedMessages(3);
  ASSERT_FALSE(messages.empty()) << "no messages in " << RNSAP_MESSAGE_CORPUS;
  for (const auto& message : messages) {
    SCOPED_TRACE("generated message of " + std::to_string(message.size()) + " octets");
    for (const testing::Pass pass : testing::kAllPasses) SweepAllocationFailures(pass, message);
  }
}

}  // namespace
}  // namespace rnsap
