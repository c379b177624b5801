// A negative result of the host library's initialisation is the Key-field
// pass's answer from then on: kept for the life of the module, so this
// program drives one module through it alone.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "tests/passes/pass_messages.h"

namespace rnsap::testing {
namespace {

TEST(KeyFieldInitNegativeTest, NegativeResultIsReturnedForGoodWithoutAnotherCall) {
  PassHost host;
  ASSERT_TRUE(host.ready());
  host::ResetHost();
  host.Load(PublicHeader(0, 20, 0));
  KeyFieldRequest& key = host.key_request();
  const uint16_t keyOffset = key.keyOffset;

  host::SetInitialiseResult(-7, 3);
  key.bitsLeftOut = kUnwritten;
  EXPECT_EQ(KFE_vorel_rnsap_04b(&key), -7);
  EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
  EXPECT_EQ(key.bitsLeftOut, kUnwritten);
  EXPECT_EQ(host.state().position, 1u) << "nothing was decoded";
  EXPECT_TRUE(host.BufferRestored()) << "nor reversed";
  EXPECT_EQ(key.keyOffset, keyOffset);
  EXPECT_TRUE(
      std::all_of(key.keyBuffer, key.keyBuffer + keyOffset + 64, [](uint8_t b) { return b == 0; }));

  host::SetInitialiseResult(1);
  for (int pass = 0; pass < 2; ++pass) {
    host.context().Rewind();
    key.bitsLeftOut = kUnwritten;
    EXPECT_EQ(KFE_vorel_rnsap_04b(&key), -7);
    EXPECT_EQ(host::InitialiseOptKfeCalls(), 1u);
    EXPECT_EQ(key.bitsLeftOut, kUnwritten);
    EXPECT_EQ(host.state().position, 1u);
  }
}

}  // namespace
}  // namespace rnsap::testing
