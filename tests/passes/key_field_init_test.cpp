// The Key-field pass asks the host library to initialise until it has
// succeeded; a result above 1 marks the row the library names in every later
// pass, a negative one is the pass's answer from then on. The result is kept
// for the life of the module, so each test runs its passes in a child process
// of its own, which meets the module as no pass has left it.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>

#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

constexpr uint16_t kMarkRow = 163;  // the row with the empty name: no field stores there
constexpr uint32_t kPduTypeRow = 0;

class KeyFieldInitTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(host.ready());
    host::ResetHost();
    host.Load(PublicHeader(0, 20, 0));
  }
  // Runs `passes` in a forked child; this process never runs the pass.
  template <class Passes>
  void InFreshModule(Passes passes) {
    EXPECT_EXIT((passes(), std::exit(HasFailure())), ::testing::ExitedWithCode(0), "");
  }
  int RunPass() {
    host.context().Rewind();  // an empty key buffer for each pass
    host.key_request().bitsLeftOut = kUnwritten;
    return KFE_vorel_rnsap_04b(&host.key_request());
  }
  PassHost host;
};

TEST_F(KeyFieldInitTest, UnfinishedThenMarkingInitialisation) {
  InFreshModule([this] {
    host::SetInitialiseResult(0);
    EXPECT_EQ(RunPass(), 1) << "a result of 0 lets the pass go on";
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
    ASSERT_EQ(host::LastKeyTable().size(), 164u);
    EXPECT_TRUE(host.KeyPresent(kPduTypeRow));
    EXPECT_FALSE(host.KeyPresent(kMarkRow));
    EXPECT_EQ(host.key_request().bitsLeftOut, 0u);

    EXPECT_EQ(RunPass(), 1);
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 2u) << "0 is tried again at the next pass";
    EXPECT_FALSE(host.KeyPresent(kMarkRow));

    host::SetInitialiseResult(2, kMarkRow);
    for (uint32_t pass = 0; pass < 3; ++pass) {
      EXPECT_EQ(RunPass(), 1);
      EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u) << "initialised: no further call";
      EXPECT_TRUE(host.KeyPresent(kMarkRow)) << "the row is marked in every pass";
      EXPECT_TRUE(host.KeyPresent(kPduTypeRow));
      host::SetInitialiseResult(0);
    }
  });
}

TEST_F(KeyFieldInitTest, NegativeResultIsReturnedForGoodWithoutAnotherCall) {
  InFreshModule([this] {
    KeyFieldRequest& key = host.key_request();
    const uint16_t keyOffset = key.keyOffset;
    host::SetInitialiseResult(-7, 3);
    for (int pass = 0; pass < 3; ++pass) {
      EXPECT_EQ(RunPass(), -7);
      EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
      EXPECT_EQ(key.bitsLeftOut, kUnwritten);
      EXPECT_EQ(host.state().position, 1u) << "nothing was decoded";
      EXPECT_TRUE(host.BufferRestored()) << "nor reversed";
      EXPECT_EQ(key.keyOffset, keyOffset);
      EXPECT_TRUE(std::all_of(key.keyBuffer, key.keyBuffer + keyOffset + 64,
                              [](uint8_t b) { return b == 0; }));
      host::SetInitialiseResult(1);
    }
  });
}

}  // namespace
}  // namespace rnsap::testing
