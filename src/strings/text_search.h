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
/// two bytes of it at many places in one step, so it runs at the speed of memory where there is
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
  static constexpr std::size_t kStep = 64;  // Places tested at once.
  template <Case kRule>
  class PairTest;

  unsigned char Folded(char c) const {
    const bool capital = rule_ == Case::kAscii && c >= 'A' && c <= 'Z';
    return static_cast<unsigned char>(capital ? c | 0x20 : c);
  }
  template <Case kRule>
  bool MatchesAt(const char* here) const {
    if constexpr (kRule == Case::kAscii) return MatchesFolded(here);
    return std::memcmp(here, needle_.data(), needle_.size()) == 0;
  }
  /// The same for needles of up to eight bytes, where eight bytes can be read: without a call, for
  /// which the loop would have to put away what it has in registers.
  bool MatchesHeadAt(const char* here) const {
    std::uint64_t head;
    std::memcpy(&head, here, sizeof head);
    return (head & headMask_) == head_;
  }
  bool MatchesFolded(const char* text) const;
  /// The bit that both cases of the needle's letter at `i` have, once it is set.
  unsigned char CaseBit(std::size_t i) const {
    const unsigned char lower = Folded(needle_[i]);
    return rule_ == Case::kAscii && lower >= 'a' && lower <= 'z' ? 0x20 : 0;
  }
  template <Case kRule, bool kHasHead, typename OnMatch>
  void ForEachByRule(std::string_view text, OnMatch&& onMatch) const;
  template <typename OnMatch>
  void ForEachSlowly(std::string_view text, std::size_t from, OnMatch&& onMatch) const;

  std::string_view needle_;
  Case rule_;
  std::size_t first_;  // The two places in the needle that are tested at once.
  std::size_t last_;
  std::uint64_t head_ = 0;  // A needle of up to eight bytes as a number, and its bits.
  std::uint64_t headMask_ = 0;
};

#ifdef __SSE2__
/// Looks for two bytes of the needle at 64 places at once.
template <LiteralSearch::Case kRule>
class LiteralSearch::PairTest {
 public:
  explicit PairTest(const LiteralSearch& search)
      : firstAt_(search.first_),
        lastAt_(search.last_),
        first_(Spread(search.Folded(search.needle_[firstAt_]))),
        last_(Spread(search.Folded(search.needle_[lastAt_]))),
        firstCase_(Spread(search.CaseBit(firstAt_))),
        lastCase_(Spread(search.CaseBit(lastAt_))) {}

  std::uint64_t Hits(const char* at) const {
    return Hits16(at) | Hits16(at + 16) << 16 | Hits16(at + 32) << 32 | Hits16(at + 48) << 48;
  }

 private:
  static __m128i Spread(unsigned char byte) { return _mm_set1_epi8(static_cast<char>(byte)); }
  static __m128i Load(const char* at) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(at));
  }
  std::uint64_t Hits16(const char* at) const {
    __m128i first = Load(at + firstAt_);
    __m128i last = Load(at + lastAt_);
    if constexpr (kRule == Case::kAscii) {
      first = _mm_or_si128(first, firstCase_);
      last = _mm_or_si128(last, lastCase_);
    }
    return static_cast<std::uint32_t>(_mm_movemask_epi8(
        _mm_and_si128(_mm_cmpeq_epi8(first, first_), _mm_cmpeq_epi8(last, last_))));
  }

  std::size_t firstAt_;
  std::size_t lastAt_;
  __m128i first_;
  __m128i last_;
  __m128i firstCase_;
  __m128i lastCase_;
};
#endif

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
  if (rule_ == Case::kAscii) {
    ForEachByRule<Case::kAscii, false>(text, onMatch);
  } else if (needle_.size() <= sizeof(head_)) {
    ForEachByRule<Case::kExact, true>(text, onMatch);
  } else {
    ForEachByRule<Case::kExact, false>(text, onMatch);
  }
}

template <LiteralSearch::Case kRule, bool kHasHead, typename OnMatch>
void LiteralSearch::ForEachByRule(std::string_view text, OnMatch&& onMatch) const {
  const std::size_t size = needle_.size();
  std::size_t next = 0;  // Nothing before this place is looked at any more.
  if (text.size() < size) return;
#ifdef __SSE2__
  const PairTest<kRule> test(*this);
  const char* const data = text.data();
  std::size_t wasted = 0;  // Bytes of long needles compared in vain.
  // Of the places where a match can be tested; the few behind it are looked at by themselves.
  const std::size_t behind = kHasHead ? sizeof(head_) - 1 : last_;
  const std::size_t end = text.size() > behind ? text.size() - behind : 0;
  for (std::size_t block = 0; end >= kStep && next < end; block += kStep) {
    if (block + kStep > end) block = end - kStep;  // The last step looks at some places again.
    for (std::uint64_t hits = test.Hits(data + block); hits != 0; hits &= hits - 1) {
      const std::size_t place = block + static_cast<std::size_t>(std::countr_zero(hits));
      if (place < next) continue;
      const bool matches = kHasHead ? MatchesHeadAt(data + place) : MatchesAt<kRule>(data + place);
      if (!matches) {
        wasted += size;
        if (wasted > 16 * (place + 4096)) return ForEachSlowly(text, place + 1, onMatch);
        continue;
      }
      if (!onMatch(place)) return;
      next = place + size;
    }
    if (next < block + kStep) next = block + kStep;
  }
#endif
  if (text.size() - next > size + kStep + sizeof(head_)) return ForEachSlowly(text, next, onMatch);
  while (next + size <= text.size()) {
    if (!MatchesAt<kRule>(text.data() + next)) {
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
  ~EquivalenceSearch() = default;
  EquivalenceSearch(const EquivalenceSearch&) = delete;
  EquivalenceSearch& operator=(const EquivalenceSearch&) = delete;

  /// The first match, or kNotFound.
  std::size_t Find(std::string_view text);

 private:
  std::size_t FindAscii(std::string_view text) const;

  platform::Form form_;
  char ascii_;  // A needle of one ASCII character that nothing else is equivalent to, or 0.
  std::u16string needle_;
  PatternMatcher<char16_t> matcher_;
  std::vector<std::size_t> begins_;  // By unit, modulo the needle's size: the place in the text.
};

}  // namespace orb
