#include "passes/field_text.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace rnsap {

void TextBuffer::Append(const char* text) {
  char* const last = data_ + size_ - 1;
  char* next = data_ + length_;
  while (next != last && *text != '\0') *next++ = *text++;
  *next = '\0';
  length_ = static_cast<size_t>(next - data_);
}

void TextBuffer::AppendFormatted(const char* format, uint32_t value) {
  char number[64];
  const int n = std::snprintf(number, sizeof number, format, value);
  if (n > 0) Append(number, std::min(static_cast<size_t>(n), sizeof number - 1));
}

namespace {

// The digits of `magnitude` in front of `end`; returns where they start. The
// base is a constant, so that the divisions become multiplications.
template <uint64_t kBase>
char* WriteDigits(uint64_t magnitude, const char* digits, char* end) {
  do {
    *--end = digits[magnitude % kBase];
    magnitude /= kBase;
  } while (magnitude != 0);
  return end;
}

}  // namespace

void TextBuffer::AppendNumber(int64_t value, int base, bool upperCase) {
  const char* digits = upperCase ? "0123456789ABCDEF" : "0123456789abcdef";
  if (value >= 0 && value < base) return Append(&digits[value], 1);  // flags and small values
  char number[24];
  char* const end = number + sizeof number;
  const uint64_t magnitude =
      value < 0 ? 0 - static_cast<uint64_t>(value) : static_cast<uint64_t>(value);
  char* first = base == 16 ? WriteDigits<16>(magnitude, digits, end)
                           : WriteDigits<10>(magnitude, digits, end);
  if (value < 0) *--first = '-';
  Append(first, static_cast<size_t>(end - first));
}

namespace {

// A name text, with %u standing for the value where it holds one.
void AppendName(const char* text, size_t length, bool hasNumber, uint32_t value, TextBuffer& out) {
  if (hasNumber) {
    out.AppendFormatted(text, value);
  } else {
    out.Append(text, length);
  }
}

// The first entry of the list naming `value`, or null. In an ascending list
// that is the entry at the value's distance from the first one when the
// values run without gaps, else it is found by halving.
const grammar::ValueName* FindValueName(uint16_t names, uint32_t value) {
  const grammar::ValueNames& list = grammar::kValueLists[names];
  const grammar::ValueName* const first = grammar::kValueNames + list.first;
  const grammar::ValueName* const last = first + list.count;
  if (first == last) return nullptr;
  if (!list.ascending) {
    const auto* found =
        std::find_if(first, last, [&](const auto& name) { return name.value == value; });
    return found != last ? found : nullptr;
  }
  const uint32_t distance = value - first->value;
  if (distance < list.count && first[distance].value == value) return &first[distance];
  const auto* found = std::lower_bound(
      first, last, value, [](const auto& name, uint32_t wanted) { return name.value < wanted; });
  return found != last && found->value == value ? found : nullptr;
}

// The first entry of the list naming `value`, else the catch-all, else nothing.
void AppendValueName(uint16_t names, uint32_t value, TextBuffer& out) {
  if (names == grammar::kNoNames) return;
  if (const grammar::ValueName* name = FindValueName(names, value)) {
    return AppendName(name->text, name->length, name->hasNumber, value, out);
  }
  const grammar::ValueNames& list = grammar::kValueLists[names];
  if (list.catchAll != nullptr) {
    AppendName(list.catchAll, std::strlen(list.catchAll), list.catchAllHasNumber, value, out);
  }
}

void AppendBinary(uint32_t value, TextBuffer& out) {
  for (int bit = 31; bit >= 0; --bit) {
    if ((value >> bit) == 0) continue;
    out.Append((value >> bit) & 1 ? "1" : "0", 1);
  }
}

// The four octets of the value, lowest first, up to the first zero octet.
void AppendOctetText(uint32_t value, TextBuffer& out) {
  for (int i = 0; i < 4; ++i) {
    const char c = static_cast<char>((value >> (8 * i)) & 0xff);
    if (c == '\0') return;
    out.Append(&c, 1);
  }
}

void AppendElements(int base, bool upperCase, const char* separator, const FieldRecord& record,
                    TextBuffer& out) {
  for (uint32_t i = 0; i < record.readCount; ++i) {
    out.AppendNumber(record.segments[i].segmentValue, base, upperCase);
    if (i + 1 < record.readCount) out.Append(separator);
  }
}

}  // namespace

void RenderValue(grammar::ValueForm form, uint16_t names, const char* separator,
                 const FieldRecord& record, TextBuffer& out) {
  using grammar::ValueForm;
  const uint32_t value = record.value;
  switch (form) {
    case ValueForm::kUnsigned:
      return out.AppendNumber(value);
    case ValueForm::kSigned:
      return out.AppendNumber(static_cast<int32_t>(value));
    case ValueForm::kHex:
      return out.AppendNumber(value, 16);
    case ValueForm::kBinary:
      return AppendBinary(value, out);
    case ValueForm::kText:
      return AppendOctetText(value, out);
    case ValueForm::kNames:
      return AppendValueName(names, value, out);
    case ValueForm::kNamesAndNumber:
      AppendValueName(names, value, out);
      out.Append(" (", 2);
      out.AppendNumber(value);
      return out.Append(")", 1);
    case ValueForm::kUnsignedOctets:
      out.AppendNumber(value);
      return out.Append(" octets", 7);
    case ValueForm::kElementsUpperHex:
      return AppendElements(16, true, separator, record, out);
    case ValueForm::kElementsLowerHex:
      return AppendElements(16, false, separator, record, out);
    case ValueForm::kElementsDecimal:
      return AppendElements(10, false, separator, record, out);
    case ValueForm::kEmpty:
      return;
  }
}

}  // namespace rnsap
