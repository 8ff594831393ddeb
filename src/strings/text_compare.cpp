// SPDX-License-Identifier: MIT
#include "strings/text_compare.h"

#ifdef __SSE2__
#include <emmintrin.h>
#endif

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
  return static_cast<int>(a > b) - static_cast<int>(a < b);
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

unsigned FoldedByte(std::string_view text, std::size_t at) {
  return FormReader::FoldAscii(ByteAt(text, at));
}

// What stands on the way that nearly all comparisons take.
#define ORB_INLINE __attribute__((always_inline)) inline

#ifdef __SSE2__

constexpr std::size_t kBlock = sizeof(__m128i);

__m128i Folded(__m128i bytes) {
  // Shifted so that the capitals are the lowest of the signed values.
  const __m128i shifted = _mm_add_epi8(bytes, _mm_set1_epi8(0x80 - 'A'));
  const __m128i capital = _mm_cmplt_epi8(shifted, _mm_set1_epi8(-0x80 + 26));
  return _mm_or_si128(bytes, _mm_and_si128(capital, _mm_set1_epi8(0x20)));
}

__m128i Block(const char* from) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from)); }

/// The first eight and the last eight of 8 to 16 bytes.
__m128i ShortBlock(std::string_view text, std::size_t size) {
  const auto half = [&](std::size_t at) {
    return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(text.data() + at));
  };
  return _mm_unpacklo_epi64(half(0), half(size - kBlock / 2));
}

bool AreEqual(__m128i a, __m128i b) { return _mm_movemask_epi8(_mm_cmpeq_epi8(a, b)) == 0xFFFF; }

/// The first byte in which two blocks differ when folded; kBlock if there is none.
std::size_t CommonFolded(__m128i a, __m128i b) {
  const __m128i equal = _mm_cmpeq_epi8(Folded(a), Folded(b));
  return static_cast<std::size_t>(std::countr_one(static_cast<unsigned>(_mm_movemask_epi8(equal))));
}

/// Where two texts begin to differ, the shorter one having 8 to 15 bytes.
ORB_INLINE std::size_t CommonInShort(std::string_view a, std::string_view b, std::size_t size) {
  const std::size_t common = CommonFolded(ShortBlock(a, size), ShortBlock(b, size));
  return common < kBlock / 2 ? common : size - kBlock + common;
}

/// The same for texts of which the shorter one has 16 bytes or more. The fewer instructions a
/// comparison has, the more of a sort's next ones the processor sees while it waits for a text from
/// memory; so what is equal as it stands is not folded.
ORB_INLINE std::size_t CommonInLong(std::string_view a, std::string_view b, std::size_t size) {
  const std::size_t last = size - kBlock;
  for (std::size_t at = 0;; at = std::min(at + kBlock, last)) {  // The last two may overlap.
    const __m128i x = Block(a.data() + at);
    const __m128i y = Block(b.data() + at);
    const std::size_t common = AreEqual(x, y) ? kBlock : CommonFolded(x, y);
    if (common != kBlock || at == last) return at + common;
  }
}

#endif

/// Where two texts begin to differ, the case of ASCII letters apart, or the shorter one ends.
ORB_INLINE std::size_t CommonFoldedBytes(std::string_view a, std::string_view b) {
  const std::size_t size = std::min(a.size(), b.size());
#ifdef __SSE2__
  if (size >= kBlock) return CommonInLong(a, b, size);
  if (size >= kBlock / 2) return CommonInShort(a, b, size);
#endif
  std::size_t at = 0;
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

/// Decides where the texts are equal but for case up to `common` bytes, and where one of them ends
/// there or goes on with a character beyond ASCII.
__attribute__((noinline)) int CompareFrom(std::size_t common,
                                          const TextPrefix& a,
                                          const TextPrefix& b,
                                          Form form) {
  // No mark can move across an ASCII character, so what follows the last one stands by itself.
  std::size_t from = common;
  while (from != 0 && ByteAt(a.bytes, from - 1) >= 0x80) --from;
  const std::string_view x = a.bytes.substr(from);
  const std::string_view y = b.bytes.substr(from);
  const bool ends = common == a.bytes.size() || common == b.bytes.size();
  if (ends && from == common && a.lone == 0 && b.lone == 0) return Order(x.size(), y.size());
  if (!x.empty() && !y.empty()) {
    const char16_t unitOfX = FirstUnit(x, form);
    const char16_t unitOfY = FirstUnit(y, form);
    if (unitOfX != unitOfY && unitOfX != 0 && unitOfY != 0) return Order(unitOfX, unitOfY);
  }
  return CompareForms(FormReader(x, form, a.lone), FormReader(y, form, b.lone));
}

bool AreAscii(std::string_view a, std::string_view b, std::size_t at) {
  return at != a.size() && at != b.size() && (ByteAt(a, at) | ByteAt(b, at)) < 0x80;
}

int OrderOfAscii(std::string_view a, std::string_view b, std::size_t at) {
  return Order(FoldedByte(a, at), FoldedByte(b, at));
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
  const std::size_t common = CommonFoldedBytes(a.bytes, b.bytes);
  if (AreAscii(a.bytes, b.bytes, common)) return OrderOfAscii(a.bytes, b.bytes, common);
  return CompareFrom(common, a, b, Form::kFolded);
}

int CompareFoldedEquivalent(std::string_view a, std::string_view b) {
  const std::size_t common = CommonFoldedBytes(a, b);
  if (AreAscii(a, b, common)) return OrderOfAscii(a, b, common);
  return CompareFrom(common, {a}, {b}, Form::kFoldedDecomposed);
}

}  // namespace orb
