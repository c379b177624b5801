// Output compared line for line with a file that holds what it must be: the
// first lines that differ are shown, and the whole output goes to a scratch
// file, from which the expected file is rewritten when the output changes on
// purpose.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "tests/support/scratch_path.h"

namespace rnsap::testing {

inline void ExpectLinesOfFile(const std::vector<std::string>& got, const std::string& path) {
  std::vector<std::string> expected;
  std::ifstream file(path);
  for (std::string line; std::getline(file, line);) expected.push_back(line);
  size_t differing = 0;
  for (size_t i = 0; i < std::max(got.size(), expected.size()); ++i) {
    const std::string gotLine = i < got.size() ? got[i] : "<none>";
    const std::string expectedLine = i < expected.size() ? expected[i] : "<none>";
    if (gotLine != expectedLine && ++differing <= 10)
      ADD_FAILURE() << path << ":" << i + 1 << "\n expected: " << expectedLine
                    << "\n      got: " << gotLine;
  }
  if (differing == 0) return;
  const std::string scratch = ScratchPath(std::filesystem::path(path).filename().string());
  std::ofstream out(scratch);
  for (const std::string& line : got) out << line << '\n';
  ADD_FAILURE() << differing << " lines differ from " << path << "; the output is in " << scratch;
}

}  // namespace rnsap::testing
