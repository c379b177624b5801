#include "passes/field_text.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace rnsap {

void TextBuffer::Append(const char* text) { Append(text, std::strlen(text)); }

void TextBuffer::Append(const char* text, size_t length) {
  const size_t room = size_ - 1 - length_;
  const size_t n = std::min(length, room);
  std::memcpy(data_ + length_, text, n);
  length_ += n;
  data_[length_] = '\0';
}

void TextBuffer::AppendFormatted(const char* format, uint32_t value) {
  char number[64];
  const int n = std::snprintf(number, sizeof number, format, value);
  if (n > 0) Append(number, std::min(static_cast<size_t>(n), sizeof number - 1));
}

void TextBuffer::AppendNumber(int64_t value, int base, bool upperCase) {
  const char* digits = upperCase ? "0123456789ABCDEF" : "0123456789abcdef";
  char number[24];
  char* first = number + sizeof number;
  uint64_t magnitude = value < 0 ? 0 - static_cast<uint64_t>(value) : static_cast<uint64_t>(value);
  do {
    *--first = digits[magnitude % static_cast<uint64_t>(base)];
    magnitude /= static_cast<uint64_t>(base);
  } while (magnitude != 0);
  if (value < 0) *--first = '-';
  Append(first, static_cast<size_t>(number + sizeof number - first));
}

namespace {

// A name text, with %u standing for the value where it holds one.
void AppendName(const char* text, bool hasNumber, uint32_t value, TextBuffer& out) {
  if (hasNumber) {
    out.AppendFormatted(text, value);
  } else {
    out.Append(text);
  }
}

// The first entry of the list naming `value`, else the catch-all, else nothing.
void AppendValueName(uint16_t names, uint32_t value, TextBuffer& out) {
  if (names == grammar::kNoNames) return;
  const grammar::ValueNames& list = grammar::kValueLists[names];
  for (uint32_t i = 0; i < list.count; ++i) {
    const grammar::ValueName& name = grammar::kValueNames[list.first + i];
    if (name.value == value) return AppendName(name.text, name.hasNumber, value, out);
  }
  if (list.catchAll != nullptr) AppendName(list.catchAll, list.catchAllHasNumber, value, out);
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
