// SPDX-License-Identifier: MIT
#include "strings/text_edit.h"

#include <algorithm>
#include <array>
#include <bitset>
#include <cstring>
#include <utility>

#include "strings/text_search.h"
#include "strings/text_utf8.h"

namespace orb {
namespace {

using platform::Form;

bool IsAscii(const Utf8Text& text) { return text.scan.kind == TextKind::kAscii; }

bool IsPlain(const Utf8Text& text) { return IsAscii(text) || text.scan.kind == TextKind::kPlain; }

/// Cuts a text at the equivalents of another, one piece at a time.
class Cutter {
 public:
  /// `repaired` takes a copy of the text if a surrogate pair is cut.
  Cutter(const Utf8Text& text, const Utf8Text& find, std::string& repaired)
      : rest_(text.Readable()),
        units_(find.scan.charLength),
        repaired_(repaired),
        search_(find.bytes, Form::kDecomposed) {}

  /// The text before the next match; nothing when there is none.
  std::optional<std::string_view> Next() {
    const std::size_t found = search_.Find(rest_);
    if (found == kNotFound) return std::nullopt;
    const std::string_view piece = rest_.substr(0, found);
    DropTo(PlaceOfUnit(rest_, units_, found));
    return piece;
  }

  std::string_view Rest() const { return rest_; }

 private:
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
  EquivalenceSearch search_;
};

/// Writes many short stretches one behind the other. It copies 32 bytes where fewer are wanted, so
/// it needs that many bytes of room behind the last.
class Writer {
 public:
  static constexpr std::size_t kStretch = 32;

  explicit Writer(char* to) : to_(to) {}

  /// `readable` bytes can be read from where `text` begins.
  void Put(std::string_view text, std::size_t readable) {
    if (text.size() > kStretch || readable < kStretch) {
      text.copy(to_, text.size());
    } else {
      std::memcpy(to_, text.data(), kStretch / 2);
      std::memcpy(to_ + kStretch / 2, text.data() + kStretch / 2, kStretch / 2);
    }
    to_ += text.size();
  }
  const char* End() const { return to_; }

 private:
  char* to_;
};

std::size_t CountMatches(const LiteralSearch& search, std::string_view text) {
  std::size_t count = 0;
  search.ForEach(text, [&](std::size_t) { return ++count != 0; });
  return count;
}

/// No fewer than there are. Counts only where a guess would take much more room than the text.
std::size_t MostMatches(const LiteralSearch& search,
                        std::string_view text,
                        std::size_t find,
                        std::size_t with) {
  return with <= 2 * find ? text.size() / find : CountMatches(search, text);
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
    const Replaced step(Scanned(text), Scanned(set[i]), set.front());
    text = std::string(step.View());
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
    const bool nothing = Replaced(Scanned(unified), separator, {}).View().empty();
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

Replaced::Replaced(const Utf8Text& text, const Utf8Text& find, std::string_view with)
    : view_(text.bytes) {
  if (text.Readable().empty() || find.Readable().empty()) return;
  if (IsPlain(text) && IsPlain(find)) {
    ReplaceLiterally(text.bytes, find.bytes, with);
  } else {
    ReplaceInSteps(text, find, with);
  }
}

void Replaced::ReplaceInSteps(const Utf8Text& text, const Utf8Text& find, std::string_view with) {
  std::string repaired;
  Cutter cutter(text, find, repaired);
  while (const auto piece = cutter.Next()) {
    inSteps_ += *piece;
    inSteps_ += with;
  }
  inSteps_ += cutter.Rest();
  view_ = inSteps_;
}

void Replaced::ReplaceLiterally(std::string_view text,
                                std::string_view find,
                                std::string_view with) {
  const LiteralSearch search(find);
  const std::size_t most = MostMatches(search, text, find.size(), with.size());
  const std::size_t grown = with.size() > find.size() ? (with.size() - find.size()) * most : 0;
  literally_ = std::make_unique_for_overwrite<char[]>(text.size() + grown + Writer::kStretch);
  std::array<char, Writer::kStretch> padded{};  // A short `with`, so that 32 bytes can be read.
  if (with.size() < padded.size()) with = {padded.data(), with.copy(padded.data(), with.size())};
  Writer writer(literally_.get());
  std::size_t done = 0;
  search.ForEach(text, [&](std::size_t place) {
    writer.Put(text.substr(done, place - done), text.size() - done);
    writer.Put(with, Writer::kStretch);
    done = place + find.size();
    return true;
  });
  writer.Put(text.substr(done), 0);
  view_ = {literally_.get(), static_cast<std::size_t>(writer.End() - literally_.get())};
}

Pieces::Pieces(const Utf8Text& text, const Utf8Text& separator) {
  if (separator.Readable().empty()) return;
  if (IsPlain(text) && IsPlain(separator)) {
    SplitLiterally(text.bytes, separator.bytes);
  } else {
    SplitInSteps(text, separator);
  }
}

void Pieces::Add(std::string_view piece) {
  if (!piece.empty()) views_.push_back(piece);
}

void Pieces::SplitLiterally(std::string_view text, std::string_view separator) {
  const LiteralSearch search(separator);
  views_.reserve(CountMatches(search, text) + 1);
  std::size_t done = 0;
  search.ForEach(text, [&](std::size_t place) {
    Add(text.substr(done, place - done));
    done = place + separator.size();
    return true;
  });
  if (done != 0) Add(text.substr(done));
}

void Pieces::SplitInSteps(const Utf8Text& text, const Utf8Text& separator) {
  Cutter cutter(text, separator, repaired_);
  bool found = false;
  while (const auto piece = cutter.Next()) {
    found = true;
    Add(*piece);
  }
  if (found) Add(cutter.Rest());
}

Trimmed Trim(const Utf8Text& text, const Utf8Text& set, bool left, bool right) {
  if (text.scan.kind == TextKind::kInvalid) return {};
  if (IsPlain(text) && IsPlain(set)) {
    return TrimPlain(text.bytes, PlainSet(set.bytes), left, right);
  }
  return TrimInSteps(text, set.Readable(), left, right);
}

}  // namespace orb
