// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/platform/core_foundation.h>

#include <array>
#include <limits>
#include <string>
#include <tuple>
#include <utility>

namespace {

CFStringRef Make(const char* utf8) {
  return CFStringCreateWithCString(kCFAllocatorDefault, utf8, kCFStringEncodingUTF8);
}

CFStringRef Make(const std::u16string& units) {
  return CFStringCreateWithCharacters(kCFAllocatorDefault,
                                      reinterpret_cast<const UniChar*>(units.data()),
                                      static_cast<CFIndex>(units.size()));
}

TEST(CFString, CountsItsOwners) {
  CFStringRef text = Make("a");
  EXPECT_EQ(CFRetain(text), text);
  CFStringRef copy = CFStringCreateCopy(kCFAllocatorDefault, text);
  EXPECT_EQ(CFGetRetainCount(text), 3);
  CFRelease(copy);
  CFRelease(text);
  EXPECT_EQ(CFGetRetainCount(text), 1);
  CFRelease(text);
}

TEST(CFString, IsNullForWhatItCannotRead) {
  EXPECT_EQ(Make("\xFF"), nullptr);
  EXPECT_EQ(CFStringCreateWithCString(nullptr, "a", 0x0600), nullptr);
  EXPECT_EQ(CFStringCreateWithCharacters(nullptr, nullptr, 1), nullptr);
  const UniChar unit = 'a';
  EXPECT_EQ(CFStringCreateWithCharacters(nullptr, &unit, -1), nullptr);
  constexpr CFIndex kMost = std::numeric_limits<CFIndex>::max();
  EXPECT_EQ(CFStringCreateWithCharacters(nullptr, &unit, kMost), nullptr);
}

TEST(CFString, GivesItsTextInEitherEncoding) {
  const std::tuple<std::u16string, CFStringEncoding, CFIndex, Boolean, std::string> kCases[] = {
      {u"\u00E9t\u00E9", kCFStringEncodingUTF8, 6, 1, "\xC3\xA9t\xC3\xA9"},
      {u"\u00E9t\u00E9", kCFStringEncodingUTF8, 5, 0, "-"},  // No room for the terminator.
      {u"\u00E9t\u00E9", kCFStringEncodingMacRoman, 4, 1, "\x8Et\x8E"},
      {u"\u65E51", kCFStringEncodingMacRoman, 3, 0, "?1"},
      {u"\xDC00", kCFStringEncodingUTF8, 4, 1, "\xEF\xBF\xBD"},
      {u"", kCFStringEncodingUTF8, 1, 1, ""},
  };
  for (const auto& [units, encoding, size, success, bytes] : kCases) {
    SCOPED_TRACE(bytes);
    CFStringRef text = Make(units);
    std::array<char, 16> buffer = {"-"};
    EXPECT_EQ(CFStringGetCString(text, buffer.data(), size, encoding), success);
    EXPECT_EQ(buffer.data(), bytes);
    EXPECT_EQ(CFStringGetLength(text), static_cast<CFIndex>(units.size()));
    CFRelease(text);
  }
}

TEST(CFString, CopiesARangeOfItsUnits) {
  CFStringRef text = CFStringCreateWithCString(nullptr, "\x80xyz", kCFStringEncodingMacRoman);
  std::array<UniChar, 3> units = {'-', '-', '-'};
  CFStringGetCharacters(text, {0, 2}, units.data());
  EXPECT_EQ(units, (std::array<UniChar, 3>{0x00C4, 'x', '-'}));
  for (const CFRange outside : {CFRange{3, 2}, CFRange{-1, 2}, CFRange{0, -1}, CFRange{5, 1}}) {
    CFStringGetCharacters(text, outside, units.data());
    EXPECT_EQ(units[0], 0x00C4);
  }
  CFRelease(text);
}

TEST(CFString, KnowsTheMostBytes) {
  constexpr CFIndex kMost = std::numeric_limits<CFIndex>::max();
  EXPECT_EQ(CFStringGetMaximumSizeForEncoding(5, kCFStringEncodingUTF8), 15);
  EXPECT_EQ(CFStringGetMaximumSizeForEncoding(5, kCFStringEncodingMacRoman), 5);
  EXPECT_EQ(CFStringGetMaximumSizeForEncoding(5, 0x0600), -1);
  EXPECT_EQ(CFStringGetMaximumSizeForEncoding(kMost / 3 + 1, kCFStringEncodingUTF8), -1);
}

TEST(CFURL, GivesItsPathWithoutATrailingSeparator) {
  const std::pair<const char*, const char*> kCases[] = {
      {"/a/b", "/a/b"}, {"/a/b/", "/a/b"}, {"/", "/"}, {"a/", "a"}, {"", ""}};
  for (const auto& [text, expected] : kCases) {
    CFStringRef path = Make(text);
    CFURLRef url = CFURLCreateWithFileSystemPath(nullptr, path, kCFURLPOSIXPathStyle, 0);
    CFStringRef copied = CFURLCopyFileSystemPath(url, kCFURLPOSIXPathStyle);
    std::array<char, 16> buffer = {};
    CFStringGetCString(copied, buffer.data(), buffer.size(), kCFStringEncodingUTF8);
    EXPECT_STREQ(buffer.data(), expected);
    EXPECT_EQ(CFURLCopyFileSystemPath(url, 1), nullptr);
    EXPECT_EQ(CFURLCreateWithFileSystemPath(nullptr, path, 1, 0), nullptr);
    for (CFTypeRef object : {CFTypeRef{path}, CFTypeRef{url}, CFTypeRef{copied}}) CFRelease(object);
  }
}

TEST(CoreFoundation, TakesNullForAnyObject) {
  char buffer[2] = {};
  CFRelease(CFRetain(nullptr));
  EXPECT_EQ(Make(nullptr), nullptr);
  EXPECT_EQ(CFStringCreateCopy(nullptr, nullptr), nullptr);
  EXPECT_EQ(CFGetRetainCount(nullptr) + CFStringGetLength(nullptr), 0);
  EXPECT_EQ(CFStringGetCString(nullptr, buffer, 2, kCFStringEncodingUTF8), 0);
  EXPECT_EQ(CFURLCreateWithFileSystemPath(nullptr, nullptr, kCFURLPOSIXPathStyle, 0), nullptr);
  EXPECT_EQ(CFURLCopyFileSystemPath(nullptr, kCFURLPOSIXPathStyle), nullptr);
}

}  // namespace
