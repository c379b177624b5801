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

class KeyFieldInitRetryTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(host_.ready());
    host::ResetHost();
    host_.Load(PublicHeader(0, 20, 0));
  }

  int32_t Pass() {
    host_.context().Rewind();  // an empty key buffer for each pass
    return KFE_vorel_rnsap_04b(&host_.key_request());
  }
  bool Present(uint32_t row) { return host_.KeyPresent(row); }

  PassHost host_;
};

TEST_F(KeyFieldInitRetryTest, UnfinishedThenMarkingInitialisation) {
  host::SetInitialiseResult(0);
  EXPECT_EQ(Pass(), 1) << "a result of 0 lets the pass go on";
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
  ASSERT_EQ(host::LastKeyTable().size(), 164u);
  EXPECT_TRUE(Present(kPduTypeRow));
  EXPECT_FALSE(Present(kMarkRow));
  EXPECT_EQ(host_.key_request().bitsLeftOut, 0u);

  EXPECT_EQ(Pass(), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 2u) << "0 is tried again at the next pass";
  EXPECT_FALSE(Present(kMarkRow));

  host::SetInitialiseResult(2, kMarkRow);
  EXPECT_EQ(Pass(), 1);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u);
  EXPECT_TRUE(Present(kMarkRow));
  EXPECT_TRUE(Present(kPduTypeRow));

  host::SetInitialiseResult(0);
  for (int pass = 0; pass < 2; ++pass) {
    EXPECT_EQ(Pass(), 1);
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 3u) << "initialised: no further call";
    EXPECT_TRUE(Present(kMarkRow)) << "the row is marked in every pass";
  }
}

}  // namespace
}  // namespace rnsap::testing
