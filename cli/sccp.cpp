#include "cli/sccp.h"

#include <array>

#include "cli/octet_reader.h"

namespace rnsap::cli {
namespace {

using Kind = SccpMessageKind;

// Which mandatory variable parameter is which.
enum class Variable : uint8_t { kNone, kCalled, kCalling, kData };

// The layout of a message type: where its local references and the "more
// data" bit stand (0: not there), then its pointers, one per mandatory
// variable parameter and one to the optional part if it has one.
struct Layout {
  uint8_t type;
  Kind kind;
  uint8_t destinationReferenceAt, sourceReferenceAt, moreDataAt;
  uint8_t firstPointer;
  std::array<Variable, 3> variables;
  bool optionalPart;
  uint8_t pointerSize;  // also the size of a data parameter's length indicator
};

constexpr Variable kCalled = Variable::kCalled, kCalling = Variable::kCalling,
                   kData = Variable::kData, kNone = Variable::kNone;
constexpr Layout kLayouts[] = {
    {0x09, Kind::kUdt, 0, 0, 0, 2, {kCalled, kCalling, kData}, false, 1},
    {0x11, Kind::kXudt, 0, 0, 0, 3, {kCalled, kCalling, kData}, true, 1},
    {0x13, Kind::kLudt, 0, 0, 0, 3, {kCalled, kCalling, kData}, true, 2},
    {0x01, Kind::kCr, 0, 1, 0, 5, {kCalled, kNone, kNone}, true, 1},
    {0x02, Kind::kCc, 1, 4, 0, 8, {kNone, kNone, kNone}, true, 1},
    {0x03, Kind::kCref, 1, 0, 0, 5, {kNone, kNone, kNone}, true, 1},
    {0x04, Kind::kRlsd, 1, 4, 0, 8, {kNone, kNone, kNone}, true, 1},
    {0x05, Kind::kRlc, 1, 4, 0, 7, {kNone, kNone, kNone}, false, 1},
    {0x06, Kind::kDt1, 1, 0, 4, 5, {kData, kNone, kNone}, false, 1},
    {0x07, Kind::kDt2, 1, 0, 5, 6, {kData, kNone, kNone}, false, 1},
};

constexpr uint8_t kOptionalEnd = 0x00, kOptionalData = 0x0f, kOptionalSegmentation = 0x10;

const Layout* LayoutOf(uint8_t type) {
  for (const Layout& layout : kLayouts)
    if (layout.type == type) return &layout;
  return nullptr;
}

size_t ReadUnsigned(OctetReader& reader, size_t size) {
  return size == 1 ? reader.U8() : reader.U16LittleEndian();
}

// A local reference is three octets, taken as a number least significant
// first.
uint32_t LocalReference(OctetReader& reader, size_t at) {
  reader.Seek(at);
  const auto octets = reader.Take(3);
  return octets[0] | octets[1] << 8 | octets[2] << 16;
}

// Where a pointer leads: a one-octet pointer counts from itself, a two-octet
// one (LUDT) from its second octet. 0 when it points nowhere.
size_t Pointee(OctetReader& sccp, size_t pointerAt, size_t pointerSize) {
  sccp.Seek(pointerAt);
  const size_t pointer = ReadUnsigned(sccp, pointerSize);
  return pointer == 0 ? 0 : pointerAt + pointerSize - 1 + pointer;
}

std::span<const uint8_t> VariablePart(OctetReader& sccp, size_t pointerAt, size_t pointerSize,
                                      size_t lengthSize) {
  const size_t at = Pointee(sccp, pointerAt, pointerSize);
  if (at == 0) sccp.Fail("pointer at offset " + std::to_string(pointerAt) + " is 0");
  sccp.Seek(at);
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

SccpSegmentation Segmentation(std::span<const uint8_t> value) {
  OctetReader segmentation(value, "SCCP segmentation");
  const uint8_t first = segmentation.U8();
  return {(first & 0x80) != 0, static_cast<uint8_t>(first & 0x0f), LocalReference(segmentation, 1)};
}

// Parameters of name, length and value up to the end of optional parameters.
void ReadOptionalPart(OctetReader& sccp, size_t at, SccpMessage& message) {
  sccp.Seek(at);
  for (uint8_t name; (name = sccp.U8()) != kOptionalEnd;) {
    const auto value = sccp.Take(sccp.U8());
    if (name == kOptionalData) message.data = value;
    if (name == kOptionalSegmentation) message.segmentation = Segmentation(value);
  }
}

}  // namespace

std::optional<SccpMessage> ReadSccp(std::span<const uint8_t> sccp) {
  OctetReader reader(sccp, "SCCP");
  const Layout* layout = LayoutOf(reader.U8());
  if (!layout) return std::nullopt;
  SccpMessage message;
  message.kind = layout->kind;
  if (layout->destinationReferenceAt != 0)
    message.destinationReference = LocalReference(reader, layout->destinationReferenceAt);
  if (layout->sourceReferenceAt != 0)
    message.sourceReference = LocalReference(reader, layout->sourceReferenceAt);
  if (layout->moreDataAt != 0) {
    reader.Seek(layout->moreDataAt);
    message.moreData = reader.U8() & 0x01;
  }
  const size_t size = layout->pointerSize;
  size_t pointerAt = layout->firstPointer;
  for (const Variable variable : layout->variables) {
    if (variable == kNone) break;
    const auto value = VariablePart(reader, pointerAt, size, variable == kData ? size : 1);
    if (variable == kCalled) message.calledSubsystem = CalledSubsystem(value);
    if (variable == kCalling) message.calling = value;
    if (variable == kData) message.data = value;
    pointerAt += size;
  }
  if (layout->optionalPart) {
    if (const size_t at = Pointee(reader, pointerAt, size); at != 0)
      ReadOptionalPart(reader, at, message);
  }
  if (message.data && message.data->empty()) reader.Fail("a Data parameter of no octets");
  return message;
}

}  // namespace rnsap::cli
