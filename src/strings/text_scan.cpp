// SPDX-License-Identifier: MIT
#include "strings/text_scan.h"

#include <optional>

#include "platform/transcode.h"

namespace orb {

TextScan ScanUtf8(std::string_view text) {
  const std::optional<std::size_t> length = platform::Utf16LengthOfUtf8(text);
  if (!length) return {TextKind::kInvalid, 0};
  return {*length == text.size() ? TextKind::kAscii : TextKind::kComposing, *length};
}

}  // namespace orb
