// SPDX-License-Identifier: MIT
#include "strings/text_compare.h"

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstring>

#include "strings/text_forms.h"
#include "strings/text_utf8.h"

namespace orb {
namespace {

using platform::Form;

template <typename T>
int Order(T a, T b) {
  return a < b ? -1 : a > b ? 1 : 0;
}

std::uint64_t Word(const char* bytes) {
  std::uint64_t word;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

/// Where two texts begin to differ, or the shorter one ends.
std::size_t CommonBytes(std::string_view a, std::string_view b) {
  const std::size_t size = std::min(a.size(), b.size());
  std::size_t at = 0;
  for (; size - at >= sizeof(std::uint64_t); at += sizeof(std::uint64_t)) {
    const std::uint64_t different = Word(a.data() + at) ^ Word(b.data() + at);
    if (different == 0) continue;
    if constexpr (std::endian::native != std::endian::little) break;
    return at + static_cast<std::size_t>(std::countr_zero(different)) / 8;
  }
  while (at < size && a[at] == b[at]) ++at;
  return at;
}

/// The unit that follows the first `at` bytes; -1 at the end.
int UnitAfter(const TextPrefix& text, std::size_t at) {
  if (at < text.bytes.size()) return LeadUnit(CharAt(text.bytes, at));
  return text.lone != 0 ? text.lone : -1;
}

/// UTF-8 orders by code points. UTF-16 differs only in that surrogates stand below U+E000.
int OrderOfBytes(unsigned a, unsigned b) {
  const bool swapped = a >= 0xEE && b >= 0xEE && (a >= 0xF0) != (b >= 0xF0);
  return swapped ? Order(b, a) : Order(a, b);
}

/// Skips what both texts have in common in ASCII, letter case apart.
std::size_t CommonFoldedAscii(std::string_view a, std::string_view b) {
  const std::size_t size = std::min(a.size(), b.size());
  std::size_t at = 0;
  constexpr std::uint64_t kHighBits = 0x8080808080808080;
  while (size - at >= sizeof(std::uint64_t)) {
    const std::uint64_t word = Word(a.data() + at);
    if (word != Word(b.data() + at) || (word & kHighBits) != 0) break;
    at += sizeof(std::uint64_t);
  }
  for (; at < size; ++at) {
    const unsigned x = ByteAt(a, at);
    const unsigned y = ByteAt(b, at);
    if ((x | y) >= 0x80 || FormReader::FoldAscii(x) != FormReader::FoldAscii(y)) break;
  }
  return at;
}

int CompareForms(FormReader a, FormReader b) {
  std::u16string_view x;
  std::u16string_view y;
  for (;;) {
    if (x.empty()) x = a.Next();
    if (y.empty()) y = b.Next();
    if (x.empty() || y.empty()) return Order(!x.empty(), !y.empty());
    if (x.front() != y.front()) return Order(x.front(), y.front());
    x.remove_prefix(1);
    y.remove_prefix(1);
  }
}

int CompareInForm(const TextPrefix& a, const TextPrefix& b, Form form) {
  // No mark can move across an ASCII character, so the rest can be compared by itself.
  const std::size_t common = CommonFoldedAscii(a.bytes, b.bytes);
  const std::string_view x = a.bytes.substr(common);
  const std::string_view y = b.bytes.substr(common);
  if (!x.empty() && !y.empty() && (ByteAt(x, 0) | ByteAt(y, 0)) < 0x80) {
    return Order(FormReader::FoldAscii(ByteAt(x, 0)), FormReader::FoldAscii(ByteAt(y, 0)));
  }
  return CompareForms(FormReader(x, form, a.lone), FormReader(y, form, b.lone));
}

}  // namespace

TextPrefix PrefixOf(std::string_view text, std::size_t units) {
  if (units >= text.size()) return {text};
  const UnitPlace end = PlaceOfUnit(text, units);
  return {text.substr(0, end.at), end.insidePair ? LeadUnit(CharAt(text, end.at)) : u'\0'};
}

int CompareUnits(const TextPrefix& a, const TextPrefix& b) {
  const std::size_t common = CommonBytes(a.bytes, b.bytes);
  if (common == a.bytes.size() || common == b.bytes.size()) {
    return Order(UnitAfter(a, common), UnitAfter(b, common));
  }
  return OrderOfBytes(ByteAt(a.bytes, common), ByteAt(b.bytes, common));
}

int CompareFolded(const TextPrefix& a, const TextPrefix& b) {
  return CompareInForm(a, b, Form::kFolded);
}

int CompareFoldedEquivalent(std::string_view a, std::string_view b) {
  return CompareInForm({a}, {b}, Form::kFoldedDecomposed);
}

}  // namespace orb
