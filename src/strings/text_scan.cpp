// SPDX-License-Identifier: MIT
#include "strings/text_scan.h"

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <algorithm>
#include <array>
#include <bit>

#include "platform/transcode.h"
#include "platform/unicode.h"
#include "strings/text_utf8.h"

namespace orb {
namespace {

using platform::kNotUtf8;
using platform::kSlack;

/// How many ASCII bytes a text begins with.
std::size_t AsciiRun(std::string_view text) {
  std::size_t at = 0;
#ifdef __SSE2__
  for (; text.size() - at >= 16; at += 16) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text.data() + at));
    const auto high = static_cast<unsigned>(_mm_movemask_epi8(block));
    if (high != 0) return at + static_cast<std::size_t>(std::countr_zero(high));
  }
  if (text.size() >= 16) {  // The last ones once more, with those before them.
    const char* last = text.data() + text.size() - 16;
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(last));
    if (_mm_movemask_epi8(block) == 0) return text.size();
  }
#endif
  while (at < text.size() && ByteAt(text, at) < 0x80) ++at;
  return at;
}

/// What most texts are written in, all of it plain: letters and punctuation below U+0300, Cyrillic
/// and Armenian, dashes and quotes, kana, ideographs and their punctuation, Hangul, full-width
/// forms. Of a surrogate pair the first half tells: the pictures stand behind the four listed here.
/// Characters keep these properties in every version of Unicode.
struct UnitRange {
  std::size_t first;
  std::size_t last;
};
constexpr UnitRange kPlainRanges[] = {{0x0000, 0x02FF},
                                      {0x0400, 0x047F},
                                      {0x0490, 0x058F},
                                      {0x2010, 0x2027},
                                      {0x3000, 0x3027},
                                      {0x3030, 0x3097},
                                      {0x30A0, 0x9FFF},
                                      {0xAC00, 0xD79F},
                                      {0xD83C, 0xD83F},
                                      {0xDC00, 0xDFFF},
                                      {0xFF00, 0xFFEF}};
constexpr std::size_t kUnitsInEntry = 4;

/// For each four units, whether any of them is not in those ranges.
constexpr auto kNeedsALook = [] {
  std::array<bool, 0x10000 / kUnitsInEntry> table{};
  table.fill(true);
  for (const UnitRange& range : kPlainRanges) {
    const std::size_t end = (range.last + 1) / kUnitsInEntry;
    for (std::size_t i = (range.first + kUnitsInEntry - 1) / kUnitsInEntry; i < end; ++i) {
      table[i] = false;
    }
  }
  return table;
}();

bool IsPlain(char32_t c) { return platform::FormOf(platform::Form::kDecomposed, c).isPlain; }

/// Asks for each character of units that belong to a valid text.
bool ArePlainOnLooking(std::u16string_view units) {
  for (std::size_t at = 0; at < units.size(); ++at) {
    char32_t c = units[at];
    if (c >= 0xD800 && c < 0xDC00) c = 0x10000 + ((c - 0xD800) << 10) + (units[++at] - 0xDC00U);
    if (!IsPlain(c)) return false;
  }
  return true;
}

bool ArePlain(std::u16string_view units) {
  std::size_t at = 0;
#ifdef __SSE2__
  for (; units.size() - at >= 8; at += 8) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(units.data() + at));
    const __m128i above = _mm_subs_epu16(block, _mm_set1_epi16(0x02FF));
    if (_mm_movemask_epi8(_mm_cmpeq_epi16(above, _mm_setzero_si128())) == 0xFFFF) continue;
    bool look = false;
    for (std::size_t i = 0; i < 8; ++i) look |= kNeedsALook[units[at + i] / kUnitsInEntry];
    if (look) break;
  }
#endif
  while (at < units.size() && !kNeedsALook[units[at] / kUnitsInEntry]) ++at;
  if (at == units.size()) return true;
  if (at != 0 && (units[at] & 0xFC00) == 0xDC00) --at;
  return ArePlainOnLooking(units.substr(at));
}

/// Where a piece of at most `most` bytes ends that cuts no character.
std::size_t PieceSize(std::string_view text, std::size_t most) {
  if (text.size() <= most) return text.size();
  while (most != 0 && (ByteAt(text, most) & 0xC0) == 0x80) --most;
  return most;
}

}  // namespace

// The conversion is the fastest reader of UTF-8 that there is, so the text goes through it.
TextScan ScanUtf8(std::string_view text) {
  constexpr std::size_t kPiece = 1024;
  std::array<char16_t, kPiece + kSlack> units;
  TextScan scan;
  scan.charLength = AsciiRun(text);
  text.remove_prefix(scan.charLength);
  if (!text.empty()) scan.kind = TextKind::kPlain;
  while (!text.empty()) {
    const std::string_view piece = text.substr(0, PieceSize(text, kPiece));
    const std::size_t length =
        piece.empty() ? kNotUtf8 : platform::Utf16FromUtf8(piece, units.data());
    if (length == kNotUtf8) return {TextKind::kInvalid, 0};
    if (scan.kind == TextKind::kPlain && !ArePlain({units.data(), length})) {
      scan.kind = TextKind::kComposing;
    }
    scan.charLength += length;
    text.remove_prefix(piece.size());
  }
  return scan;
}

}  // namespace orb
