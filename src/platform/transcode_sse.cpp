// SPDX-License-Identifier: MIT
#include "platform/transcode_sse.h"

#include "platform/transcode.h"

#if defined(__x86_64__)

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

/// One bit for each byte of a block.
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

/// As far as the text is ASCII, in steps of 64 and 16; the first 16 bytes are known to be.
ORB_SSE_INLINE std::size_t WidenAscii(const char* from, std::size_t left, char16_t* out) {
  std::size_t at = 0;
  for (; left - at >= 4 * kBlock; at += 4 * kBlock) {
    const __m128i a = Load(from + at);
    const __m128i b = Load(from + at + kBlock);
    const __m128i c = Load(from + at + 2 * kBlock);
    const __m128i d = Load(from + at + 3 * kBlock);
    if (Mask(_mm_or_si128(_mm_or_si128(a, b), _mm_or_si128(c, d))) != 0) break;
    char16_t* to = out + at;
    for (const __m128i bytes : {a, b, c, d}) to = StoreAscii(to, bytes);
  }
  for (; left - at >= kBlock; at += kBlock) {
    const __m128i bytes = Load(from + at);
    if (Mask(bytes) != 0) break;
    StoreAscii(out + at, bytes);
  }
  return at;
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

/// The lanes of a block's first eight bytes and of its last.
struct Halves {
  __m128i low;
  __m128i high;

  ORB_SSE_INLINE bool Any() const { return Mask(_mm_or_si128(low, high)) != 0; }
};

/// Where a conversion stands.
struct Place {
  const char* at;
  char16_t* out;
};

/// What the bytes of a block are; one bit for each.
ORB_SSE_INLINE Leads LeadsOf(__m128i bytes, unsigned nonAscii) {
  const unsigned continuation = Mask(_mm_cmplt_epi8(bytes, _mm_set1_epi8(-64)));
  return {continuation, nonAscii & ~continuation, AtLeast(bytes, 0xE0), AtLeast(bytes, 0xF0)};
}

/// How many bytes of a block belong to characters that lie whole in it, as long as it is valid.
/// Read from its last bytes and not from masks, because the next block waits for it.
ORB_SSE_INLINE unsigned Whole(const char* block) {
  const auto isAtLeast = [block](std::size_t at, unsigned lead) {
    return static_cast<unsigned>(static_cast<unsigned char>(block[at]) >= lead);
  };
  return static_cast<unsigned>(kBlock) - isAtLeast(15, 0xC0) - 2 * isAtLeast(14, 0xE0) -
         3 * isAtLeast(13, 0xF0);
}

ORB_SSE_INLINE unsigned Expected(const Leads& leads) {
  return (leads.two << 1 | leads.three << 2 | leads.four << 3) & 0xFFFF;
}

/// Sets the units of the characters of four bytes. False for values that they must not carry.
ORB_SSE_INLINE bool SetFours(
    __m128i bytes, const Lanes& low, const Lanes& high, Halves* units, Halves* bad) {
  const __m128i first =
      _mm_cmpeq_epi8(_mm_max_epu8(bytes, _mm_set1_epi8(static_cast<char>(0xF0))), bytes);
  const __m128i next = _mm_slli_si128(first, 1);
  units->low = UpToFourBytes(
      low, units->low, _mm_unpacklo_epi8(first, first), _mm_unpacklo_epi8(next, next), &bad->low);
  units->high = UpToFourBytes(high,
                              units->high,
                              _mm_unpackhi_epi8(first, first),
                              _mm_unpackhi_epi8(next, next),
                              &bad->high);
  return AtLeast(bytes, 0xF5) == 0;
}

/// The character that four bytes hold; 0 where they hold none.
std::uint32_t FourByteCharacter(const char* at) {
  std::uint32_t bytes = 0;
  std::memcpy(&bytes, at, sizeof bytes);
  if ((bytes & 0xC0C0C0F8) != 0x808080F0) return 0;
  const std::uint32_t value = (bytes & 0x07) << 18 | (bytes & 0x3F00) << 4 |
                              (bytes & 0x3F0000) >> 10 | (bytes & 0x3F000000) >> 24;
  return value >= 0x10000 && value <= 0x10FFFF ? value : 0;
}

/// Among ASCII, characters of four bytes stand in small groups: takes a block's ASCII up to such a
/// group, and the group, so that the next block begins in step with the text. Takes nothing where
/// the first character beyond ASCII is of another kind.
ORB_SSE_INLINE void ConvertGroup(Place* place, __m128i bytes, unsigned nonAscii, const char* end) {
  const int ascii = std::countr_zero(nonAscii);
  const char* at = place->at + ascii;
  char16_t* out = place->out + ascii;
  const auto next = [&] { return end - at >= 4 ? FourByteCharacter(at) : 0; };
  std::uint32_t value = next();
  if (value == 0) return;
  StoreAscii(place->out, bytes);
  do {
    *out++ = static_cast<char16_t>(0xD7C0 + (value >> 10));
    *out++ = static_cast<char16_t>(0xDC00 + (value & 0x3FF));
    at += 4;
    value = next();
  } while (value != 0);
  *place = {at, out};
}

ORB_SSE_INLINE bool HasTooSmallLead(__m128i bytes) {
  const __m128i pairs = _mm_and_si128(bytes, _mm_set1_epi8(-2));
  return Mask(_mm_cmpeq_epi8(pairs, _mm_set1_epi8(static_cast<char>(0xC0)))) != 0;
}

/// ConvertBlock() for a whole block without a lead of three bytes or more, as most European text
/// has them.
ORB_SSE_INLINE bool ConvertUpToTwoBytes(Place* place, __m128i bytes, unsigned nonAscii) {
  const unsigned continuation = Mask(_mm_cmplt_epi8(bytes, _mm_set1_epi8(-64)));
  const unsigned expected = (nonAscii & ~continuation) << 1 & 0xFFFF;
  if (continuation != expected || HasTooSmallLead(bytes)) return false;
  const bool isCut = static_cast<unsigned char>(place->at[kBlock - 1]) >= 0xC0;
  const __m128i second = Load(place->at + 1);
  place->at += isCut ? kBlock - 1 : kBlock;
  place->out = StoreKept(place->out,
                         UpToTwoBytes(_mm_unpacklo_epi8(second, bytes)),
                         UpToTwoBytes(_mm_unpackhi_epi8(second, bytes)),
                         ~continuation & (isCut ? 0x7FFF : 0xFFFF));
  return true;
}

/// Converts the characters that lie whole in the first `limit` bytes of the block, which begins
/// with one and holds one that is not ASCII. False for what is no UTF-8.
ORB_SSE_INLINE bool ConvertBlock(Place* place, __m128i bytes, unsigned nonAscii, unsigned limit) {
  const Leads leads = LeadsOf(bytes, nonAscii);
  constexpr unsigned kFifteen = 0x7FFF;
  if (((leads.three ^ leads.four) & kFifteen) == 0x1249 &&
      (leads.continuation & kFifteen) == 0x6DB6 && limit >= 15) {
    place->out = StoreFiveTriples(place->out, bytes);
    place->at += 15;
    return place->out != nullptr;
  }
  if (leads.continuation != Expected(leads) || HasTooSmallLead(bytes)) return false;
  const unsigned whole = Whole(place->at);
  const unsigned consumed = whole < limit ? whole : limit;
  const unsigned inside = (1U << consumed) - 1;

  const __m128i zero = _mm_setzero_si128();
  const __m128i second = Load(place->at + 1);
  const __m128i third = Load(place->at + 2);
  const Lanes low = {_mm_unpacklo_epi8(second, bytes), _mm_unpacklo_epi8(third, zero)};
  const Lanes high = {_mm_unpackhi_epi8(second, bytes), _mm_unpackhi_epi8(third, zero)};
  unsigned keep = ~leads.continuation & inside;
  place->at += consumed;
  if (leads.three == 0) {
    place->out = StoreKept(place->out, UpToTwoBytes(low.pair), UpToTwoBytes(high.pair), keep);
    return true;
  }
  Halves bad;
  Halves units = {UpToThreeBytes(low, &bad.low), UpToThreeBytes(high, &bad.high)};
  if (leads.four != 0) {
    if (!SetFours(bytes, low, high, &units, &bad)) return false;
    keep |= leads.four << 1 & inside;
  }
  if (bad.Any()) return false;
  place->out = StoreKept(place->out, units.low, units.high, keep);
  return true;
}

/// Fewer bytes than a block at the end of a text that has a block. Where that one is ASCII it is
/// taken whole, over what is done of it.
ORB_SSE_INLINE bool WidenTail(const char* at, std::size_t left, char16_t* out) {
  const std::size_t again = kBlock - left;
  const __m128i bytes = Load(at - again);
  if (Mask(bytes) != 0) return false;
  StoreAscii(out - again, bytes);
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
      const std::size_t ascii = WidenAscii(place.at, left(), place.out);
      place.at += ascii;
      place.out += ascii;
      continue;
    }
    if (left() < kBlock + kReadAhead) break;
    if (AtLeast(bytes, 0xE0) == 0) {
      if (!ConvertUpToTwoBytes(&place, bytes, nonAscii)) return kNotUtf8;
      continue;
    }
    if (AtLeast(bytes, 0xF0) != 0) {
      const char* const before = place.at;
      ConvertGroup(&place, bytes, nonAscii, end);
      if (place.at != before) continue;
    }
    if (!ConvertBlock(&place, bytes, nonAscii, kBlock)) return kNotUtf8;
  }
  if (left() == 0) return static_cast<std::size_t>(place.out - out);
  if (left() < kBlock && text.size() >= kBlock && WidenTail(place.at, left(), place.out)) {
    return static_cast<std::size_t>(place.out - out) + left();
  }
  place.out = ConvertTail(place.at, left(), place.out);
  return place.out == nullptr ? kNotUtf8 : static_cast<std::size_t>(place.out - out);
}

namespace {

constexpr std::size_t kUnits = 8;

ORB_SSE_INLINE __m128i TwoBytes(__m128i units) {
  return _mm_or_si128(
      _mm_or_si128(_mm_srli_epi16(units, 6), _mm_slli_epi16(Bits16(units, 0x3F), 8)),
      _mm_set1_epi16(static_cast<short>(0x80C0)));
}

/// Writes ASCII units as one byte and the others as the two of `bytes`.
ORB_SSE_INLINE char* StoreUpToTwoBytes(char* out, __m128i units, __m128i bytes) {
  const __m128i one = _mm_cmpeq_epi16(Bits16(units, 0xFF80), _mm_setzero_si128());
  const unsigned set = LaneMask(one) ^ 0xFF;
  Store(out, Shuffled(_mm_blendv_epi8(bytes, units, one), kOneOrTwoBytes[set]));
  return out + kUnits + std::popcount(set);
}

/// Which of eight units are surrogates.
struct Surrogates {
  __m128i high;
  __m128i low;
};

/// Of the four bytes of a pair each unit gives two.
ORB_SSE_INLINE __m128i BytesOfPairs(__m128i units, const Surrogates& surrogates) {
  const __m128i top = _mm_add_epi16(Bits16(units, 0x3FF), _mm_set1_epi16(0x40));
  const __m128i ofHigh =
      _mm_or_si128(_mm_or_si128(_mm_srli_epi16(top, 8), Bits16(_mm_slli_epi16(top, 6), 0x3F00)),
                   _mm_set1_epi16(static_cast<short>(0x80F0)));
  const __m128i before = _mm_slli_si128(units, 2);
  const __m128i ofLow = _mm_or_si128(
      _mm_or_si128(_mm_slli_epi16(Bits16(before, 3), 4), Bits16(_mm_srli_epi16(units, 6), 0x0F)),
      _mm_or_si128(_mm_slli_epi16(Bits16(units, 0x3F), 8),
                   _mm_set1_epi16(static_cast<short>(0x8080))));
  return _mm_blendv_epi8(ofHigh, ofLow, surrogates.low);
}

/// What the bytes of eight units are: each unit gives the last one, two or three of a head of two
/// bytes and a tail of one.
struct Triples {
  __m128i head;
  __m128i tail;
  unsigned two;    // One bit for each unit that gives two bytes or more.
  unsigned three;  // That gives three.
};

ORB_SSE_INLINE char* StoreTriples(char* out, const Triples& bytes) {
  const unsigned low = (bytes.two & 0xF) | (bytes.three & 0xF) << 4;
  const unsigned high = bytes.two >> 4 | (bytes.three & 0xF0);
  Store(out, Shuffled(_mm_unpacklo_epi16(bytes.head, bytes.tail), kOneToThreeBytes[low]));
  out += 4 + std::popcount(low);
  Store(out, Shuffled(_mm_unpackhi_epi16(bytes.head, bytes.tail), kOneToThreeBytes[high]));
  return out + 4 + std::popcount(high);
}

ORB_SSE_INLINE __m128i TailOf(__m128i units) {
  return _mm_or_si128(Bits16(units, 0x3F), _mm_set1_epi16(0x80));
}

ORB_SSE_INLINE __m128i HeadOfThree(__m128i units) {
  return _mm_or_si128(
      _mm_or_si128(_mm_srli_epi16(units, 12), Bits16(_mm_slli_epi16(units, 2), 0x3F00)),
      _mm_set1_epi16(static_cast<short>(0x80E0)));
}

/// Eight units that all take three bytes.
ORB_SSE_INLINE char* StoreThreeBytes(char* out, __m128i units) {
  const __m128i head = HeadOfThree(units);
  const __m128i tail = TailOf(units);
  const __m128i pack = _mm_setr_epi8(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, -1, -1, -1, -1);
  Store(out, _mm_shuffle_epi8(_mm_unpacklo_epi16(head, tail), pack));
  Store(out + 12, _mm_shuffle_epi8(_mm_unpackhi_epi16(head, tail), pack));
  return out + 24;
}

/// Any eight units without surrogates.
ORB_SSE_INLINE Triples UpToThreeBytes(__m128i units) {
  const __m128i zero = _mm_setzero_si128();
  const __m128i one = _mm_cmpeq_epi16(Bits16(units, 0xFF80), zero);
  const __m128i upToTwo = _mm_cmpeq_epi16(Bits16(units, 0xF800), zero);
  // The second byte of the head leads where there are two.
  const __m128i headOfTwo = _mm_or_si128(Bits16(_mm_slli_epi16(units, 2), 0x1F00),
                                         _mm_set1_epi16(static_cast<short>(0xC000)));
  return {_mm_blendv_epi8(HeadOfThree(units), headOfTwo, upToTwo),
          _mm_blendv_epi8(TailOf(units), units, one),
          LaneMask(one) ^ 0xFF,
          LaneMask(upToTwo) ^ 0xFF};
}

/// The surrogates of a block whose first unit is no half of a pair begun before.
struct Pairs {
  Surrogates lanes;
  unsigned high;
  unsigned low;

  bool AreWhole() const { return low == (high << 1 & 0xFF); }
};

/// 1 where the last of eight units begins a pair that they do not end. Read from that unit and not
/// from a mask, because the next block waits for it.
unsigned CutPair(std::u16string_view text) { return (text[kUnits - 1] & 0xFC00) == 0xD800 ? 1 : 0; }

ORB_SSE_INLINE Pairs PairsIn(__m128i units) {
  const __m128i kind = Bits16(units, 0xFC00);
  const Surrogates lanes = {_mm_cmpeq_epi16(kind, _mm_set1_epi16(static_cast<short>(0xD800))),
                            _mm_cmpeq_epi16(kind, _mm_set1_epi16(static_cast<short>(0xDC00)))};
  return {lanes, LaneMask(lanes.high), LaneMask(lanes.low)};
}

/// Any eight units whose surrogates are paired, but for one at the end.
ORB_SSE_INLINE char* StoreUnits(char* out, __m128i units, const Pairs& pairs) {
  Triples bytes = UpToThreeBytes(units);
  if ((pairs.high | pairs.low) == 0) {
    return bytes.three == 0xFF ? StoreThreeBytes(out, units) : StoreTriples(out, bytes);
  }
  const __m128i any = _mm_or_si128(pairs.lanes.high, pairs.lanes.low);
  const __m128i two = BytesOfPairs(units, pairs.lanes);
  bytes.head = _mm_blendv_epi8(bytes.head, _mm_slli_epi16(two, 8), any);
  bytes.tail = _mm_blendv_epi8(bytes.tail, _mm_srli_epi16(two, 8), any);
  bytes.three &= ~(pairs.high | pairs.low);
  return StoreTriples(out, bytes);
}

ORB_SSE_INLINE void StoreAscii(char* out, __m128i units) {
  _mm_storel_epi64(reinterpret_cast<__m128i*>(out), _mm_packus_epi16(units, units));
}

bool IsPair(std::u16string_view text) {
  if (text.size() < 2) return false;
  std::uint32_t both = 0;
  std::memcpy(&both, text.data(), sizeof both);
  return (both & 0xFC00FC00) == 0xDC00D800;
}

std::uint32_t BytesOfPair(std::u16string_view text) {
  const std::uint32_t top = (text[0] & 0x3FFU) + 0x40;
  const std::uint32_t low = text[1];
  return 0x808080F0 | top >> 8 | (top & 0xFC) << 6 | (top & 3) << 20 | (low & 0x3C0) << 10 |
         (low & 0x3F) << 24;
}

/// Among ASCII, pairs stand in small groups: takes a block's ASCII up to such a group, and the
/// group, so that the next block begins in step with the text.
ORB_SSE_INLINE char* StoreGroup(char* out,
                                __m128i units,
                                std::size_t ascii,
                                std::u16string_view* text) {
  StoreAscii(out, units);
  out += ascii;
  text->remove_prefix(ascii);
  do {
    const std::uint32_t bytes = BytesOfPair(*text);
    std::memcpy(out, &bytes, sizeof bytes);
    out += sizeof bytes;
    text->remove_prefix(2);
  } while (IsPair(*text));
  return out;
}

ORB_SSE_INLINE bool AreAscii(__m128i units) {
  return _mm_testz_si128(units, _mm_set1_epi16(-0x80)) != 0;
}

/// As far as the text is ASCII, in steps of 64, 16 and 8; the first 8 units are known to be.
ORB_SSE_INLINE std::size_t CopyAscii(std::u16string_view text, char* out) {
  const char16_t* const from = text.data();
  std::size_t at = 0;
  for (; text.size() - at >= 64; at += 64) {
    __m128i units[8];
    __m128i any = _mm_setzero_si128();
    for (std::size_t i = 0; i < 8; ++i) {
      units[i] = Load(from + at + i * kUnits);
      any = _mm_or_si128(any, units[i]);
    }
    if (!AreAscii(any)) break;
    for (std::size_t i = 0; i < 8; i += 2) {
      Store(out + at + i * kUnits, _mm_packus_epi16(units[i], units[i + 1]));
    }
  }
  for (; text.size() - at >= 2 * kUnits; at += 2 * kUnits) {
    const __m128i a = Load(from + at);
    const __m128i b = Load(from + at + kUnits);
    if (!AreAscii(_mm_or_si128(a, b))) break;
    Store(out + at, _mm_packus_epi16(a, b));
  }
  if (text.size() - at < kUnits || !AreAscii(Load(from + at))) return at;
  StoreAscii(out + at, Load(from + at));
  return at + kUnits;
}

/// The same with units as WidenTail() does with bytes.
ORB_SSE_INLINE bool NarrowTail(std::u16string_view tail, char* out) {
  const std::size_t again = kUnits - tail.size();
  const __m128i units = Load(tail.data() - again);
  if (!AreAscii(units)) return false;
  StoreAscii(out - again, units);
  return true;
}

/// How long the text begins with ASCII, in whole steps of 64.
ORB_SSE_INLINE std::size_t AsciiLength(std::string_view text) {
  std::size_t at = 0;
  for (; text.size() - at >= 4 * kBlock; at += 4 * kBlock) {
    const char* from = text.data() + at;
    const __m128i a = _mm_or_si128(Load(from), Load(from + kBlock));
    const __m128i b = _mm_or_si128(Load(from + 2 * kBlock), Load(from + 3 * kBlock));
    if (Mask(_mm_or_si128(a, b)) != 0) break;
  }
  return at;
}

}  // namespace

ORB_SSE std::size_t Utf16LengthOfValid(std::string_view text) {
  constexpr std::size_t kRound = 127;  // So many blocks add up to no more than a byte holds.
  const __m128i zero = _mm_setzero_si128();
  const std::size_t ascii = AsciiLength(text);
  text.remove_prefix(ascii);
  __m128i sum = zero;
  std::size_t blocks = text.size() / kBlock;
  const char* at = text.data();
  while (blocks != 0) {
    __m128i counts = zero;
    const std::size_t round = blocks < kRound ? blocks : kRound;
    for (std::size_t i = 0; i < round; ++i, at += kBlock) {
      const __m128i bytes = Load(at);
      const __m128i first = _mm_cmpgt_epi8(bytes, _mm_set1_epi8(-65));
      const __m128i four =
          _mm_cmpeq_epi8(_mm_max_epu8(bytes, _mm_set1_epi8(static_cast<char>(0xF0))), bytes);
      counts = _mm_sub_epi8(_mm_sub_epi8(counts, first), four);
    }
    sum = _mm_add_epi64(sum, _mm_sad_epu8(counts, zero));
    blocks -= round;
  }
  const auto counted = static_cast<std::size_t>(_mm_cvtsi128_si64(sum)) +
                       static_cast<std::size_t>(_mm_extract_epi64(sum, 1));
  return ascii + counted + portable::Utf16LengthOfValid(text.substr(text.size() / kBlock * kBlock));
}

ORB_SSE std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  const char* const begin = out;
  const bool hasBlock = text.size() >= kUnits;
  bool wasAscii = false;
  while (text.size() >= kUnits) {
    const __m128i units = Load(text.data());
    const unsigned one = Mask(_mm_cmpeq_epi16(Bits16(units, 0xFF80), _mm_setzero_si128()));
    if (one == 0xFFFF) {
      // A block alone is taken alone: only the second in a row promises more.
      StoreAscii(out, units);
      const std::size_t ascii = wasAscii ? CopyAscii(text, out) : kUnits;
      out += ascii;
      text.remove_prefix(ascii);
      wasAscii = true;
      continue;
    }
    wasAscii = false;
    const auto ascii = static_cast<std::size_t>(std::countr_one(one)) / 2;
    if (IsPair(text.substr(ascii))) {
      out = StoreGroup(out, units, ascii, &text);
      continue;
    }
    if (_mm_testz_si128(units, _mm_set1_epi16(-0x800))) {
      out = StoreUpToTwoBytes(out, units, TwoBytes(units));
      text.remove_prefix(kUnits);
      continue;
    }
    const Pairs pairs = PairsIn(units);
    const std::size_t cut = CutPair(text);
    if (pairs.AreWhole()) {
      out = StoreUnits(out, units, pairs) - 2 * cut;
    } else {
      // A surrogate alone, for which the plain way knows what to do.
      out += portable::Utf8FromUtf16(text.substr(0, kUnits - cut), out);
    }
    text.remove_prefix(kUnits - cut);
  }
  const auto done = static_cast<std::size_t>(out - begin);
  if (hasBlock && !text.empty() && NarrowTail(text, out)) return done + text.size();
  return done + portable::Utf8FromUtf16(text, out);
}

}  // namespace orb::platform::sse

#else

namespace orb::platform::sse {

bool IsSupported() { return false; }
std::size_t Utf16LengthOfValid(std::string_view text) { return portable::Utf16LengthOfValid(text); }
std::size_t Utf16FromUtf8(std::string_view text, char16_t* out) {
  return portable::Utf16FromUtf8(text, out);
}
std::size_t Utf8FromUtf16(std::u16string_view text, char* out) {
  return portable::Utf8FromUtf16(text, out);
}

}  // namespace orb::platform::sse

#endif
