// date_conv: renders the current field's value, a signed count of seconds
// since 1970-01-01 00:00:00 UTC, as a date and time behind the host's text.
#include <cstdio>
#include <cstring>
#include <ctime>

#include "boundary/export.h"
#include "boundary/module_api.h"

namespace {

constexpr size_t kDateTextSize = 256;

// Broken-down UTC time of `seconds`; false if the C library can't convert it.
bool ToUtc(time_t seconds, std::tm& utc) {
#ifdef _WIN32
  return gmtime_s(&utc, &seconds) == 0;
#else
  return gmtime_r(&seconds, &utc) != nullptr;
#endif
}

}  // namespace

extern "C" RNSAP_EXPORT char* date_conv(char* destination, void* /*unused*/,
                                        rnsap::DecodeState* state) {
  const time_t seconds = static_cast<int32_t>(state->field.value);
  std::tm utc{};
  if (!ToUtc(seconds, utc)) return destination;
  char text[kDateTextSize];
  std::snprintf(text, sizeof text, "%04d-%02d-%02d %02d:%02d:%02d", utc.tm_year + 1900,
                utc.tm_mon + 1, utc.tm_mday, utc.tm_hour, utc.tm_min, utc.tm_sec);
  std::strcat(destination, text);
  return destination;
}
