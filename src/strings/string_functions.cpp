// SPDX-License-Identifier: MIT
// A "%n" in a caller's format must not end the host program, as the checked printf would.
#undef _FORTIFY_SOURCE
#include <orb/strings/string_functions.h>

#include <algorithm>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "platform/transcode.h"
#include "platform/unicode.h"
#include "strings/string_access.h"

namespace {

using orb::StringAccess;
using orb::platform::Utf16FromUtf8;
using orb::platform::Utf8FromUtf16;

/// The UTF-16 text; nothing when it is not valid UTF-8.
std::optional<std::u16string> Units(const COrbStringData& s) {
  return Utf16FromUtf8(StringAccess::Read(s).bytes);
}

std::u16string Readable(const COrbStringData& s) { return Units(s).value_or(std::u16string()); }

COrbStringData Made(std::u16string_view text) {
  return StringAccess::FromUtf8(Utf8FromUtf16(text));
}

bool Starts(const std::u16string& text, std::size_t at) {
  if (at == 0 || at >= text.size()) return true;
  char32_t c = text[at];
  if (c >= 0xDC00 && c < 0xE000) return false;
  if (c >= 0xD800 && c < 0xDC00) c = 0x10000 + ((c - 0xD800) << 10) + (text[at + 1] - 0xDC00U);
  return orb::platform::StartsSegment(c);
}

template <typename Form>
std::size_t FindEquivalent(const std::u16string& text, const std::u16string& find, Form form) {
  if (find.empty()) return std::u16string::npos;
  const std::u16string wanted = form(find);
  for (std::size_t from = 0; from < text.size(); ++from) {
    if (!Starts(text, from)) continue;
    std::u16string seen;
    for (std::size_t to = from; to < text.size() && seen.size() < wanted.size();) {
      const std::size_t piece = to++;
      while (!Starts(text, to)) ++to;
      seen += form(std::u16string_view(text).substr(piece, to - piece));
    }
    if (seen == wanted) return from;
  }
  return std::u16string::npos;
}

COrbStringData TailFrom(const std::u16string& text, std::size_t at) {
  if (at == std::u16string::npos) return {};
  return Made(std::u16string_view(text).substr(at));
}

int Sign(int order) { return order < 0 ? -1 : order > 0 ? 1 : 0; }

template <typename Compare>
int Compared(const COrbStringData& a,
             const COrbStringData& b,
             unsigned long count,
             Compare compare) {
  const std::optional<std::u16string> left = Units(a);
  const std::optional<std::u16string> right = Units(b);
  if (!left || !right) return 0;
  return Sign(compare(std::u16string_view(*left).substr(0, count),
                      std::u16string_view(*right).substr(0, count)));
}

constexpr unsigned long kAll = static_cast<unsigned long>(-1);

int CompareUnits(std::u16string_view a, std::u16string_view b) { return a.compare(b); }

std::string Joined(const COrbStringData& a, const COrbStringData& b) {
  std::string text(StringAccess::Read(a).bytes);
  text += StringAccess::Read(b).bytes;
  return text;
}

COrbStringData Formatted(const char* format, std::va_list arguments) {
  char* text = nullptr;
  if (::vasprintf(&text, format, arguments) < 0) return {};
  COrbStringData result;
  result.InitWithUtf8(text);
  std::free(text);
  return result;
}

std::u16string Utf16FromWide(const wchar_t* text) {
  std::u16string units;
  for (; *text != 0; ++text) {
    const auto c = static_cast<char32_t>(*text);
    if (c < 0x10000) {
      units.push_back(static_cast<char16_t>(c));
    } else {
      units.push_back(static_cast<char16_t>(0xD7C0 + (c >> 10)));
      units.push_back(static_cast<char16_t>(0xDC00 + (c & 0x3FF)));
    }
  }
  return units;
}

constexpr std::size_t kWideLimit = 2048;

}  // namespace

COrbStringData COrbStringData::Mid(unsigned long start, unsigned long count) const {
  if (start >= GetLengthChar() || IsEmpty()) return {};
  return Made(std::u16string_view(Readable(*this)).substr(start, count));
}

COrbStringData COrbStringData::operator+(const COrbStringData& other) const {
  return StringAccess::FromUtf8(Joined(*this, other));
}

COrbStringData& COrbStringData::operator+=(const COrbStringData& other) {
  InitWithUtf8(Joined(*this, other).c_str());
  return *this;
}

COrbStringData OrbStringDataCat(const COrbStringData& a, const COrbStringData& b) {
  return StringAccess::FromUtf8(Joined(a, b));
}

COrbStringData OrbStringDataInc(const COrbStringData& s, unsigned long m) {
  if (s.GetLengthChar() < m) return {};
  return Made(std::u16string_view(Readable(s)).substr(m));
}

COrbStringData OrbStringDataStr(const COrbStringData& s, const COrbStringData& find) {
  const std::u16string text = Readable(s);
  return TailFrom(text, FindEquivalent(text, Readable(find), orb::platform::Decomposed));
}

COrbStringData OrbStringDataStrNoCase(const COrbStringData& s, const COrbStringData& find) {
  const std::u16string text = Readable(s);
  return TailFrom(text, FindEquivalent(text, Readable(find), orb::platform::FoldedDecomposed));
}

COrbStringData OrbStringDataStrReverse(const COrbStringData& s, const COrbStringData& find) {
  const std::u16string text = Readable(s);
  const std::u16string wanted = Readable(find);
  return wanted.empty() ? COrbStringData() : TailFrom(text, text.rfind(wanted));
}

int OrbStringDataCmp(const COrbStringData& a, const COrbStringData& b) {
  return Compared(a, b, kAll, CompareUnits);
}

int OrbStringDataCmpi(const COrbStringData& a, const COrbStringData& b) {
  return Compared(a, b, kAll, orb::platform::CompareFoldedEquivalent);
}

int OrbStringDataCmpn(const COrbStringData& a, const COrbStringData& b, unsigned long n) {
  return Compared(a, b, n, CompareUnits);
}

int OrbStringDataCmpni(const COrbStringData& a, const COrbStringData& b, unsigned long n) {
  return Compared(a, b, n, orb::platform::CompareFolded);
}

COrbStringData OrbStringDataReplace(const COrbStringData& s,
                                    const COrbStringData& find,
                                    const COrbStringData& with) {
  COrbStringData result;
  COrbStringData rest = s;
  for (;;) {
    const COrbStringData tail = OrbStringDataStr(rest, find);
    if (tail.IsEmpty()) return OrbStringDataCat(result, rest);
    const unsigned long before = rest.GetLengthChar() - tail.GetLengthChar();
    result = OrbStringDataCat(OrbStringDataCat(result, rest.Mid(0, before)), with);
    rest = tail.Mid(find.GetLengthChar(), tail.GetLengthChar() - find.GetLengthChar());
  }
}

void OrbStringDataSplit(const COrbStringData& s,
                        const COrbStringData& sep,
                        std::vector<COrbStringData>* out) {
  if (out == nullptr) return;
  std::vector<COrbStringData> pieces;
  COrbStringData rest = s;
  bool found = false;
  for (;;) {
    const COrbStringData tail = OrbStringDataStr(rest, sep);
    if (tail.IsEmpty()) break;
    const COrbStringData piece = rest.Mid(0, rest.GetLengthChar() - tail.GetLengthChar());
    if (!piece.IsEmpty()) pieces.push_back(piece);
    rest = tail.Mid(sep.GetLengthChar(), tail.GetLengthChar() - sep.GetLengthChar());
    found = true;
  }
  if (found && !rest.IsEmpty()) pieces.push_back(rest);
  *out = std::move(pieces);
}

COrbStringData OrbString::Trim(const COrbStringData& s,
                               const COrbStringData& set,
                               bool left,
                               bool right) {
  if (set.IsEmpty() || (!left && !right)) return s;
  const COrbStringData first = set.Mid(0, 1);
  COrbStringData marked = s;
  for (unsigned long i = 1; i < set.GetLengthChar(); ++i) {
    marked = OrbStringDataReplace(marked, set.Mid(i, 1), first);
  }
  std::vector<COrbStringData> pieces;
  OrbStringDataSplit(marked, first, &pieces);
  if (pieces.empty()) {
    const COrbStringData rest = OrbStringDataReplace(marked, first, OrbCharUtf8(""));
    return rest.IsEmpty() ? COrbStringData() : s;
  }
  const unsigned long head = OrbStringDataStr(s, pieces.front()).GetLengthChar();
  const unsigned long back = OrbStringDataStrReverse(s, pieces.back()).GetLengthChar();
  unsigned long count = s.GetLengthChar();
  const unsigned long start = left ? count - head : 0;
  count -= start;
  if (right && pieces.size() == 1) count = count - head + pieces.front().GetLengthChar();
  if (right && pieces.size() != 1) count = count - back + pieces.back().GetLengthChar();
  return s.Mid(start, count);
}

COrbStringData OrbStringDataTrim(const COrbStringData& s, const COrbStringData& set) {
  return OrbString::Trim(s, set, true, true);
}

COrbStringData OrbStringDataTrimLeft(const COrbStringData& s, const COrbStringData& set) {
  return OrbString::Trim(s, set, true, false);
}

COrbStringData OrbStringDataTrimRight(const COrbStringData& s, const COrbStringData& set) {
  return OrbString::Trim(s, set, false, true);
}

COrbStringData OrbStringDataLower(const COrbStringData& s) {
  return Made(orb::platform::Lower(Readable(s)));
}

COrbStringData OrbStringDataUpper(const COrbStringData& s) {
  return Made(orb::platform::Upper(Readable(s)));
}

int OrbStringDataToNumber(const OrbCharPlatform& text) {
  const char* digits = text;
  return digits == nullptr ? 0 : std::atoi(digits);
}

double OrbStringDataToFloat(const OrbCharPlatform& text) {
  const char* digits = text;
  return digits == nullptr ? 0 : std::atof(digits);
}

COrbStringData OrbStringDataFormat(const COrbStringData* format, ...) {
  if (format == nullptr || format->GetPtrSystemEncoding() == nullptr) return {};
  std::va_list arguments;
  va_start(arguments, format);
  COrbStringData result = Formatted(format->GetPtrUtf8(), arguments);
  va_end(arguments);
  return result;
}

COrbStringData OrbStringDataFormat(const OrbCharPlatform* format, ...) {
  if (format == nullptr || static_cast<const char*>(*format) == nullptr) return {};
  std::va_list arguments;
  va_start(arguments, format);
  COrbStringData result = Formatted(*format, arguments);
  va_end(arguments);
  return result;
}

COrbStringData OrbStringDataFormatW(const OrbCharUnicode* format, ...) {
  if (format == nullptr || static_cast<const wchar_t*>(*format) == nullptr) return {};
  const auto buffer = std::make_unique<wchar_t[]>(kWideLimit);
  std::va_list arguments;
  va_start(arguments, format);
  const int length = std::vswprintf(buffer.get(), kWideLimit, *format, arguments);
  va_end(arguments);
  if (length < 0) return {};
  COrbStringData result;
  result.InitWithUnicode(
      reinterpret_cast<const unsigned short*>(Utf16FromWide(buffer.get()).c_str()));
  return result;
}
