// Runs the built rnsap-decode as a user does, through the shell.
#pragma once

#include <sys/wait.h>

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "tests/support/scratch_path.h"

namespace rnsap::testing {

using Lines = std::vector<std::string>;

inline std::string ReadAll(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

inline Lines SplitLines(const std::string& text) {
  Lines lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

struct DecodeRun {
  int status = -1;  // -1 if it did not exit
  Lines out, err;
};

// rnsap-decode with `arguments` (shell words, behind the redirections, so
// that "2>&1" puts the error lines among the output lines), `input` on
// standard input and the `environment` assignments (shell words).
inline DecodeRun RunDecode(const std::string& arguments, const std::string& input = "",
                           const std::string& environment = "") {
  const std::string in = ScratchPath("in"), out = ScratchPath("out"), err = ScratchPath("err");
  std::ofstream(in, std::ios::binary) << input;
  const std::string command = environment + " '" RNSAP_DECODE_PATH "' <'" + in + "' >'" + out +
                              "' 2>'" + err + "' " + arguments;
  const int status = std::system(command.c_str());
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, SplitLines(ReadAll(out)),
          SplitLines(ReadAll(err))};
}

}  // namespace rnsap::testing
