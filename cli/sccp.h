// SCCP messages (ITU): the unitdata messages UDT, XUDT and LUDT, and the
// connection-oriented CR, CC, CREF, RLSD, RLC, DT1 and DT2, read as far as
// finding their user data and the connection and segment they belong to.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

#include "cli/message_origin.h"

namespace rnsap::cli {

using OptionalOctets = std::optional<std::span<const uint8_t>>;

// The Segmentation parameter of an XUDT or LUDT.
struct SccpSegmentation {
  bool first = false;
  uint8_t remaining = 0;  // segments still to come
  uint32_t reference = 0;
};

struct SccpMessage {
  SccpMessageKind kind = SccpMessageKind::kUdt;
  std::optional<uint8_t> calledSubsystem;  // of a unitdata message or a CR
  std::span<const uint8_t> calling;        // calling party address of a unitdata message
  uint32_t destinationReference = 0;       // local references of the connection's ends
  uint32_t sourceReference = 0;
  bool moreData = false;  // DT1, DT2: the data goes on in the next one
  std::optional<SccpSegmentation> segmentation;
  OptionalOctets data;  // the Data (Long Data) parameter, where present
};

// The message, or nullopt for a message type not listed above. Throws
// MalformedFrame when its pointers, lengths or addresses do not fit.
std::optional<SccpMessage> ReadSccp(std::span<const uint8_t> sccp);

}  // namespace rnsap::cli
