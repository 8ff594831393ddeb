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

/// Eight bytes with the ASCII capitals among them made small.
std::uint64_t FoldedWord(std::uint64_t word) {
  constexpr std::uint64_t kEach = 0x0101010101010101;
  const std::uint64_t low = word & 0x7F * kEach;
  const std::uint64_t fromA = low + (0x80 - 'A') * kEach;
  const std::uint64_t beyondZ = low + (0x7F - 'Z') * kEach;
  return word | (fromA & ~beyondZ & ~word & 0x80 * kEach) >> 2;
}

unsigned FoldedByte(std::string_view text, std::size_t at) {
  return FormReader::FoldAscii(ByteAt(text, at));
}

/// Where two texts begin to differ, the case of ASCII letters apart, or the shorter one ends.
std::size_t CommonFoldedBytes(std::string_view a, std::string_view b) {
  const std::size_t size = std::min(a.size(), b.size());
  std::size_t at = 0;
  for (; size - at >= sizeof(std::uint64_t); at += sizeof(std::uint64_t)) {
    const std::uint64_t different =
        FoldedWord(Word(a.data() + at)) ^ FoldedWord(Word(b.data() + at));
    if (different == 0) continue;
    if constexpr (std::endian::native != std::endian::little) break;
    return at + static_cast<std::size_t>(std::countr_zero(different)) / 8;
  }
  while (at < size && FoldedByte(a, at) == FoldedByte(b, at)) ++at;
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

/// The first unit of a text that is not empty; 0 when more than its first character decides that.
char16_t FirstUnit(std::string_view text, Form form) {
  const unsigned lead = ByteAt(text, 0);
  if (lead < 0x80) return static_cast<char16_t>(FormReader::FoldAscii(lead));
  const platform::CharForm first = platform::FormOf(form, CharAt(text, 0));
  return first.leadsWithStarter && first.length != 0 ? first.units[0] : u'\0';
}

int CompareInForm(const TextPrefix& a, const TextPrefix& b, Form form) {
  const std::size_t common = CommonFoldedBytes(a.bytes, b.bytes);
  const bool ends = common == a.bytes.size() || common == b.bytes.size();
  if (!ends && (ByteAt(a.bytes, common) | ByteAt(b.bytes, common)) < 0x80) {
    return Order(FoldedByte(a.bytes, common), FoldedByte(b.bytes, common));
  }
  // No mark can move across an ASCII character, so what follows the last one stands by itself.
  std::size_t from = common;
  while (from != 0 && ByteAt(a.bytes, from - 1) >= 0x80) --from;
  const std::string_view x = a.bytes.substr(from);
  const std::string_view y = b.bytes.substr(from);
  if (ends && from == common && a.lone == 0 && b.lone == 0) return Order(x.size(), y.size());
  if (!x.empty() && !y.empty()) {
    const char16_t unitOfX = FirstUnit(x, form);
    const char16_t unitOfY = FirstUnit(y, form);
    if (unitOfX != unitOfY && unitOfX != 0 && unitOfY != 0) return Order(unitOfX, unitOfY);
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
