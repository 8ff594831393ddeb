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
};

TextScan ScanUtf8(std::string_view text);

}  // namespace orb
