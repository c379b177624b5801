// SCCP connectionless messages: the RNSAP message in a unitdata message
// addressed to the RNSAP subsystem.
#pragma once

#include <cstdint>
#include <optional>
#include <span>

namespace rnsap::cli {

inline constexpr uint8_t kRnsapSubsystem = 143;

// The user data of a UDT, XUDT or LUDT whose called party address carries
// subsystem number 143; nullopt for any other SCCP message. Throws
// MalformedFrame when the message's pointers, lengths or called party
// address do not fit.
std::optional<std::span<const uint8_t>> RnsapInSccp(std::span<const uint8_t> sccp);

}  // namespace rnsap::cli
