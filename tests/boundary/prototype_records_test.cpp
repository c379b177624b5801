#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "boundary/module_api.h"

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
  std::vector<uint8_t> BytesAt(uint32_t offset, uint32_t count) const {
    return {bytes_ + offset, bytes_ + offset + count};
  }
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

TEST(PrototypeRecordsTest, FirstBlockBody) {
  const Block first(4);
  EXPECT_EQ(first.Word(28), 1u);
  EXPECT_EQ(first.Word(32), 0x0000FFFDu);
  EXPECT_EQ(first.Word(36), 0x00000106u);
  EXPECT_EQ(first.Word(40), 0x0000FFFFu);
  EXPECT_EQ(first.Word(48), 8u | 13u << 16);
  EXPECT_EQ(first.Word(52), 1u | 3u << 16);
  EXPECT_EQ(first.TextAt(56), "VEX Protocol Prototype dummy field");
  EXPECT_EQ(first.BytesAt(90, 2), (std::vector<uint8_t>{0, 0}));
}

TEST(PrototypeRecordsTest, SecondBlockBody) {
  const Block second(5);
  const std::vector<std::pair<uint32_t, uint32_t>> words = {
      {36, 0},          {40, 0},           {48, 0},           {52, 0x00010000},  {56, 1},
      {88, 1},          {92, 0},           {96, 0},           {100, 0},          {104, 1},
      {112, 7},         {124, 8},          {132, 0},          {136, 3},          {144, 0},
      {148, 0},         {152, 13},         {156, 0},          {160, 0},          {164, 0},
      {168, 0},         {108, 0x3C3C0000}, {116, 0x3C3C0000}, {120, 0x00013C01}, {128, 0x00003C00},
      {140, 0x3C000000}};
  for (const auto& [offset, word] : words) EXPECT_EQ(second.Word(offset), word) << offset;
  EXPECT_EQ(second.TextAt(60), "test_vex_protocol_DLL.dll");
  EXPECT_EQ(second.BytesAt(86, 2), (std::vector<uint8_t>{0x3C, 0x3C}));
}

// Copies a block and stores in each pointer field the address of the copy plus
// the target offset, as a 32-bit host links it.
std::vector<uint32_t> LinkedCopy(const Block& block) {
  std::vector<uint32_t> copy(block.Size() / 4);
  std::memcpy(copy.data(), block.data(), block.Size());
  const auto* base = reinterpret_cast<const uint8_t*>(copy.data());
  for (const auto& [field, target] : block.FixupList()) {
    const uint8_t* address = base + target;
    std::memcpy(reinterpret_cast<uint8_t*>(copy.data()) + field, &address, sizeof address);
  }
  return copy;
}

template <typename T>
const T* PointerIn(const std::vector<uint32_t>& copy, uint32_t field) {
  const T* pointer = nullptr;
  std::memcpy(&pointer, reinterpret_cast<const uint8_t*>(copy.data()) + field, sizeof pointer);
  return pointer;
}

TEST(PrototypeRecordsTest, FixupsLinkACopy) {
  if (sizeof(void*) != sizeof(uint32_t)) GTEST_SKIP() << "pointer fields are 32-bit words";
  const std::vector<uint32_t> first = LinkedCopy(Block(4));
  EXPECT_EQ(*PointerIn<uint32_t>(first, 16), 0x106u);
  EXPECT_EQ(*PointerIn<uint32_t>(first, 20), 0xFFFDu);
  EXPECT_EQ(PointerIn<uint32_t>(first, 24), PointerIn<uint32_t>(first, 20));
  EXPECT_STREQ(PointerIn<char>(first, 44), "VEX Protocol Prototype dummy field");

  const std::vector<uint32_t> second = LinkedCopy(Block(5));
  EXPECT_EQ(PointerIn<uint32_t>(second, 16), &second[88 / 4]);
  EXPECT_EQ(*PointerIn<uint32_t>(second, 16), 1u);
  EXPECT_EQ(*PointerIn<uint32_t>(second, 44), 7u);
  EXPECT_EQ(PointerIn<uint32_t>(second, 32), &second[164 / 4]);
}

}  // namespace
}  // namespace rnsap
