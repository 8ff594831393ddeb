// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/copy.h>
#include <sys/resource.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <functional>
#include <string>

#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"
#include "support/trees.h"

/// \file
/// The copies to a full path.

namespace {

namespace fs = std::filesystem;
using orb::test::Describe;
using orb::test::ReadAll;
using orb::test::TempFolder;

TEST(CopyFile, TakesTwoTextsAndReplacesNothing) {
  const TempFolder folder;
  folder.Write("a", "a");
  folder.Write("taken", "old");
  fs::create_symlink("nowhere", folder / "dangling");
  const struct {
    const char* from;
    const char* to;
    OrbResult expected;
  } kCases[] = {
      {"a", "taken", kOrbErrUnknown},
      {"a", "a", kOrbErrUnknown},
      {"a", "missing/new", kOrbErrNotFound},
      {"missing", "new", kOrbErrNoSuchFile},
      {"dangling", "new", kOrbErrNoSuchFile},
      {"\xff", "new", kOrbErrNoSuchFile},
  };
  const auto before = Describe(folder.Path());
  for (const auto& c : kCases)
    EXPECT_EQ(OrbCopyFile(S(folder / c.from), S(folder / c.to)), c.expected) << c.from << c.to;
  EXPECT_EQ(Describe(folder.Path()), before);
  EXPECT_EQ(OrbCopyFile(S(folder / "a"), S(folder / "new")), kOrbNoErr);
  EXPECT_EQ(ReadAll(folder / "new"), "a");
}

TEST(CopyFileOverwrite, TakesTwoFullPathsThatDifferInCaseAlone) {
  const TempFolder folder;
  fs::create_directory(folder / "sub");
  fs::create_directory_symlink("sub", folder / "link");
  folder.Write("sub/a", "new");
  folder.Write("sub/A", "old");
  const struct {
    const char* from;
    const char* to;
    OrbResult expected;
  } kRefused[] = {
      {"sub/a", "sub/a", kOrbErrAccessDenied},
      {"sub/a", "link/a", kOrbErrInsideSource},
      {"sub/a", "sub//a", kOrbErrInsideSource},
      {"sub/a", "sub", kOrbErrInsideSource},
      {"sub", "sub/A", kOrbErrInsideSource},
      {"missing", "sub/A", kOrbErrNotFound},
  };
  const auto before = Describe(folder.Path());
  const auto copy = [&](const char* from, const char* to) {
    return OrbCopyFileOverwrite(PathOf(folder / from), PathOf(folder / to));
  };
  for (const auto& c : kRefused) EXPECT_EQ(copy(c.from, c.to), c.expected) << c.from << c.to;
  EXPECT_EQ(Describe(folder.Path()), before);
  EXPECT_EQ(copy("sub/a", "sub/A"), kOrbNoErr);
  EXPECT_EQ(ReadAll(folder / "sub/A"), "new");
  ASSERT_TRUE(Lock(folder / "sub/A"));
  EXPECT_EQ(copy("sub/a", "sub/A"), kOrbErrAccessDenied);
}

/// What the callback does at its first, second, ... call.
using Script = std::function<bool(int)>;

struct Calls {
  Script script;
  int count = 0;

  static bool Call(void* data) {
    auto* self = static_cast<Calls*>(data);
    ++self->count;
    return !self->script || self->script(self->count);
  }
};

OrbResult CopyOnto(const std::string& source, const std::string& destination, Calls* calls) {
  return OrbCopyFileEx(
      PathOf(source), PathOf(destination), calls != nullptr ? Calls::Call : nullptr, calls);
}

TEST(HandleCopy, OverwritesAnExistingFileFromItsStart) {
  const TempFolder folder;
  for (const std::size_t size : {0u, 5u, 65536u, 65537u, 200000u}) {
    SCOPED_TRACE(size);
    folder.Write("source", std::string(size, 's'));
    folder.Write("old", std::string(100000, 'o'));
    Calls calls;
    EXPECT_EQ(CopyOnto(folder / "source", folder / "old", &calls), kOrbNoErr);
    EXPECT_EQ(calls.count, static_cast<int>((size + 65535) / 65536));
    const std::size_t rest = size < 100000 ? 100000 - size : 0;
    EXPECT_TRUE(ReadAll(folder / "old") == std::string(size, 's') + std::string(rest, 'o'));
  }
  EXPECT_EQ(CopyOnto(folder / "source", folder / "old", nullptr), kOrbNoErr);
}

TEST(HandleCopy, CarriesTimesAndLock) {
  const TempFolder folder;
  COrbFileHandle source(PathOf(folder.Write("source", "new")));
  folder.Write("old", "old");
  const COrbTime created(std::uint64_t{37000000000000000});
  const COrbTime updated(std::uint64_t{38000000000000000});
  ASSERT_EQ(source.SetCreateTime(created), kOrbNoErr);
  ASSERT_EQ(source.SetUpdateTime(updated), kOrbNoErr);
  ASSERT_TRUE(Lock(folder / "source"));
  EXPECT_EQ(CopyOnto(folder / "source", folder / "old", nullptr), kOrbNoErr);
  COrbFileHandle copy(PathOf(folder / "old"));
  COrbTime time;
  EXPECT_EQ(copy.GetCreateTime(&time), kOrbNoErr);
  EXPECT_EQ(time.ticks, created.ticks);
  EXPECT_EQ(copy.GetUpdateTime(&time), kOrbNoErr);
  EXPECT_EQ(time.ticks, updated.ticks);
  EXPECT_TRUE(copy.GetAttribute() & kOrbFileAttrLocked);
}

TEST(HandleCopy, RefusesBeforeItTouchesAnything) {
  const TempFolder folder;
  folder.Write("source", "new");
  folder.Write("locked", "old");
  folder.Write("old", "old");
  fs::create_directory(folder / "tree");
  fs::create_hard_link(folder / "source", folder / "hard");
  fs::create_symlink("old", folder / "link");
  ASSERT_TRUE(Lock(folder / "locked"));
  const struct {
    const char* from;
    const char* to;
    OrbResult expected;
  } kCases[] = {
      {"missing", "old", kOrbErrNotFound},
      {"source", "missing", kOrbErrNotFound},
      {"source", "locked", kOrbErrAccessDenied},
      {"source", "link", kOrbErrAccessDenied},
      {"source", "source", kOrbErrSamePath},
      {"source", "hard", kOrbErrSamePath},
      {"tree", "old", kOrbErrUnknown},
      {"source", "tree", kOrbErrUnknown},
      {"\xff", "old", kOrbErrNotFound},
  };
  const auto before = Describe(folder.Path());
  const int descriptors = orb::test::OpenDescriptors();
  Calls calls;
  for (const auto& c : kCases)
    EXPECT_EQ(CopyOnto(folder / c.from, folder / c.to, &calls), c.expected) << c.from << c.to;
  EXPECT_EQ(calls.count, 0);
  EXPECT_EQ(Describe(folder.Path()), before);
  EXPECT_EQ(orb::test::OpenDescriptors(), descriptors);
}

TEST(HandleCopy, DeletesTheDestinationWhenItIsCanceledButNotWhenTheCallbackThrows) {
  const TempFolder folder;
  folder.Write("source", std::string(200000, 's'));
  const int descriptors = orb::test::OpenDescriptors();
  for (const int last : {1, 3}) {
    folder.Write("old", "old");
    Calls cancels{[=](int count) { return count < last; }};
    EXPECT_EQ(CopyOnto(folder / "source", folder / "old", &cancels), kOrbErrCanceled);
    EXPECT_EQ(cancels.count, last);
    EXPECT_FALSE(fs::exists(folder / "old"));
  }
  folder.Write("old", "old");
  Calls throws{[](int count) { return count < 2 ? true : throw std::string("mine"); }};
  EXPECT_THROW(CopyOnto(folder / "source", folder / "old", &throws), std::string);
  EXPECT_TRUE(ReadAll(folder / "old") == std::string(65536, 's'));
  EXPECT_EQ(orb::test::OpenDescriptors(), descriptors);
}

TEST(HandleCopy, DeletesTheDestinationWhenItCannotBeWritten) {
  const TempFolder folder;
  folder.Write("source", std::string(200000, 's'));
  folder.Write("old", "old");
  const auto limit = [] {
    const rlimit size{100000, 100000};
    return std::signal(SIGXFSZ, SIG_IGN) != SIG_ERR && ::setrlimit(RLIMIT_FSIZE, &size) == 0;
  };
  ORB_IN_CHILD(orb::test::RunInChild(limit, [&] {
    EXPECT_EQ(CopyOnto(folder / "source", folder / "old", nullptr), kOrbErrUnknown);
    EXPECT_FALSE(fs::exists(folder / "old"));
  }));
}

}  // namespace
