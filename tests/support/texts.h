// SPDX-License-Identifier: MIT
#pragma once

#include <orb/strings/string_data.h>

#include <ostream>
#include <string>

/// A string of UTF-8, and back.
inline COrbStringData S(const std::string& utf8) {
  return COrbStringData(OrbCharUtf8(utf8.c_str()));
}

inline std::string Text(const COrbStringData& text) { return text.GetPtrUtf8(); }

/// Without value, as distinct from the empty text.
inline bool HasNoValue(const COrbStringData& text) {
  return !text.HasValueSystemEncoding() && !text.HasValueUtf8() && !text.HasValueUnicode();
}
