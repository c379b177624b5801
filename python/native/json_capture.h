// A capture decoded into a file of JSON lines, as `rnsap-decode --json -r`
// writes it.
#pragma once

#include <string>

#include "cli/capture_input.h"
#include "cli/options.h"

namespace rnsap::python {

struct JsonCaptureOutcome {
  cli::CaptureCounts counts;
  bool read = false;   // whether the capture was read to its end
  std::string errors;  // the notes and errors rnsap-decode writes to standard error
};

// Writes the lines of the capture at `capturePath` to `outputPath`. Throws
// std::runtime_error when the output file cannot be written.
JsonCaptureOutcome WriteJsonLines(const std::string& capturePath, const std::string& outputPath,
                                  cli::Pass pass);

}  // namespace rnsap::python
