// SPDX-License-Identifier: MIT
#pragma once

#include <orb/strings/string_data.h>

#include <atomic>
#include <cstdint>
#include <string_view>

#include "strings/text_buffer.h"
#include "strings/text_scan.h"
#include "strings/text_utf8.h"

namespace orb {

/// The UTF-8 text of a string and what is known of it. Valid while the string's value lives.
struct Utf8Text {
  std::string_view bytes;
  TextScan scan;

  /// What the operations work on: an invalid text counts as the empty text.
  std::string_view Readable() const {
    return scan.kind == TextKind::kInvalid ? std::string_view() : bytes;
  }
};

/// What the library's own sources may do with a string beyond the interface.
struct StringAccess {
  /// Reads as a pointer accessor does: a string without value gets one without text. The scan is
  /// made once for each value and kept.
  static Utf8Text Read(const COrbStringData& s) {
    if (s.value == nullptr) GiveValue(s);
    // NOLINTNEXTLINE(clang-analyzer-core.NonNullParamChecker): GiveValue() has set it.
    return Read(*s.value);
  }
  static Utf8Text Read(const COrbStringData::COrbStringValue& value) {
    const std::uint8_t known = value.scannedKind.load(std::memory_order_acquire);
    if (known == 0) return Scan(value);
    const char* bytes = value.utf8Text.load(std::memory_order_relaxed);
    const std::string_view text(bytes, TextBuffer::Length(bytes));
    const std::uint32_t length = value.scannedLength.load(std::memory_order_relaxed);
    const auto kind = static_cast<TextKind>(known - 1);
    return {text, {kind, length != kTooLong ? length : CountUnits(text)}};
  }
  /// A new value from bytes that need no terminating zero, with one allocation. They must not hold
  /// a zero byte.
  static COrbStringData FromUtf8(std::string_view text);

 private:
  static void GiveValue(const COrbStringData& s);
  /// Leaves an empty text when there is no memory for the UTF-8 copy.
  static Utf8Text Scan(const COrbStringData::COrbStringValue& value);

  /// Four billion units are not kept but counted each time.
  static constexpr std::uint32_t kTooLong = UINT32_MAX;
};

}  // namespace orb
