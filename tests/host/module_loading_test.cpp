// Loads the built decoder module as the protocol analyser does: by file name,
// with the host libraries already in the process, and checks what it exports
// and what it needs from the dynamic loader.
#include <dlfcn.h>
#include <elf.h>
#include <gtest/gtest.h>
#include <link.h>

#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <vector>

#include "boundary/module_api.h"
#include "host/recorder.h"
#include "host/setup.h"

namespace rnsap::host {
namespace {

const std::set<std::string> kModuleExports = {
    "vex_DLLGetPtr",   "vex_DLLGetTable",     "vex_PreDecodeMV", "vex_PreDecodeMD",
    "vex_PreDecodeTO", "KFE_vorel_rnsap_04b", "date_conv"};

// What the dynamic section of an ELF shared object tells a loader.
struct DynamicInfo {
  std::set<std::string> definedSymbols;
  std::set<std::string> neededLibraries;
};

class ElfImage {
 public:
  explicit ElfImage(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    bytes_.assign(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
  }

  bool IsElf() const {
    return bytes_.size() >= sizeof(ElfW(Ehdr)) && std::memcmp(bytes_.data(), ELFMAG, SELFMAG) == 0;
  }

  DynamicInfo ReadDynamicInfo() const {
    DynamicInfo info;
    const std::vector<ElfW(Shdr)> sections = Sections();
    for (const ElfW(Shdr) & section : sections) {
      const ElfW(Shdr)& strings = sections.at(section.sh_link);
      if (section.sh_type == SHT_DYNSYM) AddDefinedSymbols(section, strings, info.definedSymbols);
      if (section.sh_type == SHT_DYNAMIC)
        AddNeededLibraries(section, strings, info.neededLibraries);
    }
    return info;
  }

 private:
  template <typename T>
  T At(size_t offset) const {
    T value{};
    if (offset + sizeof(T) <= bytes_.size()) std::memcpy(&value, bytes_.data() + offset, sizeof(T));
    return value;
  }

  std::vector<ElfW(Shdr)> Sections() const {
    const auto header = At<ElfW(Ehdr)>(0);
    std::vector<ElfW(Shdr)> sections;
    for (size_t i = 0; i < header.e_shnum; ++i) {
      sections.push_back(At<ElfW(Shdr)>(header.e_shoff + i * header.e_shentsize));
    }
    return sections;
  }

  std::string StringAt(const ElfW(Shdr) & strings, size_t offset) const {
    const size_t start = strings.sh_offset + offset;
    if (start >= bytes_.size()) return {};
    return std::string(bytes_.data() + start,
                       strnlen(bytes_.data() + start, bytes_.size() - start));
  }

  void AddDefinedSymbols(const ElfW(Shdr) & symbols, const ElfW(Shdr) & strings,
                         std::set<std::string>& names) const {
    for (size_t i = 1; i < symbols.sh_size / sizeof(ElfW(Sym)); ++i) {
      const auto symbol = At<ElfW(Sym)>(symbols.sh_offset + i * sizeof(ElfW(Sym)));
      const bool visible = ELF64_ST_VISIBILITY(symbol.st_other) == STV_DEFAULT;
      if (symbol.st_shndx != SHN_UNDEF && visible) names.insert(StringAt(strings, symbol.st_name));
    }
  }

  void AddNeededLibraries(const ElfW(Shdr) & dynamic, const ElfW(Shdr) & strings,
                          std::set<std::string>& names) const {
    for (size_t i = 0; i < dynamic.sh_size / sizeof(ElfW(Dyn)); ++i) {
      const auto entry = At<ElfW(Dyn)>(dynamic.sh_offset + i * sizeof(ElfW(Dyn)));
      if (entry.d_tag == DT_NULL) break;
      if (entry.d_tag == DT_NEEDED) names.insert(StringAt(strings, entry.d_un.d_val));
    }
  }

  std::vector<char> bytes_;
};

TEST(ModuleImageTest, ExportsTheSevenEntryPointsAndNeedsBothHostLibraries) {
  const ElfImage image(RNSAP_MODULE_PATH);
  ASSERT_TRUE(image.IsElf()) << RNSAP_MODULE_PATH;
  const DynamicInfo info = image.ReadDynamicInfo();
  EXPECT_EQ(info.definedSymbols, kModuleExports);
  EXPECT_TRUE(info.neededLibraries.contains("libpu_ParserUtilities.so"));
  EXPECT_TRUE(info.neededLibraries.contains("libkf_OptSupport.so"));
}

class LoadedModuleTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ResetHost();
    handle_ = dlopen(RNSAP_MODULE_PATH, RTLD_NOW | RTLD_LOCAL);
    ASSERT_NE(handle_, nullptr) << dlerror();
  }
  void TearDown() override {
    if (handle_ != nullptr) dlclose(handle_);
  }

  template <typename Function>
  Function* Resolve(const char* name) {
    return reinterpret_cast<Function*>(dlsym(handle_, name));
  }

  // The 8-octet radio link setup request with no IEs.
  void LoadEmptyRadioLinkSetupRequest() {
    ASSERT_TRUE(context_.ready());
    context_.LoadMessage(std::array<uint8_t, 8>{0x00, 0x14, 0x40, 0x50, 0x03, 0x00, 0x00, 0x00});
  }

  void* handle_ = nullptr;
  HostDecodeContext context_;
};

TEST_F(LoadedModuleTest, HasTheHostsFileNameAndAnswersByName) {
  EXPECT_EQ(std::filesystem::path(RNSAP_MODULE_PATH).filename(), kModuleFileName);
  for (const std::string& name : kModuleExports) {
    EXPECT_NE(dlsym(handle_, name.c_str()), nullptr) << name;
  }
}

TEST_F(LoadedModuleTest, ReportsFieldsToTheLoadedParserUtilities) {
  LoadEmptyRadioLinkSetupRequest();
  auto* decode = Resolve<decltype(vex_PreDecodeMD)>("vex_PreDecodeMD");
  ASSERT_NE(decode, nullptr);
  ASSERT_TRUE(decode(&context_.decode_request()));
  ASSERT_FALSE(DecodedFields().empty());
  EXPECT_EQ(DecodedFields().front().label, "PDU EXTENSION");
  EXPECT_EQ(DecodedFields().front().fieldId, 684u);
  EXPECT_EQ(context_.decode_request().textRecordIndex, DecodedFields().size() % kTextRecordCount);
  ASSERT_EQ(context_.closed_layer_rows().size(), 1u);
  EXPECT_EQ(context_.closed_layer_rows()[0].lastBit, 64u);
}

TEST_F(LoadedModuleTest, InitialisesItsKeyFieldsThroughTheLoadedOptSupport) {
  LoadEmptyRadioLinkSetupRequest();
  auto* extract = Resolve<decltype(KFE_vorel_rnsap_04b)>("KFE_vorel_rnsap_04b");
  ASSERT_NE(extract, nullptr);
  EXPECT_EQ(extract(&context_.key_request()), 1);
  EXPECT_EQ(InitialiseOptKfeCalls(), 1u);
  EXPECT_GT(LastKeyLayoutSize(), 0u);
}

}  // namespace
}  // namespace rnsap::host
