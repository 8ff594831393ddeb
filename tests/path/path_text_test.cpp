// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/path/path_text.h>

#include <array>
#include <string>
#include <tuple>
#include <vector>

#include "support/paths.h"

namespace {

using Texts = std::vector<std::string>;

/// Asks both forms of a function, which agree on all but the empty path.
template <typename Function, typename... Rest>
std::string Both(Function function, const std::string& path, const Rest&... rest) {
  const std::string text = Text(function(S(path), rest...));
  const std::string ofPath = Text(function(PathOf(path), rest...));
  EXPECT_EQ(ofPath, path.empty() ? "" : text);
  return text;
}

#define ORB_BOTH(function, ...) \
  Both([](const auto&... arguments) { return function(arguments...); }, __VA_ARGS__)

Texts Pieces(const std::string& path) {
  std::vector<COrbStringData> pieces{S("old"), S(path)};
  OrbSplitFilePath(pieces[1], &pieces);  // The path is one of the old pieces.
  Texts texts;
  for (const COrbStringData& piece : pieces) texts.push_back(Text(piece));
  return texts;
}

TEST(PathText, FindsExtensionAndFileName) {
  const std::array<const char*, 5> kCases[] = {
      {"/a/b.tar.gz", ".gz", "gz", "b.tar.gz", "b.tar"},
      {"/a/b", "", "", "b", "b"},
      {"/a.d/b", ".d/b", "d/b", "b", "b"},
      {"/a/b.", ".", "", "b.", "b"},
      {"/a/.profile", ".profile", "profile", ".profile", ""},
      {"/a/b/", "", "", "", ""},
      {"b.c", ".c", "c", "b.c", "b"},
      {"/a.\xCC\x81x", ".\xCC\x81x", "\xCC\x81x", "a.\xCC\x81x", "a"},  // Found literally.
      {"/\xFF.c", "", "", "/\xFF.c", "/\xFF.c"},  // Not UTF-8: nothing is found.
  };
  for (const auto& [path, dotted, extension, name, withoutExtension] : kCases) {
    SCOPED_TRACE(path);
    EXPECT_EQ(ORB_BOTH(OrbPathFindExtension, path, true), dotted);
    EXPECT_EQ(ORB_BOTH(OrbPathFindExtension, path, false), extension);
    EXPECT_EQ(ORB_BOTH(OrbPathFindFileName, path, false), name);
    EXPECT_EQ(ORB_BOTH(OrbPathFindFileName, path, true), withoutExtension);
  }
}

TEST(PathText, TellsNoValueFromTheEmptyText) {
  EXPECT_TRUE(HasNoValue(OrbPathFindExtension(S("/a."), false)));
  EXPECT_TRUE(HasNoValue(OrbPathFindFileName(S("/a/"), false)));
  EXPECT_FALSE(HasNoValue(OrbPathFindFileName(S("/a/.b"), true)));
  EXPECT_FALSE(HasNoValue(OrbPathRemoveBackslash(S("/"))));
  EXPECT_TRUE(HasNoValue(OrbPathAddBackslash(COrbFilePath())));
}

TEST(PathText, SplitsIntoThePiecesThatAreNotEmpty) {
  EXPECT_EQ(Pieces("/a//b.c/"), (Texts{"a", "b.c"}));
  EXPECT_EQ(Pieces("/a/\xCC\x81/b"), (Texts{"a", "\xCC\x81", "b"}));  // A mark hides no separator.
  EXPECT_EQ(Pieces("b.c"), Texts{"b.c"});
  for (const char* path : {"", "//", "/\xFF/b"}) EXPECT_EQ(Pieces(path), Texts{}) << path;
  std::vector<COrbStringData> pieces{S("old")};
  OrbSplitFilePath(COrbFilePath(), &pieces);
  EXPECT_EQ(pieces.size(), 1u);
}

TEST(PathText, RenamesFromThePieces) {
  const std::array<const char*, 4> kCases[] = {
      {"/a/b.jpg", ".tif", "/a/b.tif", "/a/.tif.jpg"},
      {"/a/b.jpg", "c", "/a/b.c", "/a/c.jpg"},
      {"/a//b.jpg/", "c", "/a/b.c", "/a/c.jpg/"},
      {"/a.d/b", "c", "/a.d/b.c", "/a.d/c.d/b"},
      {"b.jpg", "c.x", "/b.c.x", "/c.x.jpg"},
      {"/.b", "..x", "/..x", "/..x.b"},
      {"/a/\xCC\x81.b", "c", "/a/\xCC\x81.c", "/a/c.b"},
      {"", "x", ".x", "x"},
  };
  for (const auto& [path, given, extensionRenamed, nameRenamed] : kCases) {
    EXPECT_EQ(ORB_BOTH(OrbPathRenameExtension, path, S(given)), extensionRenamed) << path << given;
    EXPECT_EQ(ORB_BOTH(OrbPathRenameFileName, path, S(given)), nameRenamed) << path << given;
  }
}

TEST(PathText, TakesAndAddsOneSeparator) {
  const std::array<const char*, 3> kCases[] = {
      {"/a/", "/a", "/a/"},
      {"/a", "/a", "/a/"},
      {"/", "", "/"},
      {"", "", "/"},
      {"/a//", "/a/", "/a//"},
  };
  for (const auto& [path, without, with] : kCases) {
    EXPECT_EQ(ORB_BOTH(OrbPathRemoveBackslash, path), without) << path;
    EXPECT_EQ(ORB_BOTH(OrbPathAddBackslash, path), with) << path;
  }
}

TEST(PathText, ComparesPathsAndTellsAncestors) {
  const std::tuple<const char*, const char*, int, int, bool, bool> kCases[] = {
      {"/a", "/a/", 0, 0, true, true},
      {"/a/b", "/a/bcde", -3, -3, true, false},
      {"/a/b", "/A/B/c", -2, -2, true, true},
      {"/a/c", "/a/b/c", -2, -2, false, false},
      {"/A/b/", "/a/B", -1, 0, true, true},
      {"/a//", "/a", 1, 1, false, false},
      {"/", "/a", -2, -2, true, true},
      {"/", "", 0, 0, false, false},
      {"/\xC3\xA9", "/ab", 1, 1, false, false},  // By bytes.
      {"/\xC3\xA9", "/\xC3\x89", 1, 0, true, true},
      {"/ff", "/\xEF\xAC\x80", -1, -1, false, false},  // The ligature ff.
  };
  for (const auto& [a, b, exact, noCase, isPrefix, isAncestor] : kCases) {
    SCOPED_TRACE(testing::Message() << a << " and " << b);
    EXPECT_EQ(OrbPathCompare(S(a), S(b)), exact);
    EXPECT_EQ(OrbPathCompare(S(b), S(a)), -exact);
    EXPECT_EQ(OrbPathCompareNoCase(S(a), S(b)), noCase);
    EXPECT_EQ(OrbPathIsEqualOrRootActually(S(a), S(b), false), isPrefix);
    EXPECT_EQ(OrbPathIsEqualOrRootActually(S(a), S(b), true), isAncestor);
  }
}

}  // namespace
