// The field read protocol and the walk of the compiled grammar, written once
// for all four passes. A pass differs only in its Sink:
//
//   uint32_t OnField(DecodeState&, const grammar::FieldInfo&)  after each field read;
//                                                              0 unwinds the walk
//   void CheckPoint(DecodeState&)         after each read, assignment and rule exit
//   void OnLoopEnd(DecodeState&, int32_t counter, int32_t bound)  after a counted loop
//   static constexpr bool kCallsHostPerField  whether OnField hands the field to the host
//
// The walk keeps its own stack of open rules, branches and loops in the
// pass's module-wide state, so that it needs the same few hundred bytes of
// the caller's stack at any depth of nesting.
//
// Rule names and labels are copied into the host's buffers only where the
// host can look at them: before each host call and when the walk ends. Until
// then a DeferredText keeps what the copies would have left there.
#pragma once

#include <cstdint>
#include <cstring>

#include "contract/decode_state.h"
#include "engine/bit_access.h"
#include "engine/deferred_text.h"
#include "engine/grammar_tables.h"

namespace rnsap {

// Rules nest as deep as extension containers inside extensions go, which
// only the message's length bounds. A walk that would open more rules fails
// as if the position stack could not grow, so that no host takes a cut-off
// walk for a complete one.
inline constexpr int32_t kMaxRuleDepth = 512;

// One entry of the walk's own stack: an open rule, the then-branch of a
// condition that has an else-branch, or a counted loop.
struct WalkFrame {
  enum Kind : uint8_t { kRule, kBranch, kLoop };
  const grammar::Step* resume;  // where the walk goes on once this ends
  const grammar::Step* end;     // end of the block this was opened in
  union {
    const grammar::Rule* rule;  // kRule: the rule this was opened in
    const grammar::Step* body;  // kLoop: first step of the body
  };
  int32_t counter;  // kLoop
  uint16_t slot;    // kLoop: the count variable
  Kind kind;
};

// The module-wide state of one pass: its grammar variables and bit order,
// the walk's stack and the texts not yet copied out.
struct PassState {
  static constexpr uint32_t kFrameCapacity = kMaxRuleDepth * (1 + grammar::kMaxOpenBlocksPerRule);

  int32_t variables[grammar::kVariableCount];
  BitOrderStack bitOrder;
  WalkFrame frames[kFrameCapacity];
  DeferredText<kRuleNameBufferSize> ruleName;
  DeferredText<kLabelBufferSize> label;

  void Clear() {
    std::memset(variables, 0, sizeof variables);
    bitOrder.Clear();
  }

  // Copies the held-back texts into the state's buffers, as the host must see them.
  void WriteTexts(DecodeState& s) {
    if (ruleName.pending()) ruleName.WriteTo(s.ruleName);
    if (label.pending()) {
      label.WriteTo(s.field.label);
      s.field.valueText[0] = '\0';  // every reset clears it
    }
  }
};

// Pushes `position` for a rule named `literal`; 0 when the stack cannot grow.
inline uint32_t EnterRule(DecodeState& s, PassState& pass, const char* literal, uint32_t length) {
  pass.ruleName.Copy(literal, length + 1);
  s.stackIndex = static_cast<int32_t>(s.stackTop + 1 - s.stackBase);
  if (static_cast<uint32_t>(s.stackIndex) >= s.stackCapacity) {
    pass.WriteTexts(s);
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

template <class Sink>
class Walker {
 public:
  Walker(DecodeState& state, Sink& sink, PassState& pass)
      : s_(state), sink_(sink), pass_(pass), vars_(pass.variables), top_(pass.frames) {}

  // Walks rule `index` to its end; 0 when a table failed to grow. The pass's
  // texts are left to WriteTexts.
  uint32_t Walk(uint32_t index) {
    if (!CallRule(index)) return 0;
    for (;;) {
      if (pc_ == end_) {
        if (!CloseBlock()) return 0;
        if (top_ == pass_.frames) return 1;
        continue;
      }
      if (!Execute(*pc_++)) return 0;
    }
  }

  void LeaveRule() {
    sink_.CheckPoint(s_);
    --s_.stackTop;
  }

 private:
  using Step = grammar::Step;

  uint32_t Execute(const Step& st) {
    switch (st.op) {
      case grammar::Op::kRead:
        return Read(grammar::kReads[st.arg]);
      case grammar::Op::kAlign:
        return Align();
      case grammar::Op::kCall:
        return CallRule(st.arg);
      case grammar::Op::kIf:
        return Branch(st);
      case grammar::Op::kWhen:
        if (ok_) {
          s_.test = (static_cast<uint32_t>(vars_[st.slot]) & st.arg) != 0;
          if (!s_.test) s_.flags |= ERR_CONDITION;
        }
        if (!ok_ || !s_.test) pc_ += st.len1;
        return 1;
      case grammar::Op::kRepeat:
        return OpenLoop(st);
      case grammar::Op::kDispatch:
        return Dispatch(grammar::kDispatchTables[st.arg], vars_[st.slot]);
      case grammar::Op::kSet:
        if (ok_) {
          vars_[st.slot] = Evaluate(grammar::kExprs[st.arg]);
          sink_.CheckPoint(s_);
        }
        return 1;
    }
    return 1;
  }

  // A frame for what is opened now; 0 once the walk's stack is full.
  WalkFrame* Push(WalkFrame::Kind kind) {
    if (top_ == pass_.frames + PassState::kFrameCapacity) {
      s_.flags |= ERR_NO_MEMORY_STACK;
      return nullptr;
    }
    WalkFrame* frame = top_++;
    frame->kind = kind;
    frame->resume = pc_;
    frame->end = end_;
    return frame;
  }

  uint32_t CallRule(uint32_t index) {
    if (!ok_) return 1;
    if (s_.stackTop - s_.stackBase >= kMaxRuleDepth) {
      s_.flags |= ERR_NO_MEMORY_STACK;
      return 0;
    }
    const grammar::Rule& rule = grammar::kRules[index];
    if (!EnterRule(s_, pass_, rule.literal, rule.literalLength)) return 0;
    WalkFrame* frame = Push(WalkFrame::kRule);
    if (frame == nullptr) return 0;
    frame->rule = rule_;
    rule_ = &rule;
    pc_ = grammar::kSteps + rule.firstStep;
    end_ = pc_ + rule.stepCount;
    return 1;
  }

  // The then-branch runs to the end of the else-branch's steps unless there
  // are some; the else-branch runs straight on into what follows.
  uint32_t Branch(const Step& st) {
    s_.test = Holds(grammar::kConds[st.arg]);
    const Step* then = pc_;
    const Step* otherwise = then + st.len1;
    if (!s_.test) {
      pc_ = otherwise;
    } else if (st.len2 != 0) {
      pc_ = otherwise + st.len2;
      if (st.len1 == 0) return 1;
      if (Push(WalkFrame::kBranch) == nullptr) return 0;
      pc_ = then;
      end_ = otherwise;
    }
    return 1;
  }

  // A counted loop: the bound is read afresh at each test.
  uint32_t OpenLoop(const Step& st) {
    const Step* body = pc_;
    s_.test = 1;
    pc_ = body + st.len1;
    if (!ok_ || vars_[st.slot] <= 0) {
      sink_.OnLoopEnd(s_, 0, vars_[st.slot]);
      return 1;
    }
    WalkFrame* frame = Push(WalkFrame::kLoop);
    if (frame == nullptr) return 0;
    frame->body = body;
    frame->counter = 1;
    frame->slot = st.slot;
    end_ = pc_;
    pc_ = body;
    return 1;
  }

  // The end of the innermost open block: a rule, a branch or a loop's body.
  uint32_t CloseBlock() {
    WalkFrame& frame = top_[-1];
    if (frame.kind == WalkFrame::kLoop) {
      const int32_t bound = vars_[frame.slot];
      if (frame.counter < bound) s_.test = 1;
      if (ok_ && s_.test && frame.counter < vars_[frame.slot]) {
        ++frame.counter;
        pc_ = frame.body;
        return 1;
      }
      sink_.OnLoopEnd(s_, frame.counter, vars_[frame.slot]);
    } else if (frame.kind == WalkFrame::kRule) {
      LeaveRule();
      rule_ = frame.rule;
    }
    pc_ = frame.resume;
    end_ = frame.end;
    --top_;
    return 1;
  }

  uint32_t Dispatch(const grammar::DispatchTable& table, int32_t id) {
    if (id < 0 || static_cast<uint32_t>(id) >= table.size) return 1;
    const int16_t branch = table.branches[id];
    if (branch < 0) return 1;  // no branch, or an empty one
    return CallRule(static_cast<uint32_t>(branch));
  }

  int32_t Operand(const grammar::ExprTerm& t) const {
    return t.isVariable ? vars_[t.operand] : t.operand;
  }

  int32_t Evaluate(const grammar::Expr& e) const {
    const grammar::ExprTerm* t = grammar::kExprTerms + e.first;
    if (e.count == 1) return Operand(*t);
    int32_t value = 0;
    for (const grammar::ExprTerm* last = t + e.count; t < last; ++t) {
      const auto operand = static_cast<uint32_t>(Operand(*t));
      const auto v = static_cast<uint32_t>(value);
      switch (t->op) {
        case '=':
          value = static_cast<int32_t>(operand);
          break;
        case '+':
          value = static_cast<int32_t>(v + operand);
          break;
        case '-':
          value = static_cast<int32_t>(v - operand);
          break;
        case '*':
          value = static_cast<int32_t>(v * operand);
          break;
        case '/':
          value = operand == 0 ? 0 : value / static_cast<int32_t>(operand);
          break;
      }
    }
    return value;
  }

  static bool Compare(grammar::Compare compare, int32_t a, int32_t b) {
    switch (compare) {
      case grammar::Compare::kEq:
        return a == b;
      case grammar::Compare::kNe:
        return a != b;
      case grammar::Compare::kLt:
        return a < b;
      case grammar::Compare::kLe:
        return a <= b;
      case grammar::Compare::kGt:
        return a > b;
      case grammar::Compare::kGe:
        return a >= b;
    }
    return false;
  }

  bool Holds(const grammar::Cond& c) const {
    for (uint16_t i = 0; i < c.count; ++i) {
      const grammar::CondTerm& t = grammar::kCondTerms[c.first + i];
      if (!Compare(t.compare, Evaluate(grammar::kExprs[t.lhs]), Evaluate(grammar::kExprs[t.rhs])))
        return false;
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

  // Steps 3 and 4 of a read: the rule's name, the reset record with the
  // read's label, and room for `segments`; 0 when the segments cannot grow.
  uint32_t StartField(const grammar::ReadSpec& r, uint32_t segments) {
    pass_.ruleName.Copy(rule_->literal, rule_->literalLength + 1u);
    pass_.label.Copy(r.label, r.labelLength + 1u);
    FieldRecord& rec = s_.field;
    rec.value = 0;
    rec.readCount = 0;
    rec.rawFlag = 0;
    if (segments < rec.segmentCapacity) return 1;  // EnsureExact's own test
    pass_.WriteTexts(s_);
    if (!EnsureExact(reinterpret_cast<void**>(&rec.segments), segments - 1, &rec.segmentCapacity,
                     sizeof(BitSegment))) {
      s_.flags |= ERR_NO_MEMORY_SEGMENTS;
      return 0;
    }
    return 1;
  }

  // One field read: room test, segments and value, conversion, sink. Once the
  // room test has passed, every extent fits the message and so 32 bits.
  uint32_t Read(const grammar::ReadSpec& r) {
    if (!ok_) return 1;
    if (r.shape == grammar::Shape::kRun) return ReadRun(r);
    const Extent x = Measure(r);
    s_.test = s_.bitsLeft >= x.tested;
    if (!s_.test) {
      ok_ = 0;
      return 1;
    }
    const auto segments = static_cast<uint32_t>(x.segments);
    if (!StartField(r, segments)) return 0;
    FillSegments(r, static_cast<uint32_t>(x.elements), segments);
    return FinishField(r, static_cast<uint32_t>(x.consumed));
  }

  // The common read of one run of bits, without the shapes' general steps.
  uint32_t ReadRun(const grammar::ReadSpec& r) {
    s_.test = s_.bitsLeft >= r.width;
    if (!s_.test) {
      ok_ = 0;
      return 1;
    }
    if (!StartField(r, 1)) return 0;
    const uint32_t p = s_.position;
    BitSegment& seg = s_.field.segments[0];
    seg.segmentValue = ReadMessageBits(s_, p, r.width);
    seg.firstBit = p;
    seg.lastBit = p + r.width - 1;
    seg.shapeWord = 0;
    s_.field.value = seg.segmentValue;
    s_.field.readCount = 1;
    return FinishField(r, r.width);
  }

  // Steps 8 to 11 of a read, once its segments and value are in the record.
  uint32_t FinishField(const grammar::ReadSpec& r, uint32_t consumed) {
    FieldRecord& rec = s_.field;
    Convert(r, rec);
    rec.segmentCount = rec.readCount;
    s_.width = consumed;
    const grammar::FieldInfo& info = grammar::kFields[r.field];
    rec.fieldId = info.fieldId;
    s_.bitsLeft -= consumed;
    s_.position += consumed;
    return Report(info);
  }

  uint32_t Report(const grammar::FieldInfo& info) {
    if constexpr (Sink::kCallsHostPerField) pass_.WriteTexts(s_);
    if (!sink_.OnField(s_, info)) return 0;
    sink_.CheckPoint(s_);
    return 1;
  }

  void Segment(uint32_t first, uint32_t last, uint32_t shift, bool mirrored = false) {
    FieldRecord& rec = s_.field;
    BitSegment& seg = rec.segments[rec.readCount++];
    seg.firstBit = first;
    seg.lastBit = last;
    seg.segmentValue = mirrored ? ExtractBits(s_.buffer, first, last)
                                : ReadMessageBits(s_, first, last - first + 1);
    rec.value = (shift >= 32 ? 0 : rec.value << shift) + seg.segmentValue;
  }

  void FillSegments(const grammar::ReadSpec& r, uint32_t elements, uint32_t segments) {
    using grammar::Shape;
    const uint32_t p = s_.position;
    FieldRecord& rec = s_.field;
    switch (r.shape) {
      case Shape::kRun:
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
  uint32_t Align() {
    if (!ok_) return 1;
    static constexpr char kAlign[] = "Align";
    static constexpr char kSpare[] = "  Spare";
    if (!EnterRule(s_, pass_, kAlign, sizeof kAlign - 1)) return 0;
    const uint32_t count = s_.bitsLeft & 7;
    pass_.label.Copy(kSpare, sizeof kSpare);
    FieldRecord& rec = s_.field;
    const uint32_t p = s_.position;
    rec.value = count != 0 ? ReadMessageBits(s_, p, count) : 0;
    rec.readCount = 0;
    rec.rawFlag = 0;
    rec.paddingHigh = 0;
    rec.paddingBits = count;
    rec.segments[0].firstBit = p;
    rec.segments[0].lastBit = p + count - 1;
    rec.segmentCount = 1;
    s_.width = count;
    const grammar::FieldInfo& info = grammar::kFields[grammar::kSpareField];
    rec.fieldId = info.fieldId;
    s_.bitsLeft -= count;
    s_.position += count;
    if (!Report(info)) return 0;
    LeaveRule();
    return 1;
  }

  DecodeState& s_;
  Sink& sink_;
  PassState& pass_;
  int32_t* vars_;
  WalkFrame* top_;
  const grammar::Rule* rule_ = nullptr;
  const Step* pc_ = nullptr;
  const Step* end_ = nullptr;
  uint32_t ok_ = 1;  // falls at the first failed room test and stops every later read
};

}  // namespace rnsap
