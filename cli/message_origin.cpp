#include "cli/message_origin.h"

#include <arpa/inet.h>
#include <fmt/compile.h>

namespace rnsap::cli {

std::string_view SccpMessageKindName(SccpMessageKind kind) {
  constexpr std::string_view kNames[] = {"UDT",  "XUDT", "LUDT", "CR",  "CC",
                                         "CREF", "RLSD", "RLC",  "DT1", "DT2"};
  return kNames[static_cast<size_t>(kind)];
}

std::string IpAddressText(const NetworkEndpoint& endpoint) {
  if (endpoint.ipVersion == 0) return {};
  const auto& octets = endpoint.address;
  if (endpoint.ipVersion == 4) {
    return fmt::format(FMT_COMPILE("{}.{}.{}.{}"), octets[0], octets[1], octets[2], octets[3]);
  }
  char text[INET6_ADDRSTRLEN] = "";
  inet_ntop(AF_INET6, octets.data(), text, sizeof text);
  return text;
}

}  // namespace rnsap::cli
