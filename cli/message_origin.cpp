#include "cli/message_origin.h"

namespace rnsap::cli {

std::string_view SccpMessageKindName(SccpMessageKind kind) {
  constexpr std::string_view kNames[] = {"UDT",  "XUDT", "LUDT", "CR",  "CC",
                                         "CREF", "RLSD", "RLC",  "DT1", "DT2"};
  return kNames[static_cast<size_t>(kind)];
}

}  // namespace rnsap::cli
