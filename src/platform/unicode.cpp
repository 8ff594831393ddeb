// SPDX-License-Identifier: MIT
#include "platform/unicode.h"

#include <unicode/utf16.h>

#include <algorithm>
#include <limits>
#include <memory>
#include <vector>

#include "platform/icu.h"

namespace orb::platform {
namespace {

using detail::CharPage;

std::int32_t Size(std::u16string_view text) { return static_cast<std::int32_t>(text.size()); }

const UNormalizer2* Nfd() {
  UErrorCode status = U_ZERO_ERROR;
  return Icu().unorm2_getNFDInstance(&status);
}

const UNormalizer2* Nfc() {
  UErrorCode status = U_ZERO_ERROR;
  return Icu().unorm2_getNFCInstance(&status);
}

UChar32 Point(char32_t c) { return static_cast<UChar32>(c); }

void Append(std::u16string& out, char32_t c) {
  if (c < 0x10000) {
    out.push_back(static_cast<char16_t>(c));
  } else {
    out.push_back(U16_LEAD(c));
    out.push_back(U16_TRAIL(c));
  }
}

void AppendDecomposed(std::u16string& out, char32_t c) {
  constexpr std::int32_t kLongest = 32;
  std::array<char16_t, kLongest> units;
  UErrorCode status = U_ZERO_ERROR;
  const std::int32_t length =
      Icu().unorm2_getDecomposition(Nfd(), Point(c), units.data(), kLongest, &status);
  if (length < 0 || U_FAILURE(status)) return Append(out, c);
  out.append(units.data(), static_cast<std::size_t>(length));
}

/// Reads one character; an unpaired surrogate is read as itself.
char32_t ReadUtf16(std::u16string_view text, std::size_t& at) {
  const char32_t unit = text[at++];
  if (!U16_IS_LEAD(unit) || at == text.size() || !U16_IS_TRAIL(text[at])) return unit;
  return static_cast<char32_t>(U16_GET_SUPPLEMENTARY(unit, text[at++]));
}

void AppendFolded(std::u16string& out, char32_t c) {
  constexpr std::int32_t kLongest = 8;
  std::array<char16_t, kLongest> units;
  std::u16string self;
  Append(self, c);
  UErrorCode status = U_ZERO_ERROR;
  const std::int32_t length = Icu().u_strFoldCase(
      units.data(), kLongest, self.data(), Size(self), U_FOLD_CASE_DEFAULT, &status);
  if (U_FAILURE(status)) return Append(out, c);
  out.append(units.data(), static_cast<std::size_t>(length));
}

std::u16string Folded(std::u16string_view text) {
  std::u16string out;
  out.reserve(text.size());
  for (std::size_t at = 0; at < text.size();) AppendFolded(out, ReadUtf16(text, at));
  return out;
}

std::uint8_t CombiningClass(char32_t c) { return Icu().u_getCombiningClass(Point(c)); }

std::u16string DecomposedInOrder(std::u16string_view text) {
  std::u16string units;
  for (std::size_t at = 0; at < text.size();) AppendDecomposed(units, ReadUtf16(text, at));
  struct Mark {
    char32_t c;
    std::uint8_t combiningClass;
  };
  std::vector<Mark> marks;
  std::u16string out;
  out.reserve(units.size());
  const auto putMarks = [&] {
    std::stable_sort(marks.begin(), marks.end(), [](const Mark& a, const Mark& b) {
      return a.combiningClass < b.combiningClass;
    });
    for (const Mark& mark : marks) Append(out, mark.c);
    marks.clear();
  };
  for (std::size_t at = 0; at < units.size();) {
    const char32_t c = ReadUtf16(units, at);
    const std::uint8_t combiningClass = CombiningClass(c);
    if (combiningClass != 0) {
      marks.push_back({c, combiningClass});
    } else {
      putMarks();
      Append(out, c);
    }
  }
  putMarks();
  return out;
}

bool IsMark(char32_t c) { return (U_MASK(Icu().u_charType(Point(c))) & U_GC_M_MASK) != 0; }

bool IsComposed(char32_t c) {
  return Icu().u_getIntPropertyValue(Point(c), UCHAR_NFC_QUICK_CHECK) == UNORM_YES;
}

CharForm Made(Form form, char32_t c) {
  std::u16string self;
  Append(self, c);
  const std::u16string units = FormOfRun(form, self);
  CharForm made;
  if (units.size() <= made.units.size()) {
    std::copy(units.begin(), units.end(), made.units.begin());
    made.length = static_cast<std::uint8_t>(units.size());
  }
  made.startsSegment = Icu().unorm2_hasBoundaryBefore(Nfc(), Point(c)) && !IsMark(c);
  made.isPlain = made.startsSegment && IsComposed(c);
  made.leadsWithStarter =
      Icu().u_getIntPropertyValue(Point(c), UCHAR_LEAD_CANONICAL_COMBINING_CLASS) == 0;
  made.endsWithStarter =
      Icu().u_getIntPropertyValue(Point(c), UCHAR_TRAIL_CANONICAL_COMBINING_CLASS) == 0;
  return made;
}

/// ICU counts in 32 bits, and mapping may triple a text.
constexpr std::size_t kMostUnits = std::numeric_limits<std::int32_t>::max() / 4;

std::u16string Mapped(std::u16string_view text, decltype(IcuFunctions::u_strToLower) map) {
  std::u16string out(text);
  if (text.empty() || text.size() > kMostUnits) return out;
  for (;;) {
    UErrorCode status = U_ZERO_ERROR;
    const std::int32_t length = map(out.data(), Size(out), text.data(), Size(text), "", &status);
    if (U_FAILURE(status) && status != U_BUFFER_OVERFLOW_ERROR) return std::u16string(text);
    out.resize(static_cast<std::size_t>(length));
    if (U_SUCCESS(status)) return out;
  }
}

}  // namespace

namespace detail {

constinit std::array<CharPages, kFormCount> charPages{};

CharForm LookUp(Form form, char32_t c) {
  if (c >= kPagedEnd || !IsIcuLoaded()) return Made(form, c);
  auto page = std::make_unique<CharPage>();
  const char32_t first = c & ~char32_t{0xFF};
  for (char32_t i = 0; i < page->size(); ++i) (*page)[i] = Made(form, first + i);
  const CharForm found = (*page)[c & 0xFF];
  const CharPage* none = nullptr;
  auto& slot = charPages[static_cast<std::size_t>(form)][c >> 8];
  if (slot.compare_exchange_strong(none, page.get(), std::memory_order_acq_rel)) {
    (void)page.release();  // Kept until the process ends; others may be reading it.
  }
  return found;
}

}  // namespace detail

std::u16string FormOfRun(Form form, std::u16string_view text) {
  if (form == Form::kFolded) return Folded(text);
  std::u16string decomposed = DecomposedInOrder(text);
  if (form == Form::kDecomposed) return decomposed;
  return DecomposedInOrder(Folded(decomposed));
}

std::u16string Lower(std::u16string_view text) { return Mapped(text, Icu().u_strToLower); }

std::u16string Upper(std::u16string_view text) { return Mapped(text, Icu().u_strToUpper); }

}  // namespace orb::platform
