// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string_view>

/// The parts of the conversions that take long texts in whole groups, with the wide registers of
/// AVX2. Whoever calls them goes on where they stop.
namespace orb::platform::avx {

/// Whether this processor can run the other functions here.
bool IsSupported();

/// How much a group holds, in bytes of UTF-8 or in units of UTF-16.
inline constexpr std::size_t kGroup = 64;

/// Convert as many whole groups of ASCII as the text begins with, and return how much that is.
std::size_t Utf16FromAscii(std::string_view text, char16_t* out);
std::size_t AsciiFromUtf16(std::u16string_view text, char* out);

/// The number of units in the whole groups of a valid text.
std::size_t Utf16LengthOfGroups(std::string_view text);

/// The first group of units that holds a zero. `units` lie at a multiple of a group's size.
const unsigned short* GroupWithZero(const unsigned short* units);

}  // namespace orb::platform::avx
