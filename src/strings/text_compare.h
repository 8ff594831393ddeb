// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string_view>

/// \file
/// Comparisons of valid UTF-8 texts: -1, 0 or 1 in the order of UTF-16 units.

namespace orb {

/// The beginning of a text. Where it ends inside a surrogate pair, the first half of that pair
/// follows the bytes.
struct TextPrefix {
  std::string_view bytes;
  char16_t lone = 0;
};
TextPrefix PrefixOf(std::string_view text, std::size_t units);

int CompareUnits(const TextPrefix& a, const TextPrefix& b);
/// Full case folding, otherwise unit for unit.
int CompareFolded(const TextPrefix& a, const TextPrefix& b);
/// Full case folding, canonically equivalent texts being equal.
int CompareFoldedEquivalent(std::string_view a, std::string_view b);

}  // namespace orb
