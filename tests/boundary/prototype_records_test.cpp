#include <gtest/gtest.h>

#include <cstring>
#include <sstream>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "boundary/module_api.h"
#include "tests/support/facts.h"

namespace rnsap {
namespace {

constexpr uint32_t kPointerFiller = 0xA5A5A5A5;
constexpr uint32_t kTextPointerFiller = 0x4B4B4B4B;

using Fixups = std::vector<std::pair<uint32_t, uint32_t>>;

// A prototype block as the host gets it through vex_DLLGetPtr.
class Block {
 public:
  explicit Block(int32_t pointerIndex) {
    const void* out = nullptr;
    EXPECT_EQ(vex_DLLGetPtr(pointerIndex, &out), 0u);
    bytes_ = static_cast<const uint8_t*>(out);
  }

  uint32_t Word(uint32_t offset) const {
    return bytes_[offset] | bytes_[offset + 1] << 8 | bytes_[offset + 2] << 16 |
           static_cast<uint32_t>(bytes_[offset + 3]) << 24;
  }
  uint32_t Size() const { return Word(4); }
  uint32_t FixupOffset() const { return Word(8); }

  Fixups FixupList() const {
    Fixups fixups;
    for (uint32_t at = FixupOffset(); at + 8 <= Size(); at += 8) {
      fixups.emplace_back(Word(at), Word(at + 4));
    }
    return fixups;
  }

  std::string TextAt(uint32_t offset) const {
    return reinterpret_cast<const char*>(bytes_ + offset);
  }
  uint8_t Byte(uint32_t offset) const { return bytes_[offset]; }
  const uint8_t* data() const { return bytes_; }

 private:
  const uint8_t* bytes_ = nullptr;
};

const Fixups kFirstFixups = {{16, 36}, {20, 32}, {24, 32}, {44, 56}};
const Fixups kSecondFixups = {{16, 88}, {20, 104}, {24, 120}, {28, 156}, {32, 164}, {44, 112}};

// Each block: kind, size, offset of the fixup list, which runs to the end of
// the block, and the filler in every pointer field it names.
TEST(PrototypeRecordsTest, HeadsAndFixupLists) {
  for (const auto& [index, size, fixupOffset, fixups] :
       {std::tuple{4, 124u, 92u, kFirstFixups}, std::tuple{5, 220u, 172u, kSecondFixups}}) {
    const Block block(index);
    EXPECT_EQ(block.Word(0), static_cast<uint32_t>(index));
    EXPECT_EQ(block.Size(), size);
    EXPECT_EQ(block.FixupOffset(), fixupOffset);
    EXPECT_EQ(block.Word(12), 60u);
    EXPECT_EQ(reinterpret_cast<uintptr_t>(block.data()) % 4, 0u) << "word-aligned";
    EXPECT_EQ(block.FixupList(), fixups);
    for (const auto& [field, target] : fixups) {
      const bool text = index == 4 && field == 44;
      EXPECT_EQ(block.Word(field), text ? kTextPointerFiller : kPointerFiller) << field;
    }
  }
}

// The words, texts and octets of both blocks' bodies.
TEST(PrototypeRecordsTest, BlockBodies) {
  const testing::Facts facts = testing::ReadFacts(RNSAP_EXPECTED_BLOCKS);
  for (const auto& [kind, expected] : facts) {
    for (const testing::Fact& f : expected) {
      if (kind == "identity") continue;
      SCOPED_TRACE(kind + " at " + f[2] + " of block " + f[1]);
      const Block block(static_cast<int32_t>(testing::Number(f[1])));
      uint32_t offset = testing::Number(f[2]);
      if (kind == "word") {
        EXPECT_EQ(block.Word(offset), testing::Number(f[3]));
      } else if (kind == "text") {
        EXPECT_EQ('"' + block.TextAt(offset) + '"', f[3]);
      } else {
        std::istringstream hex(f[3]);
        for (std::string octet; hex >> octet; ++offset)
          EXPECT_EQ(block.Byte(offset), std::stoul(octet, nullptr, 16));
      }
    }
  }
}

}  // namespace
}  // namespace rnsap
