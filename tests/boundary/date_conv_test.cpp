#include <gtest/gtest.h>

#include <string>

#include "boundary/module_api.h"

namespace rnsap {
namespace {

// The UTC time of the field value, a signed count of seconds, behind "T=".
TEST(DateConvTest, AppendsTheUtcTimeOfTheFieldValue) {
  const std::pair<uint32_t, const char*> cases[] = {
      {0, "T=1970-01-01 00:00:00"},
      {86399, "T=1970-01-01 23:59:59"},
      {951782400, "T=2000-02-29 00:00:00"},
      {0x7FFFFFFF, "T=2038-01-19 03:14:07"},
      {0xFFFFFFFF, "T=1969-12-31 23:59:59"},
      {static_cast<uint32_t>(-31536000), "T=1969-01-01 00:00:00"},
      {0x80000000, "T=1901-12-13 20:45:52"}};
  for (const auto& [value, text] : cases) {
    DecodeState state{};
    state.field.value = value;
    char destination[64] = "T=";
    EXPECT_EQ(date_conv(destination, nullptr, &state), destination);
    EXPECT_STREQ(destination, text);
  }
}

}  // namespace
}  // namespace rnsap
