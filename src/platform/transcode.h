// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace orb::platform {

/// UTF-8 read strictly: nothing for overlong forms, surrogates, values above U+10FFFF and bytes
/// that are no UTF-8.
std::optional<std::u16string> Utf16FromUtf8(std::string_view text);
/// An unpaired surrogate becomes U+FFFD.
std::string Utf8FromUtf16(std::u16string_view text);
/// The length in UTF-16 units; nothing for a text that is not valid UTF-8.
std::optional<std::size_t> Utf16LengthOfUtf8(std::string_view text);

/// Mac OS Roman, the system encoding: all 256 bytes are valid. The text is composed first; a
/// character that the encoding cannot express becomes "?".
std::string Utf8FromMacRoman(std::string_view text);
std::string MacRomanFromUtf16(std::u16string_view text);

}  // namespace orb::platform
