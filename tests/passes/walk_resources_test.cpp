// What a walk takes from its host besides the message: no allocation of its
// own, none at all on a second pass over the same message, and no more than
// a 64 KiB thread stack at any depth of nesting.
#include <gtest/gtest.h>
#include <pthread.h>

#include <atomic>
#include <cstdlib>
#include <new>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "tests/stand_in/recorder.h"
#include "tests/passes/pass_messages.h"
#include "tests/support/generated_corpus.h"

namespace {
std::atomic<uint32_t> newCalls{0};
}  // namespace

void* operator new(size_t size) {
  ++newCalls;
  if (void* block = std::malloc(size ? size : 1)) return block;
  throw std::bad_alloc();
}
void operator delete(void* block) noexcept { std::free(block); }
void operator delete(void* block, size_t) noexcept { std::free(block); }

namespace rnsap::testing {
namespace {

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

// Every allocation of a pass goes through the host, and only where a table grows.
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
