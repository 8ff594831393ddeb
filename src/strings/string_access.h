// SPDX-License-Identifier: MIT
#pragma once

#include <orb/strings/string_data.h>

#include <atomic>
#include <cstdint>
#include <string_view>

#include "strings/text_scan.h"

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
    if (value.scan.load(std::memory_order_relaxed) == 0) Scan(value);
    const TextScan scan = TextScan::Unpack(value.scan.load(std::memory_order_acquire));
    return {{value.utf8Text.load(std::memory_order_relaxed), value.utf8Length}, scan};
  }
  /// A new value from bytes that need no terminating zero, with one allocation. They must not hold
  /// a zero byte.
  static COrbStringData FromUtf8(std::string_view text);

 private:
  static void GiveValue(const COrbStringData& s);
  /// Leaves an empty text when there is no memory for the UTF-8 copy.
  static void Scan(const COrbStringData::COrbStringValue& value);
};

}  // namespace orb
