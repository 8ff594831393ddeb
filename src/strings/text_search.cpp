// SPDX-License-Identifier: MIT
#include "strings/text_search.h"

#include <algorithm>
#include <utility>

#include "strings/text_forms.h"

namespace orb {

LiteralSearch::LiteralSearch(std::string_view needle, Case rule) : needle_(needle), rule_(rule) {
  // The last bytes of characters differ more than their first ones, most of all in CJK.
  const std::size_t beforeLast = needle.size() < 2 ? 0 : needle.size() - 2;
  last_ = needle.size() - 1;
  first_ = std::min(CharSize(ByteAt(needle, 0)) - 1, beforeLast);
  for (std::size_t i = 0; i < std::min(needle.size(), kBlock); ++i) {
    head_[i] = Folded(needle[i]);
    headCase_[i] = CaseBit(i);
  }
}

bool LiteralSearch::EqualFrom(std::size_t i, const char* text) const {
  if (rule_ == Case::kExact) return std::memcmp(text + i, &needle_[i], needle_.size() - i) == 0;
  while (i < needle_.size() && Folded(text[i]) == Folded(needle_[i])) ++i;
  return i == needle_.size();
}

bool LiteralSearch::MatchesAt(std::string_view text, std::size_t at) const {
  return EqualFrom(0, text.data() + at);
}

std::size_t LiteralSearch::Find(std::string_view text) const {
  std::size_t found = kNotFound;
  ForEach(text, [&](std::size_t place) {
    found = place;
    return false;
  });
  return found;
}

std::size_t FindLastLiteral(std::string_view text, std::string_view needle) {
  constexpr std::size_t kShort = 16;  // Where looking at each place by itself is cheap.
  if (needle.size() <= kShort) return text.rfind(needle);
  const std::string backwards(needle.rbegin(), needle.rend());
  PatternMatcher<char> matcher{std::string_view(backwards)};
  for (std::size_t at = text.size(); at-- != 0;) {
    if (matcher.Feed(text[at])) return at;
  }
  return kNotFound;
}

EquivalenceSearch::EquivalenceSearch(std::string_view needle, platform::Form form)
    : form_(form), needle_(FormOfText(form, needle)), matcher_(needle_), begins_(needle_.size()) {}

std::size_t EquivalenceSearch::Find(std::string_view text) {
  matcher_.Reset();
  std::size_t slot = 0;  // Of the next unit, and of the one that a match ending before it began at.
  for (FormReader reader(text, form_); !reader.AtEnd();) {
    std::size_t begin = reader.AtBoundary() ? reader.Position() : kNotFound;
    bool ended = false;
    for (const char16_t unit : reader.Next()) {
      begins_[slot] = std::exchange(begin, kNotFound);
      slot = slot + 1 == begins_.size() ? 0 : slot + 1;
      ended = matcher_.Feed(unit);
    }
    if (ended && begins_[slot] != kNotFound && reader.AtBoundary()) return begins_[slot];
  }
  return kNotFound;
}

}  // namespace orb
