// Which procedures expect an answer: a class 1 procedure is answered by a
// successful outcome (and most by an unsuccessful one as well), a class 2
// procedure by nothing.
#pragma once

#include <array>
#include <cstdint>
#include <optional>

namespace rnsap::cli {

struct ProcedureClass {
  uint32_t code = 0;
  uint8_t procedureClass = 0;  // 1 or 2
};

inline constexpr std::array<ProcedureClass, 27> kProcedureClasses = {{
    {0, 1},   // common transport channel resources initiation, FDD
    {1, 1},   // likewise, TDD
    {2, 2},   // common transport channel resources release
    {3, 2},   // compressed mode cancellation
    {4, 2},   // compressed mode commit
    {5, 1},   // compressed mode prepare: ready or failure
    {6, 2},   // downlink power control
    {7, 2},   // downlink signalling transfer
    {8, 2},   // error indication
    {9, 2},   // dedicated measurement failure
    {10, 1},  // dedicated measurement initiation
    {11, 2},  // dedicated measurement reporting
    {12, 2},  // dedicated measurement termination
    {13, 2},  // paging
    {14, 1},  // physical channel reconfiguration
    {15, 2},  // private message
    {16, 1},  // radio link addition
    {17, 1},  // radio link deletion: a response, no failure
    {18, 2},  // radio link failure
    {19, 2},  // radio link restoration
    {20, 1},  // radio link setup
    {21, 2},  // SRNS relocation commit
    {22, 2},  // synchronised radio link reconfiguration cancellation
    {23, 2},  // synchronised radio link reconfiguration commit
    {24, 1},  // synchronised radio link reconfiguration preparation
    {25, 1},  // unsynchronised radio link reconfiguration
    {26, 2},  // uplink signalling transfer
}};

// The class of procedure `code`; nullopt for a code the protocol lacks.
constexpr std::optional<uint8_t> ClassOfProcedure(uint32_t code) {
  for (const ProcedureClass& entry : kProcedureClasses) {
    if (entry.code == code) return entry.procedureClass;
  }
  return std::nullopt;
}

}  // namespace rnsap::cli
