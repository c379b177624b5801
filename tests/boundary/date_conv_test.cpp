#include <gtest/gtest.h>

#include <string>

#include "boundary/module_api.h"

namespace rnsap {
namespace {

// date_conv of `value` behind the text "T=".
std::string Convert(uint32_t value) {
  DecodeState state{};
  state.field.value = value;
  char destination[64] = "T=";
  EXPECT_EQ(date_conv(destination, nullptr, &state), destination);
  return destination;
}

TEST(DateConvTest, AppendsTheUtcTimeOfTheFieldValue) {
  EXPECT_EQ(Convert(0), "T=1970-01-01 00:00:00");
  EXPECT_EQ(Convert(86399), "T=1970-01-01 23:59:59");
  EXPECT_EQ(Convert(951782400), "T=2000-02-29 00:00:00");
  EXPECT_EQ(Convert(0x7FFFFFFF), "T=2038-01-19 03:14:07");
}

TEST(DateConvTest, ValuesWithTheTopBitSetAreBefore1970) {
  EXPECT_EQ(Convert(0xFFFFFFFF), "T=1969-12-31 23:59:59");
  EXPECT_EQ(Convert(static_cast<uint32_t>(-31536000)), "T=1969-01-01 00:00:00");
  EXPECT_EQ(Convert(0x80000000), "T=1901-12-13 20:45:52");
}

}  // namespace
}  // namespace rnsap
