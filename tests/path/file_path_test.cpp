// SPDX-License-Identifier: MIT
#include <orb/path/file_path.h>

#include <tuple>
#include <utility>

#include "support/files.h"

namespace {

using namespace orb::test;

std::string Text(const COrbFilePath& path) { return Text(path.GetFullPath()); }

/// Sees every change of its path, as a class with a cache must, and answers with a code of its own.
class WatchedPath : public COrbFilePath {
 public:
  using COrbFilePath::Initialize;
  using COrbFilePath::operator=;
  void Free() override {
    seen += 'F';
    COrbFilePath::Free();
  }
  OrbResult Initialize(const COrbStringData* text) override {
    seen += 'I';
    COrbFilePath::Initialize(text);
    return 0x77;
  }
  std::string seen;
};

TEST(FilePath, KeepsItsTextAndShowsEveryChange) {
  const COrbStringData full = S("/a//b/");
  WatchedPath path;
  EXPECT_TRUE(HasNoValue(path.GetFullPath()));
  path.Initialize(&full);
  path = std::as_const(path);
  EXPECT_EQ(path.seen, "IF");
  const COrbFilePath copy = path;
  const COrbFilePath moved = std::move(static_cast<COrbFilePath&>(path));
  EXPECT_EQ(Text(copy), "/a//b/");
  EXPECT_EQ(Text(moved), "/a//b/");
  EXPECT_TRUE(OrbIsPathEmpty(path));
  EXPECT_EQ(path.seen, "IFF");
  path = copy;
  EXPECT_EQ(Text(path), "/a//b/");
  OrbClearPath(&path);
  EXPECT_TRUE(path.IsEmpty());
  EXPECT_EQ(path.seen, "IFFIFF");
}

TEST(FilePath, TakesPlatformTexts) {
  WatchedPath path;
  const UniChar units[] = {'/', 0xD800, 0xE9};
  CFStringRef text = CFStringCreateWithCharacters(kCFAllocatorDefault, units, 3);
  EXPECT_EQ(path.Initialize(&text), kOrbNoErr);
  EXPECT_EQ(Text(path), "/\xEF\xBF\xBD\xC3\xA9");
  CFRelease(text);
  text = nullptr;
  EXPECT_EQ(path.Initialize(&text), kOrbNoErr);
  EXPECT_TRUE(path.IsEmpty());

  const CFURLRef url = PathOf("/a/b/").CreateCopyCFURL();
  EXPECT_EQ(path.Initialize(url), kOrbNoErr);
  EXPECT_EQ(Text(path), "/a/b");
  CFRelease(url);
  EXPECT_EQ(path.Initialize(CFURLRef{nullptr}), kOrbNoErr);
  EXPECT_TRUE(path.IsEmpty());
  EXPECT_EQ(path.seen, "FFFF");
}

TEST(GetParent, IsTheTextUpToTheLastSeparator) {
  const std::tuple<const char*, const char*, OrbResult> kCases[] = {
      {"/a/b", "/a", kOrbNoErr},
      {"/a/b//", "/a/b", kOrbNoErr},
      {"/a/", "/", kOrbNoErr},
      {"//", "/", kOrbNoErr},
      {"a/b", "a", kOrbNoErr},
      {"/a/\xFF", "/a", kOrbNoErr},
      {"", "", kOrbErrEmptyPath},
      {"/", "/", kOrbErrNoSuchFile},
      {"a/", "a/", kOrbErrNoSuchFile},
  };
  for (const auto& [text, parent, result] : kCases) {
    COrbFilePath path = PathOf(text);
    EXPECT_EQ(path.GetParent(&path), result) << text;
    EXPECT_EQ(Text(path), parent) << text;
  }
  WatchedPath parent;
  EXPECT_EQ(PathOf("/a/b").GetParent(&parent), 0x77u);
}

TEST(FileReference, HoldsTheAbsolutePathOfAnExistingItem) {
  const Tree tree("\xC3\xA9 %s, link -> \xC3\xA9 %s");
  const fs::path old = fs::current_path();
  fs::current_path(tree.Path());
  const std::string here = fs::current_path();
  for (const auto& [path, held] : {std::pair<std::string, std::string>("link", here + "/link"),
                                   {"\xC3\xA9 %s", here + "/\xC3\xA9 %s"},
                                   {here + "//", here},
                                   {"/", "/"}}) {
    FSRef reference;
    EXPECT_EQ(PathOf(path).GetFSRef(&reference), kOrbNoErr) << path;
    COrbFilePath back;
    EXPECT_EQ(back.Initialize(&reference), kOrbNoErr) << path;
    EXPECT_EQ(Text(back), held);
  }
  fs::current_path(old);
}

TEST(FileReference, NeedsSomethingAtThePath) {
  const Tree tree("dangling -> nothing, \xFF, file");
  for (const char* path : {"", "none", "dangling", "\xFF", "file/"}) {
    FSRef reference{};
    EXPECT_EQ(PathOf(tree.At(path)).GetFSRef(&reference), kOrbErrNotFound) << path;
    WatchedPath back;
    EXPECT_EQ(back.Initialize(&reference), kOrbErrNoSuchFile);
    EXPECT_TRUE(back.IsEmpty());
    EXPECT_EQ(back.seen, "FF");
  }
}

}  // namespace
