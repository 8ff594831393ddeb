// SPDX-License-Identifier: MIT
#pragma once

#include <unicode/unorm2.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>

#include <cstdint>
#include <string>

/// \file
/// What Unicode means by ICU's own functions.

namespace orb::test {

inline std::int32_t Size(const std::u16string& text) {
  return static_cast<std::int32_t>(text.size());
}

inline std::u16string UnitsOf(char32_t c) {
  if (c < 0x10000) return {static_cast<char16_t>(c)};
  return {static_cast<char16_t>(U16_LEAD(c)), static_cast<char16_t>(U16_TRAIL(c))};
}

inline std::u16string IcuNormalised(const UNormalizer2* form, const std::u16string& text) {
  UErrorCode status = U_ZERO_ERROR;
  std::u16string out(text.size() * 18 + 1, u'\0');
  const auto length =
      unorm2_normalize(form, text.data(), Size(text), out.data(), Size(out), &status);
  return out.substr(0, static_cast<std::size_t>(length));
}

inline std::u16string IcuFolded(const std::u16string& text) {
  UErrorCode status = U_ZERO_ERROR;
  std::u16string out(text.size() * 3 + 1, u'\0');
  const auto length =
      u_strFoldCase(out.data(), Size(out), text.data(), Size(text), U_FOLD_CASE_DEFAULT, &status);
  return out.substr(0, static_cast<std::size_t>(length));
}

}  // namespace orb::test
