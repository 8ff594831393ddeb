// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace orb {

/// How much care a text needs when it is searched or compared.
enum class TextKind : std::uint8_t {
  kAscii,
  /// Every character stands alone and is in composed form, so canonical equivalence is equality.
  kPlain,
  /// Combining marks, or characters with other canonically equivalent forms.
  kComposing,
  /// Not UTF-8: counts as the empty text.
  kInvalid,
};

/// What one pass over a text finds.
struct TextScan {
  TextKind kind = TextKind::kAscii;
  /// In UTF-16 units; 0 for an invalid text.
  std::size_t charLength = 0;

  /// Never 0.
  std::uint64_t Pack() const {
    return std::uint64_t{charLength} << 3 | static_cast<std::uint64_t>(kind) << 1 | 1;
  }
  static TextScan Unpack(std::uint64_t packed) {
    return {static_cast<TextKind>(packed >> 1 & 3), static_cast<std::size_t>(packed >> 3)};
  }
};

TextScan ScanUtf8(std::string_view text);

}  // namespace orb
