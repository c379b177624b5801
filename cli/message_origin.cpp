#include "cli/message_origin.h"

#include <arpa/inet.h>

namespace rnsap::cli {

std::string_view SccpMessageKindName(SccpMessageKind kind) {
  constexpr std::string_view kNames[] = {"UDT",  "XUDT", "LUDT", "CR",  "CC",
                                         "CREF", "RLSD", "RLC",  "DT1", "DT2"};
  return kNames[static_cast<size_t>(kind)];
}

std::string IpAddressText(const NetworkEndpoint& endpoint) {
  if (endpoint.ipVersion == 0) return {};
  char text[INET6_ADDRSTRLEN] = "";
  inet_ntop(endpoint.ipVersion == 4 ? AF_INET : AF_INET6, endpoint.address.data(), text,
            sizeof text);
  return text;
}

}  // namespace rnsap::cli
