// SPDX-License-Identifier: MIT
#include "strings/text_scan.h"

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include <bit>

#include "platform/unicode.h"
#include "strings/text_utf8.h"

namespace orb {
namespace {

/// How many ASCII bytes stand at `at`.
std::size_t AsciiRun(std::string_view text, std::size_t at) {
  const std::size_t from = at;
#ifdef __SSE2__
  for (; text.size() - at >= 16; at += 16) {
    const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text.data() + at));
    const auto high = static_cast<unsigned>(_mm_movemask_epi8(block));
    if (high != 0) return at - from + static_cast<std::size_t>(std::countr_zero(high));
  }
#endif
  while (at < text.size() && ByteAt(text, at) < 0x80) ++at;
  return at - from;
}

bool Continues(std::string_view text, std::size_t at) { return (ByteAt(text, at) & 0xC0) == 0x80; }

/// The bytes of the character at `at`, which is not ASCII; 0 when it is not UTF-8.
std::size_t ValidCharSize(std::string_view text, std::size_t at) {
  const unsigned lead = ByteAt(text, at);
  if (lead < 0xC2 || lead > 0xF4) return 0;
  const std::size_t size = CharSize(lead);
  if (text.size() - at < size) return 0;
  for (std::size_t i = 1; i < size; ++i) {
    if (!Continues(text, at + i)) return 0;
  }
  const unsigned second = ByteAt(text, at + 1);
  const bool overlong = (lead == 0xE0 && second < 0xA0) || (lead == 0xF0 && second < 0x90);
  const bool outside = (lead == 0xED && second >= 0xA0) || (lead == 0xF4 && second >= 0x90);
  return overlong || outside ? 0 : size;
}

/// Below U+0300 and among the ideographs and the Hangul syllables everything is plain.
bool IsPlain(char32_t c) {
  if (c < 0x300 || (c >= 0xAC00 && c < 0xD7A4)) return true;
  return platform::FormOf(platform::Form::kDecomposed, c).isPlain;
}

/// How many bytes of Han ideographs, U+4000 to U+9FFF, stand at `at`.
std::size_t IdeographRun(std::string_view text, std::size_t at) {
  const std::size_t from = at;
  while (text.size() - at >= 3 && ByteAt(text, at) - 0xE4U < 6 && Continues(text, at + 1) &&
         Continues(text, at + 2)) {
    at += 3;
  }
  return at - from;
}

}  // namespace

TextScan ScanUtf8(std::string_view text) {
  TextScan scan;
  for (std::size_t at = 0;;) {
    const std::size_t ascii = AsciiRun(text, at);
    at += ascii;
    scan.charLength += ascii;
    if (at == text.size()) return scan;
    if (scan.kind == TextKind::kAscii) scan.kind = TextKind::kPlain;
    const std::size_t ideographs = IdeographRun(text, at);
    at += ideographs;
    scan.charLength += ideographs / 3;
    while (at < text.size() && ByteAt(text, at) >= 0x80) {
      const std::size_t size = ValidCharSize(text, at);
      if (size == 0) return {TextKind::kInvalid, 0};
      if (scan.kind == TextKind::kPlain && !IsPlain(CharAt(text, at))) {
        scan.kind = TextKind::kComposing;
      }
      at += size;
      scan.charLength += CharUnits(ByteAt(text, at - size));
    }
  }
}

}  // namespace orb
