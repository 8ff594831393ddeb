// SPDX-License-Identifier: MIT
#pragma once

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "platform/unicode.h"
#include "strings/text_utf8.h"

namespace orb {

inline constexpr std::size_t kNotFound = std::string_view::npos;

/// Finds a pattern in units that are fed to it one by one, in time that no input can make worse
/// than linear (Knuth, Morris, Pratt).
template <typename Unit>
class PatternMatcher {
 public:
  explicit PatternMatcher(std::basic_string_view<Unit> pattern);
  /// True when the units fed so far end with the pattern.
  bool Feed(Unit unit);
  void Reset() { matched_ = 0; }

 private:
  std::basic_string_view<Unit> pattern_;
  std::vector<std::size_t> borders_;  // Of each beginning, the longest border's length.
  std::size_t matched_ = 0;
};

template <typename Unit>
PatternMatcher<Unit>::PatternMatcher(std::basic_string_view<Unit> pattern)
    : pattern_(pattern), borders_(pattern.size() + 1) {
  std::size_t border = 0;
  for (std::size_t i = 1; i < pattern.size(); ++i) {
    while (border != 0 && pattern[i] != pattern[border]) border = borders_[border];
    if (pattern[i] == pattern[border]) ++border;
    borders_[i + 1] = border;
  }
}

template <typename Unit>
bool PatternMatcher<Unit>::Feed(Unit unit) {
  if (matched_ == pattern_.size()) matched_ = borders_[matched_];
  while (matched_ != 0 && pattern_[matched_] != unit) matched_ = borders_[matched_];
  if (pattern_[matched_] == unit) ++matched_;
  return matched_ == pattern_.size();
}

/// Finds one text in others byte for byte, or without regard to the case of ASCII letters. Tests
/// two bytes of it at 16 places in one step, so it runs at the speed of memory where there is
/// nothing to find.
class LiteralSearch {
 public:
  enum class Case { kExact, kAscii };

  /// The needle must not be empty and must live as long as the search.
  explicit LiteralSearch(std::string_view needle, Case rule = Case::kExact);

  /// Calls `onMatch(position)` for each match from left to right, without overlap, until it returns
  /// false.
  template <typename OnMatch>
  void ForEach(std::string_view text, OnMatch&& onMatch) const;
  /// The first match, or kNotFound.
  std::size_t Find(std::string_view text) const;

 private:
  static constexpr std::size_t kBlock = 16;

  unsigned char Folded(char c) const {
    const bool capital = rule_ == Case::kAscii && c >= 'A' && c <= 'Z';
    return static_cast<unsigned char>(capital ? c | 0x20 : c);
  }
  /// The bit that has to be set in a text's byte for both cases of the needle's letter to look
  /// alike.
  unsigned char CaseBit(std::size_t i) const {
    const char lower = static_cast<char>(Folded(needle_[i]));
    return rule_ == Case::kAscii && lower >= 'a' && lower <= 'z' ? 0x20 : 0;
  }
  bool EqualFrom(std::size_t i, const char* text) const;
  bool MatchesAt(std::string_view text, std::size_t at) const;
  template <typename OnMatch>
  void ForEachSlowly(std::string_view text, std::size_t from, OnMatch&& onMatch) const;

  std::string_view needle_;
  Case rule_;
  std::size_t first_;  // The two places in the needle that are tested at once.
  std::size_t last_;
  alignas(kBlock) std::array<unsigned char, kBlock> head_{};
  alignas(kBlock) std::array<unsigned char, kBlock> headCase_{};
};

template <typename OnMatch>
void LiteralSearch::ForEachSlowly(std::string_view text,
                                  std::size_t from,
                                  OnMatch&& onMatch) const {
  std::string folded(needle_);
  for (char& c : folded) c = static_cast<char>(Folded(c));
  PatternMatcher<char> matcher{std::string_view(folded)};
  for (std::size_t at = from; at < text.size(); ++at) {
    if (!matcher.Feed(static_cast<char>(Folded(text[at])))) continue;
    if (!onMatch(at + 1 - needle_.size())) return;
    matcher.Reset();
  }
}

template <typename OnMatch>
void LiteralSearch::ForEach(std::string_view text, OnMatch&& onMatch) const {
  const std::size_t size = needle_.size();
  std::size_t next = 0;  // Nothing before this place is looked at any more.
#ifdef __SSE2__
  const auto load = [](const void* from) {
    return _mm_loadu_si128(static_cast<const __m128i*>(from));
  };
  const auto spread = [](unsigned char byte) { return _mm_set1_epi8(static_cast<char>(byte)); };
  const __m128i firstCase = spread(CaseBit(first_));
  const __m128i lastCase = spread(CaseBit(last_));
  const __m128i first = spread(Folded(needle_[first_]));
  const __m128i last = spread(Folded(needle_[last_]));
  const __m128i head = load(head_.data());
  const __m128i headCase = load(headCase_.data());
  const unsigned headMask = size >= kBlock ? 0xFFFFU : (1U << size) - 1;
  std::size_t wasted = 0;  // Bytes of long needles compared in vain.
  // Two blocks have to be left, so that the 16 bytes at any place of the first can be read.
  for (std::size_t block = 0; text.size() - block >= last_ + 2 * kBlock; block += kBlock) {
    const char* at = text.data() + block;
    const __m128i hits =
        _mm_and_si128(_mm_cmpeq_epi8(_mm_or_si128(load(at + first_), firstCase), first),
                      _mm_cmpeq_epi8(_mm_or_si128(load(at + last_), lastCase), last));
    for (auto mask = static_cast<unsigned>(_mm_movemask_epi8(hits)); mask != 0; mask &= mask - 1) {
      const std::size_t place = block + static_cast<std::size_t>(std::countr_zero(mask));
      if (place < next) continue;
      const __m128i here = _mm_or_si128(load(text.data() + place), headCase);
      const auto equal = static_cast<unsigned>(_mm_movemask_epi8(_mm_cmpeq_epi8(here, head)));
      if ((equal & headMask) != headMask) continue;
      if (size > kBlock && !EqualFrom(kBlock, text.data() + place)) {
        wasted += size;
        if (wasted > 16 * (place + 4096)) return ForEachSlowly(text, place + 1, onMatch);
        continue;
      }
      if (!onMatch(place)) return;
      next = place + size;
    }
    if (next < block + kBlock) next = block + kBlock;
  }
#endif
  if (text.size() < size) return;
  if (text.size() - next > size + 2 * kBlock) return ForEachSlowly(text, next, onMatch);
  while (next <= text.size() - size) {
    if (!MatchesAt(text, next)) {
      ++next;
    } else {
      if (!onMatch(next)) return;
      next += size;
    }
  }
}

/// The last match, byte for byte, or kNotFound.
std::size_t FindLastLiteral(std::string_view text, std::string_view needle);

/// Finds one text in others by canonical equivalence. A match begins and ends where a character and
/// its marks do.
class EquivalenceSearch {
 public:
  /// The needle must not be empty.
  EquivalenceSearch(std::string_view needle, platform::Form form);
  EquivalenceSearch(const EquivalenceSearch&) = delete;
  EquivalenceSearch& operator=(const EquivalenceSearch&) = delete;

  /// The first match, or kNotFound.
  std::size_t Find(std::string_view text);

 private:
  platform::Form form_;
  std::u16string needle_;
  PatternMatcher<char16_t> matcher_;
  std::vector<std::size_t> begins_;  // By unit, modulo the needle's size: the place in the text.
};

}  // namespace orb
