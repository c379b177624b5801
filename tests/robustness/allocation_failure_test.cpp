// What a walk takes from its host besides the message. Every allocation a
// pass makes, made to fail in turn: the pass gives up at once with the flag of
// the table that could not grow, writes no bitsLeftOut and closes no layer
// row, keeps what it reported, and leaves the buffer as far as the walk had
// got with it, without a crash or a leak; the host's arrays serve the next
// message. No allocation of its own, none at all on a second pass over the
// same message, and no more than a 64 KiB thread stack at any depth of
// nesting.
#include <gtest/gtest.h>
#include <pthread.h>

#include <algorithm>
#include <atomic>
#include <bit>
#include <cstdlib>
#include <new>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "hostrt/setup.h"
#include "tests/passes/pass_messages.h"
#include "tests/stand_in/recorder.h"
#include "tests/support/generated_corpus.h"

namespace {
std::atomic<uint32_t> newCalls{0};
}  // namespace

// None of the replacements is inlined, so that the compiler does not take
// the free of a block from the replaced operator new for a mismatch.
[[gnu::noinline]] void* operator new(size_t size) {
  ++newCalls;
  if (void* block = std::malloc(size ? size : 1)) return block;
  throw std::bad_alloc();
}
[[gnu::noinline]] void* operator new(size_t size, const std::nothrow_t&) noexcept {
  ++newCalls;
  return std::malloc(size ? size : 1);
}
[[gnu::noinline]] void operator delete(void* block) noexcept { std::free(block); }
[[gnu::noinline]] void operator delete(void* block, size_t) noexcept { std::free(block); }

namespace rnsap::testing {
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
uint32_t LayerGrowths(Pass pass) {
  return pass == Pass::kDecodedField || pass == Pass::kDisplay ? 2 : 1;
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

FailedRun RunWithFailure(Pass pass, const std::vector<uint8_t>& message, uint32_t failingCall) {
  host::HostDecodeContext context(kOneEntryEach);
  EXPECT_TRUE(context.ready());
  context.LoadMessage(message);
  context.decode_request().layerRowIndex = kFurtherLayerRow;
  host::ResetHost();
  host::FailAllocationCall(failingCall);
  context.decode_request().bitsLeftOut = context.key_request().bitsLeftOut = kUnwritten;
  FailedRun run;
  run.result = RunPass(pass, context);
  const uint8_t* buffer = context.state().buffer;
  run.flags = context.state().flags;
  run.bitsLeftOutWritten = context.decode_request().bitsLeftOut != kUnwritten ||
                           context.key_request().bitsLeftOut != kUnwritten;
  run.buffer = {buffer, buffer + message.size()};
  run.allocationCalls = host::AllocationCalls();
  run.stackCapacity = context.state().stackCapacity;
  run.layerRowIndex = context.decode_request().layerRowIndex;
  for (const host::DecodedFieldReport& field : host::DecodedFields())
    run.reports.push_back(field.text);
  for (const host::DisplayLine& line : host::DisplayLines()) run.reports.push_back(line.text);
  context.LoadMessage(message);
  host::ResetRecorder();
  run.nextResult = RunPass(pass, context);
  return run;
}

// Runs `pass` over `message` with each of its allocations failing in turn;
// returns how many of them grew the segments.
uint32_t SweepAllocationFailures(Pass pass, const std::vector<uint8_t>& message) {
  SCOPED_TRACE(NameOf(pass) + " pass");
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
  BitWriter w = PublicHeader(0, 20, 2);
  for (uint32_t bits : {250u, 300u}) {
    PutIeFrame(w, 85, (bits + 7) / 8 + 3).Align();
    w.Put(1, 1).Put(0, 1).Put(bits, 14);
    for (uint32_t i = 0; i < bits; ++i) w.Put(i % 3 == 0, 1);
  }
  w.Align();
  return w.bytes();
}

// The longest generated messages, which nest their rules the deepest.
std::vector<std::vector<uint8_t>> LongestGeneratedMessages(size_t count) {
  auto messages = ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS);
  std::ranges::stable_sort(messages, std::ranges::greater{}, &std::vector<uint8_t>::size);
  messages.resize(std::min(count, messages.size()));
  return messages;
}

TEST(AllocationFailureTest, EveryPassGivesUpOnEachFailedGrowthOfLongSegments) {
  for (const Pass pass : kAllPasses) EXPECT_EQ(SweepAllocationFailures(pass, LongBitStrings()), 2u);
}

TEST(AllocationFailureTest, EveryPassGivesUpOnEachFailedGrowthOfGeneratedMessages) {
  const auto messages = LongestGeneratedMessages(3);
  ASSERT_FALSE(messages.empty()) << "no messages in " << RNSAP_MESSAGE_CORPUS;
  for (const auto& message : messages) {
    SCOPED_TRACE("generated message of " + std::to_string(message.size()) + " octets");
    for (const Pass pass : kAllPasses) SweepAllocationFailures(pass, message);
  }
}

// Runs `pass` afresh on the message loaded in `host`.
int32_t RunAfresh(Pass pass, PassHost& host) {
  host.context().Rewind();
  host::ResetRecorder();
  return RunPass(pass, host.context());
}

// What a host reads of one pass over a message.
struct PassOutcome {
  int32_t result;
  uint32_t position, bitsLeft, flags, reports;
  bool operator==(const PassOutcome&) const = default;
};

// Runs the four passes over each message, against the counting host.
std::vector<PassOutcome> RunAllPasses(const std::vector<std::vector<uint8_t>>& messages) {
  std::vector<PassOutcome> outcomes;
  PassHost host;
  for (const auto& message : messages) {
    host.Load(message, static_cast<uint32_t>(8 * message.size()));
    for (const Pass pass : kAllPasses) {
      const int32_t result = RunAfresh(pass, host);
      const DecodeState& s = host.state();
      outcomes.push_back({result, s.position, s.bitsLeft, s.flags, host::ReportCount()});
    }
  }
  return outcomes;
}

struct ThreadRun {
  const std::vector<std::vector<uint8_t>>* messages;
  std::vector<PassOutcome> outcomes;
};

// An optimised module needs 64 KiB; unoptimised or AddressSanitizer code
// keeps every value of a rule in a frame many times as large.
#if defined(__OPTIMIZE__) && !defined(__SANITIZE_ADDRESS__)
constexpr size_t kSmallStack = 64 * 1024;
#else
constexpr size_t kSmallStack = 4 * 1024 * 1024;
#endif

// The passes on a thread of a small stack, where an overrun faults on the guard page.
std::vector<PassOutcome> RunOnSmallStack(const std::vector<std::vector<uint8_t>>& messages) {
  ThreadRun run{&messages, {}};
  pthread_attr_t attr;
  pthread_attr_init(&attr);
  EXPECT_EQ(pthread_attr_setstacksize(&attr, kSmallStack), 0);
  pthread_t thread;
  const auto body = [](void* arg) -> void* {
    auto* r = static_cast<ThreadRun*>(arg);
    r->outcomes = RunAllPasses(*r->messages);
    return nullptr;
  };
  EXPECT_EQ(pthread_create(&thread, &attr, body, &run), 0);
  pthread_join(thread, nullptr);
  pthread_attr_destroy(&attr);
  return run.outcomes;
}

class WalkResourcesTest : public ::testing::Test {
 protected:
  void SetUp() override { host::SetReportMode(host::ReportMode::kCount); }
  void TearDown() override { host::SetReportMode(host::ReportMode::kRecord); }
};

TEST_F(WalkResourcesTest, EveryPassRunsOnASmallStack) {
  const std::vector<std::vector<uint8_t>> deepest{DeepestNesting().bytes()};
  const std::vector<PassOutcome> atTheBound = RunOnSmallStack(deepest);
  ASSERT_EQ(atTheBound.size(), 4u);
  for (const PassOutcome& outcome : atTheBound) {
    EXPECT_EQ(outcome.result, 0);
    EXPECT_EQ(outcome.flags & ERR_NO_MEMORY_STACK, ERR_NO_MEMORY_STACK);
  }
  const auto generated = ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS);
  ASSERT_FALSE(generated.empty());
  EXPECT_EQ(RunOnSmallStack(generated), RunAllPasses(generated));
}

// Every allocation of a pass goes through the host, and only where a table
// grows.
TEST_F(WalkResourcesTest, APassAllocatesNothingOfItsOwnAndASecondOneNothingAtAll) {
  PassHost host;
  for (const auto& message : ReadGeneratedMessages(RNSAP_MESSAGE_CORPUS)) {
    host.Load(message, static_cast<uint32_t>(8 * message.size()));
    for (const Pass pass : kAllPasses)
      for (int round = 0; round < 2; ++round) {
        newCalls = 0;
        ASSERT_EQ(RunAfresh(pass, host), 1);
        ASSERT_EQ(newCalls.load(), 0u) << NameOf(pass);
        if (round == 1) {
          ASSERT_EQ(host::AllocationCalls(), 0u) << NameOf(pass);
        }
      }
  }
}

}  // namespace
}  // namespace rnsap::testing
