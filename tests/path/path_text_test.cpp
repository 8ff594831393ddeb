// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/path/path_text.h>

#include <string>
#include <vector>

#include "support/texts.h"

namespace {

using Texts = std::vector<std::string>;

/// Asks both forms of a function, which agree on all but the empty path.
template <typename Function, typename... Rest>
std::string Both(Function function, const std::string& path, const Rest&... rest) {
  const std::string text = Text(function(S(path), rest...));
  COrbFilePath filePath;
  const COrbStringData full = S(path);
  filePath.Initialize(&full);
  const std::string ofPath = Text(function(filePath, rest...));
  EXPECT_EQ(ofPath, path.empty() ? "" : text);
  return text;
}

#define ORB_BOTH(function, ...) \
  Both([](const auto&... arguments) { return function(arguments...); }, __VA_ARGS__)

Texts Pieces(const COrbStringData& path) {
  std::vector<COrbStringData> pieces{S("old")};
  OrbSplitFilePath(path, &pieces);
  Texts texts;
  for (const COrbStringData& piece : pieces) texts.push_back(Text(piece));
  return texts;
}

TEST(PathExtension, IsTheTextAfterTheLastDot) {
  const struct {
    const char* path;
    const char* withDot;
    const char* without;
  } kCases[] = {{"/a/b.tar.gz", ".gz", "gz"},
                {"/a/b", "", ""},
                {"/a.d/b", ".d/b", "d/b"},
                {"/a/b.", ".", ""},
                {"/a/.profile", ".profile", "profile"},
                {"", "", ""},
                {"/a.\xCC\x81x", ".\xCC\x81x", "\xCC\x81x"},  // Literally: an accent may follow.
                {"/\xFF.jpg", "", ""}};                       // Not UTF-8.
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(ORB_BOTH(OrbPathFindExtension, c.path, true), c.withDot);
    EXPECT_EQ(ORB_BOTH(OrbPathFindExtension, c.path, false), c.without);
  }
}

TEST(PathFileName, IsTheTextAfterTheLastSeparator) {
  const struct {
    const char* path;
    const char* name;
    const char* without;
  } kCases[] = {{"/a/b.c", "b.c", "b"},
                {"/a/b/", "", ""},
                {"b.c", "b.c", "b"},
                {"/a/.profile", ".profile", ""},
                {"/a.d/b", "b", "b"},
                {"/a/b.", "b.", "b"},
                {"/a/b.c.d", "b.c.d", "b.c"},
                {"", "", ""},
                {"/\xFF.c", "/\xFF.c", "/\xFF.c"}};
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(ORB_BOTH(OrbPathFindFileName, c.path, false), c.name);
    EXPECT_EQ(ORB_BOTH(OrbPathFindFileName, c.path, true), c.without);
  }
}

TEST(PathResults, TellNoValueFromTheEmptyText) {
  EXPECT_TRUE(HasNoValue(OrbPathFindExtension(S("/a"), true)));
  EXPECT_TRUE(HasNoValue(OrbPathFindFileName(S("/a/"), false)));
  EXPECT_FALSE(HasNoValue(OrbPathFindFileName(S("/a/.b"), true)));
  EXPECT_FALSE(HasNoValue(OrbPathRemoveBackslash(S("/"))));
  EXPECT_TRUE(HasNoValue(OrbPathAddBackslash(COrbFilePath())));
}

TEST(SplitPath, GivesThePiecesThatAreNotEmpty) {
  EXPECT_EQ(Pieces(S("/a//b.c/")), (Texts{"a", "b.c"}));
  EXPECT_EQ(Pieces(S("b.c")), Texts{"b.c"});
  EXPECT_EQ(Pieces(S("//")), Texts{});
  EXPECT_EQ(Pieces(S("")), Texts{});
  EXPECT_EQ(Pieces(S("/\xFF/b")), Texts{});
  OrbSplitFilePath(S("/a"), nullptr);

  std::vector<COrbStringData> pieces{S("old")};
  OrbSplitFilePath(COrbFilePath(), &pieces);
  EXPECT_EQ(pieces.size(), 1u);
  pieces[0] = S("x/y");
  OrbSplitFilePath(pieces[0], &pieces);  // The path is one of the old pieces.
  ASSERT_EQ(pieces.size(), 2u);
  EXPECT_EQ(Text(pieces[1]), "y");
}

TEST(RenameExtension, RebuildsThePathFromItsPieces) {
  const struct {
    const char* path;
    const char* extension;
    const char* renamed;
  } kCases[] = {{"/a/b.jpg", ".tif", "/a/b.tif"},
                {"/a/b.jpg", "tif", "/a/b.tif"},
                {"/a/b.jpg", "", "/a/b"},
                {"/a/b.jpg", ".", "/a/b"},
                {"/a//b.jpg/", "tif", "/a/b.tif"},
                {"b.c", "x", "/b.x"},
                {"/a.d/b", "..x", "/a.d/b..x"},
                {"/.b", "x", "/.x"},
                {"//", "x", ".x"},
                {"", "x", ".x"}};
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(ORB_BOTH(OrbPathRenameExtension, c.path, S(c.extension)), c.renamed);
  }
}

TEST(RenameFileName, KeepsTheExtension) {
  const struct {
    const char* path;
    const char* name;
    const char* renamed;
  } kCases[] = {{"/a/b.jpg", "c", "/a/c.jpg"},
                {"/a/b", "c", "/a/c"},
                {"/a.d/b", "c", "/a.d/c.d/b"},
                {"/a//b.jpg/", "c", "/a/c.jpg/"},
                {"/a/b.jpg", "c.x", "/a/c.x.jpg"},
                {"b.jpg", "c", "/c.jpg"},
                {"/a/b.", "c", "/a/c"},
                {"//", "c", "c"},
                {"/a/b.x", "", "/a/.x"}};
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(ORB_BOTH(OrbPathRenameFileName, c.path, S(c.name)), c.renamed);
  }
}

TEST(TrailingSeparator, IsTakenAndAdded) {
  const struct {
    const char* path;
    const char* without;
    const char* with;
  } kCases[] = {{"/a/", "/a", "/a/"},
                {"/a", "/a", "/a/"},
                {"/", "", "/"},
                {"", "", "/"},
                {"/a//", "/a/", "/a//"},
                {"\xFF/", "\xFF", "\xFF/"}};
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(ORB_BOTH(OrbPathRemoveBackslash, c.path), c.without);
    EXPECT_EQ(ORB_BOTH(OrbPathAddBackslash, c.path), c.with);
  }
}

TEST(ComparePath, OrdersByLengthFirst) {
  const struct {
    const char* a;
    const char* b;
    int exact;
    int noCase;
  } kCases[] = {{"/a", "/a/", 0, 0},
                {"/ab", "/a", 1, 1},
                {"/b", "/abcd", -3, -3},
                {"/a/B", "/a/b", -1, 0},
                {"/A/b/", "/a/B", -1, 0},
                {"/", "", 0, 0},
                {"/a//", "/a", 1, 1},
                {"/\xC3\xA9", "/ab", 1, 1},
                {"/\xC3\xA9", "/\xC3\x89", 1, 0},
                {"/\xFF", "/a", 0, 0}};  // Not UTF-8: it compares as 0.
  for (const auto& c : kCases) {
    SCOPED_TRACE(testing::Message() << c.a << " and " << c.b);
    EXPECT_EQ(OrbPathCompare(S(c.a), S(c.b)), c.exact);
    EXPECT_EQ(OrbPathCompare(S(c.b), S(c.a)), -c.exact);
    EXPECT_EQ(OrbPathCompareNoCase(S(c.a), S(c.b)), c.noCase);
  }
}

TEST(EqualOrRoot, IsThePathOrAnAncestor) {
  const struct {
    const char* a;
    const char* b;
    bool plain;
    bool withSeparator;
  } kCases[] = {{"/a/b", "/A/B/c", true, true},
                {"/a/b", "/a/bc", true, false},
                {"/a/b/", "/a/b", true, true},
                {"/a/b", "/a/b/", true, true},
                {"/a/b/c", "/a/b", false, false},
                {"", "/a", false, false},
                {"/a", "", false, false},
                {"/", "/a", true, true},
                {"/\xC3\x89", "/\xC3\xA9/x", true, true}};
  for (const auto& c : kCases) {
    SCOPED_TRACE(testing::Message() << c.a << " and " << c.b);
    EXPECT_EQ(OrbPathIsEqualOrRootActually(S(c.a), S(c.b), false), c.plain);
    EXPECT_EQ(OrbPathIsEqualOrRootActually(S(c.a), S(c.b), true), c.withSeparator);
  }
}

TEST(PathText, NoLastCharacterIsInvalid) {
  for (const char* path : {"", "/a.", "/a "}) EXPECT_FALSE(OrbPathIsEndofInvalidCharactor(S(path)));
}

}  // namespace
