// SPDX-License-Identifier: MIT
// The operations beside slow references: ICU's own functions for what Unicode means, and the cut
// and search again of the definitions for replacing, splitting and trimming.
#include <gtest/gtest.h>
#include <orb/strings/string_functions.h>
#include <unicode/uchar.h>
#include <unicode/unorm.h>

#include <array>
#include <random>
#include <string>
#include <vector>

#include "platform/transcode.h"
#include "platform/unicode.h"
#include "strings/text_scan.h"
#include "support/icu.h"
#include "support/texts.h"

namespace {

using namespace orb::test;

constexpr unsigned long kAll = static_cast<unsigned long>(-1);

std::u16string Units(const COrbStringData& s) {
  return {reinterpret_cast<const char16_t*>(s.GetPtrUnicode()), s.GetLengthChar()};
}

COrbStringData FromUnits(const std::u16string& units) {
  return COrbStringData(OrbCharUnicode(reinterpret_cast<const unsigned short*>(units.c_str())));
}

std::u16string Decomposed(const std::u16string& text) {
  UErrorCode status = U_ZERO_ERROR;
  return IcuNormalised(unorm2_getNFDInstance(&status), text);
}

std::u16string Folded(const std::u16string& text) {
  return Decomposed(IcuFolded(Decomposed(text)));
}

/// Without the rules of any language.
std::u16string Cased(decltype(&u_strToLower) map, const std::u16string& text) {
  UErrorCode status = U_ZERO_ERROR;
  std::u16string out(8, u'\0');
  const auto size = map(out.data(), Size(out), text.data(), Size(text), "", &status);
  return out.substr(0, static_cast<std::size_t>(size));
}

bool IsBoundary(const std::u16string& text, std::size_t at) {
  if (at == 0 || at == text.size()) return true;
  if (U16_IS_TRAIL(text[at])) return false;
  UErrorCode status = U_ZERO_ERROR;
  const UChar32 c =
      U16_IS_LEAD(text[at])
          ? static_cast<UChar32>(U16_GET_SUPPLEMENTARY(char32_t{text[at]}, text[at + 1]))
          : text[at];
  return (U_GET_GC_MASK(c) & U_GC_M_MASK) == 0 &&
         unorm2_hasBoundaryBefore(unorm2_getNFCInstance(&status), c);
}

/// Tries every stretch between two boundaries.
template <typename Form>
std::size_t Found(const std::u16string& text, const std::u16string& find, Form form) {
  for (std::size_t from = 0; from < text.size() && !find.empty(); ++from) {
    if (!IsBoundary(text, from)) continue;
    for (std::size_t to = from + 1; to <= text.size(); ++to) {
      if (IsBoundary(text, to) && form(text.substr(from, to - from)) == form(find)) return from;
    }
  }
  return std::u16string::npos;
}

std::u16string Tail(const std::u16string& text, std::size_t at) {
  return at == std::u16string::npos ? u"(no value)" : text.substr(at);
}

std::u16string Shown(const COrbStringData& s) { return HasNoValue(s) ? u"(no value)" : Units(s); }

COrbStringData ReplaceInSteps(const COrbStringData& s,
                              const COrbStringData& find,
                              const COrbStringData& with) {
  COrbStringData result;
  COrbStringData rest = s;
  for (;;) {
    const COrbStringData tail = OrbStringDataStr(rest, find);
    if (tail.IsEmpty()) return OrbStringDataCat(result, rest);
    const COrbStringData prefix = rest.Mid(0, rest.GetLengthChar() - tail.GetLengthChar());
    result = OrbStringDataCat(OrbStringDataCat(result, prefix), with);
    rest = tail.Mid(find.GetLengthChar(), tail.GetLengthChar() - find.GetLengthChar());
  }
}

std::vector<COrbStringData> SplitInSteps(const COrbStringData& s, const COrbStringData& sep) {
  std::vector<COrbStringData> pieces;
  COrbStringData rest = s;
  bool found = false;
  for (;;) {
    const COrbStringData tail = OrbStringDataStr(rest, sep);
    if (tail.IsEmpty()) break;
    const COrbStringData piece = rest.Mid(0, rest.GetLengthChar() - tail.GetLengthChar());
    if (!piece.IsEmpty()) pieces.push_back(piece);
    rest = tail.Mid(sep.GetLengthChar(), tail.GetLengthChar() - sep.GetLengthChar());
    found = true;
  }
  if (found && !rest.IsEmpty()) pieces.push_back(rest);
  return pieces;
}

COrbStringData TrimInSteps(const COrbStringData& s,
                           const COrbStringData& set,
                           bool left,
                           bool right) {
  if (set.IsEmpty() || (!left && !right)) return s;
  const COrbStringData first = set.Mid(0, 1);
  COrbStringData marked = s;
  for (unsigned long i = 1; i < set.GetLengthChar(); ++i) {
    marked = ReplaceInSteps(marked, set.Mid(i, 1), first);
  }
  const std::vector<COrbStringData> pieces = SplitInSteps(marked, first);
  if (pieces.empty()) {
    const bool nothing = ReplaceInSteps(marked, first, S("")).IsEmpty();
    return nothing ? COrbStringData() : s;
  }
  const unsigned long head = OrbStringDataStr(s, pieces.front()).GetLengthChar();
  const unsigned long back = OrbStringDataStrReverse(s, pieces.back()).GetLengthChar();
  const unsigned long start = left ? s.GetLengthChar() - head : 0;
  unsigned long count = s.GetLengthChar() - start;
  if (right && pieces.size() == 1) count = count - head + pieces.front().GetLengthChar();
  if (right && pieces.size() != 1) count = count - back + pieces.back().GetLengthChar();
  return s.Mid(start, count);
}

/// Random texts over few characters, so that they often meet.
class Texts {
 public:
  COrbStringData Next(std::size_t longest) {
    const std::u16string& alphabet = kAlphabets[random_() % kAlphabets.size()];
    std::u16string units;
    for (std::size_t left = random_() % (longest + 1); left != 0; --left) {
      const std::size_t at = random_() % alphabet.size() & ~std::size_t{1};
      units.append(alphabet, at, alphabet[at + 1] == u' ' ? 1 : 2);
    }
    return FromUnits(units);
  }
  /// A text, and one that may well occur in it.
  COrbStringData PartOf(const COrbStringData& text) {
    if (random_() % 3 == 0 || text.IsEmpty()) return Next(3);
    const unsigned long from = random_() % text.GetLengthChar();
    const COrbStringData part = text.Mid(from, 1 + random_() % 3);
    return random_() % 2 == 0 ? part : FromUnits(Decomposed(Units(part)));
  }
  unsigned long Below(unsigned long end) { return random_() % end; }

 private:
  // Pairs of units: a character and a blank, or a surrogate pair.
  const std::array<std::u16string, 5> kAlphabets = {
      u"a b A - ",
      u"a é \u00C9 e \u0301 \u0316 \u0345 \u0391 ",
      u"\u1100 \u1161 \u11A8 \uAC00 \uAC01 - 漢 ",
      u"😀😁\uFFFD \u20DD \U0001D15E\U0001D165\u0301 a ",
      u"K k \u212A \u017F s ß \u1E9E ﬁ i İ \u037E ; \uE000 \uFFFD 😀",
  };
  std::mt19937 random_{20261122};
};

/// A character at a time.
orb::TextScan ScannedPlainly(const std::string& text) {
  std::u16string units(text.size(), u'\0');
  const std::size_t length = orb::platform::portable::Utf16FromUtf8(text, units.data());
  if (length == orb::platform::kNotUtf8) return {orb::TextKind::kInvalid, 0};
  orb::TextScan scan{orb::TextKind::kAscii, length};
  for (std::size_t at = 0; at < length;) {
    const bool isPair = U16_IS_LEAD(units[at]);
    const auto c = static_cast<char32_t>(
        isPair ? U16_GET_SUPPLEMENTARY(char32_t{units[at]}, units[at + 1]) : units[at]);
    at += isPair ? 2 : 1;
    const bool isPlain =
        c < 0x80 || orb::platform::FormOf(orb::platform::Form::kDecomposed, c).isPlain;
    if (!isPlain) return {orb::TextKind::kComposing, length};
    if (c >= 0x80) scan.kind = orb::TextKind::kPlain;
  }
  return scan;
}

TEST(Oracle, ScansAgreeWithReadingEachCharacter) {
  const auto check = [](const std::string& text) {
    const orb::TextScan scan = orb::ScanUtf8(text);
    const orb::TextScan expected = ScannedPlainly(text);
    ASSERT_EQ(scan.kind, expected.kind) << testing::PrintToString(text);
    ASSERT_EQ(scan.charLength, expected.charLength);
  };
  std::string plain;
  for (char32_t c = 1; c < 0x110000; ++c) {
    std::string one;
    if (c < 0xD800 || c >= 0xE000) one = orb::platform::Utf8FromUtf16(UnitsOf(c));
    check(one);
    if (orb::ScanUtf8(one).kind != orb::TextKind::kComposing) plain += one;
  }
  std::mt19937 random{20261123};
  for (int i = 0; i < 3000; ++i) {  // Stretches that are plain, with one other byte or character.
    std::string text = plain.substr(random() % plain.size(), random() % (i % 8 == 0 ? 4000 : 40));
    while (!text.empty() && (text[0] & 0xC0) == 0x80) text.erase(0, 1);
    if (i % 3 != 0) text = orb::platform::Utf8FromUtf16(UnitsOf(U'x')) + text;
    if (text.empty()) continue;
    check(text);
    const std::size_t at = random() % text.size();
    check(text.substr(0, at) + "\u0301" + text.substr(at));
    text[at] = static_cast<char>(random());
    check(text);
  }
}

TEST(Oracle, SearchesAgreeWithTryingEveryStretch) {
  Texts texts;
  for (int i = 0; i < 20000; ++i) {
    const COrbStringData s = texts.Next(10);
    const COrbStringData find = texts.PartOf(s);
    SCOPED_TRACE(Text(s) + " | " + Text(find));
    const std::u16string text = Units(s);
    const std::u16string wanted = Units(find);
    ASSERT_EQ(Shown(OrbStringDataStr(s, find)), Tail(text, Found(text, wanted, Decomposed)));
    ASSERT_EQ(Shown(OrbStringDataStrNoCase(s, find)), Tail(text, Found(text, wanted, Folded)));
    const std::size_t last = wanted.empty() ? std::u16string::npos : text.rfind(wanted);
    ASSERT_EQ(Shown(OrbStringDataStrReverse(s, find)), Tail(text, last));
  }
}

TEST(Oracle, EveryCharacterEqualsItsFormsAndHasIcusCases) {
  for (char32_t c = 1; c < 0x20000; ++c) {
    if (U_IS_SURROGATE(c)) continue;
    const std::u16string self = UnitsOf(c);
    const COrbStringData text = FromUnits(self);
    const COrbStringData decomposed = FromUnits(Decomposed(self));
    SCOPED_TRACE(Text(text));
    ASSERT_EQ(Units(OrbStringDataLower(text)), Cased(u_strToLower, self));
    ASSERT_EQ(Units(OrbStringDataUpper(text)), Cased(u_strToUpper, self));
    ASSERT_EQ(OrbStringDataCmpi(text, FromUnits(Folded(self))), 0);
    ASSERT_EQ(Text(OrbStringDataStr(text, decomposed)), Text(text));
    ASSERT_EQ(Text(OrbStringDataStr(decomposed, text)), Text(decomposed));
  }
}

int Sign(int order) { return order < 0 ? -1 : order > 0 ? 1 : 0; }

TEST(Oracle, ComparisonsAgreeWithIcu) {
  Texts texts;
  for (int i = 0; i < 50000; ++i) {
    const COrbStringData a = texts.Next(6);
    const COrbStringData b = texts.Below(2) == 0 ? texts.Next(6) : OrbStringDataUpper(a);
    const unsigned long n = texts.Below(8);
    SCOPED_TRACE(Text(a) + " | " + Text(b) + " | " + std::to_string(n));
    const std::u16string x = Units(a);
    const std::u16string y = Units(b);
    UErrorCode status = U_ZERO_ERROR;
    ASSERT_EQ(OrbStringDataCmp(a, b), Sign(x.compare(y)));
    ASSERT_EQ(OrbStringDataCmpn(a, b, n), Sign(x.substr(0, n).compare(y.substr(0, n))));
    ASSERT_EQ(OrbStringDataCmpn(a, b, kAll), Sign(x.compare(y)));
    ASSERT_EQ(OrbStringDataCmpi(a, b), Sign(Folded(x).compare(Folded(y))));
    const int order = unorm_compare(
        x.data(), Size(x), y.data(), Size(y), U_COMPARE_IGNORE_CASE | U_FOLD_CASE_DEFAULT, &status);
    ASSERT_EQ(OrbStringDataCmpi(a, b), Sign(order));
    const bool isInside = n < x.size();
    ASSERT_EQ(isInside ? Text(a.Mid(n, 3)) : "", isInside ? Text(FromUnits(x.substr(n, 3))) : "");
    const std::u16string p = x.substr(0, n);
    const std::u16string q = y.substr(0, n);
    const int literal =
        u_strCaseCompare(p.data(), Size(p), q.data(), Size(q), U_FOLD_CASE_DEFAULT, &status);
    ASSERT_EQ(OrbStringDataCmpni(a, b, n), Sign(literal));
  }
}

TEST(Oracle, ReplacingSplittingAndTrimmingAgreeWithTheirSteps) {
  Texts texts;
  for (int i = 0; i < 30000; ++i) {
    const COrbStringData s = texts.Next(i % 8 == 0 ? 80 : 10);
    const COrbStringData find = texts.PartOf(s);
    const COrbStringData with = texts.Next(2);
    SCOPED_TRACE(Text(s) + " | " + Text(find) + " | " + Text(with));
    ASSERT_EQ(Shown(OrbStringDataReplace(s, find, with)), Shown(ReplaceInSteps(s, find, with)));
    std::vector<COrbStringData> pieces;
    OrbStringDataSplit(s, find, &pieces);
    const std::vector<COrbStringData> expected = SplitInSteps(s, find);
    ASSERT_EQ(pieces.size(), expected.size());
    for (std::size_t k = 0; k < pieces.size(); ++k) {
      ASSERT_EQ(Shown(pieces[k]), Shown(expected[k]));
    }
    const bool left = texts.Below(2) == 0;
    const bool right = texts.Below(3) != 0;
    ASSERT_EQ(Shown(OrbString::Trim(s, find, left, right)),
              Shown(TrimInSteps(s, find, left, right)));
  }
}

}  // namespace
