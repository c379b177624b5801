// Records shared between the decoder module and its host.
//
// Field order and widths are a binary contract with the host. On a 32-bit
// build every offset and size below is exact and checked; on a 64-bit build
// pointer fields are native pointers and every other field keeps its width,
// in the same order, with the compiler's natural alignment.
#pragma once

#include <cstddef>
#include <cstdint>

namespace rnsap {

// Error flags in DecodeState::flags. Sticky: no pass clears them.
inline constexpr uint32_t ERR_CONDITION = 2;
inline constexpr uint32_t ERR_LAYER = 0x10000000;
inline constexpr uint32_t ERR_NO_MEMORY_STACK = 0x20000000;
inline constexpr uint32_t ERR_NO_MEMORY_SEGMENTS = 0x40000000;

// What the Validation pass writes to DecodeRequest::verdict once flags are set.
inline constexpr int32_t VERDICT_FLAGGED = -52;

inline constexpr uint32_t kLabelBufferSize = 255;
inline constexpr uint32_t kValueTextBufferSize = 255;
inline constexpr uint32_t kInitialSegmentCapacity = 200;
inline constexpr uint32_t kRuleNameBufferSize = 71;
inline constexpr uint32_t kTextRecordSize = 1000;

// One run of bits of a field, inclusive, in the message's bit numbering.
struct BitSegment {
  uint32_t segmentValue;
  uint32_t firstBit;
  uint32_t lastBit;
  uint32_t shapeWord;  // written 0 by reads of fixed shape; loops leave it
  uint32_t reserved[2];
};

// The one field being read; overwritten by every read.
struct FieldRecord {
  uint32_t fieldId;
  char* label;
  uint32_t value;
  char* valueText;
  uint32_t readCount;
  uint32_t segmentCount;
  BitSegment* segments;
  uint32_t segmentCapacity;
  uint32_t paddingHigh;
  uint32_t paddingBits;
  uint8_t reserved[8];
  uint32_t rawFlag;
  uint8_t* rawBytes;
  uint32_t rawBits;
};

// A row of layerTable, one per message walked.
struct LayerRecord {
  uint32_t startPosition;
  uint32_t unused[13];
};

// A row of DecodeRequest::layerRows, opened and closed by the reporting passes.
struct LayerBoundary {
  uint32_t firstBit;
  uint32_t lastBit;
  uint32_t layerValue;
  uint32_t tag;
};

// Host memory that the Decoded-field pass marks before each field report.
struct TextRecord {
  uint8_t bytes[kTextRecordSize];
};

struct DecodeState {
  uint8_t* buffer;
  const uint8_t* source;
  uint32_t totalBits;
  uint32_t position;
  uint8_t reserved0[4];
  uint32_t bitsLeft;
  uint32_t flags;
  uint32_t* stackBase;
  uint32_t* stackTop;
  int32_t stackIndex;
  uint32_t stackCapacity;
  uint8_t limitStack[16];  // the host's second stack of bit limits
  uint8_t test;
  uint8_t reserved1[3];
  uint32_t width;
  uint8_t reserved2[4];
  char* ruleName;
  uint8_t reserved3[128];
  FieldRecord field;
  LayerRecord* layerTable;
  uint32_t layerPending;
  uint32_t layerIndex;
  uint32_t layerCapacity;
};

// Passed to the Validation, Decoded-field and Display passes.
struct DecodeRequest {
  uint8_t reserved0[12];
  uint32_t bitsLeftOut;
  uint8_t reserved1[8];
  uint8_t tag;
  uint8_t reserved2[11];
  uint32_t layerValue;
  uint8_t reserved3[4];
  int32_t verdict;
  uint8_t reserved4[4];
  TextRecord* textRecords;
  uint32_t textRecordIndex;
  uint8_t reserved5[20];
  LayerBoundary* layerRows;
  uint32_t layerRowIndex;
  uint32_t layerRowLimit;
  uint8_t reserved6[12];
  DecodeState* state;
};

// Passed to the Key-field pass.
struct KeyFieldRequest {
  uint8_t reserved0[8];
  uint32_t bitsLeftOut;
  uint8_t reserved1[8];
  uint8_t* keyBuffer;
  uint16_t keyOffset;
  uint16_t keyLimit;
  DecodeState* state;
};

// A row of the key-field table that the Key-field pass hands to
// kf_InitialiseOptKFE. The module supplies the two names; the host library
// fills in where each key lives in the key buffer.
struct KeyFieldRow {
  uint32_t presenceOffset;
  uint32_t valueOffset;
  uint32_t presenceMask;
  const char* moduleName;
  const char* keyName;
  uint32_t reserved[3];
};

static_assert(sizeof(BitSegment) == 24);
static_assert(sizeof(LayerRecord) == 56);
static_assert(sizeof(LayerBoundary) == 16);
static_assert(sizeof(TextRecord) == 1000);

#if UINTPTR_MAX == 0xffffffffu
static_assert(sizeof(FieldRecord) == 60);
static_assert(offsetof(FieldRecord, segments) == 24);
static_assert(offsetof(FieldRecord, paddingBits) == 36);
static_assert(offsetof(FieldRecord, rawFlag) == 48);
static_assert(offsetof(FieldRecord, rawBits) == 56);

static_assert(offsetof(DecodeState, totalBits) == 8);
static_assert(offsetof(DecodeState, position) == 12);
static_assert(offsetof(DecodeState, bitsLeft) == 20);
static_assert(offsetof(DecodeState, flags) == 24);
static_assert(offsetof(DecodeState, stackBase) == 28);
static_assert(offsetof(DecodeState, stackIndex) == 36);
static_assert(offsetof(DecodeState, stackCapacity) == 40);
static_assert(offsetof(DecodeState, limitStack) == 44);
static_assert(offsetof(DecodeState, test) == 60);
static_assert(offsetof(DecodeState, width) == 64);
static_assert(offsetof(DecodeState, ruleName) == 72);
static_assert(offsetof(DecodeState, field) == 204);
static_assert(offsetof(DecodeState, layerTable) == 264);
static_assert(offsetof(DecodeState, layerCapacity) == 276);
static_assert(sizeof(DecodeState) == 280);

static_assert(offsetof(DecodeRequest, bitsLeftOut) == 12);
static_assert(offsetof(DecodeRequest, tag) == 24);
static_assert(offsetof(DecodeRequest, layerValue) == 36);
static_assert(offsetof(DecodeRequest, verdict) == 44);
static_assert(offsetof(DecodeRequest, textRecords) == 52);
static_assert(offsetof(DecodeRequest, textRecordIndex) == 56);
static_assert(offsetof(DecodeRequest, layerRows) == 80);
static_assert(offsetof(DecodeRequest, layerRowIndex) == 84);
static_assert(offsetof(DecodeRequest, layerRowLimit) == 88);
static_assert(offsetof(DecodeRequest, state) == 104);
static_assert(sizeof(DecodeRequest) == 108);

static_assert(offsetof(KeyFieldRequest, bitsLeftOut) == 8);
static_assert(offsetof(KeyFieldRequest, keyBuffer) == 20);
static_assert(offsetof(KeyFieldRequest, keyOffset) == 24);
static_assert(offsetof(KeyFieldRequest, keyLimit) == 26);
static_assert(offsetof(KeyFieldRequest, state) == 28);
static_assert(sizeof(KeyFieldRequest) == 32);
static_assert(sizeof(KeyFieldRow) == 32);
#endif

}  // namespace rnsap
