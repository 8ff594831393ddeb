// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/strings/string_functions.h>

#include <array>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <string>
#include <tuple>
#include <vector>

#include "support/texts.h"

namespace {

/// What a result shows: its text, or that it has no value.
std::string Shown(const COrbStringData& s) { return HasNoValue(s) ? "(no value)" : Text(s); }

const std::string kNone = "(no value)";
const std::string kInvalid = "a\xFF";

std::vector<std::string> Pieces(const std::string& s, const std::string& sep) {
  std::vector<COrbStringData> out = {S("old")};
  OrbStringDataSplit(S(s), S(sep), &out);
  std::vector<std::string> pieces;
  for (const COrbStringData& piece : out) pieces.push_back(Text(piece));
  return pieces;
}

TEST(Cutting, CountsUtf16UnitsAndClamps) {
  const std::tuple<std::string, unsigned long, unsigned long, std::string> kMid[] = {
      {"abcd", 2, 10, "cd"},
      {"abcd", 4, 1, kNone},
      {"abcd", 0, 0, ""},
      {"abcd", 1, static_cast<unsigned long>(-1), "bcd"},
      {"", 0, 1, kNone},
      {"é漢x", 1, 1, "漢"},
      {"a😀b", 1, 2, "😀"},
      {"a😀b", 1, 1, "�"},
      {"a😀b", 2, 2, "�b"},
      {kInvalid, 0, 1, kNone},
  };
  for (const auto& [text, start, count, middle] : kMid)
    EXPECT_EQ(Shown(S(text).Mid(start, count)), middle) << text << start;
  const std::tuple<std::string, unsigned long, std::string> kInc[] = {
      {"abcd", 4, ""},
      {"abcd", 5, kNone},
      {"abcd", 1, "bcd"},
      {"😀", 1, "�"},
      {kInvalid, 0, ""},
      {kInvalid, 1, kNone},
  };
  for (const auto& [text, from, rest] : kInc)
    EXPECT_EQ(Shown(OrbStringDataInc(S(text), from)), rest) << text << from;
  EXPECT_EQ(Shown(OrbStringDataInc(COrbStringData(), 0)), "");
  EXPECT_EQ(Shown(OrbStringDataInc(COrbStringData(), 1)), kNone);
  EXPECT_EQ(Shown(COrbStringData().Mid(0, 0)), kNone);
}

TEST(Joining, AlwaysHasAValueAndKeepsRawBytes) {
  EXPECT_EQ(Shown(COrbStringData() + S("a")), "a");
  EXPECT_EQ(Shown(OrbStringDataCat(COrbStringData(), COrbStringData())), "");
  EXPECT_EQ(Text(OrbStringDataCat(S("\xE6\xBC"), S("\xA2"))), "漢");
  COrbStringData doubled = S("ab");
  const COrbStringData copy = doubled;
  (doubled += doubled) += S("c");
  EXPECT_EQ(Text(doubled), "ababc");
  EXPECT_EQ(Text(copy), "ab");
}

TEST(Comparing, HasItsOwnRuleInEachForm) {
  const std::tuple<const char*, const char*, int, int, int> kCases[] = {
      {"a", "B", 1, -1, -1},
      {"é", "e\u0301", 1, 0, 1},  // Only the uncounted form knows equivalence.
      {"Straße", "STRASSE", 1, 0, 0},
      {"\uFB00", "😀", 1, -1, -1},  // In UTF-16 a surrogate stands before U+FB00, which folds to ff.
      {"a", "a\xFF", 0, 0, 0},
      {"", "a", -1, -1, -1},
  };
  for (const auto& [a, b, cmp, cmpi, cmpni] : kCases) {
    SCOPED_TRACE(a);
    EXPECT_EQ(OrbStringDataCmp(S(a), S(b)), cmp);
    EXPECT_EQ(OrbStringDataCmp(S(b), S(a)), -cmp);
    EXPECT_EQ(OrbStringDataCmpi(S(a), S(b)), cmpi);
    EXPECT_EQ(OrbStringDataCmpni(S(a), S(b), 10), cmpni);
  }
  EXPECT_EQ(OrbStringDataCmpn(S("abc"), S("abd"), 2), 0);
  EXPECT_EQ(OrbStringDataCmpn(S("😀"), S("😁"), 1), 0);  // Both begin with the same half.
}

TEST(Comparing, SeesADifferenceAtEachPlaceOfEachSize) {
  for (std::size_t size = 1; size != 70; ++size) {
    const std::string small(size, 'm');
    const std::string capital(size, 'M');
    EXPECT_EQ(OrbStringDataCmpi(S(small), S(capital)), 0) << size;
    EXPECT_EQ(OrbStringDataCmpi(S(small), S(capital + "x")), -1) << size;
    for (std::size_t at = 0; at != size; ++at) {
      std::string other = capital + std::string(at % 3, 'A');  // Longer, with more to differ in.
      for (std::size_t i = at; i != size; ++i) other[i] = 'a';
      other[at] = 'N';
      EXPECT_EQ(OrbStringDataCmpi(S(small), S(other)), -1) << size << " at " << at;
      other[at] = '[';  // Behind the capitals, before the small letters.
      EXPECT_EQ(OrbStringDataCmpi(S(small), S(other)), 1) << size << " at " << at;
    }
  }
}

TEST(Splitting, DropsEmptyPiecesAndGivesNothingWithoutASeparator) {
  using Texts = std::vector<std::string>;
  EXPECT_EQ(Pieces(",a,,b,", ","), (Texts{"a", "b"}));
  EXPECT_EQ(Pieces("ab", ","), Texts());
  EXPECT_EQ(Pieces("a,b", ""), Texts());
  EXPECT_EQ(Pieces("aéb", "e\u0301"), Texts{"a"});  // Two units go, although the match has one.
  EXPECT_EQ(Pieces("aé😀b", "e\u0301"), (Texts{"a", "�b"}));
  OrbStringDataSplit(S("a"), S("a"), nullptr);
  std::vector<COrbStringData> own = {S("x-y"), S("-")};
  OrbStringDataSplit(own[0], own[1], &own);
  ASSERT_EQ(own.size(), 2U);
  EXPECT_EQ(Text(own[1]), "y");
}

TEST(Replacing, CutsAsManyUnitsAsTheWantedTextHas) {
  const std::array<std::string, 4> kCases[] = {
      {"aXbXc", "X", "--", "a--b--c"},
      {"aaa", "aa", "b", "ba"},
      {"abc", "", "x", "abc"},
      {"", "a", "x", ""},
      {kInvalid, "a", "x", kInvalid},
      {"abc", "b", kInvalid, "a" + kInvalid + "c"},
      {"e\u0301x", "é", "-", "-\u0301x"},  // One unit goes; the mark begins the rest.
      {"éxyé", "e\u0301", "-", "-y-"},
      {"\u212AK", "K", "-", "--"},
  };
  for (const auto& [text, find, with, result] : kCases)
    EXPECT_EQ(Shown(OrbStringDataReplace(S(text), S(find), S(with))), result) << text;
  EXPECT_EQ(Shown(OrbStringDataReplace(COrbStringData(), S("a"), S("b"))), "");
}

TEST(Operations, ReadTheirInputsButGiveASourceNoValue) {
  const COrbStringData source;
  const COrbStringData read;
  std::vector<COrbStringData> pieces;
  OrbStringDataReplace(source, S("a"), read);  // Nothing matches, so `read` is not needed.
  OrbStringDataSplit(source, S("a"), &pieces);
  OrbStringDataTrim(source, S("a"));
  EXPECT_TRUE(HasNoValue(source) && HasNoValue(read));
  EXPECT_EQ(OrbStringDataCmp(source, read), 0);
  EXPECT_TRUE(source.HasValueUtf8() && read.HasValueUtf8());
}

TEST(Trimming, TakesTheSetUnitByUnit) {
  const std::tuple<std::string, std::string, bool, bool, std::string> kCases[] = {
      {"  ab c  ", " ", true, true, "ab c"},
      {"  ab c  ", " ", true, false, "ab c  "},
      {"  ab c  ", " ", false, true, "  ab c"},
      {"  ab c  ", " ", false, false, "  ab c  "},
      {"-_x_-", "-_", true, true, "x"},
      {"---", "-", true, true, kNone},
      {"", "-", true, false, kNone},
      {"abc", "-", true, true, "abc"},
      {"abc", "", true, true, "abc"},
      {"😀a😀", "😀", true, true, "😀a😀"},  // The set holds halves, and no half stands in the text.
      {"\uFFFDa", "😀", true, true, "a"},
      {"\u0301a", "\u0301", true, true, "a"},
      {" \u0301a ", " ", true, true, " \u0301a"},
      {kInvalid, "a", true, true, kInvalid},
      {"a", kInvalid, true, true, "a"},
      {"", kInvalid, true, true, kNone},
  };
  for (const auto& [text, set, left, right, result] : kCases)
    EXPECT_EQ(Shown(OrbString::Trim(S(text), S(set), left, right)), result) << text;
  EXPECT_EQ(Shown(OrbStringDataTrim(S(" a "), S(" "))), "a");
  EXPECT_EQ(Shown(OrbStringDataTrimLeft(S(" a "), S(" "))), "a ");
  EXPECT_EQ(Shown(OrbStringDataTrimRight(S(" a "), S(" "))), " a");
  EXPECT_EQ(Shown(OrbString::Trim(COrbStringData(), S(""), true, true)), kNone);
}

TEST(CaseMapping, IsFullAndLocaleIndependent) {
  EXPECT_EQ(Text(OrbStringDataUpper(S("straße ŉ i"))), "STRASSE ʼN I");
  EXPECT_EQ(Text(OrbStringDataLower(S("ΟΔΟΣ ΑΣ. İ"))), "οδος ας. i̇");
  EXPECT_EQ(Text(OrbStringDataLower(S("A-Z[`{@"))), "a-z[`{@");
  EXPECT_EQ(Shown(OrbStringDataUpper(COrbStringData())), "");
  EXPECT_EQ(Shown(OrbStringDataLower(S(kInvalid))), "");
}

TEST(Numbers, ReadWhatStandsInFront) {
  const OrbCharPlatform none(static_cast<const char*>(nullptr));
  EXPECT_EQ(OrbStringDataToNumber(" -12x"), -12);
  EXPECT_EQ(OrbStringDataToNumber("x"), 0);
  EXPECT_EQ(OrbStringDataToFloat("2.5e1,"), 25.0);
  EXPECT_TRUE(OrbStringDataToNumber(none) == 0 && OrbStringDataToFloat(none) == 0);
}

TEST(Formatting, GivesNoValueWhereItFails) {
  const COrbStringData format = S("%d-%s");
  EXPECT_EQ(Text(OrbStringDataFormat(&format, 7, "x")), "7-x");
  EXPECT_TRUE(format.HasValueSystemEncoding());
  const OrbCharPlatform platform("é%s %.1f%n!");
  int written = 0;
  EXPECT_EQ(Text(OrbStringDataFormat(&platform, "\xFF", 0.5, &written)), "é\xFF 0.5!");
  EXPECT_EQ(written, 7);
  const std::string large(100000, 'x');
  EXPECT_EQ(Text(OrbStringDataFormat(&format, 1, large.c_str())), "1-" + large);
  const OrbCharPlatform wide("%ls");  // Fails in the "C" locale, which the tests run in.
  EXPECT_EQ(Shown(OrbStringDataFormat(&wide, L"é")), kNone);
  EXPECT_EQ(Shown(OrbStringDataFormat(static_cast<const COrbStringData*>(nullptr))), kNone);
  EXPECT_EQ(Shown(OrbStringDataFormat(static_cast<const OrbCharPlatform*>(nullptr))), kNone);
  const OrbCharPlatform null(static_cast<const char*>(nullptr));
  EXPECT_EQ(Shown(OrbStringDataFormat(&null)), kNone);
}

TEST(Formatting, ReadsErrnoAndLeavesIt) {
  const OrbCharPlatform number("%m");
  const OrbCharPlatform wide("%ls");
  errno = EBUSY;
  EXPECT_EQ(OrbStringDataToFloat("1e999"), HUGE_VAL);         // ERANGE
  EXPECT_TRUE(HasNoValue(OrbStringDataFormat(&wide, L"é")));  // EILSEQ
  EXPECT_EQ(Text(OrbStringDataFormat(&number)), std::strerror(EBUSY));
  EXPECT_EQ(errno, EBUSY);
}

TEST(Formatting, OfWideTextIsBounded) {
  const OrbCharUnicode format(L"%d é漢😀 %ls");
  EXPECT_EQ(Text(OrbStringDataFormatW(&format, 7, L"x")), "7 é漢😀 x");
  const OrbCharUnicode repeated(L"%*d");
  EXPECT_EQ(OrbStringDataFormatW(&repeated, 2047, 1).GetLengthChar(), 2047U);
  EXPECT_EQ(Shown(OrbStringDataFormatW(&repeated, 2048, 1)), kNone);
  const OrbCharUnicode narrow(L"%s");
  EXPECT_EQ(Shown(OrbStringDataFormatW(&narrow, "\xFF")), kNone);
  const OrbCharUnicode null(static_cast<const wchar_t*>(nullptr));
  EXPECT_EQ(Shown(OrbStringDataFormatW(&null)), kNone);
  EXPECT_EQ(Shown(OrbStringDataFormatW(nullptr)), kNone);
}

}  // namespace
