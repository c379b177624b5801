// Expectations kept as data: one fact a line, its kind first, its fields
// split at " ; ". Lines starting with '#' are comments.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <fstream>
#include <map>
#include <string>
#include <vector>

namespace rnsap::testing {

using Fact = std::vector<std::string>;
using Facts = std::map<std::string, std::vector<Fact>>;  // by kind

inline Facts ReadFacts(const std::string& path) {
  Facts facts;
  std::ifstream file(path);
  EXPECT_TRUE(file) << path;
  for (std::string line; std::getline(file, line);) {
    if (line.empty() || line.starts_with('#')) continue;
    Fact fact;
    for (size_t at = 0, end;; at = end + 3) {
      end = line.find(" ; ", at);
      fact.push_back(line.substr(at, end - at));
      if (end == std::string::npos) break;
    }
    facts[fact[0]].push_back(fact);
  }
  return facts;
}

// A number of a fact, decimal or 0x hexadecimal; "none" is all ones.
inline uint32_t Number(const std::string& text) {
  return text == "none" ? 0xffffffffu : static_cast<uint32_t>(std::stoul(text, nullptr, 0));
}

}  // namespace rnsap::testing
