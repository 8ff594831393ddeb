// SPDX-License-Identifier: MIT
#include "text.h"

#include <gtest/gtest.h>

namespace orbimport {
namespace {

TEST(Quote, LeavesPlainNamesAndMakesTheRestSafe) {
  const std::pair<std::string, std::string> kCases[] = {
      {"DCIM/IMG_1.JPG", "DCIM/IMG_1.JPG"},
      {"a b's 100%.jpg", "a b's 100%.jpg"},
      {"Caf\u00e9 Cafe\u0301 \u6771.jpg", "Caf\u00e9 Cafe\u0301 \u6771.jpg"},
      {"", "\"\""},
      {" edge", "\" edge\""},
      {"a\nb\t\"\\", R"("a\nb\t\"\\")"},
      {"bell\x07 escape\x1b[31m", R"("bell\u{7} escape\u{1b}[31m")"},
      {"\u009b31m", R"("\u{9b}31m")"},                      // A C1 control opens sequences too.
      {"photo\u202egpj.exe", R"("photo\u{202e}gpj.exe")"},  // Turns the direction.
      {"\xff\xe9.jpg", R"("\xFF\xE9.jpg")"},
      {"\xc0\xaf", R"("\xC0\xAF")"},          // Overlong.
      {"\xed\xa0\x80", R"("\xED\xA0\x80")"},  // A surrogate.
      {"cut \xe6\x9d", R"("cut \xE6\x9D")"},
  };
  for (const auto& [name, quoted] : kCases) {
    EXPECT_EQ(Quote(name), quoted);
    EXPECT_EQ(IsUtf8(name), quoted.find("\\x") == std::string::npos) << quoted;
  }
}

TEST(JsonText, IsValidWhateverTheBytesAre) {
  EXPECT_EQ(JsonText("a\"\\\n\x01/\u6771"), "\"a\\\"\\\\\\n\\u0001/\u6771\"");
  EXPECT_EQ(JsonText("\xff\xe9."), R"("\ufffd\ufffd.")");
  EXPECT_EQ(JsonText("\U000E0041"), R"("\udb40\udc41")");
}

TEST(PercentEncode, ComesBackByteForByte) {
  std::string all;
  for (int i = 1; i < 256; ++i) all += static_cast<char>(i);
  std::string back;
  EXPECT_TRUE(PercentDecode(PercentEncode(all), back));
  EXPECT_EQ(back, all);
  EXPECT_EQ(PercentEncode("a/b c\n%\xff"), "a/b%20c%0A%25%FF");
  for (const char* const bad : {"%", "%4", "%zz", "%4g", "a b"}) {
    EXPECT_FALSE(PercentDecode(bad, back)) << bad;
  }
}

TEST(Format, BytesDurationsAndCodes) {
  EXPECT_EQ(FormatBytes(999), "999 B");
  EXPECT_EQ(FormatBytes(1500), "1.5 kB");
  EXPECT_EQ(FormatBytes(999'960), "1.0 MB");  // Never 1000.0 kB.
  EXPECT_EQ(FormatBytes(~0ull), "18.4 EB");
  EXPECT_EQ(FormatDuration(7), "0:07");
  EXPECT_EQ(FormatDuration(3723), "1:02:03");
  EXPECT_EQ(CodeName(kOrbErrDiskFull), "kOrbErrDiskFull");
  EXPECT_EQ(CodeName(0x1999), "0x1999");
}

}  // namespace
}  // namespace orbimport
