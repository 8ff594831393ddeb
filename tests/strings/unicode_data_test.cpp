// SPDX-License-Identifier: MIT
// Unicode's own test data, as Debian's package unicode-data has it, through the public operations.
#include <gtest/gtest.h>
#include <orb/strings/string_functions.h>
#include <unicode/uchar.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "platform/transcode.h"
#include "support/texts.h"

namespace {

using Fields = std::vector<std::string>;

std::string Unpacked(const std::string& path) {
  std::string content;
  std::array<char, 65536> block;
  FILE* pipe = ::popen(("bzip2 -dc " + path).c_str(), "r");
  if (pipe == nullptr) return content;
  for (std::size_t n; (n = std::fread(block.data(), 1, block.size(), pipe)) != 0;) {
    content.append(block.data(), n);
  }
  ::pclose(pipe);
  return content;
}

std::string Content(const std::string& name) {
  const std::string path = "/usr/share/unicode/" + name;
  if (std::filesystem::exists(path + ".bz2")) return Unpacked(path + ".bz2");
  std::ostringstream content;
  content << std::ifstream(path).rdbuf();
  return content.str();
}

/// The fields of each row, without comments and the blanks in front of them.
std::vector<Fields> Rows(const std::string& name) {
  std::vector<Fields> rows;
  std::istringstream lines(Content(name));
  for (std::string line; std::getline(lines, line);) {
    std::istringstream cells(line.substr(0, line.find('#')));
    Fields fields;
    for (std::string cell; std::getline(cells, cell, ';');) {
      fields.push_back(cell.substr(std::min(cell.size(), cell.find_first_not_of(' '))));
    }
    if (fields.size() > 1) rows.push_back(fields);
  }
  return rows;
}

/// The text of "0041 0301"; empty when ICU does not know one of the characters yet.
std::string Utf8(const std::string& points) {
  std::u16string units;
  std::istringstream words(points);
  for (unsigned long c; words >> std::hex >> c;) {
    if (u_isdefined(static_cast<UChar32>(c)) == 0) return {};
    if (c >= 0x10000) units.push_back(static_cast<char16_t>(0xD7C0 + (c >> 10)));
    units.push_back(static_cast<char16_t>(c < 0x10000 ? c : 0xDC00 + (c & 0x3FF)));
  }
  return orb::platform::Utf8FromUtf16(units);
}

TEST(UnicodeData, EquivalentColumnsAreEqualAndFindEachOther) {
  const std::vector<Fields> rows = Rows("NormalizationTest.txt");
  if (rows.empty()) GTEST_SKIP() << "the package unicode-data is not installed";
  for (const Fields& row : rows) {
    ASSERT_GE(row.size(), 5U);
    for (const auto& [first, second] : {std::pair{0U, 1U}, {0U, 2U}, {1U, 2U}, {3U, 4U}}) {
      const COrbStringData a = S(Utf8(row[first]));
      const COrbStringData b = S(Utf8(row[second]));
      if (a.IsEmpty() || b.IsEmpty()) continue;
      SCOPED_TRACE(row[first] + " | " + row[second]);
      ASSERT_EQ(OrbStringDataCmpi(a, b), 0);
      ASSERT_EQ(Text(OrbStringDataStr(a, b)), Text(a));
      ASSERT_EQ(Text(OrbStringDataStr(b, a)), Text(b));
      const COrbStringData inside = S("x" + Text(a) + "x");
      const COrbStringData found = OrbStringDataStr(inside, S("x" + Text(b) + "x"));
      ASSERT_EQ(Text(found), Text(inside));
    }
  }
}

TEST(UnicodeData, FullCaseFoldingsAreEqualWithoutCase) {
  const std::vector<Fields> rows = Rows("CaseFolding.txt");
  if (rows.empty()) GTEST_SKIP() << "the package unicode-data is not installed";
  for (const Fields& row : rows) {
    if (row[1] != "C" && row[1] != "F") continue;
    SCOPED_TRACE(row[0]);
    const COrbStringData self = S(Utf8(row[0]));
    const COrbStringData folded = S(Utf8(row[2]));
    if (self.IsEmpty()) continue;
    ASSERT_NE(OrbStringDataCmp(self, folded), 0);
    ASSERT_EQ(OrbStringDataCmpi(self, folded), 0);
    ASSERT_EQ(OrbStringDataCmpni(self, folded, 100), 0);
    ASSERT_EQ(Text(OrbStringDataStrNoCase(self, folded)), Text(self));
    ASSERT_EQ(Text(OrbStringDataStrNoCase(folded, self)), Text(folded));
  }
}

TEST(UnicodeData, SpecialCasesHoldWithoutALanguage) {
  const std::vector<Fields> rows = Rows("SpecialCasing.txt");
  if (rows.empty()) GTEST_SKIP() << "the package unicode-data is not installed";
  for (const Fields& row : rows) {
    if (row.size() > 4 && !row[4].empty()) continue;  // Depends on a language or on what follows.
    SCOPED_TRACE(row[0]);
    const COrbStringData self = S(Utf8(row[0]));
    EXPECT_EQ(Text(OrbStringDataLower(self)), Utf8(row[1]));
    EXPECT_EQ(Text(OrbStringDataUpper(self)), Utf8(row[3]));
  }
}

}  // namespace
