// Paths for files a test writes: in the test temporary directory, under a
// name of this process's own, so that test programs running side by side
// (ctest -j, several build trees on one machine) never share a file.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <string>
#include <string_view>

namespace rnsap::testing {

inline std::string ScratchPath(std::string_view name) {
  return ::testing::TempDir() + "rnsap_" + std::to_string(getpid()) + "_" + std::string(name);
}

}  // namespace rnsap::testing
