// SPDX-License-Identifier: MIT
#include "platform/transcode_sse.h"

#include "platform/transcode.h"

#if defined(__x86_64__) || defined(__i386__)

#include <immintrin.h>

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

// Functions for this target inline into each other, and into nothing else.
#define ORB_SSE __attribute__((target("sse4.1,popcnt")))
#define ORB_SSE_INLINE __attribute__((target("sse4.1,popcnt"), always_inline)) inline

namespace orb::platform::sse {
namespace {

constexpr std::size_t kBlock = 16;
/// A block is read together with the two bytes behind it.
constexpr std::size_t kReadAhead = 2;
constexpr std::uint8_t kDrop = 0x80;

using Shuffle = std::array<std::uint8_t, 16>;

/// For each set of lanes, the shuffle that moves them to the front.
constexpr auto kKeepLanes = [] {
  std::array<Shuffle, 256> table{};
  for (std::size_t set = 0; set < table.size(); ++set) {
    table[set].fill(kDrop);
    std::size_t to = 0;
    for (std::size_t lane = 0; lane < 8; ++lane) {
      if ((set >> lane & 1) == 0) continue;
      table[set][to++] = static_cast<std::uint8_t>(2 * lane);
      table[set][to++] = static_cast<std::uint8_t>(2 * lane + 1);
    }
  }
  return table;
}();

/// For each set of two-byte lanes among eight, the shuffle that keeps one byte of the others.
constexpr auto kOneOrTwoBytes = [] {
  std::array<Shuffle, 256> table{};
  for (std::size_t set = 0; set < table.size(); ++set) {
    table[set].fill(kDrop);
    std::size_t to = 0;
    for (std::size_t lane = 0; lane < 8; ++lane) {
      table[set][to++] = static_cast<std::uint8_t>(2 * lane);
      if ((set >> lane & 1) != 0) table[set][to++] = static_cast<std::uint8_t>(2 * lane + 1);
    }
  }
  return table;
}();

/// For four lanes of three bytes each: bits 0 to 3 say which keep at least two, bits 4 to 7 which
/// keep all three. What is dropped stands in front.
constexpr auto kOneToThreeBytes = [] {
  std::array<Shuffle, 256> table{};
  for (std::size_t set = 0; set < table.size(); ++set) {
    table[set].fill(kDrop);
    std::size_t to = 0;
    for (std::size_t lane = 0; lane < 4; ++lane) {
      const std::size_t kept = 1 + (set >> lane & 1) + (set >> (lane + 4) & 1);
      for (std::size_t byte = 3 - kept; byte < 3; ++byte) {
        table[set][to++] = static_cast<std::uint8_t>(4 * lane + byte);
      }
    }
  }
  return table;
}();

template <typename T>
ORB_SSE_INLINE __m128i Load(const T* from) {
  return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

template <typename T>
ORB_SSE_INLINE void Store(T* to, __m128i value) {
  _mm_storeu_si128(reinterpret_cast<__m128i*>(to), value);
}

ORB_SSE_INLINE __m128i Shuffled(__m128i value, const Shuffle& shuffle) {
  return _mm_shuffle_epi8(value, Load(shuffle.data()));
}

ORB_SSE_INLINE __m128i Bits16(__m128i value, int mask) {
  return _mm_and_si128(value, _mm_set1_epi16(static_cast<short>(mask)));
}

ORB_SSE_INLINE __m128i Bits32(__m128i value, int mask) {
  return _mm_and_si128(value, _mm_set1_epi32(mask));
}

/// One bit for each byte.
ORB_SSE_INLINE unsigned Mask(__m128i value) {
  return static_cast<unsigned>(_mm_movemask_epi8(value));
}

/// One bit for each of eight lanes.
ORB_SSE_INLINE unsigned LaneMask(__m128i lanes) {
  return Mask(_mm_packs_epi16(lanes, _mm_setzero_si128()));
}

ORB_SSE_INLINE unsigned AtLeast(__m128i bytes, int least) {
  return Mask(_mm_cmpeq_epi8(_mm_max_epu8(bytes, _mm_set1_epi8(static_cast<char>(least))), bytes));
}

/// What the bytes of a block are; one bit for each.
struct Leads {
  unsigned continuation;
  unsigned two;    // Leads two bytes or more.
  unsigned three;  // Leads three or more.
  unsigned four;
};

/// Eight bytes as the first of a character, with the bytes that follow each.
struct Lanes {
  __m128i pair;   // The first byte above the second.
  __m128i third;  // Zero-extended.
};

/// The units of the one- and two-byte characters that begin in the lanes.
ORB_SSE_INLINE __m128i UpToTwoBytes(__m128i pair) {
  const __m128i one = _mm_srli_epi16(pair, 8);
  const __m128i two = _mm_or_si128(Bits16(_mm_srli_epi16(pair, 2), 0x07C0), Bits16(pair, 0x3F));
  return _mm_blendv_epi8(one, two, _mm_srai_epi16(pair, 15));
}

/// The same up to three bytes. `bad` gets the lanes with a value that three bytes must not carry.
ORB_SSE_INLINE __m128i UpToThreeBytes(const Lanes& lanes, __m128i* bad) {
  const __m128i led =
      _mm_and_si128(_mm_srai_epi16(lanes.pair, 15),
                    _mm_cmpgt_epi16(lanes.pair, _mm_set1_epi16(static_cast<short>(0xDFFF))));
  const __m128i three =
      _mm_or_si128(_mm_or_si128(_mm_slli_epi16(lanes.pair, 4) & _mm_set1_epi16(-0x1000),
                                _mm_slli_epi16(Bits16(lanes.pair, 0x3F), 6)),
                   Bits16(lanes.third, 0x3F));
  const __m128i top = Bits16(three, 0xF800);
  const __m128i overlong = _mm_cmpeq_epi16(top, _mm_setzero_si128());
  const __m128i surrogate = _mm_cmpeq_epi16(top, _mm_set1_epi16(static_cast<short>(0xD800)));
  *bad = _mm_and_si128(led, _mm_or_si128(overlong, surrogate));
  return _mm_blendv_epi8(UpToTwoBytes(lanes.pair), three, led);
}

/// A character of four bytes gives its high surrogate in the lane of its first byte and its low one
/// in the lane of its second. The masks say which lanes those are.
ORB_SSE_INLINE __m128i
UpToFourBytes(const Lanes& lanes, __m128i units, __m128i first, __m128i second, __m128i* bad) {
  const __m128i high = _mm_add_epi16(
      _mm_set1_epi16(static_cast<short>(0xD7C0)),
      _mm_or_si128(
          _mm_or_si128(Bits16(lanes.pair, 0x0700), _mm_slli_epi16(Bits16(lanes.pair, 0x3F), 2)),
          Bits16(_mm_srli_epi16(lanes.third, 4), 3)));
  const __m128i low = _mm_or_si128(
      _mm_set1_epi16(static_cast<short>(0xDC00)),
      _mm_or_si128(_mm_slli_epi16(Bits16(lanes.pair, 0x0F), 6), Bits16(lanes.third, 0x3F)));
  const __m128i inRange =
      _mm_cmpeq_epi16(Bits16(high, 0xFC00), _mm_set1_epi16(static_cast<short>(0xD800)));
  *bad = _mm_or_si128(_mm_andnot_si128(first, *bad), _mm_andnot_si128(inRange, first));
  return _mm_blendv_epi8(_mm_blendv_epi8(units, high, first), low, second);
}

ORB_SSE_INLINE char16_t* StoreKept(char16_t* out, __m128i low, __m128i high, unsigned keep) {
  Store(out, Shuffled(low, kKeepLanes[keep & 0xFF]));
  out += std::popcount(keep & 0xFF);
  Store(out, Shuffled(high, kKeepLanes[keep >> 8]));
  return out + std::popcount(keep >> 8);
}

ORB_SSE_INLINE char16_t* StoreAscii(char16_t* out, __m128i bytes) {
  Store(out, _mm_unpacklo_epi8(bytes, _mm_setzero_si128()));
  Store(out + 8, _mm_unpackhi_epi8(bytes, _mm_setzero_si128()));
  return out + 16;
}

/// Five characters of three bytes each, the shape of most East Asian text. Null when a value is not
/// allowed.
ORB_SSE_INLINE char16_t* StoreFiveTriples(char16_t* out, __m128i bytes) {
  const __m128i first = _mm_shuffle_epi8(
      bytes, _mm_setr_epi8(-1, 0, -1, 3, -1, 6, -1, 9, -1, 12, -1, -1, -1, -1, -1, -1));
  const __m128i rest = _mm_shuffle_epi8(
      bytes, _mm_setr_epi8(2, 1, 5, 4, 8, 7, 11, 10, 14, 13, -1, -1, -1, -1, -1, -1));
  const __m128i units =
      _mm_or_si128(_mm_slli_epi16(first, 4),
                   _mm_or_si128(Bits16(_mm_srli_epi16(rest, 2), 0x0FC0), Bits16(rest, 0x3F)));
  const __m128i top = Bits16(units, 0xF800);
  const __m128i bad =
      _mm_or_si128(_mm_cmpeq_epi16(top, _mm_setzero_si128()),
                   _mm_cmpeq_epi16(top, _mm_set1_epi16(static_cast<short>(0xD800))));
  if ((Mask(bad) & 0x3FF) != 0) return nullptr;
  Store(out, units);
  return out + 5;
}

/// Where a conversion stands.
struct Place {
  const char* at;
  char16_t* out;
};

/// Converts the characters that lie whole in the first `limit` bytes of the block, which begins
/// with one and holds one that is not ASCII. False for what is no UTF-8.
ORB_SSE_INLINE bool ConvertBlock(Place* place, __m128i bytes, unsigned nonAscii, unsigned limit) {
  const unsigned continuation = Mask(_mm_cmplt_epi8(bytes, _mm_set1_epi8(-64)));
  const Leads leads = {
      continuation, nonAscii & ~continuation, AtLeast(bytes, 0xE0), AtLeast(bytes, 0xF0)};
  constexpr unsigned kFifteen = 0x7FFF;
  if (((leads.three ^ leads.four) & kFifteen) == 0x1249 && (continuation & kFifteen) == 0x6DB6 &&
      limit >= 15) {
    place->out = StoreFiveTriples(place->out, bytes);
    place->at += 15;
    return place->out != nullptr;
  }
  const unsigned expected = (leads.two << 1 | leads.three << 2 | leads.four << 3) & 0xFFFF;
  const __m128i tooSmall = _mm_cmpeq_epi8(_mm_and_si128(bytes, _mm_set1_epi8(-2)),
                                          _mm_set1_epi8(static_cast<char>(0xC0)));
  if (continuation != expected || Mask(tooSmall) != 0) return false;

  const unsigned cut = (leads.two & 0x8000) | (leads.three & 0xC000) | (leads.four & 0xE000);
  const unsigned whole = cut == 0 ? kBlock : static_cast<unsigned>(std::countr_zero(cut));
  const unsigned consumed = whole < limit ? whole : limit;
  const unsigned inside = (1U << consumed) - 1;

  const __m128i second = Load(place->at + 1);
  const __m128i lowPair = _mm_unpacklo_epi8(second, bytes);
  const __m128i highPair = _mm_unpackhi_epi8(second, bytes);
  if (leads.three == 0) {
    place->out = StoreKept(
        place->out, UpToTwoBytes(lowPair), UpToTwoBytes(highPair), ~continuation & inside);
    place->at += consumed;
    return true;
  }
  const __m128i zero = _mm_setzero_si128();
  const __m128i third = Load(place->at + 2);
  const Lanes low = {lowPair, _mm_unpacklo_epi8(third, zero)};
  const Lanes high = {highPair, _mm_unpackhi_epi8(third, zero)};
  __m128i badLow = zero;
  __m128i badHigh = zero;
  __m128i lowUnits = UpToThreeBytes(low, &badLow);
  __m128i highUnits = UpToThreeBytes(high, &badHigh);
  unsigned keep = ~continuation;
  if (leads.four != 0) {
    if (AtLeast(bytes, 0xF5) != 0) return false;
    const __m128i first =
        _mm_cmpeq_epi8(_mm_max_epu8(bytes, _mm_set1_epi8(static_cast<char>(0xF0))), bytes);
    const __m128i next = _mm_slli_si128(first, 1);
    lowUnits = UpToFourBytes(
        low, lowUnits, _mm_unpacklo_epi8(first, first), _mm_unpacklo_epi8(next, next), &badLow);
    highUnits = UpToFourBytes(
        high, highUnits, _mm_unpackhi_epi8(first, first), _mm_unpackhi_epi8(next, next), &badHigh);
    keep |= leads.four << 1;
  }
  if (Mask(_mm_or_si128(badLow, badHigh)) != 0) return false;
  place->out = StoreKept(place->out, lowUnits, highUnits, keep & inside);
  place->at += consumed;
  return true;
}

/// The last bytes, from a copy that zeros follow: a character that they cut short is no UTF-8.
ORB_SSE_INLINE char16_t* ConvertTail(const char* at, std::size_t left, char16_t* out) {
  std::array<char, 3 * kBlock> padded{};
  std::memcpy(padded.data(), at, left);
  Place place = {padded.data(), out};
  const char* end = padded.data() + left;
  while (place.at < end) {
    const auto rest = static_cast<unsigned>(end - place.at);
    const __m128i bytes = Load(place.at);
    const unsigned nonAscii = Mask(bytes);
    if (nonAscii == 0) {
      StoreAscii(place.out, bytes);
      const unsigned taken = rest < kBlock ? rest : kBlock;
      place.at += taken;
      place.out += taken;
    } else if (!ConvertBlock(&place, bytes, nonAscii, rest)) {
      return nullptr;
    }
  }
  return place.out;
}

}  // namespace

bool IsSupported() {
  return __builtin_cpu_supports("sse4.1") != 0 && __builtin_cpu_supports("popcnt") != 0;
}

ORB_SSE std::size_t Utf16FromUtf8(std::string_view text, char16_t* out) {
  Place place = {text.data(), out};
  const char* end = text.data() + text.size();
  const auto left = [&] { return static_cast<std::size_t>(end - place.at); };
  while (left() >= kBlock) {
    const __m128i bytes = Load(place.at);
    const unsigned nonAscii = Mask(bytes);
    if (nonAscii == 0) {
      place.out = StoreAscii(place.out, bytes);
      place.at += kBlock;
      continue;
    }
    if (left() < kBlock + kReadAhead) break;
    if (!ConvertBlock(&place, bytes, nonAscii, kBlock)) return kNotUtf8;
  }
  if (left() != 0) place.out = ConvertTail(place.at, left(), place.out);
  return place.out == nullptr ? kNotUtf8 : static_cast<std::size_t>(place.out - out);
}

namespace {

constexpr std::size_t kUnits = 8;

/// Eight units below U+0800.
ORB_SSE_INLINE char* StoreUpToTwoBytes(char* out, __m128i units) {
  const __m128i two =
      _mm_or_si128(_mm_or_si128(_mm_srli_epi16(units, 6), _mm_slli_epi16(Bits16(units, 0x3F), 8)),
                   _mm_set1_epi16(static_cast<short>(0x80C0)));
  const __m128i wide = _mm_cmpgt_epi16(units, _mm_set1_epi16(0x7F));
  const unsigned set = LaneMask(wide);
  Store(out, Shuffled(_mm_blendv_epi8(units, two, wide), kOneOrTwoBytes[set]));
  return out + kUnits + std::popcount(set);
}

/// Four units, zero-extended. `high` and `low` mark surrogates, which are all paired; `before`
/// holds the unit before each.
ORB_SSE_INLINE char* StoreUpToThreeBytes(
    char* out, __m128i units, __m128i high, __m128i low, __m128i before) {
  const __m128i ge80 = _mm_cmpgt_epi32(units, _mm_set1_epi32(0x7F));
  const __m128i surrogate = _mm_or_si128(high, low);
  const __m128i ge800 = _mm_andnot_si128(surrogate, _mm_cmpgt_epi32(units, _mm_set1_epi32(0x7FF)));

  const __m128i last = _mm_slli_epi32(_mm_or_si128(Bits32(units, 0x3F), _mm_set1_epi32(0x80)), 16);
  const __m128i first = _mm_or_si128(_mm_srli_epi32(units, 12), _mm_set1_epi32(0xE0));
  const __m128i middle = Bits32(_mm_srli_epi32(units, 6), 0x3F);
  // The middle byte leads where there are two.
  const __m128i mark = _mm_blendv_epi8(_mm_set1_epi32(0xC0), _mm_set1_epi32(0x80), ge800);
  __m128i bytes =
      _mm_or_si128(first, _mm_or_si128(_mm_slli_epi32(_mm_or_si128(middle, mark), 8), last));
  bytes = _mm_blendv_epi8(_mm_slli_epi32(units, 16), bytes, ge80);

  // Of a pair each unit gives two of the four bytes.
  const __m128i top = _mm_add_epi32(Bits32(units, 0x3FF), _mm_set1_epi32(0x40));
  const __m128i ofHigh =
      _mm_or_si128(_mm_or_si128(Bits32(top, 0x700), _mm_slli_epi32(Bits32(top, 0xFC), 14)),
                   _mm_set1_epi32(0x80F000));
  const __m128i ofLow = _mm_or_si128(
      _mm_or_si128(_mm_slli_epi32(Bits32(before, 3), 12), _mm_slli_epi32(Bits32(units, 0x3C0), 2)),
      _mm_or_si128(last, _mm_set1_epi32(0x8000)));
  bytes = _mm_blendv_epi8(_mm_blendv_epi8(bytes, ofHigh, high), ofLow, low);

  const auto set = static_cast<unsigned>(_mm_movemask_ps(_mm_castsi128_ps(ge80)) |
                                         _mm_movemask_ps(_mm_castsi128_ps(ge800)) << 4);
  Store(out, Shuffled(bytes, kOneToThreeBytes[set]));
  return out + 4 + std::popcount(set);
}

/// Any eight units, the first of which is no half of a pair begun before. Null where a surrogate
/// stands alone; a pair cut by the end is left for the next call.
ORB_SSE_INLINE char* StoreUnits(char* out, __m128i units, unsigned* taken) {
  const __m128i kind = Bits16(units, 0xFC00);
  const __m128i high = _mm_cmpeq_epi16(kind, _mm_set1_epi16(static_cast<short>(0xD800)));
  const __m128i low = _mm_cmpeq_epi16(kind, _mm_set1_epi16(static_cast<short>(0xDC00)));
  const unsigned highSet = LaneMask(high);
  if (LaneMask(low) != (highSet << 1 & 0xFF)) return nullptr;
  const __m128i zero = _mm_setzero_si128();
  const __m128i before = _mm_slli_si128(units, 2);
  out = StoreUpToThreeBytes(out,
                            _mm_unpacklo_epi16(units, zero),
                            _mm_unpacklo_epi16(high, high),
                            _mm_unpacklo_epi16(low, low),
                            _mm_unpacklo_epi16(before, zero));
  out = StoreUpToThreeBytes(out,
                            _mm_unpackhi_epi16(units, zero),
                            _mm_unpackhi_epi16(high, high),
                            _mm_unpackhi_epi16(low, low),
                            _mm_unpackhi_epi16(before, zero));
  const unsigned cut = highSet >> 7;
  *taken = kUnits - cut;
  return out - 2 * cut;
}

}  // namespace

ORB_SSE std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  const char* const begin = out;
  while (text.size() >= kUnits) {
    const __m128i units = Load(text.data());
    unsigned taken = kUnits;
    if (_mm_testz_si128(units, _mm_set1_epi16(-0x80))) {
      _mm_storel_epi64(reinterpret_cast<__m128i*>(out), _mm_packus_epi16(units, units));
      out += kUnits;
    } else if (_mm_testz_si128(units, _mm_set1_epi16(-0x800))) {
      out = StoreUpToTwoBytes(out, units);
    } else if (char* stored = StoreUnits(out, units, &taken)) {
      out = stored;
    } else {
      // A surrogate alone: the plain way knows what to do, up to a unit that begins a character.
      const bool cut = (text[kUnits - 1] & 0xFC00) == 0xD800;
      taken = cut ? kUnits - 1 : kUnits;
      out += portable::Utf8FromUtf16(text.substr(0, taken), out);
    }
    text.remove_prefix(taken);
  }
  return static_cast<std::size_t>(out - begin) + portable::Utf8FromUtf16(text, out);
}

}  // namespace orb::platform::sse

#else

namespace orb::platform::sse {

bool IsSupported() { return false; }
std::size_t Utf16FromUtf8(std::string_view text, char16_t* out) {
  return portable::Utf16FromUtf8(text, out);
}
std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  return portable::Utf8FromUtf16(text, out);
}

}  // namespace orb::platform::sse

#endif
