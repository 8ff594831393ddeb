// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/strings/string_data.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <future>
#include <memory>
#include <new>
#include <random>
#include <string>
#include <thread>
#include <tuple>
#include <utility>
#include <vector>

#include "strings/string_access.h"
#include "support/resource_limit.h"
#include "support/texts.h"

namespace {

using Value = COrbStringData::COrbStringValue;

bool areLocksScarce = false;

const unsigned short* Units(const char16_t* text) {
  return reinterpret_cast<const unsigned short*>(text);
}

std::u16string UnitsOf(const COrbStringData& text) {
  return reinterpret_cast<const char16_t*>(text.GetPtrUnicode());
}

}  // namespace

// What the library makes without throwing are the locks of its texts, and this program uses the
// library's own objects.
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return areLocksScarce ? nullptr : ::operator new(size);
}

namespace {

TEST(StringData, WithoutValueGetsOneFromAPointerAccessor) {
  COrbStringData text;
  EXPECT_TRUE(text.IsEmpty());
  EXPECT_EQ(text.GetLengthChar(), 0U);
  EXPECT_EQ(text.GetLengthByteSystemEncoding() + text.GetLengthByteUtf8(), 0U);
  EXPECT_EQ(text.GetLengthByteUnicode() + text.GetLengthBytePlatform(), 0U);
  EXPECT_TRUE(HasNoValue(text));
  EXPECT_TRUE(HasNoValue(COrbStringData(text)));
  EXPECT_STREQ(text.GetPtrPlatform(), "");
  EXPECT_TRUE(text.HasValueUtf8());
  EXPECT_TRUE(text.IsEmpty());
  EXPECT_STREQ(COrbStringData().GetPtrSystemEncoding(), "");
  EXPECT_EQ(UnitsOf(COrbStringData()), u"");
}

TEST(StringData, FromANullPointerHasNoText) {
  COrbStringData text = S("old");
  EXPECT_EQ(text.InitWithUtf8(nullptr), 0x1008U);
  EXPECT_TRUE(text.IsEmpty());
  EXPECT_STREQ(text.GetPtrUtf8(), "");
  EXPECT_EQ(text.InitWithSystemEncoding(nullptr), 0x1008U);
  EXPECT_TRUE(HasNoValue(text));
  EXPECT_EQ(text.GetLengthByteUnicode(), 0U);
  EXPECT_TRUE(text.HasValueUnicode());  // A length in bytes is one of a copy.
  EXPECT_EQ(text.InitWithUnicode(nullptr), 0x1008U);
  EXPECT_EQ(text.GetLengthChar(), 0U);
  EXPECT_TRUE(HasNoValue(text));
  text = S("old");
  EXPECT_EQ(text.InitWithCFString(nullptr), 0x1008U);
  EXPECT_TRUE(HasNoValue(text));
}

TEST(StringData, ReadsTheSameInEachEncoding) {
  const std::tuple<std::string, std::u16string, std::string> kCases[] = {
      {"", u"", ""},
      {" ", u" ", " "},
      {"photo.jpg", u"photo.jpg", "photo.jpg"},
      {"\xC3\xA9", u"\u00E9", "\x8E"},
      {"\xE2\x82\xAC 5", u"\u20AC 5", "\xDB 5"},
  };
  for (const auto& [utf8, units, system] : kCases) {
    SCOPED_TRACE(utf8);
    const COrbStringData fromUnits = OrbCharUnicode(Units(units.c_str()));
    for (const COrbStringData& text :
         {S(utf8), COrbStringData(OrbCharSystem(system.c_str())), fromUnits}) {
      EXPECT_EQ(text.GetLengthChar(), units.size());
      EXPECT_EQ(text.IsEmpty(), units.empty());
      EXPECT_EQ(text.GetLengthByteUtf8(), utf8.size());
      EXPECT_EQ(text.GetPtrUtf8(), utf8);
      EXPECT_EQ(text.GetPtrSystemEncoding(), system);
      EXPECT_EQ(text.GetLengthByteSystemEncoding(), system.size());
      EXPECT_EQ(UnitsOf(text), units);
      EXPECT_EQ(text.GetLengthByteUnicode(), 2 * units.size());
    }
  }
  EXPECT_EQ(S("\U0001F600").GetLengthChar(), 2U);
  EXPECT_EQ(S("\U0001F600").GetLengthByteUnicode(), 4U);
}

TEST(StringData, DerivesThroughUtf8) {
  COrbStringData text{OrbCharSystem("\x8E")};
  EXPECT_EQ(UnitsOf(text), u"\u00E9");
  EXPECT_TRUE(text.HasValueUtf8());
  text.InitWithUnicode(Units(u"\u65E5\xD800"));
  EXPECT_FALSE(text.HasValueUtf8());
  EXPECT_STREQ(text.GetPtrSystemEncoding(), "??");
  EXPECT_STREQ(text.GetPtrUtf8(), "\xE6\x97\xA5\xEF\xBF\xBD");
  EXPECT_EQ(text.GetLengthChar(), 2U);
}

TEST(StringData, LongTextsReadAsShortOnesDo) {
  for (const std::size_t count : {84U, 85U, 86U, 256U, 257U, 5000U}) {
    std::string utf8;
    std::u16string units;
    for (std::size_t i = 0; i < count; ++i) {
      utf8 += "\xE6\x97\xA5";
      units += u"\u65E5";
    }
    const COrbStringData fromUtf8 = S(utf8);
    EXPECT_EQ(UnitsOf(fromUtf8), units);
    for (std::size_t i = count; i < 2 * (count + 1); ++i) {
      ASSERT_EQ(fromUtf8.GetPtrUnicode()[i], 0) << i;  // Room for twice the units, all zero.
    }
    EXPECT_EQ(Text(COrbStringData(OrbCharUnicode(Units(units.c_str())))), utf8);
  }
}

TEST(StringData, ThatIsNoUtf8IsEmptyInTheOthersButNotItself) {
  for (const std::string& bad : {std::string("\xFF"), std::string(1000, 'x') + "\xC3"}) {
    const COrbStringData text = S(bad);
    EXPECT_EQ(text.GetLengthChar(), 0U);
    EXPECT_FALSE(text.IsEmpty());
    EXPECT_EQ(text.GetLengthByteUtf8(), bad.size());
    EXPECT_EQ(UnitsOf(text), u"");
    EXPECT_EQ(text.GetLengthByteUnicode(), 0U);
    EXPECT_STREQ(text.GetPtrSystemEncoding(), "");
    CFStringRef copy = text.CreateCopyCFString();
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(CFStringGetLength(copy), 0);
    CFRelease(copy);
  }
}

TEST(StringData, GoesThroughCFStringAndBack) {
  const COrbStringData text = S("\xC3\xA9\xF0\x9F\x98\x80");
  CFStringRef copy = text.CreateCopyCFString();
  EXPECT_EQ(CFGetRetainCount(copy), 1);
  COrbStringData back;
  EXPECT_EQ(back.InitWithCFString(copy), 0U);
  EXPECT_EQ(Text(back), Text(text));
  CFRelease(copy);
  copy = COrbStringData().CreateCopyCFString();
  ASSERT_NE(copy, nullptr);
  EXPECT_EQ(back.InitWithCFString(copy), 0U);
  EXPECT_TRUE(back.HasValueUtf8());
  CFRelease(copy);
}

TEST(StringData, CopiesShareOneValueAndKeepIt) {
  COrbStringData a = S("old");
  COrbStringData b = a;
  COrbStringData c(a);
  const char* old = a.GetPtrUtf8();
  EXPECT_EQ(b.GetPtrUtf8(), old);
  const unsigned short* units = c.GetPtrUnicode();
  EXPECT_TRUE(b.HasValueUnicode());
  a.InitWithUtf8("new");
  EXPECT_EQ(b.GetPtrUnicode(), units);
  b = a;
  EXPECT_STREQ(c.GetPtrUtf8(), "old");
  EXPECT_EQ(c.GetPtrUtf8(), old);
  b = *&b;
  EXPECT_STREQ(b.GetPtrUtf8(), "new");
  b = COrbStringData(b);
  b = COrbStringData();
  EXPECT_TRUE(HasNoValue(b));
}

TEST(StringData, OwnersMayLetGoInAnyOrder) {
  std::array<int, 4> order = {0, 1, 2, 3};
  do {
    std::array<COrbStringData, 4> owners;
    owners[0] = S("text");
    owners[1] = owners[0];
    owners[2] = owners[0];
    COrbStringData moved(owners[1]);
    owners[3] = std::move(moved);
    for (std::size_t i = 0; i < order.size(); ++i) {
      COrbStringData& leaving = owners[static_cast<std::size_t>(order[i])];
      EXPECT_STREQ(leaving.GetPtrUtf8(), "text");
      leaving.Clear();
      EXPECT_TRUE(HasNoValue(leaving));
    }
  } while (std::next_permutation(order.begin(), order.end()));
}

TEST(StringData, MovesTakeThePlaceOfTheirSource) {
  for (const int owners : {1, 2, 3}) {
    COrbStringData source = S("text");
    std::vector<COrbStringData> others(static_cast<std::size_t>(owners - 1), source);
    COrbStringData moved(std::move(source));
    EXPECT_TRUE(HasNoValue(source));  // NOLINT(bugprone-use-after-move): a promise.
    source = std::move(moved);
    EXPECT_TRUE(HasNoValue(moved));  // NOLINT(bugprone-use-after-move)
    others.clear();
    EXPECT_STREQ(source.GetPtrUtf8(), "text");
  }
}

/// Random copies, moves and ends of strings, beside the shared text that each must have. With
/// another thread in the process the locks are taken, without memory for locks a common one.
TEST(StringData, ChainsHoldUnderRandomCopiesMovesAndEnds) {
  std::mt19937 random(20261123);
  std::vector<COrbStringData> owners(12);
  std::vector<std::shared_ptr<std::string>> texts(owners.size());
  const auto turn = [&](int i) {
    const std::size_t a = random() % owners.size();
    const std::size_t b = random() % owners.size();
    switch (random() % 6) {
      case 0:
        texts[a] = std::make_shared<std::string>(std::to_string(i));
        owners[a].InitWithUtf8(texts[a]->c_str());
        break;
      case 1:
        owners[a].Clear();
        texts[a] = nullptr;
        break;
      case 2:  // Moves all of them.
        owners.reserve(owners.capacity() + 1);
        break;
      case 3:
        if (a != b) texts[a] = std::exchange(texts[b], nullptr);
        owners[a] = std::move(owners[b]);
        break;
      default:
        texts[a] = texts[b];
        owners[a] = owners[b];
    }
    for (std::size_t k = 0; k < owners.size(); ++k) {
      ASSERT_EQ(HasNoValue(owners[k]), texts[k] == nullptr);
      if (texts[k] == nullptr) continue;
      ASSERT_EQ(owners[k].GetPtrUtf8(), *texts[k]);
      const bool shares = texts[k] == texts[0];
      ASSERT_EQ(!HasNoValue(owners[0]) && owners[0].GetPtrUtf8() == owners[k].GetPtrUtf8(), shares);
    }
  };
  for (int i = 0; i < 3000; ++i) turn(i);
  std::promise<void> end;
  std::thread idle([&end] { end.get_future().wait(); });
  for (int i = 0; i < 3000; ++i) turn(i);
  areLocksScarce = true;
  for (int i = 0; i < 3000; ++i) turn(i);
  areLocksScarce = false;
  end.set_value();
  idle.join();
}

TEST(CharTypes, HandTheirPointerOnAndSayTheirEncoding) {
  const char* bytes = "\x8E";
  const wchar_t* wide = L"";
  EXPECT_EQ(static_cast<const wchar_t*>(OrbCharUnicode(wide)), wide);
  EXPECT_EQ(static_cast<const unsigned short*>(OrbCharUnicode(wide)),
            reinterpret_cast<const unsigned short*>(wide));
  EXPECT_EQ(static_cast<const char*>(OrbCharUtf8(OrbCharPlatform(OrbCharUtf8(bytes)))), bytes);
  COrbStringData text;
  EXPECT_EQ(text.InitWithChar(OrbCharSystem(bytes)), 0U);
  EXPECT_EQ(Text(text), "\xC3\xA9");
  EXPECT_EQ(text.InitWithChar(text.GetCharUnicode()), 0U);
  EXPECT_EQ(text.InitWithChar(text.GetCharPlatform()), 0U);
  EXPECT_EQ(text.GetLengthChar(), 1U);
  text = OrbCharUtf8(bytes);  // The same byte is no UTF-8.
  EXPECT_EQ(text.GetLengthChar(), 0U);
}

TEST(StringData, MayBeInitialisedFromItsOwnText) {
  COrbStringData text = S("a longer text than any small buffer would hold");
  const std::string before = Text(text);
  EXPECT_EQ(text.InitWithUtf8(text.GetPtrUtf8()), 0U);
  EXPECT_EQ(Text(text), before);
  EXPECT_EQ(text.InitWithUnicode(text.GetPtrUnicode()), 0U);
  EXPECT_EQ(Text(text), before);
  EXPECT_EQ(text.InitWithSystemEncoding(text.GetPtrSystemEncoding() + 2), 0U);
  EXPECT_EQ(Text(text), before.substr(2));
}

TEST(StringValue, KeepsItsFirstTextUntilCleared) {
  Value value;
  EXPECT_EQ(value.InitWithUtf8(nullptr), 0x1008U);
  EXPECT_TRUE(value.IsEmpty());
  EXPECT_EQ(value.InitWithUtf8("first"), 0U);
  EXPECT_EQ(value.InitWithUtf8("second"), 0U);
  EXPECT_EQ(value.InitWithSystemEncoding("second"), 0U);
  EXPECT_EQ(value.InitWithUnicode(Units(u"second")), 0U);
  const Value& read = value;
  EXPECT_FALSE(read.HasValueUnicode());
  EXPECT_STREQ(read.GetPtrSystemEncoding(), "first");
  EXPECT_EQ(read.GetLengthByteUnicode(), 10U);
  value.Clear();
  EXPECT_FALSE(value.HasValueUtf8() || value.HasValueSystemEncoding() || value.HasValueUnicode());
  EXPECT_EQ(value.InitWithUnicode(Units(u"third")), 0U);
  EXPECT_EQ(value.GetLengthChar(), 5U);
  EXPECT_STREQ(value.GetPtrUtf8(), "third");
  delete new Value;
}

TEST(StringAccess, MakesAndReadsAPartOfAText) {
  const COrbStringData text =
      orb::StringAccess::FromUtf8(std::string_view("d\xC3\xA9j\xC3\xA0").substr(0, 4));
  EXPECT_STREQ(text.GetPtrUtf8(), "d\xC3\xA9j");
  EXPECT_EQ(orb::StringAccess::Read(text).scan.charLength, 3U);
  EXPECT_EQ(orb::StringAccess::Read(text).bytes.size(), 4U);
}

#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)
TEST(StringData, WithoutMemoryForACopyHasNone) {
  const std::string huge(std::size_t{64} << 20, 'x');
  const COrbStringData text = S(huge);
  COrbStringData late;
  std::string().reserve(64 << 10);  // Leaves room for the small things below.
  {
    const orb::test::ResourceLimit scarce(RLIMIT_AS, 1);  // No large block is to be had.
    EXPECT_EQ(text.GetPtrUnicode(), nullptr);
    EXPECT_EQ(text.GetLengthByteUnicode(), 0U);
    EXPECT_EQ(text.GetPtrSystemEncoding(), nullptr);
    EXPECT_EQ(late.InitWithUtf8(huge.c_str()), 0U);
  }
  EXPECT_NE(text.GetPtrUnicode(), nullptr);
  // The text that found no room counts as none.
  EXPECT_TRUE(late.IsEmpty());
  EXPECT_FALSE(late.HasValueUtf8());
  EXPECT_EQ(late.GetLengthChar(), 0U);
  EXPECT_STREQ(late.GetPtrUtf8(), "");
}
#endif

/// Each thread works on strings of its own; what they share is the value, and the neighbours in its
/// chain.
TEST(StringData, OfOneValueMayBeUsedOnManyThreads) {
  constexpr int kTurns = 100;
  const COrbStringData source{OrbCharUnicode(Units(u"na\u00EFve \u20AC 5"))};
  std::atomic<int> wrong = 0;
  const auto check = [&wrong](const COrbStringData& text) {
    if (text.GetLengthByteUtf8() != 12 || Text(text) != "na\xC3\xAFve \xE2\x82\xAC 5") ++wrong;
    if (std::string(text.GetPtrSystemEncoding()) != "na\x95ve \xDB 5") ++wrong;
    if (UnitsOf(text) != u"na\u00EFve \u20AC 5") ++wrong;
  };
  const auto work = [&](COrbStringData own) {
    for (int i = 0; i < kTurns; ++i) {
      std::vector<COrbStringData> copies(3, i % 8 == 0 ? source : own);
      copies.push_back(std::move(copies[0]));
      copies[1] = source;
      copies[2].Clear();
      check(copies[3]);
      copies[0] = copies[1];
      own = std::move(copies[0]);
      check(own);
    }
  };
  for (int round = 0; round < 100; ++round) {
    // Nothing is derived yet, so the threads run into each other there as well.
    COrbStringData fresh{OrbCharUnicode(source.GetCharUnicode())};
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) threads.emplace_back(work, fresh);
    fresh.Clear();
    for (std::thread& thread : threads) thread.join();
  }
  EXPECT_EQ(wrong, 0);
}

}  // namespace
