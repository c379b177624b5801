// What carries RNSAP in a capture: the SCCP subsystems it is addressed to,
// and which SCTP DATA chunks hold M3UA, the layer below SCCP. The defaults
// are the protocol's own; the command line may name others.
#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>
#include <vector>

namespace rnsap::cli {

struct RnsapCarriers {
  std::vector<uint32_t> subsystems{143};
  // A DATA chunk is M3UA when its payload protocol id is one of these, or
  // when that id is 0 (unspecified) and one of its ports is an M3UA port.
  std::vector<uint32_t> m3uaPayloadProtocols{3};
  std::vector<uint32_t> m3uaPorts{2905};

  bool IsRnsapSubsystem(std::optional<uint8_t> subsystem) const {
    return subsystem && Holds(subsystems, *subsystem);
  }
  bool IsM3ua(uint32_t payloadProtocol, uint16_t sourcePort, uint16_t destinationPort) const {
    if (Holds(m3uaPayloadProtocols, payloadProtocol)) return true;
    return payloadProtocol == 0 &&
           (Holds(m3uaPorts, sourcePort) || Holds(m3uaPorts, destinationPort));
  }

 private:
  static bool Holds(const std::vector<uint32_t>& values, uint32_t value) {
    return std::find(values.begin(), values.end(), value) != values.end();
  }
};

}  // namespace rnsap::cli
