// SPDX-License-Identifier: MIT
#include "platform/transcode.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

#include "platform/icu.h"
#include "platform/transcode_avx.h"
#include "platform/transcode_sse.h"

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace orb::platform {
namespace {

/// What the bytes 0x80 to 0xFF of Mac OS Roman stand for.
constexpr std::array<char16_t, 128> kMacRomanUpperHalf = {
    0x00C4, 0x00C5, 0x00C7, 0x00C9, 0x00D1, 0x00D6, 0x00DC, 0x00E1, 0x00E0, 0x00E2, 0x00E4, 0x00E3,
    0x00E5, 0x00E7, 0x00E9, 0x00E8, 0x00EA, 0x00EB, 0x00ED, 0x00EC, 0x00EE, 0x00EF, 0x00F1, 0x00F3,
    0x00F2, 0x00F4, 0x00F6, 0x00F5, 0x00FA, 0x00F9, 0x00FB, 0x00FC, 0x2020, 0x00B0, 0x00A2, 0x00A3,
    0x00A7, 0x2022, 0x00B6, 0x00DF, 0x00AE, 0x00A9, 0x2122, 0x00B4, 0x00A8, 0x2260, 0x00C6, 0x00D8,
    0x221E, 0x00B1, 0x2264, 0x2265, 0x00A5, 0x00B5, 0x2202, 0x2211, 0x220F, 0x03C0, 0x222B, 0x00AA,
    0x00BA, 0x03A9, 0x00E6, 0x00F8, 0x00BF, 0x00A1, 0x00AC, 0x221A, 0x0192, 0x2248, 0x2206, 0x00AB,
    0x00BB, 0x2026, 0x00A0, 0x00C0, 0x00C3, 0x00D5, 0x0152, 0x0153, 0x2013, 0x2014, 0x201C, 0x201D,
    0x2018, 0x2019, 0x00F7, 0x25CA, 0x00FF, 0x0178, 0x2044, 0x20AC, 0x2039, 0x203A, 0xFB01, 0xFB02,
    0x2021, 0x00B7, 0x201A, 0x201E, 0x2030, 0x00C2, 0x00CA, 0x00C1, 0x00CB, 0x00C8, 0x00CD, 0x00CE,
    0x00CF, 0x00CC, 0x00D3, 0x00D4, 0xF8FF, 0x00D2, 0x00DA, 0x00DB, 0x00D9, 0x0131, 0x02C6, 0x02DC,
    0x00AF, 0x02D8, 0x02D9, 0x02DA, 0x00B8, 0x02DD, 0x02DB, 0x02C7,
};

constexpr char32_t kReplacement = 0xFFFD;
constexpr char32_t kInvalid = 0xFFFFFFFF;

bool IsAscii(const char* eight) {
  std::uint64_t bytes = 0;
  std::memcpy(&bytes, eight, sizeof bytes);
  return (bytes & 0x8080808080808080) == 0;
}

bool IsAscii(const char16_t* four) {
  std::uint64_t units = 0;
  std::memcpy(&units, four, sizeof units);
  return (units & 0xFF80FF80FF80FF80) == 0;
}

/// Reads one character of UTF-8 at `at` and moves behind it; kInvalid where there is none.
char32_t ReadUtf8(std::string_view text, std::size_t& at) {
  const auto byte = [&](std::size_t i) -> unsigned {
    return i < text.size() ? static_cast<unsigned char>(text[i]) : 0U;
  };
  const unsigned lead = byte(at);
  if (lead < 0x80) {
    ++at;
    return lead;
  }
  const std::size_t count = lead >= 0xF0 ? 3 : lead >= 0xE0 ? 2 : 1;
  if (lead < 0xC2 || lead > 0xF4) return kInvalid;
  char32_t value = lead & (0x3FU >> count);
  for (std::size_t i = 1; i <= count; ++i) {
    if ((byte(at + i) & 0xC0) != 0x80) return kInvalid;
    value = value << 6 | (byte(at + i) & 0x3F);
  }
  constexpr std::array<char32_t, 4> kLeast = {0, 0x80, 0x800, 0x10000};
  if (value < kLeast[count] || value > 0x10FFFF || (value >= 0xD800 && value < 0xE000)) {
    return kInvalid;
  }
  at += count + 1;
  return value;
}

/// Both writers return where the next character goes.
char* PutUtf8(char* out, char32_t c) {
  const auto put = [&](char32_t byte) { *out++ = static_cast<char>(byte); };
  if (c < 0x80) {
    put(c);
  } else if (c < 0x800) {
    put(0xC0 | c >> 6);
    put(0x80 | (c & 0x3F));
  } else if (c < 0x10000) {
    put(0xE0 | c >> 12);
    put(0x80 | (c >> 6 & 0x3F));
    put(0x80 | (c & 0x3F));
  } else {
    put(0xF0 | c >> 18);
    put(0x80 | (c >> 12 & 0x3F));
    put(0x80 | (c >> 6 & 0x3F));
    put(0x80 | (c & 0x3F));
  }
  return out;
}

char16_t* PutUtf16(char16_t* out, char32_t c) {
  if (c < 0x10000) {
    *out++ = static_cast<char16_t>(c);
  } else {
    *out++ = static_cast<char16_t>(0xD7C0 + (c >> 10));
    *out++ = static_cast<char16_t>(0xDC00 + (c & 0x3FF));
  }
  return out;
}

/// Reads one character of UTF-16 at `at` and moves behind it; U+FFFD for an unpaired surrogate.
char32_t ReadUtf16(std::u16string_view text, std::size_t& at) {
  const char32_t unit = text[at++];
  if (unit < 0xD800 || unit >= 0xE000) return unit;
  if (unit >= 0xDC00 || at == text.size()) return kReplacement;
  const char32_t low = text[at];
  if (low < 0xDC00 || low >= 0xE000) return kReplacement;
  ++at;
  return 0x10000 + ((unit - 0xD800) << 10) + (low - 0xDC00);
}

/// Nothing below U+0300 composes with what stands before it.
bool MayCompose(std::u16string_view text) {
  return std::any_of(text.begin(), text.end(), [](char16_t unit) { return unit >= 0x0300; });
}

std::u16string Composed(std::u16string_view text) {
  UErrorCode status = U_ZERO_ERROR;
  const UNormalizer2* nfc = Icu().unorm2_getNFCInstance(&status);
  std::u16string out(text.size() + 16, u'\0');
  const auto normalize = [&] {
    return Icu().unorm2_normalize(nfc,
                                  text.data(),
                                  static_cast<std::int32_t>(text.size()),
                                  out.data(),
                                  static_cast<std::int32_t>(out.size()),
                                  &status);
  };
  std::int32_t length = normalize();
  if (status == U_BUFFER_OVERFLOW_ERROR) {
    status = U_ZERO_ERROR;
    out.resize(static_cast<std::size_t>(length));
    length = normalize();
  }
  if (U_FAILURE(status)) return std::u16string(text);
  out.resize(static_cast<std::size_t>(length));
  return out;
}

struct MacRomanByte {
  char16_t unit;
  char byte;
};

/// The upper half in the order of its characters.
constexpr auto kMacRomanByCharacter = [] {
  std::array<MacRomanByte, kMacRomanUpperHalf.size()> table{};
  for (std::size_t i = 0; i < table.size(); ++i) {
    table[i] = {kMacRomanUpperHalf[i], static_cast<char>(0x80 + i)};
  }
  std::sort(table.begin(), table.end(), [](const MacRomanByte& a, const MacRomanByte& b) {
    return a.unit < b.unit;
  });
  return table;
}();

/// The byte for a character that is not ASCII; nothing where there is none.
std::optional<char> MacRomanFromCharacter(char32_t c) {
  const auto* found = std::lower_bound(
      kMacRomanByCharacter.begin(),
      kMacRomanByCharacter.end(),
      c,
      [](const MacRomanByte& entry, char32_t wanted) { return entry.unit < wanted; });
  if (found == kMacRomanByCharacter.end() || found->unit != c) return std::nullopt;
  return found->byte;
}

/// ICU counts in 32 bits; beyond that a text stays as it is.
constexpr std::size_t kMostUnitsToCompose = std::size_t{1} << 29;

}  // namespace

namespace portable {

std::size_t Utf16FromUtf8(std::string_view text, char16_t* out) {
  char16_t* const begin = out;
  for (std::size_t at = 0; at < text.size();) {
    if (text.size() - at >= 8 && IsAscii(text.data() + at)) {
      for (std::size_t i = 0; i < 8; ++i) out[i] = static_cast<unsigned char>(text[at + i]);
      at += 8;
      out += 8;
      continue;
    }
    const char32_t c = ReadUtf8(text, at);
    if (c == kInvalid) return kNotUtf8;
    out = PutUtf16(out, c);
  }
  return static_cast<std::size_t>(out - begin);
}

std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  char* const begin = out;
  for (std::size_t at = 0; at < text.size();) {
    if (text.size() - at >= 4 && IsAscii(text.data() + at)) {
      for (std::size_t i = 0; i < 4; ++i) out[i] = static_cast<char>(text[at + i]);
      at += 4;
      out += 4;
      continue;
    }
    out = PutUtf8(out, ReadUtf16(text, at));
  }
  return static_cast<std::size_t>(out - begin);
}

std::size_t Utf16FromAscii(std::string_view text, char16_t* out) {
  std::size_t at = 0;
  for (; at < text.size() && static_cast<unsigned char>(text[at]) < 0x80; ++at) {
    out[at] = static_cast<unsigned char>(text[at]);
  }
  return at;
}

std::size_t AsciiFromUtf16(std::u16string_view text, char* out) {
  std::size_t at = 0;
  for (; at < text.size() && text[at] < 0x80; ++at) out[at] = static_cast<char>(text[at]);
  return at;
}

std::size_t Utf16LengthOfValid(std::string_view text) {
  std::size_t length = 0;
  for (const char byte : text) {
    const auto value = static_cast<unsigned char>(byte);
    length += (value & 0xC0) != 0x80 ? 1 : 0;
    length += value >= 0xF0 ? 1 : 0;
  }
  return length;
}

}  // namespace portable

std::size_t Utf16LengthOfValid(std::string_view text) {
  if (!avx::IsSupported()) {
    return sse::IsSupported() ? sse::Utf16LengthOfValid(text) : portable::Utf16LengthOfValid(text);
  }
  const std::string_view rest = text.substr(text.size() / avx::kGroup * avx::kGroup);
  return avx::Utf16LengthOfGroups(text) + sse::Utf16LengthOfValid(rest);
}

std::size_t Utf16FromUtf8(std::string_view text, char16_t* out) {
  return sse::IsSupported() ? sse::Utf16FromUtf8(text, out) : portable::Utf16FromUtf8(text, out);
}

std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  return sse::IsSupported() ? sse::Utf8FromUtf16(text, out) : portable::Utf8FromUtf16(text, out);
}

#if defined(__SSE2__)

namespace {

constexpr std::size_t kBlock = sizeof(__m128i);

template <typename T>
__m128i Load(const T* from) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

template <typename T>
void Store(T* to, __m128i block) {
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to), block);
}

/// Blocks of 16 bytes, widened as long as all of them are ASCII.
template <std::size_t Count>
bool Widen(const char* from, char16_t* to) {
  __m128i blocks[Count];
  __m128i any = _mm_setzero_si128();
  for (std::size_t i = 0; i < Count; ++i) {
    blocks[i] = Load(from + i * kBlock);
    any = _mm_or_si128(any, blocks[i]);
  }
  if (_mm_movemask_epi8(any) != 0) return false;
  for (std::size_t i = 0; i < Count; ++i) {
    Store(to + i * kBlock, _mm_unpacklo_epi8(blocks[i], _mm_setzero_si128()));
    Store(to + i * kBlock + kBlock / 2, _mm_unpackhi_epi8(blocks[i], _mm_setzero_si128()));
  }
  return true;
}

/// The same the other way, sixteen units a block.
template <std::size_t Count>
bool Narrow(const char16_t* from, char* to) {
  __m128i halves[2 * Count];
  __m128i any = _mm_setzero_si128();
  for (std::size_t i = 0; i < 2 * Count; ++i) {
    halves[i] = Load(from + i * kBlock / 2);
    any = _mm_or_si128(any, halves[i]);
  }
  const __m128i high = _mm_and_si128(any, _mm_set1_epi16(-0x80));
  if (_mm_movemask_epi8(_mm_cmpeq_epi16(high, _mm_setzero_si128())) != 0xFFFF) return false;
  for (std::size_t i = 0; i < Count; ++i) {
    Store(to + i * kBlock, _mm_packus_epi16(halves[2 * i], halves[2 * i + 1]));
  }
  return true;
}

/// Goes on behind what is done, in steps of 64 and 16; the last one may go over what the one before
/// has done.
template <typename From, typename To>
std::size_t InBlocks(const From* from,
                     std::size_t size,
                     std::size_t at,
                     To* to,
                     bool (*four)(const From*, To*),
                     bool (*one)(const From*, To*)) {
  while (size - at >= 4 * kBlock && four(from + at, to + at)) at += 4 * kBlock;
  while (size - at >= kBlock && one(from + at, to + at)) at += kBlock;
  const bool nearEnd = size - at < kBlock && size >= kBlock;
  return nearEnd && one(from + size - kBlock, to + size - kBlock) ? size : at;
}

bool MayGoWide(std::size_t size) { return size >= 4 * avx::kGroup && avx::IsSupported(); }

/// Whether the units at `block` begin a group that may be read whole, far enough in a text to be
/// worth it.
bool IsGroupOfLongText(const void* block, std::size_t before) {
  constexpr std::size_t kGroupSize = avx::kGroup * sizeof(char16_t);
  return before >= 2 * kGroupSize && reinterpret_cast<std::uintptr_t>(block) % kGroupSize == 0 &&
         avx::IsSupported();
}

}  // namespace

std::size_t Utf16FromAscii(std::string_view text, char16_t* out) {
  const std::size_t wide = MayGoWide(text.size()) ? avx::Utf16FromAscii(text, out) : 0;
  const std::size_t done = InBlocks(text.data(), text.size(), wide, out, Widen<4>, Widen<1>);
  return done + portable::Utf16FromAscii(text.substr(done), out + done);
}

std::size_t AsciiFromUtf16(std::u16string_view text, char* out) {
  const std::size_t wide = MayGoWide(text.size()) ? avx::AsciiFromUtf16(text, out) : 0;
  const std::size_t done = InBlocks(text.data(), text.size(), wide, out, Narrow<4>, Narrow<1>);
  return done + portable::AsciiFromUtf16(text.substr(done), out + done);
}

// Aligned blocks of 16 bytes lie within one page, so the one that holds the terminator may be read
// whole, with what lies before the text and behind it. The reads stand in this function alone,
// where the sanitizers are told so.
__attribute__((no_sanitize("address", "thread"))) std::size_t Utf16Length(
    const unsigned short* text) {
  const auto before = reinterpret_cast<std::uintptr_t>(text) % sizeof(__m128i);
  const auto* block =
      reinterpret_cast<const __m128i*>(reinterpret_cast<const char*>(text) - before);
  unsigned inText = 0xFFFFU << before;  // Drops what the first block has before the text.
  for (std::size_t at = 0;; at += sizeof *block, ++block) {
    if (IsGroupOfLongText(block, at)) {
      const auto* units = reinterpret_cast<const unsigned short*>(block);
      const unsigned short* last = avx::GroupWithZero(units);
      at += static_cast<std::size_t>(last - units) * sizeof *units;
      block = reinterpret_cast<const __m128i*>(last);
    }
    const __m128i zeros = _mm_cmpeq_epi16(*block, _mm_setzero_si128());
    const unsigned found = static_cast<unsigned>(_mm_movemask_epi8(zeros)) & inText;
    if (found != 0) {
      return (at + static_cast<std::size_t>(std::countr_zero(found)) - before) / sizeof *text;
    }
    inText = 0xFFFF;
  }
}

#else

std::size_t Utf16FromAscii(std::string_view text, char16_t* out) {
  return portable::Utf16FromAscii(text, out);
}

std::size_t AsciiFromUtf16(std::u16string_view text, char* out) {
  return portable::AsciiFromUtf16(text, out);
}

std::size_t Utf16Length(const unsigned short* text) {
  std::size_t length = 0;
  while (text[length] != 0) ++length;
  return length;
}

#endif

namespace {

/// Eight bytes at a time; the last ones once more, with those before them.
template <typename Unit>
bool IsAsciiInWords(std::basic_string_view<Unit> text) {
  constexpr std::size_t kStep = sizeof(std::uint64_t) / sizeof(Unit);
  const std::size_t size = text.size();
  if (size < kStep)
    return std::all_of(text.begin(), text.end(), [](Unit unit) {
      return (static_cast<unsigned>(unit) & ~0x7FU) == 0;
    });
  std::uint64_t any = 0;
  const auto add = [&](std::size_t at) {
    std::uint64_t word = 0;
    std::memcpy(&word, text.data() + at, sizeof word);
    any |= word;
  };
  for (std::size_t at = 0; size - at >= kStep; at += kStep) add(at);
  add(size - kStep);
  return (any & (sizeof(Unit) == 1 ? 0x8080808080808080 : 0xFF80FF80FF80FF80)) == 0;
}

}  // namespace

bool IsAscii(std::string_view text) { return IsAsciiInWords(text); }

bool IsAscii(std::u16string_view text) { return IsAsciiInWords(text); }

std::optional<std::u16string> Utf16FromUtf8(std::string_view text) {
  std::u16string out(text.size() + kSlack, u'\0');
  const std::size_t length = Utf16FromUtf8(text, out.data());
  if (length == kNotUtf8) return std::nullopt;
  out.resize(length);
  return out;
}

std::string Utf8FromUtf16(std::u16string_view text) {
  std::string out(3 * text.size() + kSlack, '\0');
  out.resize(Utf8FromUtf16(text, out.data()));
  return out;
}

std::optional<std::size_t> Utf16LengthOfUtf8(std::string_view text) {
  std::size_t length = 0;
  for (std::size_t at = 0; at < text.size();) {
    if (text.size() - at >= 8 && IsAscii(text.data() + at)) {
      at += 8;
      length += 8;
      continue;
    }
    const char32_t c = ReadUtf8(text, at);
    if (c == kInvalid) return std::nullopt;
    length += c < 0x10000 ? 1 : 2;
  }
  return length;
}

std::size_t Utf8FromMacRoman(std::string_view text, char* out) {
  char* const begin = out;
  for (const char byte : text) {
    const auto value = static_cast<unsigned char>(byte);
    out = PutUtf8(out, value < 0x80 ? value : kMacRomanUpperHalf[value - 0x80U]);
  }
  return static_cast<std::size_t>(out - begin);
}

std::string Utf8FromMacRoman(std::string_view text) {
  std::string out(3 * text.size(), '\0');
  out.resize(Utf8FromMacRoman(text, out.data()));
  return out;
}

MacRomanText MacRomanFromUtf16(std::u16string_view text) {
  std::u16string composed;
  if (text.size() <= kMostUnitsToCompose && MayCompose(text)) {
    composed = Composed(text);
    text = composed;
  }
  MacRomanText out;
  out.bytes.reserve(text.size());
  for (std::size_t at = 0; at < text.size();) {
    const char32_t c = ReadUtf16(text, at);
    const std::optional<char> byte = c < 0x80 ? static_cast<char>(c) : MacRomanFromCharacter(c);
    out.isExact = out.isExact && byte.has_value();
    out.bytes.push_back(byte.value_or('?'));
  }
  return out;
}

}  // namespace orb::platform
