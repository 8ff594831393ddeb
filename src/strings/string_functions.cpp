// SPDX-License-Identifier: MIT
#include <orb/strings/string_functions.h>

#include <algorithm>
#include <string>
#include <string_view>
#include <utility>

#include "platform/transcode.h"
#include "platform/unicode.h"
#include "strings/string_access.h"
#include "strings/text_compare.h"
#include "strings/text_edit.h"
#include "strings/text_search.h"
#include "strings/text_utf8.h"

namespace {

using orb::StringAccess;
using orb::TextKind;
using orb::Utf8Text;

bool IsValid(const Utf8Text& text) { return text.scan.kind != TextKind::kInvalid; }

COrbStringData TailFrom(const Utf8Text& text, std::size_t at) {
  if (at == orb::kNotFound) return {};
  return StringAccess::FromUtf8(text.bytes.substr(at));
}

std::string_view Utf8Of(const COrbStringData& s) {
  // Reading comes first: it gives a string without value one, whose length can then be asked. There
  // may be memory for the copy only when it is asked for again.
  const char* text = s.GetPtrUtf8();
  return text == nullptr ? std::string_view() : std::string_view(text, s.GetLengthByteUtf8());
}

COrbStringData Joined(const COrbStringData& a, const COrbStringData& b) {
  const std::string_view first = Utf8Of(a);
  return StringAccess::FromUtf8(first, Utf8Of(b));
}

/// Reads `s`, through `copy` where that would give a string without value one.
Utf8Text ReadOnly(const COrbStringData& s, COrbStringData& copy) {
  if (s.HasValueUtf8()) return StringAccess::Read(s);
  copy = s;
  return StringAccess::Read(copy);
}

/// The `count` units from unit `start`.
COrbStringData Cut(const COrbStringData& s, std::size_t start, std::size_t count) {
  const Utf8Text text = StringAccess::Read(s);
  if (text.scan.kind == TextKind::kAscii) {
    // Without memory for the UTF-8 copy there is less of it than the string's length says.
    start = std::min(start, text.bytes.size());
    return StringAccess::FromUtf8(text.bytes.substr(start, count));
  }
  const std::string_view readable = text.Readable();
  const orb::UnitPlace from = orb::PlaceOfUnit(readable, start);
  const orb::UnitPlace to = orb::PlaceOfUnit(readable, count, from.at);
  if (from.insidePair || to.insidePair) {
    return StringAccess::FromUtf8(orb::Middle(readable, start, count));
  }
  return StringAccess::FromUtf8(readable.substr(from.at, to.at - from.at));
}

/// Calls `compare(a, b)` on the two texts; 0 when either is not UTF-8.
template <typename Compare>
int Compared(const COrbStringData& a, const COrbStringData& b, Compare compare) {
  StringAccess::Prefetch(a);
  StringAccess::Prefetch(b);
  const Utf8Text left = StringAccess::Read(a);
  const Utf8Text right = StringAccess::Read(b);
  return IsValid(left) && IsValid(right) ? compare(left.bytes, right.bytes) : 0;
}

/// A piece of text that becomes a string where it is put, without a move in between.
struct Piece {
  std::string_view text;
  operator COrbStringData() const { return StringAccess::FromUtf8(text); }
};

COrbStringData Mapped(const COrbStringData& s,
                      char first,
                      char last,
                      std::u16string (*map)(std::u16string_view)) {
  const Utf8Text text = StringAccess::Read(s);
  if (text.scan.kind != TextKind::kAscii) {
    const std::u16string units = orb::platform::Utf16FromUtf8(text.bytes).value_or(u"");
    return StringAccess::FromUtf8(orb::platform::Utf8FromUtf16(map(units)));
  }
  std::string mapped(text.bytes);
  for (char& c : mapped) {
    if (c >= first && c <= last) c = static_cast<char>(c ^ 0x20);
  }
  return StringAccess::FromUtf8(mapped);
}

}  // namespace

COrbStringData COrbStringData::Mid(unsigned long start, unsigned long count) const {
  if (start >= GetLengthChar() || IsEmpty()) return {};
  return Cut(*this, start, count);
}

COrbStringData COrbStringData::operator+(const COrbStringData& other) const {
  return Joined(*this, other);
}

COrbStringData& COrbStringData::operator+=(const COrbStringData& other) {
  return *this = Joined(*this, other);
}

COrbStringData OrbStringDataCat(const COrbStringData& a, const COrbStringData& b) {
  return Joined(a, b);
}

COrbStringData OrbStringDataInc(const COrbStringData& s, unsigned long m) {
  const unsigned long length = s.GetLengthChar();
  if (length < m) return {};
  return Cut(s, m, length - m);
}

COrbStringData OrbStringDataStr(const COrbStringData& s, const COrbStringData& find) {
  const Utf8Text text = StringAccess::Read(s);
  return TailFrom(text, orb::FindEquivalent(text, StringAccess::Read(find)));
}

COrbStringData OrbStringDataStrNoCase(const COrbStringData& s, const COrbStringData& find) {
  const Utf8Text text = StringAccess::Read(s);
  return TailFrom(text, orb::FindFolded(text, StringAccess::Read(find)));
}

COrbStringData OrbStringDataStrReverse(const COrbStringData& s, const COrbStringData& find) {
  const Utf8Text text = StringAccess::Read(s);
  const std::string_view wanted = StringAccess::Read(find).Readable();
  if (wanted.empty()) return {};
  return TailFrom(text, orb::FindLastLiteral(text.Readable(), wanted));
}

int OrbStringDataCmp(const COrbStringData& a, const COrbStringData& b) {
  return Compared(
      a, b, [](std::string_view x, std::string_view y) { return orb::CompareUnits({x}, {y}); });
}

int OrbStringDataCmpi(const COrbStringData& a, const COrbStringData& b) {
  return Compared(a, b, orb::CompareFoldedEquivalent);
}

int OrbStringDataCmpn(const COrbStringData& a, const COrbStringData& b, unsigned long n) {
  return Compared(a, b, [n](std::string_view x, std::string_view y) {
    return orb::CompareUnits(orb::PrefixOf(x, n), orb::PrefixOf(y, n));
  });
}

int OrbStringDataCmpni(const COrbStringData& a, const COrbStringData& b, unsigned long n) {
  return Compared(a, b, [n](std::string_view x, std::string_view y) {
    return orb::CompareFolded(orb::PrefixOf(x, n), orb::PrefixOf(y, n));
  });
}

COrbStringData OrbStringDataReplace(const COrbStringData& s,
                                    const COrbStringData& find,
                                    const COrbStringData& with) {
  COrbStringData copy;
  const Utf8Text text = ReadOnly(s, copy);
  const Utf8Text wanted = StringAccess::Read(find);
  if (orb::FindEquivalent(text, wanted) == orb::kNotFound) {
    return StringAccess::FromUtf8(text.bytes);
  }
  const orb::Replaced replaced(text, wanted, StringAccess::Read(with).bytes);
  return StringAccess::FromUtf8(replaced.View());
}

void OrbStringDataSplit(const COrbStringData& s,
                        const COrbStringData& sep,
                        std::vector<COrbStringData>* out) {
  if (out == nullptr) return;
  COrbStringData copy;
  const orb::Pieces pieces(ReadOnly(s, copy), StringAccess::Read(sep));
  std::vector<COrbStringData> made;  // Either string may be in the list that is to be emptied.
  made.reserve(pieces.Views().size());
  for (const std::string_view piece : pieces.Views()) made.emplace_back(Piece{piece});
  *out = std::move(made);
}

COrbStringData OrbString::Trim(const COrbStringData& s,
                               const COrbStringData& set,
                               bool left,
                               bool right) {
  if (set.IsEmpty() || (!left && !right)) return s;
  COrbStringData copy;
  const orb::Trimmed trimmed = orb::Trim(ReadOnly(s, copy), StringAccess::Read(set), left, right);
  if (trimmed.extent == orb::Trimming::kNothing) return s;
  return trimmed.text ? StringAccess::FromUtf8(*trimmed.text) : COrbStringData();
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
  return Mapped(s, 'A', 'Z', orb::platform::Lower);
}

COrbStringData OrbStringDataUpper(const COrbStringData& s) {
  return Mapped(s, 'a', 'z', orb::platform::Upper);
}
