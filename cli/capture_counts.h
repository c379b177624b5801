// What the reading of a capture counted, as its closing line tells it.
#pragma once

#include <cstdint>

namespace rnsap::cli {

struct CaptureCounts {
  uint64_t frames = 0;
  uint64_t rnsap = 0;         // messages found
  uint64_t skipped = 0;       // frames with neither an RNSAP message nor a part of one
  uint64_t malformed = 0;     // frames cut short or with lengths that do not fit
  uint64_t duplicates = 0;    // SCTP DATA chunks sent again, decoded once
  uint64_t evicted = 0;       // held parts (IP fragments, SCTP fragments, SCCP segments and
                              // data, connections) dropped to make room
  uint64_t incomplete = 0;    // held parts of messages the capture never completed
  uint64_t unattributed = 0;  // SCCP connection data of a connection not known to carry RNSAP
};

}  // namespace rnsap::cli
