// SPDX-License-Identifier: MIT
#include "platform/unicode.h"

#include <unicode/uchar.h>
#include <unicode/unorm.h>
#include <unicode/unorm2.h>
#include <unicode/ustring.h>

#include <cstdint>

namespace orb::platform {
namespace {

std::int32_t Size(std::u16string_view text) { return static_cast<std::int32_t>(text.size()); }

int Sign(std::int32_t order) { return order < 0 ? -1 : order > 0 ? 1 : 0; }

/// Calls `fill(buffer, capacity, status)` again with a larger buffer when the first is too small.
template <typename Fill>
std::u16string Filled(std::size_t guess, Fill fill) {
  std::u16string out(guess, u'\0');
  for (;;) {
    UErrorCode status = U_ZERO_ERROR;
    const std::int32_t length = fill(out.data(), static_cast<std::int32_t>(out.size()), &status);
    if (U_FAILURE(status) && status != U_BUFFER_OVERFLOW_ERROR) return {};
    out.resize(static_cast<std::size_t>(length));
    if (U_SUCCESS(status)) return out;
  }
}

const UNormalizer2* Nfd() {
  UErrorCode status = U_ZERO_ERROR;
  return unorm2_getNFDInstance(&status);
}

const UNormalizer2* Nfc() {
  UErrorCode status = U_ZERO_ERROR;
  return unorm2_getNFCInstance(&status);
}

}  // namespace

bool StartsSegment(char32_t c) {
  const auto point = static_cast<UChar32>(c);
  return unorm2_hasBoundaryBefore(Nfc(), point) && (U_GET_GC_MASK(point) & U_GC_M_MASK) == 0;
}

std::u16string Decomposed(std::u16string_view text) {
  return Filled(text.size() + 16, [&](char16_t* out, std::int32_t capacity, UErrorCode* status) {
    return unorm2_normalize(Nfd(), text.data(), Size(text), out, capacity, status);
  });
}

std::u16string FoldedDecomposed(std::u16string_view text) {
  const std::u16string plain = Decomposed(text);
  return Decomposed(
      Filled(plain.size() + 16, [&](char16_t* out, std::int32_t capacity, UErrorCode* status) {
        return u_strFoldCase(out, capacity, plain.data(), Size(plain), U_FOLD_CASE_DEFAULT, status);
      }));
}

int CompareFolded(std::u16string_view a, std::u16string_view b) {
  UErrorCode status = U_ZERO_ERROR;
  return Sign(u_strCaseCompare(a.data(), Size(a), b.data(), Size(b), U_FOLD_CASE_DEFAULT, &status));
}

int CompareFoldedEquivalent(std::u16string_view a, std::u16string_view b) {
  UErrorCode status = U_ZERO_ERROR;
  return Sign(unorm_compare(
      a.data(), Size(a), b.data(), Size(b), U_COMPARE_IGNORE_CASE | U_FOLD_CASE_DEFAULT, &status));
}

std::u16string Lower(std::u16string_view text) {
  return Filled(text.size() + 16, [&](char16_t* out, std::int32_t capacity, UErrorCode* status) {
    return u_strToLower(out, capacity, text.data(), Size(text), "", status);
  });
}

std::u16string Upper(std::u16string_view text) {
  return Filled(text.size() + 16, [&](char16_t* out, std::int32_t capacity, UErrorCode* status) {
    return u_strToUpper(out, capacity, text.data(), Size(text), "", status);
  });
}

}  // namespace orb::platform
