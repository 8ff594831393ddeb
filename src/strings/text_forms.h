// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <string_view>

#include "platform/unicode.h"
#include "strings/text_utf8.h"

namespace orb {

/// Reads a valid UTF-8 text in one of the Unicode forms, a character at a time. Marks that could
/// change places come together with the character before them; all units of a text, one behind the
/// other, are the whole text's form. Allocates only where marks have to be put in order.
class FormReader {
 public:
  /// `lone`, if not 0, is an unpaired surrogate that follows the text.
  FormReader(std::string_view text, platform::Form form, char16_t lone = 0)
      : text_(text), form_(form), lone_(lone) {}

  /// Where the next character begins.
  std::size_t Position() const { return at_; }
  bool AtEnd() const { return at_ == text_.size(); }
  /// Whether a match may begin or end here: not before a mark, except where the text begins.
  bool AtBoundary() const { return at_ == 0 || AtEnd() || NextStartsSegment(); }

  /// The next units, valid until the next call; none at the end.
  std::u16string_view Next() {
    if (AtEnd()) return NextAtEnd();
    const unsigned lead = ByteAt(text_, at_);
    if (lead >= 0x80) return NextBeyondAscii();
    ++at_;
    units_[0] =
        static_cast<char16_t>(form_ == platform::Form::kDecomposed ? lead : FoldAscii(lead));
    return {units_.data(), 1};
  }

  static constexpr unsigned FoldAscii(unsigned c) { return c - 'A' < 26 ? c | 0x20 : c; }

 private:
  bool NextStartsSegment() const {
    return ByteAt(text_, at_) < 0x80 || platform::FormOf(form_, CharAt(text_, at_)).startsSegment;
  }
  bool NextLeadsWithStarter() const {
    return ByteAt(text_, at_) < 0x80 ||
           platform::FormOf(form_, CharAt(text_, at_)).leadsWithStarter;
  }
  std::u16string_view NextAtEnd();
  std::u16string_view NextBeyondAscii();
  std::u16string_view Gather(std::size_t from);

  std::string_view text_;
  platform::Form form_;
  char16_t lone_;
  std::size_t at_ = 0;
  std::array<char16_t, 3> units_{};
  std::u16string gathered_;
};

/// The whole text in a form.
std::u16string FormOfText(platform::Form form, std::string_view text);

}  // namespace orb
