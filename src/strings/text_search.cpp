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
  const std::size_t size = std::min(needle.size(), sizeof(head_));
  std::memcpy(&head_, needle.data(), size);
  std::memset(&headMask_, 0xFF, size);
}

bool LiteralSearch::MatchesFolded(const char* text) const {
  return std::equal(
      needle_.begin(), needle_.end(), text, [&](char a, char b) { return Folded(a) == Folded(b); });
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

namespace {

/// The Kelvin sign, the Greek question mark and the Greek varia are other ways to write these.
constexpr std::string_view kWrittenOtherwise = "K;`";

char LoneAscii(std::string_view needle, platform::Form form) {
  if (form != platform::Form::kDecomposed || needle.size() != 1) return '\0';
  return kWrittenOtherwise.find(needle[0]) == std::string_view::npos ? needle[0] : '\0';
}

}  // namespace

EquivalenceSearch::EquivalenceSearch(std::string_view needle, platform::Form form)
    : form_(form),
      ascii_(LoneAscii(needle, form)),
      needle_(FormOfText(form, needle)),
      matcher_(needle_),
      begins_(needle_.size()) {}

/// Only a mark behind it can keep the character from being a match.
std::size_t EquivalenceSearch::FindAscii(std::string_view text) const {
  for (std::size_t at = 0; (at = text.find(ascii_, at)) != kNotFound; ++at) {
    const std::string_view behind = text.substr(at + 1);
    if (behind.empty() || ByteAt(behind, 0) < 0x80) return at;
    if (platform::FormOf(form_, CharAt(behind, 0)).startsSegment) return at;
  }
  return kNotFound;
}

std::size_t EquivalenceSearch::Find(std::string_view text) {
  if (ascii_ != '\0') return FindAscii(text);
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
