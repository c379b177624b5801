// The field read protocol and the walk of the compiled grammar, written once
// for all four passes. A pass differs only in its Sink:
//
//   uint32_t OnField(DecodeState&, const grammar::FieldInfo&)  after each field read;
//                                                              0 unwinds the walk
//   void CheckPoint(DecodeState&)         after each read, assignment and rule exit
//   void OnLoopEnd(DecodeState&, int32_t counter, int32_t bound)  after a counted loop
#pragma once

#include <cstdint>
#include <cstring>

#include "engine/bit_access.h"
#include "engine/decode_state.h"
#include "engine/grammar_tables.h"

namespace rnsap {

// What a rule gets from its caller: the ok flag falls at the first failed
// room test and stops every later read.
struct RuleFrame {
  uint32_t reserved;
  uint32_t ok;
  uint32_t counter;
};

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
inline uint32_t EnterRule(DecodeState& s, const char* literal, uint32_t length) {
  std::memcpy(s.ruleName, literal, length + 1);
  s.stackIndex = static_cast<int32_t>(s.stackTop + 1 - s.stackBase);
  if (!EnsureDoubling(reinterpret_cast<void**>(&s.stackBase), static_cast<uint32_t>(s.stackIndex),
                      &s.stackCapacity, sizeof(uint32_t))) {
    s.flags |= ERR_NO_MEMORY_STACK;
    return 0;
  }
  s.stackTop = s.stackBase + s.stackIndex;
  *s.stackTop = s.position;
  return 1;
}

template <class Sink>
class Walker {
 public:
  Walker(DecodeState& state, Sink& sink, PassState& pass)
      : s_(state), sink_(sink), vars_(pass.variables) {}

  // Rules nest as deep as extension containers inside extensions go, which
  // only the message's length bounds. A walk that would open more rules fails
  // as if the position stack could not grow, so that no message exhausts the
  // caller's stack and no host takes a cut-off walk for a complete one.
  static constexpr int32_t kMaxRuleDepth = 512;

  // Walks rule `index` with the caller's frame; 0 when a table failed to grow.
  uint32_t CallRule(uint32_t index, RuleFrame& caller) {
    if (!caller.ok) return 1;
    if (s_.stackTop - s_.stackBase >= kMaxRuleDepth) {
      s_.flags |= ERR_NO_MEMORY_STACK;
      return 0;
    }
    const grammar::Rule& rule = grammar::kRules[index];
    if (!EnterRule(s_, rule.literal, rule.literalLength)) return 0;
    RuleFrame frame{0, caller.ok, 0};
    const grammar::Step* first = grammar::kSteps + rule.firstStep;
    if (!RunBlock(first, first + rule.stepCount, frame, rule)) return 0;
    caller.ok = frame.ok;
    LeaveRule();
    return 1;
  }

  void LeaveRule() {
    sink_.CheckPoint(s_);
    --s_.stackTop;
  }

 private:
  using Step = grammar::Step;

  uint32_t RunBlock(const Step* step, const Step* end, RuleFrame& f, const grammar::Rule& rule) {
    while (step < end) {
      const Step& st = *step++;
      switch (st.op) {
        case grammar::Op::kRead:
          if (!Read(grammar::kReads[st.arg], f, rule)) return 0;
          break;
        case grammar::Op::kAlign:
          if (!Align(f)) return 0;
          break;
        case grammar::Op::kCall:
          if (!CallRule(st.arg, f)) return 0;
          break;
        case grammar::Op::kIf: {
          s_.test = Holds(grammar::kConds[st.arg]);
          const Step* otherwise = step + st.len1;
          const Step* after = otherwise + st.len2;
          if (!(s_.test ? RunBlock(step, otherwise, f, rule) : RunBlock(otherwise, after, f, rule)))
            return 0;
          step = after;
          break;
        }
        case grammar::Op::kWhen:
          if (f.ok) {
            s_.test = (static_cast<uint32_t>(vars_[st.slot]) & st.arg) != 0;
            if (!s_.test) {
              s_.flags |= ERR_CONDITION;
            } else if (!RunBlock(step, step + st.len1, f, rule)) {
              return 0;
            }
          }
          step += st.len1;
          break;
        case grammar::Op::kRepeat:
          if (!Repeat(st.slot, step, step + st.len1, f, rule)) return 0;
          step += st.len1;
          break;
        case grammar::Op::kDispatch:
          if (!Dispatch(grammar::kDispatchTables[st.arg], vars_[st.slot], f)) return 0;
          break;
        case grammar::Op::kSet:
          if (f.ok) {
            vars_[st.slot] = Evaluate(grammar::kExprs[st.arg]);
            sink_.CheckPoint(s_);
          }
          break;
      }
    }
    return 1;
  }

  // A counted loop: the bound is read afresh at each test.
  uint32_t Repeat(uint16_t slot, const Step* body, const Step* end, RuleFrame& f,
                  const grammar::Rule& rule) {
    int32_t counter = 0;
    s_.test = 1;
    while (f.ok && s_.test && counter < vars_[slot]) {
      ++counter;
      if (!RunBlock(body, end, f, rule)) return 0;
      if (counter < vars_[slot]) s_.test = 1;
    }
    sink_.OnLoopEnd(s_, counter, vars_[slot]);
    return 1;
  }

  uint32_t Dispatch(const grammar::DispatchTable& table, int32_t id, RuleFrame& f) {
    if (id < 0 || static_cast<uint32_t>(id) >= table.size) return 1;
    const int16_t branch = table.branches[id];
    if (branch < 0) return 1;  // no branch, or an empty one
    return CallRule(static_cast<uint32_t>(branch), f);
  }

  int32_t Evaluate(const grammar::Expr& e) const {
    int32_t value = 0;
    for (uint16_t i = 0; i < e.count; ++i) {
      const grammar::ExprTerm& t = grammar::kExprTerms[e.first + i];
      const int32_t operand = t.isVariable ? vars_[t.operand] : t.operand;
      switch (t.op) {
        case '=':
          value = operand;
          break;
        case '+':
          value =
              static_cast<int32_t>(static_cast<uint32_t>(value) + static_cast<uint32_t>(operand));
          break;
        case '-':
          value =
              static_cast<int32_t>(static_cast<uint32_t>(value) - static_cast<uint32_t>(operand));
          break;
        case '*':
          value =
              static_cast<int32_t>(static_cast<uint32_t>(value) * static_cast<uint32_t>(operand));
          break;
        case '/':
          value = operand == 0 ? 0 : value / operand;
          break;
      }
    }
    return value;
  }

  bool Holds(const grammar::Cond& c) const {
    for (uint16_t i = 0; i < c.count; ++i) {
      const grammar::CondTerm& t = grammar::kCondTerms[c.first + i];
      const int32_t a = Evaluate(grammar::kExprs[t.lhs]);
      const int32_t b = Evaluate(grammar::kExprs[t.rhs]);
      bool holds = false;
      switch (t.compare) {
        case grammar::Compare::kEq:
          holds = a == b;
          break;
        case grammar::Compare::kNe:
          holds = a != b;
          break;
        case grammar::Compare::kLt:
          holds = a < b;
          break;
        case grammar::Compare::kLe:
          holds = a <= b;
          break;
        case grammar::Compare::kGt:
          holds = a > b;
          break;
        case grammar::Compare::kGe:
          holds = a >= b;
          break;
      }
      if (!holds) return false;
    }
    return true;
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

  Extent Measure(const grammar::ReadSpec& r) const {
    using grammar::Shape;
    const uint64_t n = r.countExpr == grammar::kNoExpr
                           ? 0
                           : static_cast<uint32_t>(Evaluate(grammar::kExprs[r.countExpr]));
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

  // One field read: room test, segments and value, conversion, sink. Once the
  // room test has passed, every extent fits the message and so 32 bits.
  uint32_t Read(const grammar::ReadSpec& r, RuleFrame& f, const grammar::Rule& rule) {
    if (!f.ok) return 1;
    const Extent x = Measure(r);
    s_.test = s_.bitsLeft >= x.tested;
    if (!s_.test) {
      f.ok = 0;
      return 1;
    }
    std::memcpy(s_.ruleName, rule.literal, rule.literalLength + 1u);
    FieldRecord& rec = s_.field;
    ResetFieldRecord(rec);
    std::memcpy(rec.label, r.label, r.labelLength + 1u);
    const auto segments = static_cast<uint32_t>(x.segments);
    if (!EnsureExact(reinterpret_cast<void**>(&rec.segments), segments - 1, &rec.segmentCapacity,
                     sizeof(BitSegment))) {
      s_.flags |= ERR_NO_MEMORY_SEGMENTS;
      return 0;
    }
    FillSegments(r, static_cast<uint32_t>(x.elements), segments);
    Convert(r, rec);
    rec.segmentCount = rec.readCount;
    s_.width = static_cast<uint32_t>(x.consumed);
    rec.fieldId = grammar::kFields[r.field].fieldId;
    s_.bitsLeft -= s_.width;
    s_.position += s_.width;
    if (!sink_.OnField(s_, grammar::kFields[r.field])) return 0;
    sink_.CheckPoint(s_);
    return 1;
  }

  void Segment(uint32_t first, uint32_t last, uint32_t shift, bool mirrored = false) {
    FieldRecord& rec = s_.field;
    BitSegment& seg = rec.segments[rec.readCount++];
    seg.firstBit = first;
    seg.lastBit = last;
    seg.segmentValue =
        mirrored ? ExtractBits(s_.buffer, first, last) : ExtractBits(s_.buffer, last, first);
    rec.value = (shift >= 32 ? 0 : rec.value << shift) + seg.segmentValue;
  }

  void FillSegments(const grammar::ReadSpec& r, uint32_t elements, uint32_t segments) {
    using grammar::Shape;
    const uint32_t p = s_.position;
    FieldRecord& rec = s_.field;
    switch (r.shape) {
      case Shape::kRun:
        Segment(p, p + r.width - 1, r.width);
        rec.segments[0].shapeWord = 0;
        break;
      case Shape::kPeek:
        Segment(p + r.offset, p + r.offset + r.width - 1, r.width);
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

  void Convert(const grammar::ReadSpec& r, FieldRecord& rec) {
    rec.value += static_cast<uint32_t>(r.adjust);
    if (r.conversion == grammar::Conversion::kLength) rec.value += 1;
    if (r.keepSlot != grammar::kNoSlot) {
      const uint32_t kept = r.conversion == grammar::Conversion::kCount ? rec.value + 1 : rec.value;
      vars_[r.keepSlot] = static_cast<int32_t>(kept);
    }
    if (r.bitmapSlot != grammar::kNoSlot)
      vars_[r.bitmapSlot] =
          static_cast<int32_t>(rec.value + 2 * static_cast<uint32_t>(vars_[r.bitmapSlot]));
  }

  // Align: the padding to the next octet boundary, counted from the message's
  // end, read as the Spare field even when there is none.
  uint32_t Align(RuleFrame& f) {
    if (!f.ok) return 1;
    static constexpr char kAlign[] = "Align";
    static constexpr char kSpare[] = "  Spare";
    if (!EnterRule(s_, kAlign, sizeof kAlign - 1)) return 0;
    const uint32_t count = s_.bitsLeft & 7;
    std::memcpy(s_.ruleName, kAlign, sizeof kAlign);
    FieldRecord& rec = s_.field;
    ResetFieldRecord(rec);
    std::memcpy(rec.label, kSpare, sizeof kSpare);
    rec.readCount = 0;
    const uint32_t p = s_.position;
    for (uint32_t i = 0; i < count; ++i)
      rec.value = rec.value * 2 + ExtractBits(s_.buffer, p + i, p + i);
    rec.paddingHigh = 0;
    rec.paddingBits = count;
    rec.segments[0].firstBit = p;
    rec.segments[0].lastBit = p + count - 1;
    rec.segmentCount = 1;
    s_.width = count;
    rec.fieldId = grammar::kFields[grammar::kSpareField].fieldId;
    s_.bitsLeft -= count;
    s_.position += count;
    if (!sink_.OnField(s_, grammar::kFields[grammar::kSpareField])) return 0;
    sink_.CheckPoint(s_);
    LeaveRule();
    return 1;
  }

  DecodeState& s_;
  Sink& sink_;
  int32_t* vars_;
};

}  // namespace rnsap
