// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace orb::platform {

/// What the writing forms may overwrite behind their result: they store in whole blocks.
inline constexpr std::size_t kSlack = 32;
inline constexpr std::size_t kNotUtf8 = SIZE_MAX;

/// UTF-8 read strictly: no overlong forms, surrogates, values above U+10FFFF and bytes that are no
/// UTF-8. Writes the units, without terminator, and returns their number; kNotUtf8 when the text is
/// not valid, with the content of `out` open. `out` needs room for text.size() + kSlack units.
std::size_t Utf16FromUtf8(std::string_view text, char16_t* out);
/// The number of units that a text has if it is valid; one that is not has some number.
std::size_t Utf16LengthOfValid(std::string_view text);
/// An unpaired surrogate becomes U+FFFD. Writes the bytes, without terminator, and returns their
/// number. `out` needs room for 3 * text.size() + kSlack bytes.
std::size_t Utf8FromUtf16(std::u16string_view text, char* out);

bool IsAscii(std::string_view text);
bool IsAscii(std::u16string_view text);

/// Convert the ASCII that a text begins with and return how much that is. They write no more than
/// as many as the text has.
std::size_t Utf16FromAscii(std::string_view text, char16_t* out);
std::size_t AsciiFromUtf16(std::u16string_view text, char* out);

/// The number of units before the terminating zero.
std::size_t Utf16Length(const unsigned short* text);

/// Nothing for a text that is not valid UTF-8.
std::optional<std::u16string> Utf16FromUtf8(std::string_view text);
std::string Utf8FromUtf16(std::u16string_view text);
/// The length in UTF-16 units; nothing for a text that is not valid UTF-8.
std::optional<std::size_t> Utf16LengthOfUtf8(std::string_view text);

/// Mac OS Roman, the system encoding: all 256 bytes are valid. `out` needs room for three bytes for
/// each of the text.
std::size_t Utf8FromMacRoman(std::string_view text, char* out);
std::string Utf8FromMacRoman(std::string_view text);

struct MacRomanText {
  std::string bytes;
  /// Whether each character could be expressed.
  bool isExact = true;
};

/// The text is composed first; a character that the encoding cannot express becomes "?".
MacRomanText MacRomanFromUtf16(std::u16string_view text);

/// The same without any instruction beyond the language. They need no slack.
namespace portable {

std::size_t Utf16FromUtf8(std::string_view text, char16_t* out);
std::size_t Utf16LengthOfValid(std::string_view text);
std::size_t Utf8FromUtf16(std::u16string_view text, char* out);
std::size_t Utf16FromAscii(std::string_view text, char16_t* out);
std::size_t AsciiFromUtf16(std::u16string_view text, char* out);

}  // namespace portable
}  // namespace orb::platform
