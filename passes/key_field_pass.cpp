// The Key-field pass: stores the values of the key fields of a message in the
// key buffer, at the places the host library laid out in the key-field table.
#include <algorithm>
#include <cstring>

#include "boundary/module_api.h"
#include "contract/host_services.h"
#include "engine/message_walk.h"
#include "tables/key_field_table.h"

namespace rnsap {
namespace {

// Kept from one call to the next: the result of the host library's
// initialisation, and the row it asked to have marked.
int32_t initResult = 0;
uint16_t markRow = 0;

PassState keyFieldPass;

void MarkPresent(uint8_t* keyBuffer, const KeyFieldRow& row) {
  keyBuffer[row.presenceOffset] |= static_cast<uint8_t>(row.presenceMask);
}

uint32_t KeyBits(const FieldRecord& record) {
  uint32_t bits = 0;
  for (uint32_t i = 0; i < record.segmentCount; ++i)
    bits += record.segments[i].lastBit - record.segments[i].firstBit + 1;
  return bits;
}

// Joins the segments, entry 0 most significant, into big-endian octets at
// `key`, within `limit` octets of room. False when they do not fit.
bool PackKey(const FieldRecord& record, uint32_t keyOctets, uint8_t* key, uint32_t limit) {
  if (limit == 0) return false;
  std::memset(key, 0, std::min(keyOctets, limit));
  uint32_t room = limit;
  uint32_t bitPos = 0;
  uint8_t* octet = key;
  for (uint32_t i = record.segmentCount; i-- > 0;) {
    const BitSegment& seg = record.segments[i];
    const uint32_t n = seg.lastBit - seg.firstBit + 1;
    if (room < (bitPos + n) / 8 - bitPos / 8 + 1) return false;
    const uint32_t bits = (seg.segmentValue & ((n >= 32) ? ~0u : ((1u << n) - 1))) << bitPos;
    octet[0] |= static_cast<uint8_t>(bits);
    if (bitPos + n > 8) octet[1] |= static_cast<uint8_t>(bits >> 8);
    bitPos += n;
    while (bitPos > 8) {
      bitPos -= 8;
      --room;
      ++octet;
    }
  }
  std::reverse(key, key + keyOctets);
  return true;
}

// Key octets must end within the 16-bit range of `keyOffset`, so that the
// offset never wraps round onto the key layout at the start of the buffer.
bool KeyOctetsFit(uint16_t offset, uint32_t octets) { return uint32_t{offset} + octets <= 0xffff; }

struct KeyFieldSink : UncheckedSink {
  KeyFieldRequest& request;

  static bool WantsField(const grammar::FieldInfo& info) { return info.keyRow >= 0; }

  // Stores the key. Kept out of line, so that the rules' frames stay small.
  [[gnu::noinline]] uint32_t OnField(DecodeState& s, const grammar::FieldInfo& info) {
    const KeyFieldRow& row = tables::kKeyFieldTable[info.keyRow];
    uint8_t* slot = request.keyBuffer + row.valueOffset;
    MarkPresent(request.keyBuffer, row);
    const uint32_t value = s.field.value;
    if (info.keySize == 1) {
      slot[0] = static_cast<uint8_t>(value);
    } else if (info.keySize == 2) {
      slot[0] = static_cast<uint8_t>(value);
      slot[1] = static_cast<uint8_t>(value >> 8);
    } else {
      return StoreVariableKey(s.field, slot);
    }
    return 1;
  }

  // A variable slot: the key's bits and the offset of its octets, which
  // follow the octets of the previous variable key.
  uint32_t StoreVariableKey(const FieldRecord& record, uint8_t* slot) {
    const uint32_t bits = KeyBits(record);
    const uint16_t offset = request.keyOffset;
    slot[0] = static_cast<uint8_t>(bits);
    slot[1] = static_cast<uint8_t>(bits >> 8);
    slot[2] = static_cast<uint8_t>(offset);
    slot[3] = static_cast<uint8_t>(offset >> 8);
    const uint32_t octets = (bits + 7) / 8;
    if (!KeyOctetsFit(offset, octets) ||
        !PackKey(record, octets, request.keyBuffer + offset, request.keyLimit)) {
      slot[0] = slot[1] = 0;
      slot[3] |= 0x80;
      return 0;
    }
    request.keyOffset = static_cast<uint16_t>(offset + octets);
    return 1;
  }
};

}  // namespace
}  // namespace rnsap

int32_t KFE_vorel_rnsap_04b(rnsap::KeyFieldRequest* request) {
  using namespace rnsap;
  keyFieldPass.Clear();
  if (initResult < 0) return initResult;
  if (initResult == 0) {
    initResult = kf_InitialiseOptKFE(tables::kKeyFieldTable, tables::kKeyFieldRows, &markRow);
    if (initResult < 0) return initResult;
  }
  if (initResult > 1 && markRow < tables::kKeyFieldRows)
    MarkPresent(request->keyBuffer, tables::kKeyFieldTable[markRow]);
  KeyFieldSink sink{{}, *request};
  if (!WalkMessage(*request->state, sink, keyFieldPass)) return 0;
  request->bitsLeftOut = request->state->bitsLeft;
  return 1;
}
