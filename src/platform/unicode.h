// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

/// \file
/// What the library needs to know of Unicode, as ICU tells it. What was asked once is kept in small
/// tables: a page of 256 characters is made by the first thread that needs it, published whole and
/// never changed. Nothing happens before the first question.

namespace orb::platform {

/// The forms in which texts are searched and compared.
enum class Form : std::uint8_t {
  kDecomposed,        ///< Canonical decomposition: canonically equivalent texts become equal.
  kFolded,            ///< Full case folding.
  kFoldedDecomposed,  ///< Both: decomposed, folded and decomposed again.
};
inline constexpr std::size_t kFormCount = 3;

/// One character in one of the forms, and how it behaves beside others.
struct CharForm {
  /// The UTF-16 units; `length` 0 means that there are more than fit, and FormOfRun() tells them.
  std::array<char16_t, 3> units{};
  std::uint8_t length = 0;
  /// No mark, and nothing that attaches to the character before it, as Hangul vowels do.
  bool startsSegment : 1 = false;
  /// Stands for itself alone: no mark, no part of a composition, no other canonical form.
  bool isPlain : 1 = false;
  /// Whether its decomposition begins and ends with a character that marks cannot pass.
  bool leadsWithStarter : 1 = false;
  bool endsWithStarter : 1 = false;
};
static_assert(sizeof(CharForm) == 8);

namespace detail {
using CharPage = std::array<CharForm, 256>;
inline constexpr char32_t kPagedEnd = 0x20000;  // The planes that names are written in.
using CharPages = std::array<std::atomic<const CharPage*>, (kPagedEnd >> 8)>;
extern std::array<CharPages, kFormCount> charPages;
CharForm LookUp(Form form, char32_t c);
}  // namespace detail

inline CharForm FormOf(Form form, char32_t c) {
  if (c >= 0x3400 && c < 0xA000) {  // Han ideographs, which have one form only.
    return {{static_cast<char16_t>(c)}, 1, true, true, true, true};
  }
  if (c < detail::kPagedEnd) {
    const auto& slot = detail::charPages[static_cast<std::size_t>(form)][c >> 8];
    if (const auto* page = slot.load(std::memory_order_acquire)) return (*page)[c & 0xFF];
  }
  return detail::LookUp(form, c);
}

/// A whole text in one of the forms. Marks are put in canonical order in one sort, so a text of
/// nothing but marks costs little more than another.
std::u16string FormOfRun(Form form, std::u16string_view text);

/// The root locale's full case mapping. A text of more than half a billion units stays as it is.
std::u16string Lower(std::u16string_view text);
std::u16string Upper(std::u16string_view text);

}  // namespace orb::platform
