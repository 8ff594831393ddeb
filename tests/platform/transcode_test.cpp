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

#include "platform/transcode_sse.h"

namespace {

using namespace orb::platform;

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

TEST(Utf8, IsReadStrictly) {
  const std::pair<std::string, std::optional<std::u16string>> kCases[] = {
      {"", u""},
      {"a\x7F", u"a\x7F"},
      {"\xC2\x80\xDF\xBF", u"\u0080\u07FF"},
      {"\xE0\xA0\x80\xED\x9F\xBF\xEE\x80\x80\xEF\xBF\xBF", u"\u0800\uD7FF\uE000\uFFFF"},
      {"\xF0\x90\x80\x80\xF4\x8F\xBF\xBF", u"\U00010000\U0010FFFF"},
      {"\xC0\x80", std::nullopt},          // Overlong, in two,
      {"\xC1\xBF", std::nullopt},          //
      {"\xE0\x9F\xBF", std::nullopt},      // three
      {"\xF0\x8F\xBF\xBF", std::nullopt},  // and four bytes.
      {"\xED\xA0\x80", std::nullopt},      // A surrogate.
      {"\xED\xBF\xBF", std::nullopt},
      {"\xF4\x90\x80\x80", std::nullopt},  // Above the last character.
      {"\xF5\x80\x80\x80", std::nullopt},
      {"\xFF", std::nullopt},
      {"\x80", std::nullopt},
      {"\xC2", std::nullopt},  // Cut short.
      {"\xE2\x82", std::nullopt},
      {"\xF0\x9F\x98", std::nullopt},
      {"\xC2\x41", std::nullopt},
  };
  for (const auto& [bytes, units] : kCases) {
    // Before, across and behind the edges of a block.
    for (std::size_t before = 0; before < 40; ++before) {
      for (const std::size_t behind : {0U, 1U, 40U}) {
        const std::string text = std::string(before, 'x') + bytes + std::string(behind, 'y');
        SCOPED_TRACE(testing::PrintToString(text));
        std::optional<std::u16string> expected;
        if (units) expected = std::u16string(before, u'x') + *units + std::u16string(behind, 'y');
        EXPECT_EQ(Units(Utf16FromUtf8, text), expected);
        EXPECT_EQ(Units(portable::Utf16FromUtf8, text), expected);
        EXPECT_EQ(Utf16LengthOfUtf8(text).has_value(), expected.has_value());
        EXPECT_EQ(Bytes(Utf8FromUtf16, expected.value_or(u"")), expected ? text : "");
      }
    }
  }
}

TEST(Utf8, HasAReplacementForASurrogateAlone) {
  for (std::size_t before = 0; before < 20; ++before) {
    const std::u16string pad(before, u'x');
    for (const std::u16string lone : {u"\xD800", u"\xDFFF", u"\xDC00\xD800", u"\xD800\xD800"}) {
      std::string expected(before, 'x');
      for (std::size_t i = 0; i < lone.size(); ++i) expected += "\xEF\xBF\xBD";
      EXPECT_EQ(Bytes(Utf8FromUtf16, pad + lone), expected);
      EXPECT_EQ(Bytes(Utf8FromUtf16, pad + lone + u"\U0001F600"), expected + "\xF0\x9F\x98\x80");
    }
  }
}

class Random {
 public:
  /// Below `end`.
  std::uint32_t operator()(std::size_t end) { return static_cast<std::uint32_t>(engine_() % end); }

 private:
  std::mt19937 engine_{20261122};
};

char32_t RandomCharacter(Random& random, unsigned kinds) {
  constexpr std::array<std::array<char32_t, 2>, 5> kRanges = {
      {{0x01, 0x7F}, {0x80, 0x7FF}, {0x800, 0xD7FF}, {0xE000, 0xFFFF}, {0x10000, 0x10FFFF}}};
  unsigned kind = 0;
  do kind = random(kRanges.size());
  while ((kinds >> kind & 1) == 0);
  return kRanges[kind][0] + random(kRanges[kind][1] - kRanges[kind][0] + 1);
}

TEST(Transcode, OfRandomTextsIsWhatThePlainWayGives) {
  if (!sse::IsSupported()) GTEST_SKIP();
  Random random;
  int invalid = 0;
  for (int round = 0; round < 60'000; ++round) {
    const unsigned kinds = random(31) + 1;
    std::u16string units;
    for (std::size_t count = random(48); count != 0; --count) {
      const char32_t c = RandomCharacter(random, kinds);
      if (c > 0xFFFF) units += static_cast<char16_t>(0xD7C0 + (c >> 10));
      units += static_cast<char16_t>(c > 0xFFFF ? 0xDC00 + (c & 0x3FF) : c);
    }
    std::string bytes = Bytes(portable::Utf8FromUtf16, units);
    ASSERT_EQ(Bytes(sse::Utf8FromUtf16, units), bytes);
    ASSERT_EQ(Units(sse::Utf16FromUtf8, bytes), units);
    ASSERT_EQ(sse::Utf16LengthOfValid(bytes), units.size());
    ASSERT_EQ(portable::Utf16LengthOfValid(bytes), units.size());

    for (auto& unit : units) {
      if (random(8) == 0) unit = static_cast<char16_t>(0xD800 + random(0x800));
    }
    ASSERT_EQ(Bytes(sse::Utf8FromUtf16, units), Bytes(portable::Utf8FromUtf16, units));

    if (bytes.empty()) continue;
    const std::size_t at = random(bytes.size());
    if (random(2) == 0) {
      bytes[at] = static_cast<char>(random(256));
    } else {
      bytes.erase(at, random(3) + 1);
    }
    const auto expected = Units(portable::Utf16FromUtf8, bytes);
    ASSERT_EQ(Units(sse::Utf16FromUtf8, bytes), expected) << testing::PrintToString(bytes);
    invalid += expected ? 0 : 1;
  }
  EXPECT_GT(invalid, 10'000);
}

TEST(Transcode, OfAsciiEndsAtTheFirstCharacterBeyondAndWritesNoFurther) {
  for (std::size_t size = 0; size < 200; ++size) {
    for (std::size_t bad = 0; bad <= size; bad += 1 + size / 20) {
      std::string bytes;
      for (std::size_t i = 0; i < size; ++i) bytes += static_cast<char>(1 + i % 127);
      std::u16string units(bytes.begin(), bytes.end());
      if (bad < size) bytes[bad] = '\x80';
      if (bad < size) units[bad] = size % 2 == 0 ? u'\x80' : u'\xFF00';
      std::u16string wide(size + 1, u'!');
      std::string narrow(size + 1, '!');
      ASSERT_EQ(Utf16FromAscii(bytes, wide.data()), bad);
      ASSERT_EQ(AsciiFromUtf16(units, narrow.data()), bad);
      ASSERT_EQ(wide.substr(0, bad), units.substr(0, bad));
      ASSERT_EQ(narrow.substr(0, bad), bytes.substr(0, bad));
      ASSERT_EQ(wide[size], u'!');
      ASSERT_EQ(narrow[size], '!');
    }
  }
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
      {u"2026-11-22", "2026-11-22", true},
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
