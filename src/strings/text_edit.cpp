// SPDX-License-Identifier: MIT
#include "strings/text_edit.h"

#include <algorithm>
#include <bitset>
#include <cstring>
#include <memory>
#include <utility>

#include "strings/text_search.h"
#include "strings/text_utf8.h"

namespace orb {
namespace {

using platform::Form;

bool IsAscii(const Utf8Text& text) { return text.scan.kind == TextKind::kAscii; }

bool IsPlain(const Utf8Text& text) { return IsAscii(text) || text.scan.kind == TextKind::kPlain; }

/// Cuts a text at the matches of another, one piece at a time.
class Cutter {
 public:
  /// `repaired` takes a copy of the text if a surrogate pair is cut.
  Cutter(const Utf8Text& text, const Utf8Text& find, std::string& repaired)
      : rest_(text.Readable()), units_(find.scan.charLength), repaired_(repaired) {
    if (units_ == 0 || rest_.empty()) return;
    if (IsPlain(text) && IsPlain(find)) {
      literal_.emplace(find.bytes);
    } else {
      equivalent_.emplace(find.bytes, Form::kDecomposed);
    }
  }

  /// The text before the next match; nothing when there is none.
  std::optional<std::string_view> Next() {
    const std::size_t found = Find();
    if (found == kNotFound) return std::nullopt;
    const std::string_view piece = rest_.substr(0, found);
    DropTo(PlaceOfUnit(rest_, units_, found));
    return piece;
  }

  std::string_view Rest() const { return rest_; }

 private:
  std::size_t Find() {
    if (literal_) return literal_->Find(rest_);
    return equivalent_ ? equivalent_->Find(rest_) : kNotFound;
  }

  void DropTo(UnitPlace place) {
    if (place.insidePair) {
      // What is left of the pair becomes U+FFFD, which is one byte shorter than the pair.
      if (!std::exchange(isRepaired_, true)) rest_ = repaired_ = rest_;
      ++place.at;
      kReplacement.copy(repaired_.data() + (repaired_.size() - rest_.size()) + place.at,
                        kReplacement.size());
    }
    rest_.remove_prefix(place.at);
  }

  std::string_view rest_;
  std::size_t units_;
  std::string& repaired_;
  bool isRepaired_ = false;
  std::optional<LiteralSearch> literal_;
  std::optional<EquivalenceSearch> equivalent_;
};

std::string ReplacedInSteps(const Utf8Text& text, const Utf8Text& find, std::string_view with) {
  std::string out;
  std::string repaired;
  Cutter cutter(text, find, repaired);
  while (const auto piece = cutter.Next()) {
    out += *piece;
    out += with;
  }
  out += cutter.Rest();
  return out;
}

/// Writes short stretches in steps of 16 bytes, beyond their end where there is room.
class Writer {
 public:
  Writer(char* to, const char* end) : to_(to), end_(end) {}

  void Put(std::string_view text, const char* readableEnd) {
    const char* from = text.data();
    char* const done = to_ + text.size();
    const auto room = static_cast<std::size_t>(end_ - to_);
    const auto readable = static_cast<std::size_t>(readableEnd - from);
    if (text.size() > kShort || room < kShort || readable < kShort) {
      if (!text.empty()) std::memcpy(to_, from, text.size());
    } else {
      std::memcpy(to_, from, kShort / 2);
      std::memcpy(to_ + kShort / 2, from + kShort / 2, kShort / 2);
    }
    to_ = done;
  }

 private:
  static constexpr std::size_t kShort = 32;

  char* to_;
  const char* end_;
};

std::string ReplacedLiterally(std::string_view text, std::string_view find, std::string_view with) {
  const LiteralSearch search(find);
  std::size_t matches = 0;
  search.ForEach(text, [&](std::size_t) { return ++matches != 0; });
  std::string out(text.size() - matches * find.size() + matches * with.size(), '\0');
  Writer writer(out.data(), out.data() + out.size());
  const char* const textEnd = text.data() + text.size();
  std::size_t done = 0;
  search.ForEach(text, [&](std::size_t place) {
    writer.Put(text.substr(done, place - done), textEnd);
    writer.Put(with, with.data() + with.size());
    done = place + find.size();
    return true;
  });
  writer.Put(text.substr(done), textEnd);
  return out;
}

/// A set of plain characters. As it is one of UTF-16 units, U+FFFD is in it for halves of pairs.
class PlainSet {
 public:
  explicit PlainSet(std::string_view set) {
    for (std::size_t at = 0; at < set.size(); at += CharSize(ByteAt(set, at))) {
      const char32_t c = CharAt(set, at);
      if (c < ascii_.size()) {
        ascii_.set(c);
      } else {
        others_.push_back(c < 0x10000 ? c : 0xFFFD);
      }
    }
    std::sort(others_.begin(), others_.end());
  }

  bool Has(char32_t c) const {
    if (c < ascii_.size()) return ascii_.test(c);
    return std::binary_search(others_.begin(), others_.end(), c);
  }

 private:
  std::bitset<128> ascii_;
  std::u32string others_;
};

bool HasAny(std::string_view text, const PlainSet& set) {
  for (std::size_t at = 0; at < text.size(); at += CharSize(ByteAt(text, at))) {
    if (set.Has(CharAt(text, at))) return true;
  }
  return false;
}

std::string_view WithoutHead(std::string_view text, const PlainSet& set) {
  while (!text.empty() && set.Has(CharAt(text, 0))) text.remove_prefix(CharSize(ByteAt(text, 0)));
  return text;
}

std::string_view WithoutTail(std::string_view text, const PlainSet& set) {
  while (!text.empty()) {
    std::size_t at = text.size() - 1;
    while ((ByteAt(text, at) & 0xC0) == 0x80) --at;
    if (!set.Has(CharAt(text, at))) break;
    text = text.substr(0, at);
  }
  return text;
}

Trimmed TrimPlain(std::string_view text, const PlainSet& set, bool left, bool right) {
  std::string_view kept = WithoutHead(text, set);
  if (kept.empty()) return {Trimming::kEverything, {}};
  if (!left) kept = text;
  if (right) kept = WithoutTail(kept, set);
  if (kept.size() == text.size() && !HasAny(text, set)) return {};
  return {Trimming::kSome, std::string(kept)};
}

/// Each UTF-16 unit of a text as a text of its own.
std::vector<std::string> UnitsOf(std::string_view text) {
  std::vector<std::string> units;
  for (std::size_t at = 0; at < text.size();) {
    const unsigned lead = ByteAt(text, at);
    if (CharUnits(lead) == 1) {
      units.emplace_back(text.substr(at, CharSize(lead)));
    } else {
      units.insert(units.end(), 2, std::string(kReplacement));
    }
    at += CharSize(lead);
  }
  return units;
}

/// The text with every character of the set made its first one.
std::string Unified(std::string text, const std::vector<std::string>& set) {
  for (std::size_t i = 1; i < set.size(); ++i) {
    text = Replaced(Scanned(text), Scanned(set[i]), set.front());
  }
  return text;
}

std::size_t TailUnits(std::string_view text, std::size_t at) {
  return at == kNotFound ? 0 : CountUnits(text.substr(at));
}

/// Marks attach to characters of the set and hide them, so the ends are found by splitting.
Trimmed TrimInSteps(const Utf8Text& text, std::string_view set, bool left, bool right) {
  const std::vector<std::string> units = UnitsOf(set);
  const std::string unified = Unified(std::string(text.bytes), units);
  const Utf8Text separator = Scanned(units.empty() ? std::string_view() : units.front());
  const Pieces split(Scanned(unified), separator);
  if (split.Views().empty()) {
    const bool nothing = Replaced(Scanned(unified), separator, {}).empty();
    return {nothing ? Trimming::kEverything : Trimming::kNothing, {}};
  }
  const std::string_view first = split.Views().front();
  const std::string_view last = split.Views().back();
  const std::string_view whole = text.Readable();
  const std::size_t head = TailUnits(whole, FindEquivalent(text, Scanned(first)));
  const std::size_t back = TailUnits(whole, FindLastLiteral(whole, last));
  const std::size_t start = left ? text.scan.charLength - head : 0;
  std::size_t count = text.scan.charLength - start;
  if (right && split.Views().size() == 1) {
    count = count - head + CountUnits(first);
  } else if (right) {
    count = count - back + CountUnits(last);
  }
  if (start >= text.scan.charLength) return {Trimming::kSome, {}};
  return {Trimming::kSome, Middle(whole, start, count)};
}

}  // namespace

Utf8Text Scanned(std::string_view bytes) { return {bytes, ScanUtf8(bytes)}; }

std::size_t FindEquivalent(const Utf8Text& text, const Utf8Text& find) {
  if (find.Readable().empty()) return kNotFound;
  if (IsPlain(text) && IsPlain(find)) return LiteralSearch(find.bytes).Find(text.bytes);
  return EquivalenceSearch(find.bytes, Form::kDecomposed).Find(text.Readable());
}

std::size_t FindFolded(const Utf8Text& text, const Utf8Text& find) {
  if (find.Readable().empty()) return kNotFound;
  if (IsAscii(text) && IsAscii(find)) {
    return LiteralSearch(find.bytes, LiteralSearch::Case::kAscii).Find(text.bytes);
  }
  return EquivalenceSearch(find.bytes, Form::kFoldedDecomposed).Find(text.Readable());
}

std::string Middle(std::string_view text, std::size_t start, std::size_t count) {
  const UnitPlace from = PlaceOfUnit(text, start);
  if (count == 0 || from.at == text.size()) return {};
  std::string out(from.insidePair ? kReplacement : std::string_view());
  const std::size_t begin = from.insidePair ? from.at + 4 : from.at;
  const UnitPlace to = PlaceOfUnit(text, from.insidePair ? count - 1 : count, begin);
  out += text.substr(begin, to.at - begin);
  if (to.insidePair) out += kReplacement;
  return out;
}

std::string Replaced(const Utf8Text& text, const Utf8Text& find, std::string_view with) {
  if (text.Readable().empty() || find.Readable().empty()) return std::string(text.bytes);
  if (IsPlain(text) && IsPlain(find)) return ReplacedLiterally(text.bytes, find.bytes, with);
  return ReplacedInSteps(text, find, with);
}

Pieces::Pieces(const Utf8Text& text, const Utf8Text& separator) {
  Cutter cutter(text, separator, repaired_);
  bool found = false;
  while (const auto piece = cutter.Next()) {
    found = true;
    if (!piece->empty()) views_.push_back(*piece);
  }
  if (found && !cutter.Rest().empty()) views_.push_back(cutter.Rest());
}

Trimmed Trim(const Utf8Text& text, const Utf8Text& set, bool left, bool right) {
  if (text.scan.kind == TextKind::kInvalid) return {};
  if (IsPlain(text) && IsPlain(set)) {
    return TrimPlain(text.bytes, PlainSet(set.bytes), left, right);
  }
  return TrimInSteps(text, set.Readable(), left, right);
}

}  // namespace orb
