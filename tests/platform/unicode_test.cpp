// SPDX-License-Identifier: MIT
#include "platform/unicode.h"

#include <gtest/gtest.h>
#include <unicode/uchar.h>

#include <thread>
#include <vector>

#include "support/icu.h"

namespace orb::platform {
namespace {

using namespace test;

/// What a search would compare.
std::u16string Shown(Form form, char32_t c) {
  const CharForm made = FormOf(form, c);
  if (made.length == 0) return FormOfRun(form, UnitsOf(c));
  return {made.units.data(), made.length};
}

TEST(Unicode, EveryCharacterHasIcusForms) {
  UErrorCode status = U_ZERO_ERROR;
  const UNormalizer2* nfd = unorm2_getNFDInstance(&status);
  const UNormalizer2* nfc = unorm2_getNFCInstance(&status);
  for (char32_t c = 1; c < 0x110000; ++c) {
    if (c >= 0x30000 && c < 0xE0000) continue;  // Nothing there differs from its neighbours.
    if (U_IS_SURROGATE(c)) continue;
    const std::u16string self = UnitsOf(c);
    const std::u16string decomposed = IcuNormalised(nfd, self);
    const std::u16string folded = IcuNormalised(nfd, IcuFolded(decomposed));
    const CharForm made = FormOf(Form::kDecomposed, c);
    if (Shown(Form::kDecomposed, c) != decomposed || Shown(Form::kFolded, c) != IcuFolded(self) ||
        Shown(Form::kFoldedDecomposed, c) != folded ||
        made.isPlain !=
            (made.startsSegment && IcuNormalised(nfc, self) == self &&
             unorm2_isNormalized(nfc, self.data(), self.size() == 1 ? 1 : 2, &status))) {
      FAIL() << std::hex << static_cast<unsigned>(c);
    }
    // What cutting texts into segments rests on: no mark moves across the beginning of one.
    const auto first = static_cast<UChar32>(Shown(Form::kFoldedDecomposed, c).front());
    ASSERT_TRUE(!made.startsSegment || u_getCombiningClass(first) == 0);
    ASSERT_TRUE(!made.startsSegment || made.leadsWithStarter);
    // And what searching for one ASCII character rests on.
    const bool isAsciiToo = c >= 0x80 && decomposed.size() == 1 && decomposed[0] < 0x80;
    ASSERT_EQ(isAsciiToo, c == 0x37E || c == 0x1FEF || c == 0x212A);
  }
}

TEST(Unicode, MarksComeInCanonicalOrder) {
  EXPECT_EQ(FormOfRun(Form::kDecomposed, u"é\u0316\u0301a"), u"e\u0316\u0301\u0301a");
  EXPECT_EQ(FormOfRun(Form::kFoldedDecomposed, u"\u1F82\u0301"), u"α\u0313\u0300\u0301ι");
  EXPECT_EQ(FormOfRun(Form::kFolded, u"Éß"), u"éss");
}

TEST(Unicode, ThreadsMayAskForTheSamePageAtOnce) {
  std::vector<std::thread> threads;
  for (int i = 0; i < 4; ++i) {
    threads.emplace_back([] {
      for (char32_t c = 0x1E00; c < 0x1F00; ++c) {
        ASSERT_FALSE(Shown(Form::kFoldedDecomposed, c).empty());
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
}

}  // namespace
}  // namespace orb::platform
