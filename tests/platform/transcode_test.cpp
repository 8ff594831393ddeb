// SPDX-License-Identifier: MIT
#include "platform/transcode.h"

#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <optional>
#include <random>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include "support/icu.h"

namespace {

using namespace orb::platform;
using namespace orb::test;

constexpr char16_t kCanary = 0xABCD;

/// What a writer of UTF-16 gives; fails where it writes behind the room that it asks for.
std::optional<std::u16string> Units(std::size_t (*write)(std::string_view, char16_t*),
                                    std::string_view text) {
  std::u16string out(text.size() + kSlack + 1, kCanary);
  // A block of its own, so that a read behind the text is seen by the address sanitizer.
  const std::vector<char> exact(text.begin(), text.end());
  const std::size_t length = write({exact.data(), exact.size()}, out.data());
  EXPECT_EQ(out.back(), kCanary);
  if (length == kNotUtf8) return std::nullopt;
  return out.substr(0, length);
}

std::string Bytes(std::size_t (*write)(std::u16string_view, char*), std::u16string_view text) {
  std::string out(3 * text.size() + kSlack + 1, '\x55');
  const std::vector<char16_t> exact(text.begin(), text.end());
  const std::size_t length = write({exact.data(), exact.size()}, out.data());
  EXPECT_EQ(out.back(), '\x55');
  return out.substr(0, length);
}

std::optional<std::u16string> IcusUnits(std::string_view text) {
  UErrorCode status = U_ZERO_ERROR;
  std::u16string out(text.size() + 1, u'\0');
  std::int32_t length = 0;
  u_strFromUTF8(
      out.data(), Size(out), &length, text.data(), static_cast<int>(text.size()), &status);
  if (U_FAILURE(status)) return std::nullopt;
  return out.substr(0, static_cast<std::size_t>(length));
}

std::string IcusBytes(const std::u16string& text) {
  UErrorCode status = U_ZERO_ERROR;
  std::string out(3 * text.size() + 1, '\0');
  std::int32_t length = 0;
  const auto room = static_cast<std::int32_t>(out.size());
  u_strToUTF8WithSub(out.data(), room, &length, text.data(), Size(text), 0xFFFD, nullptr, &status);
  return out.substr(0, static_cast<std::size_t>(length));
}

void ExpectIcusUnits(const std::string& text) {
  const auto expected = IcusUnits(text);
  SCOPED_TRACE(testing::PrintToString(text));
  ASSERT_EQ(Units(Utf16FromUtf8, text), expected);
  ASSERT_EQ(Units(portable::Utf16FromUtf8, text), expected);
  ASSERT_EQ(Utf16LengthOfUtf8(text).has_value(), expected.has_value());
  if (!expected) return;
  ASSERT_EQ(Utf16LengthOfUtf8(text), expected->size());
  ASSERT_EQ(portable::Utf16LengthOfValid(text), expected->size());
}

void ExpectIcusBytes(const std::u16string& text) {
  ASSERT_EQ(Bytes(Utf8FromUtf16, text), IcusBytes(text));
  ASSERT_EQ(Bytes(portable::Utf8FromUtf16, text), IcusBytes(text));
}

class Random {
 public:
  /// Below `end`.
  std::uint32_t operator()(std::size_t end) { return static_cast<std::uint32_t>(engine_() % end); }
  /// Of the ranges whose bits are set.
  char32_t Character(unsigned ranges) {
    constexpr std::array<std::array<char32_t, 2>, 5> kRanges = {
        {{0x01, 0x7F}, {0x80, 0x7FF}, {0x800, 0xD7FF}, {0xE000, 0xFFFF}, {0x10000, 0x10FFFF}}};
    unsigned range = (*this)(kRanges.size());
    while ((ranges >> range & 1) == 0) range = (*this)(kRanges.size());
    const auto [first, last] = kRanges[range];
    return first + (*this)(last - first + 1);
  }

 private:
  std::mt19937 engine_{20261122};
};

// Overlong forms, surrogates, what lies above the last character, and what is cut short: whole and
// cut, before, across and behind the edges of a block.
TEST(Transcode, ReadsEveryBeginningOfACharacterAsIcuDoes) {
  Random random;
  for (unsigned pair = 0x7F01; pair <= 0xFFFF; ++pair) {
    const char begin[] = {static_cast<char>(pair >> 8), static_cast<char>(pair & 0xFF)};
    for (const std::string rest : {"", "\x80", "\xBF\xBF", "\x80\x80", "\xBF"}) {
      const std::string character = std::string(begin, 2) + rest;
      ExpectIcusUnits(std::string(random(40), 'x') + character + std::string(random(40), 'y'));
      if (HasFatalFailure()) return;
    }
  }
}

TEST(Transcode, OfRandomTextsIsIcus) {
  Random random;
  for (int round = 0; round < 60'000 && !HasFatalFailure(); ++round) {
    const unsigned ranges = random(31) + 1;
    std::u16string units;
    for (std::size_t count = random(48); count != 0; --count)
      units += UnitsOf(random.Character(ranges));
    if (random(2) == 0) units.append(random(24), u'z');
    ExpectIcusBytes(units);
    std::string bytes = IcusBytes(units);
    ExpectIcusUnits(bytes);
    for (auto& unit : units)
      if (random(8) == 0) unit = static_cast<char16_t>(0xD800 + random(0x800));
    ExpectIcusBytes(units);
    if (bytes.empty()) continue;
    bytes[random(bytes.size())] = static_cast<char>(random(256));
    ExpectIcusUnits(bytes);
  }
}

// Beyond a few hundred bytes wider steps are taken.
TEST(Transcode, OfAsciiEndsAtTheFirstCharacterBeyondAndWritesNoFurther) {
  for (std::size_t size = 0; size < 500; size += size < 100 || size > 400 ? 1 : 37) {
    for (std::size_t bad = 0; bad <= size; bad += 1 + size / 20) {
      std::string bytes;
      for (std::size_t i = 0; i < size; ++i) bytes += static_cast<char>(1 + i % 127);
      std::u16string units(bytes.begin(), bytes.end());
      if (bad < size) bytes[bad] = '\x80';
      if (bad < size) units[bad] = size % 2 == 0 ? u'\x80' : u'\xFF00';
      std::u16string wide(size + 1, u'!');
      std::string narrow(size + 1, '!');
      ASSERT_EQ(IsAscii(bytes), bad == size);
      ASSERT_EQ(IsAscii(units), bad == size);
      ASSERT_EQ(Utf16FromAscii(bytes, wide.data()), bad);
      ASSERT_EQ(AsciiFromUtf16(units, narrow.data()), bad);
      ASSERT_EQ(wide.substr(0, bad), units.substr(0, bad));
      ASSERT_EQ(narrow.substr(0, bad), bytes.substr(0, bad));
      ASSERT_EQ(wide[size], u'!');
      ASSERT_EQ(narrow[size], '!');
    }
  }
}

TEST(Utf16, IsAsLongAsItsUnitsBeforeTheZeroWhereverItLies) {
  std::vector<unsigned short> units(2000, 0x0100);
  for (std::size_t from = 0; from < 66; ++from) {
    for (const std::size_t size : {0U, 1U, 7U, 8U, 63U, 64U, 127U, 128U, 129U, 192U, 255U, 1500U}) {
      units[from + size] = 0;
      ASSERT_EQ(Utf16Length(&units[from]), size) << from;
      units[from + size] = 0x0100;
    }
  }
}

TEST(Utf16, HasTheLengthOfLongTextsCounted) {
  Random random;
  for (const unsigned kinds : {1U, 3U, 6U, 16U, 31U}) {
    std::string bytes;
    while (bytes.size() < 20'000) bytes += IcusBytes(UnitsOf(random.Character(kinds)));
    EXPECT_EQ(Utf16LengthOfValid(bytes), portable::Utf16LengthOfValid(bytes)) << kinds;
  }
  const std::string leads(20'000, '\xF0');  // The most that can be counted.
  EXPECT_EQ(Utf16LengthOfValid(leads), 40'000U);
}

TEST(MacRoman, GivesAllItsBytesBack) {
  std::string all;
  for (int byte = 1; byte < 256; ++byte) all += static_cast<char>(byte);
  const std::string utf8 = Utf8FromMacRoman(all);
  ASSERT_TRUE(Utf16FromUtf8(utf8));
  EXPECT_EQ(Utf16FromUtf8(utf8)->size(), 255U);
  EXPECT_EQ(MacRomanFromUtf16(*Utf16FromUtf8(utf8)).bytes, all);
  EXPECT_EQ(Utf8FromMacRoman("\x80\xCA\xDB\xF0\xFF"), "Ä\u00A0€\uF8FFˇ");
}

TEST(MacRoman, ComposesAndMarksWhatItCannotExpress) {
  const std::tuple<std::u16string_view, std::string_view, bool> kCases[] = {
      {u"e\u0301A\u0308", "\x8E\x80", true},
      {u"\u212B\u2126", "\x81\xBD", true},  // Angstrom and Ohm, as the letters that they are.
      {u"日1月2", "?1?2", false},
      {u"\U0001F600!", "?!", false},  // One mark for one character.
      {u"\xD800!", "?!", false},
      {u"x\u0304", "x?", false},
  };
  for (const auto& [text, bytes, isExact] : kCases) {
    const MacRomanText made = MacRomanFromUtf16(text);
    EXPECT_EQ(made.bytes, bytes);
    EXPECT_EQ(made.isExact, isExact);
  }
}

}  // namespace
