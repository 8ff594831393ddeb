// SPDX-License-Identifier: MIT
#include "strings/text_search.h"

#include <gtest/gtest.h>
#include <orb/strings/string_functions.h>

#include <random>
#include <string>
#include <vector>

#include "support/texts.h"

namespace {

using orb::LiteralSearch;
using Places = std::vector<std::size_t>;

Places Found(const std::string& text, const std::string& needle, LiteralSearch::Case rule) {
  // Exactly as large as the text, so that a sanitizer sees any byte that is read beyond it.
  const std::vector<char> exact(text.begin(), text.end());
  Places places;
  LiteralSearch(needle, rule).ForEach({exact.data(), exact.size()}, [&](std::size_t place) {
    places.push_back(place);
    return true;
  });
  return places;
}

Places Expected(const std::string& text, const std::string& needle) {
  Places places;
  for (std::size_t at = 0; (at = text.find(needle, at)) != std::string::npos; at += needle.size()) {
    places.push_back(at);
  }
  return places;
}

TEST(LiteralSearch, FindsWhatThePlainLoopFinds) {
  std::mt19937 random(7);
  const auto text = [&](std::size_t size, std::size_t letters) {
    std::string made;
    while (made.size() < size) made.push_back("abAB@`"[random() % letters]);
    return made;
  };
  for (int i = 0; i < 30000; ++i) {
    const std::size_t letters = 1 + random() % 6;
    const std::string s = text(random() % 150, letters);
    const std::string needle = text(1 + random() % (i % 4 == 0 ? 40 : 4), letters);
    SCOPED_TRACE(s + " | " + needle);
    ASSERT_EQ(Found(s, needle, LiteralSearch::Case::kExact), Expected(s, needle));
    ASSERT_EQ(Found(s, needle, LiteralSearch::Case::kAscii),
              Expected(Text(OrbStringDataLower(S(s))), Text(OrbStringDataLower(S(needle)))));
    ASSERT_EQ(orb::FindLastLiteral(s, needle), s.rfind(needle));
  }
}

TEST(LiteralSearch, StopsWhenItIsTold) {
  EXPECT_EQ(LiteralSearch("b").Find("abcb"), 1U);
  EXPECT_EQ(LiteralSearch("x").Find("abc"), orb::kNotFound);
}

// Each of these would take minutes if its work grew with the square of the text.
TEST(Linear, NoTextMakesASearchSlow) {
  const std::size_t half = 1 << 20;
  const std::string run(2 * half, 'a');
  const std::string inside = std::string(half / 2, 'a') + "b" + std::string(half / 2, 'a');
  EXPECT_TRUE(Found(run, inside, LiteralSearch::Case::kExact).empty());
  EXPECT_EQ(Found(run + inside, inside, LiteralSearch::Case::kExact), Places{2 * half});
  EXPECT_EQ(orb::FindLastLiteral(run, inside), orb::kNotFound);
  EXPECT_EQ(OrbStringDataReplace(S(run), S("a"), S("bc")).GetLengthChar(), 4 * half);
}

TEST(Linear, NoRunOfMarksMakesAnOperationSlow) {
  std::string marks = "e";
  std::string ordered = "e";
  for (int i = 0; i < 1 << 17; ++i) marks += "\u0301\u0316";
  for (int i = 0; i < 1 << 17; ++i) ordered += "\u0316";
  for (int i = 0; i < 1 << 17; ++i) ordered += "\u0301";
  EXPECT_EQ(OrbStringDataCmpi(S(marks), S(ordered)), 0);
  EXPECT_EQ(Text(OrbStringDataStr(S("x" + marks), S(ordered))), marks);
  EXPECT_TRUE(HasNoValue(OrbStringDataStr(S(marks), S("e"))));
  EXPECT_EQ(OrbStringDataReplace(S(marks + "-" + marks), S("-"), S("")).GetLengthChar(),
            2 * S(marks).GetLengthChar());
  std::string accents;
  for (int i = 0; i < 1 << 17; ++i) accents += "e\u0301,";
  std::vector<COrbStringData> pieces;
  OrbStringDataSplit(S(accents), S(","), &pieces);
  EXPECT_EQ(pieces.size(), 1U << 17);
  EXPECT_EQ(OrbStringDataTrim(S(accents), S(", ")).GetLengthChar(), accents.size() * 3 / 4 - 1);
}

}  // namespace
