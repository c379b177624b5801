// The built decoder module as the protocol analyser loads it: its file name,
// what it exports and what it needs from the dynamic loader.
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <iterator>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"

namespace rnsap::host {
namespace {

const std::set<std::string> kModuleExports = {
    "vex_DLLGetPtr",   "vex_DLLGetTable",     "vex_PreDecodeMV", "vex_PreDecodeMD",
    "vex_PreDecodeTO", "KFE_vorel_rnsap_04b", "date_conv"};

// The symbols the module defines and the libraries it needs, as the dynamic
// loader finds them in its tables, read by objdump.
struct DynamicInfo {
  std::set<std::string> definedSymbols;
  std::set<std::string> neededLibraries;
};

DynamicInfo ReadDynamicInfo(const std::string& path) {
  DynamicInfo info;
  FILE* out = popen((RNSAP_OBJDUMP " -p -T " + path).c_str(), "r");
  if (out == nullptr) return info;
  bool inSymbols = false;
  for (char line[512]; std::fgets(line, sizeof line, out) != nullptr;) {
    std::istringstream words(line);
    std::vector<std::string> tokens{std::istream_iterator<std::string>(words), {}};
    if (tokens.empty()) continue;
    if (tokens[0] == "NEEDED" && tokens.size() == 2) info.neededLibraries.insert(tokens[1]);
    if (inSymbols && std::string(line).find("*UND*") == std::string::npos)
      info.definedSymbols.insert(tokens.back());
    inSymbols = inSymbols || std::string(line).starts_with("DYNAMIC SYMBOL TABLE");
  }
  EXPECT_EQ(pclose(out), 0) << RNSAP_OBJDUMP;
  return info;
}

// The file the host loads by its name. rnsap-decode loads it so, and shows
// what it reports through the loaded host libraries.
TEST(ModuleImageTest, ExportsTheSevenEntryPointsAndNeedsBothHostLibraries) {
  EXPECT_EQ(std::filesystem::path(RNSAP_MODULE_PATH).filename(), kModuleFileName);
  const DynamicInfo info = ReadDynamicInfo(RNSAP_MODULE_PATH);
  EXPECT_EQ(info.definedSymbols, kModuleExports);
  EXPECT_TRUE(info.neededLibraries.contains("libpu_ParserUtilities.so"));
  EXPECT_TRUE(info.neededLibraries.contains("libkf_OptSupport.so"));
}

}  // namespace
}  // namespace rnsap::host
