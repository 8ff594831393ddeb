// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string_view>

/// \file
/// Steps through texts that are known to be valid UTF-8.

namespace orb {

inline unsigned ByteAt(std::string_view text, std::size_t at) {
  return static_cast<unsigned char>(text[at]);
}

/// How many bytes the character has that begins with this byte.
inline std::size_t CharSize(unsigned lead) {
  return lead < 0x80 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
}

/// Characters of four bytes are two UTF-16 units, all others one.
inline std::size_t CharUnits(unsigned lead) { return lead < 0xF0 ? 1 : 2; }

inline char32_t CharAt(std::string_view text, std::size_t at) {
  const auto more = [&](std::size_t i) -> char32_t { return ByteAt(text, at + i) & 0x3FU; };
  const char32_t lead = ByteAt(text, at);
  if (lead < 0x80) return lead;
  if (lead < 0xE0) return (lead & 0x1F) << 6 | more(1);
  if (lead < 0xF0) return (lead & 0x0F) << 12 | more(1) << 6 | more(2);
  return (lead & 0x07) << 18 | more(1) << 12 | more(2) << 6 | more(3);
}

inline char16_t LeadUnit(char32_t c) {
  return static_cast<char16_t>(c < 0x10000 ? c : 0xD7C0 + (c >> 10));
}
inline char16_t TrailUnit(char32_t c) { return static_cast<char16_t>(0xDC00 + (c & 0x3FF)); }

/// U+FFFD, which stands for half a surrogate pair.
inline constexpr std::string_view kReplacement = "\xEF\xBF\xBD";

/// A place in a text, counted in UTF-16 units.
struct UnitPlace {
  /// The first byte of the character there; the text's size at and beyond its end.
  std::size_t at = 0;
  /// The place is in the middle of that character's surrogate pair.
  bool insidePair = false;
};

UnitPlace PlaceOfUnit(std::string_view text, std::size_t unit, std::size_t from = 0);

std::size_t CountUnits(std::string_view text);

}  // namespace orb
