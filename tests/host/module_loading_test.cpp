// Loads the built decoder module as the protocol analyser does: by file name,
// with the host libraries already in the process, and checks what it exports
// and what it needs from the dynamic loader.
#include <dlfcn.h>
#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <filesystem>
#include <iterator>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "tests/stand_in/recorder.h"
#include "hostrt/setup.h"

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

TEST(ModuleImageTest, ExportsTheSevenEntryPointsAndNeedsBothHostLibraries) {
  const DynamicInfo info = ReadDynamicInfo(RNSAP_MODULE_PATH);
  EXPECT_EQ(info.definedSymbols, kModuleExports);
  EXPECT_TRUE(info.neededLibraries.contains("libpu_ParserUtilities.so"));
  EXPECT_TRUE(info.neededLibraries.contains("libkf_OptSupport.so"));
}

// Loaded by its file name, the module reports fields to the loaded
// ParserUtilities and initialises its key fields through the loaded OptSupport.
TEST(LoadedModuleTest, AnswersByNameThroughTheLoadedHostLibraries) {
  EXPECT_EQ(std::filesystem::path(RNSAP_MODULE_PATH).filename(), kModuleFileName);
  ResetHost();
  void* handle = dlopen(RNSAP_MODULE_PATH, RTLD_NOW | RTLD_LOCAL);
  ASSERT_NE(handle, nullptr) << dlerror();
  auto* decode = reinterpret_cast<decltype(vex_PreDecodeMD)*>(dlsym(handle, "vex_PreDecodeMD"));
  auto* extract =
      reinterpret_cast<decltype(KFE_vorel_rnsap_04b)*>(dlsym(handle, "KFE_vorel_rnsap_04b"));
  ASSERT_TRUE(decode != nullptr && extract != nullptr);
  HostDecodeContext context;
  ASSERT_TRUE(context.ready());
  // The radio link setup request with no IEs.
  context.LoadMessage(std::array<uint8_t, 8>{0x00, 0x14, 0x40, 0x50, 0x03, 0x00, 0x00, 0x00});
  ASSERT_TRUE(decode(&context.decode_request()));
  ASSERT_FALSE(DecodedFields().empty());
  EXPECT_EQ(DecodedFields().front().label, "PDU EXTENSION");
  EXPECT_EQ(DecodedFields().front().fieldId, 684u);
  EXPECT_EQ(context.decode_request().textRecordIndex, DecodedFields().size() % kTextRecordCount);
  ASSERT_EQ(context.closed_layer_rows().size(), 1u);
  EXPECT_EQ(context.closed_layer_rows()[0].lastBit, 64u);

  context.Rewind();
  EXPECT_EQ(extract(&context.key_request()), 1);
  EXPECT_EQ(InitialiseOptKfeCalls(), 1u);
  EXPECT_GT(LastKeyLayoutSize(), 0u);
  dlclose(handle);
}

}  // namespace
}  // namespace rnsap::host
