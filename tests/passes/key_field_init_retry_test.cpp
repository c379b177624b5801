// The Key-field pass asks the host library to initialise until it has
// succeeded, and with a result above 1 marks the row the library names in
// every later pass. The result is kept for the life of the module, so this
// program drives one module through one sequence: 0, 0, 2, then no call.
#include <gtest/gtest.h>

#include <cstdint>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

constexpr uint16_t kMarkRow = 163;  // the row with the empty name: no field stores there
constexpr uint32_t kPduTypeRow = 0;

TEST(KeyFieldInitRetryTest, UnfinishedThenMarkingInitialisation) {
  PassHost host;
  ASSERT_TRUE(host.ready());
  host::ResetHost();
  host.Load(PublicHeader(0, 20, 0));
  const auto runPass = [&] {
    host.context().Rewind();  // an empty key buffer for each pass
    return KFE_vorel_rnsap_04b(&host.key_request());
  };
  host::SetInitialiseResult(0);
  EXPECT_EQ(runPass(), 1) << "a result of 0 lets the pass go on";
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
  ASSERT_EQ(host::LastKeyTable().size(), 164u);
  EXPECT_TRUE(host.KeyPresent(kPduTypeRow));
  EXPECT_FALSE(host.KeyPresent(kMarkRow));
  EXPECT_EQ(host.key_request().bitsLeftOut, 0u);

  EXPECT_EQ(runPass(), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 2u) << "0 is tried again at the next pass";
  EXPECT_FALSE(host.KeyPresent(kMarkRow));

  host::SetInitialiseResult(2, kMarkRow);
  EXPECT_EQ(runPass(), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u);
  EXPECT_TRUE(host.KeyPresent(kMarkRow));
  EXPECT_TRUE(host.KeyPresent(kPduTypeRow));

  host::SetInitialiseResult(0);
  for (int pass = 0; pass < 2; ++pass) {
    EXPECT_EQ(runPass(), 1);
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u) << "initialised: no further call";
    EXPECT_TRUE(host.KeyPresent(kMarkRow)) << "the row is marked in every pass";
  }
}

}  // namespace
}  // namespace rnsap::testing
