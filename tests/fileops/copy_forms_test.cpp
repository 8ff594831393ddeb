// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>

#include "support/files.h"

/// \file
/// The copies to a full path.

namespace orb::test {
namespace {

TEST(CopyFile, TakesTwoTextsAndReplacesNothing) {
  const Tree tree("a, taken, dangling -> nowhere");
  const Row<OrbResult> kCases[] = {
      {"a", "taken", kOrbErrUnknown},
      {"a", "missing/new", kOrbErrNotFound},
      {"missing", "new", kOrbErrNoSuchFile},
      {"dangling", "new", kOrbErrNoSuchFile},
  };
  const auto copy = [](auto&& from, auto&& to) { return OrbCopyFile(S(from), S(to)); };
  ExpectRefusals(tree, kCases, copy);
  EXPECT_EQ(OrbCopyFile(S(tree / "a"), S(tree / "new")), kOrbNoErr);
  EXPECT_EQ(tree.Read("new"), "a");
}

TEST(CopyFileOverwrite, RemovesNothingOfAFolderThatItCannotLookInto) {
  const Tree tree("new, to/new/photo, to/new/closed/other, to/new/zoo");
  tree.Make("to/new/closed/ 0300");
  for (const std::string folder : {"", "to", "to/new", "to/new/closed"})
    ASSERT_EQ(::chown((tree / folder).c_str(), kStranger, kStranger), 0);
  const Unchanged unchanged(tree.Path());
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    const OrbResult copied = OrbCopyFileOverwrite(PathOf(tree / "new"), PathOf(tree / "to/new"));
    EXPECT_EQ(copied, kOrbErrAccessDenied);
  }));
}

TEST(CopyFileOverwrite, TakesTwoFullPathsThatDifferInCaseAlone) {
  const Tree tree("sub/a, sub/A, sub/locked!, link -> sub");
  const Row<OrbResult> kRefused[] = {
      {"sub/a", "sub/a", kOrbErrAccessDenied},
      {"sub/a", "link/a", kOrbErrInsideSource},
      {"sub/a", "sub//a", kOrbErrInsideSource},
      {"sub/a", "sub", kOrbErrInsideSource},
      {"sub", "sub/A", kOrbErrInsideSource},
      {"missing", "sub/A", kOrbErrNotFound},
      {"sub/a", "sub/locked", kOrbErrAccessDenied},
  };
  const auto copy = [](auto&& from, auto&& to) {
    return OrbCopyFileOverwrite(PathOf(from), PathOf(to));
  };
  ExpectRefusals(tree, kRefused, copy);
  EXPECT_EQ(OrbCopyFileOverwrite(PathOf(tree / "sub/a"), PathOf(tree / "sub/A")), kOrbNoErr);
  EXPECT_EQ(tree.Read("sub/A"), "sub/a");
}

OrbResult CopyOnto(const std::string& from, const std::string& to, Progress* calls = nullptr) {
  const auto call = calls != nullptr ? Progress::Call : nullptr;
  return OrbCopyFileEx(PathOf(from), PathOf(to), call, calls);
}

TEST(HandleCopy, OverwritesAnExistingFileFromItsStart) {
  for (const std::size_t size : {0u, 5u, 65536u, 65537u, 200000u}) {
    SCOPED_TRACE(size);
    const std::string bytes(size, 's'), old(100000, 'o');
    const Tree tree("source=" + bytes + ", old=" + old);
    Progress calls;
    EXPECT_EQ(CopyOnto(tree / "source", tree / "old", &calls), kOrbNoErr);
    EXPECT_EQ(calls.calls, static_cast<int>((size + 65535) / 65536));
    EXPECT_TRUE(tree.Read("old") == bytes + (size < old.size() ? old.substr(size) : ""));
    EXPECT_EQ(CopyOnto(tree / "source", tree / "old"), kOrbNoErr);
  }
}

TEST(HandleCopy, CarriesTimesAndLock) {
  const Tree tree("source, old");
  COrbFileHandle source(PathOf(tree / "source"));
  const COrbTime times[] = {std::uint64_t{37000000000000000}, std::uint64_t{38000000000000000}};
  ASSERT_EQ(source.SetCreateTime(times[0]), kOrbNoErr);
  ASSERT_EQ(source.SetUpdateTime(times[1]), kOrbNoErr);
  ASSERT_TRUE(SetLock(tree / "source", true));
  EXPECT_EQ(CopyOnto(tree / "source", tree / "old"), kOrbNoErr);
  const COrbFileHandle copy(PathOf(tree / "old"));
  COrbTime read[2];
  EXPECT_EQ(copy.GetCreateTime(&read[0]), kOrbNoErr);
  EXPECT_EQ(copy.GetUpdateTime(&read[1]), kOrbNoErr);
  EXPECT_TRUE(read[0] == times[0] && read[1] == times[1]);
  EXPECT_TRUE(copy.GetAttribute() & kOrbFileAttrLocked);
}

TEST(HandleCopy, RefusesBeforeItTouchesAnything) {
  const Tree tree("source, locked!, old, tree/, hard => source, link -> old");
  const Row<OrbResult> kCases[] = {
      {"missing", "old", kOrbErrNotFound},
      {"source", "missing", kOrbErrNotFound},
      {"source", "locked", kOrbErrAccessDenied},
      {"source", "link", kOrbErrAccessDenied},
      {"source", "source", kOrbErrSamePath},
      {"source", "hard", kOrbErrSamePath},
      {"tree", "old", kOrbErrUnknown},
      {"source", "tree", kOrbErrUnknown},
  };
  Progress calls;
  ExpectRefusals(tree, kCases, [&](auto&& from, auto&& to) { return CopyOnto(from, to, &calls); });
  EXPECT_EQ(calls.calls, 0);
}

TEST(HandleCopy, DeletesTheDestinationWhenItIsCanceledButNotWhenTheCallbackThrows) {
  const Tree tree("source=" + std::string(200000, 's'));
  const int descriptors = OpenDescriptors();
  for (const int last : {1, 3}) {
    tree.Make("old");
    Progress cancels{last};
    EXPECT_EQ(CopyOnto(tree / "source", tree / "old", &cancels), kOrbErrCanceled);
    EXPECT_EQ(cancels.calls, last);
    EXPECT_FALSE(tree.Has("old"));
  }
  tree.Make("old");
  const auto throws = [](void* calls) {
    return ++*static_cast<int*>(calls) < 2 ? true : throw std::string("mine");
  };
  int calls = 0;
  EXPECT_THROW(OrbCopyFileEx(PathOf(tree / "source"), PathOf(tree / "old"), throws, &calls),
               std::string);
  EXPECT_TRUE(tree.Read("old") == std::string(65536, 's'));
  EXPECT_EQ(OpenDescriptors(), descriptors);
}

TEST(HandleCopy, DeletesTheDestinationWhenItCannotBeWritten) {
  const Tree tree("old, source=" + std::string(200000, 's'));
  const auto copy = [&] { return CopyOnto(tree / "source", tree / "old"); };
  const auto limit = [] { return LimitFiles(100000); };
  ORB_IN_CHILD(RunInChild(limit, [&] { EXPECT_EQ(copy(), kOrbErrUnknown); }));
  EXPECT_FALSE(tree.Has("old"));
}

}  // namespace
}  // namespace orb::test
