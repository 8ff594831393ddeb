// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

/// \file
/// What the library needs to know of Unicode, as ICU tells it.

namespace orb::platform {

/// Whether a combining mark or a Hangul vowel or final can never attach this character to the one
/// before it.
bool StartsSegment(char32_t c);

/// Canonical decomposition, and the full case folding of it.
std::u16string Decomposed(std::u16string_view text);
std::u16string FoldedDecomposed(std::u16string_view text);

/// -1, 0 or 1 in the order of the UTF-16 units: after full case folding, and after folding with
/// canonically equivalent texts equal.
int CompareFolded(std::u16string_view a, std::u16string_view b);
int CompareFoldedEquivalent(std::u16string_view a, std::u16string_view b);

/// The root locale's full case mapping.
std::u16string Lower(std::u16string_view text);
std::u16string Upper(std::u16string_view text);

}  // namespace orb::platform
