#include "cli/sccp.h"

#include "cli/octet_reader.h"

namespace rnsap::cli {
namespace {

// Where the pointers of a unitdata message start and how wide they are: the
// called party pointer comes first, the data pointer third.
struct UnitdataLayout {
  size_t firstPointer;
  size_t pointerSize;  // also the size of the data's length indicator
};

std::optional<UnitdataLayout> LayoutOf(uint8_t messageType) {
  constexpr uint8_t kUdt = 0x09, kXudt = 0x11, kLudt = 0x13;
  switch (messageType) {
    case kUdt:
      return UnitdataLayout{2, 1};  // type, protocol class
    case kXudt:
      return UnitdataLayout{3, 1};  // type, protocol class, hop counter
    case kLudt:
      return UnitdataLayout{3, 2};
    default:
      return std::nullopt;
  }
}

size_t ReadUnsigned(OctetReader& reader, size_t size) {
  return size == 1 ? reader.U8() : reader.U16LittleEndian();
}

// A pointer counts octets from its own first octet to its parameter, which
// starts with a length indicator.
std::span<const uint8_t> VariablePart(OctetReader& sccp, size_t pointerAt, size_t pointerSize,
                                      size_t lengthSize) {
  sccp.Seek(pointerAt);
  const size_t pointer = ReadUnsigned(sccp, pointerSize);
  if (pointer == 0) sccp.Fail("pointer at offset " + std::to_string(pointerAt) + " is 0");
  sccp.Seek(pointerAt + pointer);
  return sccp.Take(ReadUnsigned(sccp, lengthSize));
}

// Octets in front of the digits of each global title format (ITU).
size_t GlobalTitleHeaderSize(OctetReader& address, uint8_t indicator) {
  constexpr size_t kHeaderSizes[] = {0, 1, 1, 2, 3};
  if (indicator >= std::size(kHeaderSizes)) {
    address.Fail("global title indicator " + std::to_string(indicator) + " is reserved");
  }
  return kHeaderSizes[indicator];
}

// The subsystem number of an ITU called party address, if it has one: the
// address indicator tells whether a point code, the subsystem number and a
// global title follow, in that order.
std::optional<uint8_t> CalledSubsystem(std::span<const uint8_t> calledParty) {
  OctetReader address(calledParty, "SCCP called party address");
  const uint8_t indicator = address.U8();
  const bool pointCode = indicator & 0x01;
  const bool subsystem = indicator & 0x02;
  const uint8_t globalTitle = indicator >> 2 & 0x0f;
  if (pointCode) address.Skip(2);
  const std::optional<uint8_t> number = subsystem ? std::optional(address.U8()) : std::nullopt;
  address.Skip(GlobalTitleHeaderSize(address, globalTitle));
  return number;
}

}  // namespace

std::optional<std::span<const uint8_t>> RnsapInSccp(std::span<const uint8_t> sccp) {
  OctetReader reader(sccp, "SCCP");
  const std::optional<UnitdataLayout> layout = LayoutOf(reader.U8());
  if (!layout) return std::nullopt;
  const size_t size = layout->pointerSize;
  const auto called = VariablePart(reader, layout->firstPointer, size, 1);
  if (CalledSubsystem(called) != kRnsapSubsystem) return std::nullopt;
  return VariablePart(reader, layout->firstPointer + 2 * size, size, size);
}

}  // namespace rnsap::cli
