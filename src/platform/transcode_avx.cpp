// SPDX-License-Identifier: MIT
#include "platform/transcode_avx.h"

#if defined(__x86_64__)

#include <immintrin.h>

// Functions for this target inline into each other, and into nothing else.
#define ORB_AVX __attribute__((target("avx2")))
#define ORB_AVX_INLINE __attribute__((target("avx2"), always_inline)) inline

namespace orb::platform::avx {
namespace {

/// Units in a register.
constexpr std::size_t kUnits = 16;

template <typename T>
ORB_AVX_INLINE __m256i Load(const T* from) {
  return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(from));
}

template <typename T>
ORB_AVX_INLINE void Store(T* to, __m256i value) {
  _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), value);
}

ORB_AVX_INLINE void WidenHalf(__m256i bytes, char16_t* out) {
  Store(out, _mm256_cvtepu8_epi16(_mm256_castsi256_si128(bytes)));
  Store(out + kUnits, _mm256_cvtepu8_epi16(_mm256_extracti128_si256(bytes, 1)));
}

/// The registers' halves are packed side by side, and so change places.
ORB_AVX_INLINE void NarrowHalf(__m256i a, __m256i b, char* out) {
  Store(out, _mm256_permute4x64_epi64(_mm256_packus_epi16(a, b), 0xD8));
}

/// How many units begin at each byte: the first of a character, and once more that of four bytes.
ORB_AVX_INLINE __m256i Counted(__m256i counts, __m256i bytes) {
  const __m256i first = _mm256_cmpgt_epi8(bytes, _mm256_set1_epi8(-65));
  const __m256i four =
      _mm256_cmpeq_epi8(_mm256_max_epu8(bytes, _mm256_set1_epi8(static_cast<char>(0xF0))), bytes);
  return _mm256_sub_epi8(_mm256_sub_epi8(counts, first), four);
}

ORB_AVX_INLINE std::size_t Sum(__m256i counts) {
  const __m256i sums = _mm256_sad_epu8(counts, _mm256_setzero_si256());
  return static_cast<std::size_t>(_mm256_extract_epi64(sums, 0) + _mm256_extract_epi64(sums, 1) +
                                  _mm256_extract_epi64(sums, 2) + _mm256_extract_epi64(sums, 3));
}

}  // namespace

bool IsSupported() { return __builtin_cpu_supports("avx2") != 0; }

ORB_AVX std::size_t Utf16FromAscii(std::string_view text, char16_t* out) {
  std::size_t at = 0;
  for (; text.size() - at >= kGroup; at += kGroup) {
    const __m256i low = Load(text.data() + at);
    const __m256i high = Load(text.data() + at + kGroup / 2);
    if (_mm256_movemask_epi8(_mm256_or_si256(low, high)) != 0) break;
    WidenHalf(low, out + at);
    WidenHalf(high, out + at + kGroup / 2);
  }
  return at;
}

ORB_AVX std::size_t AsciiFromUtf16(std::u16string_view text, char* out) {
  std::size_t at = 0;
  for (; text.size() - at >= kGroup; at += kGroup) {
    const char16_t* from = text.data() + at;
    const __m256i a = Load(from);
    const __m256i b = Load(from + kUnits);
    const __m256i c = Load(from + 2 * kUnits);
    const __m256i d = Load(from + 3 * kUnits);
    const __m256i any = _mm256_or_si256(_mm256_or_si256(a, b), _mm256_or_si256(c, d));
    if (_mm256_testz_si256(any, _mm256_set1_epi16(-0x80)) == 0) break;
    NarrowHalf(a, b, out + at);
    NarrowHalf(c, d, out + at + kGroup / 2);
  }
  return at;
}

ORB_AVX std::size_t Utf16LengthOfGroups(std::string_view text) {
  constexpr std::size_t kRound = 63;  // So many groups add up to no more than a byte holds.
  std::size_t length = 0;
  std::size_t groups = text.size() / kGroup;
  const char* at = text.data();
  while (groups != 0) {
    __m256i counts = _mm256_setzero_si256();
    const std::size_t round = groups < kRound ? groups : kRound;
    for (std::size_t i = 0; i < round; ++i, at += kGroup) {
      counts = Counted(Counted(counts, Load(at)), Load(at + kGroup / 2));
    }
    length += Sum(counts);
    groups -= round;
  }
  return length;
}

// A group at a multiple of its size lies within one page, so the one that holds the terminator may
// be read whole. The sanitizers are told so.
ORB_AVX __attribute__((no_sanitize("address", "thread"))) const unsigned short* GroupWithZero(
    const unsigned short* units) {
  for (;; units += kGroup) {
    const auto* group = reinterpret_cast<const __m256i*>(units);
    const __m256i least = _mm256_min_epu16(_mm256_min_epu16(group[0], group[1]),
                                           _mm256_min_epu16(group[2], group[3]));
    const __m256i zeros = _mm256_cmpeq_epi16(least, _mm256_setzero_si256());
    if (_mm256_movemask_epi8(zeros) != 0) return units;
  }
}

}  // namespace orb::platform::avx

#else

namespace orb::platform::avx {

bool IsSupported() { return false; }
std::size_t Utf16FromAscii(std::string_view, char16_t*) { return 0; }
std::size_t AsciiFromUtf16(std::u16string_view, char*) { return 0; }
std::size_t Utf16LengthOfGroups(std::string_view) { return 0; }
const unsigned short* GroupWithZero(const unsigned short* units) { return units; }

}  // namespace orb::platform::avx

#endif
