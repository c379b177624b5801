// The field read protocol, written once for all four passes, and the walk of
// the grammar's rules. The rules are generated as code (grammar_walk.h) that
// calls the Walker's steps below; a pass differs only in its Sink:
//
//   uint32_t OnField(DecodeState&, const grammar::FieldInfo&)  after each field read
//                                         it wants; 0 unwinds the walk
//   bool WantsField(const grammar::FieldInfo&)  optional: whether OnField must see
//                                         the field; without it, it sees every one
//   static constexpr bool kChecks         whether the walk checks loop counts and
//                                         calls CheckPoint
//   void CheckPoint(DecodeState&)         after each read, assignment and rule exit
//                                         where the flags may have come to differ
//                                         from those at the last check point
//
// A check point with flags that the last one saw non-zero, and no host call
// since, would find what it found then: it is passed over.
//
// Rule names and labels are copied with their NUL, so that a longer earlier
// text still shows behind a shorter later one, as the host expects. The rest
// of the field record of a run or an Align that no sink wants is written only
// when it can be seen: before the next read that writes it in full, before a
// call into the host, and at the walk's end.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>

#include "contract/decode_state.h"
#include "engine/bit_access.h"
#include "engine/grammar_tables.h"

namespace rnsap {

// Rules nest as deep as extension containers inside extensions go, which
// only the message's length bounds. A walk that would open more rules fails
// as if the position stack could not grow, so that no host takes a cut-off
// walk for a complete one. Each open rule holds one small frame of the
// caller's stack.
inline constexpr int32_t kMaxRuleDepth = 512;

// The module-wide state of one pass: its grammar variables and bit order.
struct PassState {
  int32_t variables[grammar::kVariableCount];
  BitOrderStack bitOrder;

  void Clear() {
    std::memset(variables, 0, sizeof variables);
    bitOrder.Clear();
  }
};

// Pushes `position` for a rule named `literal`; 0 when the stack cannot grow.
// `beforeGrowth` runs before the host is asked for more stack.
template <class BeforeGrowth = void (*)()>
[[gnu::always_inline]] inline uint32_t EnterRule(
    DecodeState& s, const char* literal, uint32_t length, BeforeGrowth beforeGrowth = [] {}) {
  std::memcpy(s.ruleName, literal, length + 1);
  s.stackIndex = static_cast<int32_t>(s.stackTop + 1 - s.stackBase);
  if (static_cast<uint32_t>(s.stackIndex) >= s.stackCapacity) {
    beforeGrowth();
    if (!EnsureDoubling(reinterpret_cast<void**>(&s.stackBase), static_cast<uint32_t>(s.stackIndex),
                        &s.stackCapacity, sizeof(uint32_t))) {
      s.flags |= ERR_NO_MEMORY_STACK;
      return 0;
    }
  }
  s.stackTop = s.stackBase + s.stackIndex;
  *s.stackTop = s.position;
  return 1;
}

// Arithmetic of the grammar's expressions: 32-bit, wrapping, and a division
// by zero gives 0.
namespace grammar {
inline int32_t Plus(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) + static_cast<uint32_t>(b));
}
inline int32_t Minus(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) - static_cast<uint32_t>(b));
}
inline int32_t Times(int32_t a, int32_t b) {
  return static_cast<int32_t>(static_cast<uint32_t>(a) * static_cast<uint32_t>(b));
}
inline int32_t Over(int32_t a, int32_t b) { return b == 0 ? 0 : a / b; }
}  // namespace grammar

}  // namespace rnsap

#include "grammar_walk.h"  // generated: the rules as code

namespace rnsap {

template <class Sink>
class Walker {
 public:
  Walker(DecodeState& state, Sink& sink, PassState& pass)
      : v(pass.variables), s_(state), sink_(sink) {}

  // The grammar's variables, by slot.
  int32_t* const v;

  // Walks the message from the grammar's first rule and completes the field
  // record; 0 when a table failed to grow.
  uint32_t Walk() {
    const uint32_t walked = grammar::WalkGrammar(*this);
    WriteDeferred();
    return walked;
  }

  // False once a room test has failed: every later read, rule and
  // assignment is then passed over.
  bool ok() const { return ok_ != 0; }

  // Opens a rule; 0 when the walk would nest too deep or the stack cannot grow.
  [[gnu::always_inline]] uint32_t OpenRule(const grammar::Rule& rule) {
    DecodeState& s = s_;
    if (s.stackTop - s.stackBase >= kMaxRuleDepth) {
      Raise(ERR_NO_MEMORY_STACK);
      return 0;
    }
    return EnterRule(s, rule.literal, rule.literalLength, [this] { BeforeHostCall(); });
  }

  [[gnu::always_inline]] void LeaveRule() {
    CheckPoint();
    --s_.stackTop;
  }

  // The outcome of a condition, kept in the state.
  bool Test(bool holds) {
    s_.test = holds;
    return holds;
  }

  // A presence test of the rule's option bitmap.
  bool When(uint16_t slot, uint32_t mask) {
    if (!ok_) return false;
    s_.test = (static_cast<uint32_t>(v[slot]) & mask) != 0;
    if (!s_.test) Raise(ERR_CONDITION);
    return s_.test;
  }

  void Set(uint16_t slot, int32_t value) {
    if (!ok_) return;
    v[slot] = value;
    CheckPoint();
  }

  // A counted loop: whether its body runs a first time. The bound is read
  // afresh at each test.
  bool LoopStart(uint16_t slot) {
    s_.test = 1;
    if (ok_ && v[slot] > 0) return true;
    EndLoop(0, v[slot]);
    return false;
  }

  // After the body's `counter`th run: whether it runs once more.
  bool LoopNext(uint16_t slot, int32_t& counter) {
    if (counter < v[slot]) {
      s_.test = 1;
      if (ok_) {
        ++counter;
        return true;
      }
    }
    EndLoop(counter, v[slot]);
    return false;
  }

  // One field read of `rule`: room test, segments and value, conversion,
  // sink; `count` is the number of elements of a loop shape. 0 when a table
  // failed to grow.
  [[gnu::always_inline]] uint32_t Read(const grammar::ReadPlan& r, const grammar::Rule& rule,
                                       uint32_t count = 0) {
    if (!ok_) return 1;
    if (r.shape == grammar::Shape::kRun) return ReadRun(r, rule);
    return ReadShaped(r, rule, count);
  }

  // Align: the padding to the next octet boundary, counted from the message's
  // end, read as the Spare field even when there is none.
  [[gnu::always_inline]] uint32_t Align() {
    if (!ok_) return 1;
    static constexpr char kAlign[] = "Align";
    DecodeState& s = s_;
    if (!EnterRule(s, kAlign, sizeof kAlign - 1, [this] { BeforeHostCall(); })) return 0;
    std::memcpy(s.field.label, grammar::kSpareLabel, sizeof grammar::kSpareLabel);
    const uint32_t p = s.position;
    const uint32_t count = s.bitsLeft & 7;
    s.bitsLeft -= count;
    s.position = p + count;
    const grammar::FieldInfo& info = grammar::kFields[grammar::kSpareField];
    if (Wants(info)) {
      WriteDeferred();
      WriteAlignRecord(p, count);
      if (!Report(info)) return 0;
    } else {
      deferredAlign_ = {p, count};
      alignLast_ = true;
      CheckPoint();
    }
    --s.stackTop;  // the read's check point, just made, is the rule's exit one too
    return 1;
  }

 private:
  template <class S>
  static constexpr bool kChoosesFields = requires(S& sink, const grammar::FieldInfo& info) {
    sink.WantsField(info);
  };

  bool Wants(const grammar::FieldInfo& info) {
    if constexpr (kChoosesFields<Sink>) {
      return sink_.WantsField(info);
    } else {
      return true;
    }
  }

  // A read of any shape but a run; its record is written at once.
  [[gnu::noinline]] uint32_t ReadShaped(const grammar::ReadPlan& r, const grammar::Rule& rule,
                                        uint32_t count) {
    const Extent x = Measure(r, count);
    s_.test = s_.bitsLeft >= x.tested;
    if (!s_.test) {
      ok_ = 0;
      return 1;
    }
    const auto segments = static_cast<uint32_t>(x.segments);
    WriteDeferredUnder(segments);
    if (!StartField(r, rule, segments)) return 0;
    FieldRecord& rec = s_.field;
    ClearRecord(rec);
    FillSegments(r, static_cast<uint32_t>(x.elements), segments);
    rec.value = Converted(r, rec.value);
    Keep(r, rec.value);
    rec.segmentCount = rec.readCount;
    s_.width = static_cast<uint32_t>(x.consumed);
    const grammar::FieldInfo& info = grammar::kFields[r.field];
    rec.fieldId = info.fieldId;
    s_.bitsLeft -= s_.width;
    s_.position += s_.width;
    return Report(info);
  }

  // Bits the read consumes and segments it needs, for its shape. A count
  // from a wide field times an element size can pass 2^32: the sums are in
  // 64 bits, so that such a read fails its room test instead of wrapping.
  struct Extent {
    uint64_t tested;    // bits the room test asks for
    uint64_t consumed;  // bits `position` moves by
    uint64_t segments;
    uint64_t elements;  // loop elements
  };

  static Extent Measure(const grammar::ReadPlan& r, uint32_t count) {
    using grammar::Shape;
    const uint64_t n = count;
    switch (r.shape) {
      case Shape::kRun:
        return {r.width, r.width, 1, 1};
      case Shape::kPeek:
        return {r.offset + 1u, 0, 1, 1};
      case Shape::kGroups:
        return {r.width, r.width, r.groupCount, r.groupCount};
      case Shape::kOctets:
      case Shape::kOctetsBack:
      case Shape::kOctetsMirrored:
        return {8 * n, 8 * n, n, n};
      case Shape::kBits:
      case Shape::kBitsBack:
        return {n, n, n, n};
      case Shape::kNibbles:
        return {4 * n, 4 * n, n, n};
      case Shape::kDigitPairs: {
        const uint64_t digits = r.width ? r.width : 2 * n;
        return {8 * n, 8 * n, digits, n};
      }
    }
    return {0, 0, 0, 0};
  }

  // The start of a read: the rule's name, the read's label, and room for
  // `segments`; 0 when the segments cannot grow.
  [[gnu::always_inline]] uint32_t StartField(const grammar::ReadPlan& r, const grammar::Rule& rule,
                                             uint32_t segments) {
    DecodeState& s = s_;
    std::memcpy(s.ruleName, rule.literal, rule.literalLength + 1u);
    std::memcpy(s.field.label, r.label, r.labelLength + 1u);
    if (segments < s.field.segmentCapacity) return 1;  // EnsureExact's own test
    return GrowSegments(segments);
  }

  // Asks the host for `segments`, with the record as the read has begun it.
  [[gnu::noinline]] uint32_t GrowSegments(uint32_t segments) {
    BeforeHostCall();
    FieldRecord& rec = s_.field;
    ClearRecord(rec);
    if (!EnsureExact(reinterpret_cast<void**>(&rec.segments), segments - 1, &rec.segmentCapacity,
                     sizeof(BitSegment))) {
      Raise(ERR_NO_MEMORY_SEGMENTS);
      return 0;
    }
    return 1;
  }

  static void ClearRecord(FieldRecord& rec) {
    rec.valueText[0] = '\0';
    rec.value = 0;
    rec.readCount = 0;
    rec.rawFlag = 0;
  }

  // The common read of one run of bits, without the shapes' general steps.
  [[gnu::always_inline]] uint32_t ReadRun(const grammar::ReadPlan& r, const grammar::Rule& rule) {
    DecodeState& s = s_;
    s.test = s.bitsLeft >= r.width;
    if (!s.test) {
      ok_ = 0;
      return 1;
    }
    if (!StartField(r, rule, 1)) return 0;
    const uint32_t p = s.position;
    s.bitsLeft -= r.width;
    s.position = p + r.width;
    const grammar::FieldInfo& info = grammar::kFields[r.field];
    if (Wants(info)) {
      WriteDeferred();
      Keep(r, WriteRunRecord(r, p));
      return Report(info);
    }
    if (r.keepSlot != grammar::kNoSlot || r.bitmapSlot != grammar::kNoSlot)
      Keep(r, Converted(r, ReadMessageBits(s, p, r.width)));
    deferredRun_ = {&r, p};
    alignLast_ = false;
    CheckPoint();
    return 1;
  }

  // The record of a run of `r.width` bits at `p`; gives its value.
  [[gnu::always_inline]] uint32_t WriteRunRecord(const grammar::ReadPlan& r, uint32_t p) {
    DecodeState& s = s_;
    FieldRecord& rec = s.field;
    const uint32_t bits = ReadMessageBits(s, p, r.width);
    BitSegment& seg = rec.segments[0];
    seg.segmentValue = bits;
    seg.firstBit = p;
    seg.lastBit = p + r.width - 1;
    seg.shapeWord = 0;
    rec.valueText[0] = '\0';
    rec.value = Converted(r, bits);
    rec.readCount = 1;
    rec.rawFlag = 0;
    rec.segmentCount = 1;
    s.width = r.width;
    rec.fieldId = grammar::kFields[r.field].fieldId;
    return rec.value;
  }

  // The record of an Align of `count` bits at `p`. The segment's value and
  // fourth word stay as the last read left them.
  [[gnu::always_inline]] void WriteAlignRecord(uint32_t p, uint32_t count) {
    DecodeState& s = s_;
    FieldRecord& rec = s.field;
    rec.valueText[0] = '\0';
    rec.value = count != 0 ? ReadMessageBits(s, p, count) : 0;
    rec.readCount = 0;
    rec.rawFlag = 0;
    rec.paddingHigh = 0;
    rec.paddingBits = count;
    rec.segments[0].firstBit = p;
    rec.segments[0].lastBit = p + count - 1;
    rec.segmentCount = 1;
    s.width = count;
    rec.fieldId = grammar::kFields[grammar::kSpareField].fieldId;
  }

  // Writes the records of the deferred run and Align, the older first. A
  // sink that wants every field leaves none.
  void WriteDeferred() {
    if constexpr (!kChoosesFields<Sink>) return;
    const bool run = deferredRun_.plan != nullptr;
    const bool align = deferredAlign_.position != 0;
    if (run && !alignLast_) {
      if (align) WriteAlignRecord(deferredAlign_.position, deferredAlign_.count);
      WriteRunRecord(*deferredRun_.plan, deferredRun_.position);
    } else if (align) {
      if (run) WriteRunRecord(*deferredRun_.plan, deferredRun_.position);
      WriteAlignRecord(deferredAlign_.position, deferredAlign_.count);
    }
    ForgetDeferred();
  }

  void ForgetDeferred() {
    deferredRun_.plan = nullptr;
    deferredAlign_.position = 0;
  }

  // Before a read of `segments` segments: what of the deferred records that
  // read leaves as it is, the run's fourth segment word and the Align's
  // padding words; all of them when it writes no segment or must grow them.
  void WriteDeferredUnder(uint32_t segments) {
    if (segments == 0 || segments >= s_.field.segmentCapacity) return WriteDeferred();
    FieldRecord& rec = s_.field;
    if (deferredRun_.plan != nullptr) rec.segments[0].shapeWord = 0;
    if (deferredAlign_.position != 0) {
      rec.paddingHigh = 0;
      rec.paddingBits = deferredAlign_.count;
    }
    ForgetDeferred();
  }

  [[gnu::always_inline]] uint32_t Report(const grammar::FieldInfo& info) {
    if (Wants(info) && !sink_.OnField(s_, info)) return 0;
    CheckPoint();
    return 1;
  }

  // The host may change the flags while it has control.
  void BeforeHostCall() {
    WriteDeferred();
    flagsChanged_ = 1;
  }

  void Raise(uint32_t flag) {
    flagsChanged_ |= s_.flags == 0 ? 1u : 0u;
    s_.flags |= flag;
  }

  [[gnu::always_inline]] void CheckPoint() {
    if constexpr (Sink::kChecks) {
      if (flagsChanged_) {
        flagsChanged_ = 0;
        sink_.CheckPoint(s_);
      }
    }
  }

  // The count check behind a counted loop: one that ends early is flagged.
  void EndLoop(int32_t counter, int32_t bound) {
    if constexpr (Sink::kChecks) {
      if (counter != bound) Raise(ERR_CONDITION);
    }
  }

  void Segment(uint32_t first, uint32_t last, uint32_t shift, bool mirrored = false) {
    AddSegment(first, last, shift,
               mirrored ? ExtractBits(s_.buffer, first, last)
                        : ReadMessageBits(s_, first, last - first + 1));
  }

  void AddSegment(uint32_t first, uint32_t last, uint32_t shift, uint32_t bits) {
    FieldRecord& rec = s_.field;
    BitSegment& seg = rec.segments[rec.readCount++];
    seg.firstBit = first;
    seg.lastBit = last;
    seg.segmentValue = bits;
    rec.value = (shift >= 32 ? 0 : rec.value << shift) + bits;
  }

  // A look-ahead needs room for its first bit only, so its run may reach
  // past the message: the bits behind the end of the buffer read as 0.
  uint32_t LookAheadBits(uint32_t first, uint32_t width) const {
    const uint32_t bufferBits = (s_.totalBits + 7) / 8 * 8;
    const uint32_t present = std::min(width, bufferBits - first + 1);
    return ReadMessageBits(s_, first, present) << (width - present);
  }

  void FillSegments(const grammar::ReadPlan& r, uint32_t elements, uint32_t segments) {
    using grammar::Shape;
    const uint32_t p = s_.position;
    FieldRecord& rec = s_.field;
    switch (r.shape) {
      case Shape::kRun:
        Segment(p, p + r.width - 1, r.width);
        rec.segments[0].shapeWord = 0;
        break;
      case Shape::kPeek:
        AddSegment(p + r.offset, p + r.offset + r.width - 1, r.width,
                   LookAheadBits(p + r.offset, r.width));
        rec.segments[0].shapeWord = 0;
        break;
      case Shape::kGroups:
        for (uint32_t g = 0; g < r.groupCount; ++g) {
          const grammar::Group& run = grammar::kGroups[r.offset + g];
          Segment(p + run.from, p + run.to, run.to - run.from + 1u);
          rec.segments[g].shapeWord = 0;
        }
        break;
      case Shape::kOctets:
      case Shape::kOctetsMirrored:
        for (uint32_t i = 0; i < elements; ++i)
          Segment(p + 8 * i, p + 8 * i + 7, 8, r.shape == Shape::kOctetsMirrored);
        break;
      case Shape::kOctetsBack:
        for (uint32_t i = elements; i-- > 0;) Segment(p + 8 * i, p + 8 * i + 7, 8);
        break;
      case Shape::kBits:
        for (uint32_t i = 0; i < elements; ++i) Segment(p + i, p + i, 1);
        break;
      case Shape::kBitsBack:
        for (uint32_t i = elements; i-- > 0;) Segment(p + i, p + i, 1);
        break;
      case Shape::kNibbles:
        for (uint32_t i = 0; i < elements; ++i) Segment(p + 4 * i, p + 4 * i + 3, 4);
        break;
      case Shape::kDigitPairs:
        for (uint32_t d = 0; d < segments; ++d) {
          const uint32_t octet = p + 8 * (d / 2);
          const uint32_t first = d % 2 == 0 ? octet + 4 : octet;
          Segment(first, first + 3, 4);
          rec.segments[d].shapeWord = 0;
        }
        break;
    }
  }

  // The value of a read built from `raw`.
  static uint32_t Converted(const grammar::ReadPlan& r, uint32_t raw) {
    const uint32_t value = raw + static_cast<uint32_t>(r.adjust);
    return r.conversion == grammar::Conversion::kLength ? value + 1 : value;
  }

  // The variables a read of `value` sets: its kept value and the option bitmap.
  [[gnu::always_inline]] void Keep(const grammar::ReadPlan& r, uint32_t value) {
    if (r.keepSlot != grammar::kNoSlot) {
      const uint32_t kept = r.conversion == grammar::Conversion::kCount ? value + 1 : value;
      v[r.keepSlot] = static_cast<int32_t>(kept);
    }
    if (r.bitmapSlot != grammar::kNoSlot)
      v[r.bitmapSlot] = static_cast<int32_t>(value + 2 * static_cast<uint32_t>(v[r.bitmapSlot]));
  }

  DecodeState& s_;
  Sink& sink_;
  uint32_t ok_ = 1;  // falls at the first failed room test and stops every later read
  // The record writes still owed: the last run (no plan: none) and the last
  // Align (position 0: none), and which of the two came last.
  struct {
    const grammar::ReadPlan* plan;
    uint32_t position;
  } deferredRun_{};
  struct {
    uint32_t position;
    uint32_t count;
  } deferredAlign_{};
  bool alignLast_ = false;
  // Whether the flags may differ from what the last check point saw; a word,
  // as byte writes beside alignLast_ slow every check point that reads it.
  uint32_t flagsChanged_ = 1;
};

}  // namespace rnsap
