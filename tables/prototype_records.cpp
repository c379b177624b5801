// The two prototype records of the tool chain: self-contained blocks whose
// pointer fields hold a filler and are listed, with the block offset they are
// to point to, in a fix-up list at the end of the block. The second block
// follows the first directly. Both are built here word by word, little-endian.
#include <array>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string_view>

#include "tables/descriptor_tables.h"

namespace rnsap::tables {
namespace {

constexpr size_t kFirstBlockSize = 124;
constexpr size_t kSecondBlockSize = 220;
constexpr size_t kMaxPointerFields = 8;

constexpr uint32_t kPointerFiller = 0xA5A5A5A5;
constexpr uint32_t kTextPointerFiller = 0x4B4B4B4B;
constexpr uint32_t kHeadConstant = 60;
constexpr uint8_t kFillerByte = 0x3C;

// Reached only when a block's content disagrees with the offsets its head
// declares; as it is not constexpr, the image then fails to compile.
void BlockLayoutMismatch() {}

// Writes blocks into one byte image and keeps, per block, the pointer fields
// for its fix-up list.
class PrototypeImage {
 public:
  static constexpr size_t kSize = kFirstBlockSize + kSecondBlockSize;

  constexpr void BeginBlock(uint32_t kind, uint32_t blockSize, uint32_t fixupOffset) {
    blockStart_ = end_;
    blockSize_ = blockSize;
    fixupOffset_ = fixupOffset;
    pointerCount_ = 0;
    Words({kind, blockSize, fixupOffset, kHeadConstant});
  }

  constexpr void Words(std::initializer_list<uint32_t> words) {
    for (const uint32_t word : words) {
      Bytes({static_cast<uint8_t>(word), static_cast<uint8_t>(word >> 8),
             static_cast<uint8_t>(word >> 16), static_cast<uint8_t>(word >> 24)});
    }
  }

  constexpr void HalfWords(uint16_t first, uint16_t second) {
    Bytes({static_cast<uint8_t>(first), static_cast<uint8_t>(first >> 8),
           static_cast<uint8_t>(second), static_cast<uint8_t>(second >> 8)});
  }

  constexpr void Bytes(std::initializer_list<uint8_t> bytes) {
    for (const uint8_t byte : bytes) bytes_[end_++] = byte;
  }

  // The text with its NUL, then `filler` bytes up to block offset `endOffset`.
  constexpr void Text(std::string_view text, uint32_t endOffset, uint8_t filler) {
    for (const char character : text) Bytes({static_cast<uint8_t>(character)});
    Bytes({0});
    while (BlockOffset() < endOffset) Bytes({filler});
  }

  // A pointer field to block offset `target`, holding `filler` in the image.
  constexpr void Pointer(uint32_t target, uint32_t filler = kPointerFiller) {
    pointerFields_[pointerCount_++] = {BlockOffset(), target};
    Words({filler});
  }

  // Appends the fix-up list, which ends the block.
  constexpr void EndBlock() {
    if (BlockOffset() != fixupOffset_) BlockLayoutMismatch();
    for (size_t field = 0; field < pointerCount_; ++field) {
      Words({pointerFields_[field].offset, pointerFields_[field].target});
    }
    if (BlockOffset() != blockSize_) BlockLayoutMismatch();
  }

  constexpr const std::array<uint8_t, kSize>& bytes() const { return bytes_; }

 private:
  struct PointerField {
    uint32_t offset;
    uint32_t target;
  };

  constexpr uint32_t BlockOffset() const { return static_cast<uint32_t>(end_ - blockStart_); }

  std::array<uint8_t, kSize> bytes_{};
  size_t end_ = 0;
  size_t blockStart_ = 0;
  uint32_t blockSize_ = 0;
  uint32_t fixupOffset_ = 0;
  std::array<PointerField, kMaxPointerFields> pointerFields_{};
  size_t pointerCount_ = 0;
};

constexpr void AppendFirstBlock(PrototypeImage& image) {
  image.BeginBlock(4, kFirstBlockSize, 92);
  image.Pointer(36);
  image.Pointer(32);
  image.Pointer(32);
  image.Words({1, 0x0000FFFD, 0x00000106, 0x0000FFFF});
  image.Pointer(56, kTextPointerFiller);
  image.HalfWords(8, 13);
  image.HalfWords(1, 3);
  image.Text("VEX Protocol Prototype dummy field", 92, 0);
  image.EndBlock();
}

constexpr void AppendSecondBlock(PrototypeImage& image) {
  image.BeginBlock(5, kSecondBlockSize, 172);
  image.Pointer(88);
  image.Pointer(104);
  image.Pointer(120);
  image.Pointer(156);
  image.Pointer(164);
  image.Words({0, 0});
  image.Pointer(112);
  image.Words({0, 0x00010000, 1});
  image.Text("test_vex_protocol_DLL.dll", 88, kFillerByte);
  image.Words({1, 0, 0, 0});  // offset 88
  image.Words({1});           // offset 104
  image.Bytes({0x00, 0x00, kFillerByte, kFillerByte});
  image.Words({7});  // offset 112
  image.Bytes({0x00, 0x00, kFillerByte, kFillerByte});
  image.Bytes({0x01, kFillerByte, 0x01, 0x00});  // offset 120
  image.Words({8});
  image.Bytes({0x00, kFillerByte, 0x00, 0x00});
  image.Words({0, 3});
  image.Bytes({0x00, 0x00, 0x00, kFillerByte});
  image.Words({0, 0, 13});
  image.Words({0, 0});  // offset 156
  image.Words({0, 0});  // offset 164
  image.EndBlock();
}

constexpr std::array<uint8_t, PrototypeImage::kSize> BuildPrototypeRecords() {
  PrototypeImage image;
  AppendFirstBlock(image);
  AppendSecondBlock(image);
  return image.bytes();
}

alignas(4) constexpr std::array<uint8_t, PrototypeImage::kSize> kPrototypeRecords =
    BuildPrototypeRecords();

}  // namespace

const void* FirstPrototypeRecord() { return kPrototypeRecords.data(); }

const void* SecondPrototypeRecord() { return kPrototypeRecords.data() + kFirstBlockSize; }

}  // namespace rnsap::tables
