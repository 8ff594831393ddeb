// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string_view>

/// Conversion with the shuffles of SSE4.1, which the library's baseline does not promise. The
/// contracts are those of platform/transcode.h.
namespace orb::platform::sse {

/// Whether this processor can run the other functions here.
bool IsSupported();

std::size_t Utf16FromUtf8(std::string_view text, char16_t* out);
std::size_t Utf8FromUtf16(std::u16string_view text, char* out);

}  // namespace orb::platform::sse
