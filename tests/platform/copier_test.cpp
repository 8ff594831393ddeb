// SPDX-License-Identifier: MIT
#include "platform/copier.h"

#include <signal.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <sys/xattr.h>

#include <chrono>
#include <thread>
#include <vector>

#include "platform/linux/item_metadata.h"
#include "platform/linux/posix.h"
#include "platform/removal.h"
#include "support/files.h"
#include "support/refused_calls.h"

namespace orb::platform {
namespace {

using namespace test;

std::string Bytes(std::size_t size) {
  std::string bytes(size, '\0');
  for (std::size_t i = 0; i < size; ++i) bytes[i] = static_cast<char>(i * 7 + i / 4096);
  return bytes;
}

Error Copy(const std::string& from, const std::string& to) { return ErrorOf(CopyItem(from, to)); }

struct stat StatusOf(const std::string& path) {
  struct stat status {};
  EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
  return status;
}

// The second volume makes the kernel refuse to carry bytes by itself.
TEST(CopyItem, CopiesFilesOfEverySizeToThisVolumeAndAnother) {
  const TempFolder folder;
  for (const std::size_t size : {0u, 1u, 65535u, 65536u, 65537u, 131073u, 5242883u}) {
    const std::string source = folder.Write("source", Bytes(size));
    EXPECT_TRUE(CopyItem(source, folder / std::to_string(size)));
    EXPECT_TRUE(ReadAll(folder / std::to_string(size)) == Bytes(size)) << size;
  }
  EXPECT_TRUE(CopyItem("/proc/self/limits", folder / "limits"));  // Shows no size.
  EXPECT_EQ(ReadAll(folder / "limits"), ReadAll("/proc/self/limits"));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(folder / "other", "size=64m"));
    EXPECT_TRUE(CopyItem(folder / "5242883", folder / "other/there"));
    EXPECT_TRUE(CopyItem(folder / "other/there", folder / "back"));
    EXPECT_TRUE(ReadAll(folder / "back") == Bytes(5242883));
  }));
}

TEST(CopyItem, KeepsWhatLiesBesideTheContent) {
  const Tree tree("from/source=x, to/, bits 04755");
  const std::string source = tree / "from/source";
  ASSERT_EQ(::setxattr(source.c_str(), "user.rating", "5", 1, 0), 0);
  ASSERT_EQ(::setxattr(source.c_str(), "user.empty", "", 0, 0), 0);
  // Owner rw-, user 1234 r--, group ---, mask r--, others ---.
  const char acl[] =
      "\2\0\0\0\1\0\6\0\377\377\377\377\2\0\4\0\322\4\0\0\4\0\0\0\377\377\377\377"
      "\20\0\4\0\377\377\377\377\40\0\0\0\377\377\377\377";
  ASSERT_EQ(::setxattr(source.c_str(), "system.posix_acl_access", acl, sizeof acl - 1, 0), 0);
  ASSERT_TRUE(SetMode(source, 0440));
  ASSERT_TRUE(Items::Current().SetCreated(source, {1000000000, 0}));
  const timespec times[2] = {{1500000000, 123456789}, {1400000000, 987654321}};
  ASSERT_EQ(::utimensat(AT_FDCWD, source.c_str(), times, 0), 0);
  ASSERT_TRUE(SetLock(source, true));
  ASSERT_TRUE(CopyItem(source, tree / "to/source"));
  EXPECT_EQ(StatusOf(tree / "to/source").st_atim.tv_nsec, 123456789);
  EXPECT_EQ(StatusOf(source).st_atim.tv_nsec, 123456789);  // Copying is no use of the source.
  EXPECT_EQ(Describe(tree / "to"), Describe(tree / "from"));
  EXPECT_EQ(Items::Current().Read(tree / "to/source").Value().created.seconds, 1000000000);
  ASSERT_TRUE(CopyItem(tree / "bits", tree / "mine"));
  EXPECT_EQ(ModeOf(tree / "mine"), 04755u);
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    ASSERT_TRUE(CopyItem(tree / "bits", tree / "theirs"));
    EXPECT_EQ(ModeOf(tree / "theirs"), 0755u);  // The bit is the owner's to give.
  }));
}

TEST(CopyItem, KeepsHoles) {
  const Tree tree("source=begin");
  ASSERT_EQ(::truncate((tree / "source").c_str(), off_t{1} << 40), 0);
  std::fstream(tree / "source", std::ios::in | std::ios::out).seekp(off_t{1} << 39) << "middle";
  ASSERT_TRUE(CopyItem(tree / "source", tree / "copy"));
  EXPECT_EQ(StatusOf(tree / "copy").st_size, off_t{1} << 40);
  EXPECT_LT(StatusOf(tree / "copy").st_blocks, 1024);
  std::string text(6, ' ');
  std::ifstream(tree / "copy").seekg(off_t{1} << 39).read(text.data(), 6);
  EXPECT_EQ(text, "middle");
}

TEST(CopyItem, TakesNoNameThatIsTakenAndNothingButFilesLinksAndFolders) {
  const Tree tree(
      "file=old, folder/, dangling -> nowhere, link -> file, tree/sub/, tree/pipe|, locked/!");
  constexpr Error kInvalid{ErrorDomain::kPosix, EINVAL};
  const Row<Error> kCases[] = {
      {"tree/pipe", "a", kNotPermitted},
      {"/dev/null", "a", kNotPermitted},
      {"tree", "tree/sub/c", kInvalid},
      {"file/", "a", kNoSuchItem},
      {"", "a", kNoSuchItem},
      {"file", "", kNoSuchItem},
      {"file", "locked/a", kNotPermitted},
  };
  ExpectRefusals(tree, kCases, Copy);
  EXPECT_EQ(Copy(tree / "tree", tree / "b"), kNotPermitted);
  const Unchanged unchanged(tree.Path());
  for (const char* from : {"file", "folder", "link"})
    for (const char* to : {"file", "folder", "dangling", ".", ".."})
      EXPECT_EQ(Copy(tree / from, tree / to), kItemExists) << from << to;
}

TEST(CopyItem, CopiesTreesOfOddNamesAndFollowsNoLink) {
  const Tree tree("tree/plain/empty/, tree/plain/link -> /, tree/plain/file");
  for (const std::string name : {"new\nline", "per%scent", "\xff\xfe not UTF-8"})
    tree.Make("tree/" + name + "/" + name + ", tree/" + std::string(255, 'n') + "/");
  ASSERT_TRUE(SetMode(tree / "tree/plain", 0500));
  ASSERT_TRUE(CopyItem(tree / "tree", tree / "copy"));
  EXPECT_EQ(Describe(tree / "copy"), Describe(tree / "tree"));
  EXPECT_EQ(Describe(tree / "copy").size(), 11u);
}

TEST(CopyItem, CopiesAndRemovesTreesDeeperThanDescriptorsAndPathsReach) {
  const Tree tree("deep/");
  ASSERT_TRUE(MakeChain(tree / "deep", 2000));
  const auto body = [&] {
    const int before = OpenDescriptors();
    ASSERT_TRUE(CopyItem(tree / "deep", tree / "copy"));
    EXPECT_EQ(ChainDepth(tree / "copy"), 2001);
    EXPECT_TRUE(RemoveItem(tree / "deep"));
    EXPECT_TRUE(RemoveItem(tree / "copy"));
    EXPECT_EQ(OpenDescriptors(), before);
  };
  ORB_IN_CHILD(RunInChild([] { return LimitDescriptors(64); }, body));
  EXPECT_TRUE(fs::is_empty(tree.Path()));
}

TEST(CopyItem, LeavesNothingWhenTheVolumeOrTheRightsEnd) {
  const Tree tree("to/ 0755");
  const std::string source = tree.Write("source", Bytes(3 * 1024 * 1024));
  const auto expect = [&](const Error& error) {
    const Unchanged unchanged(tree / "to");
    EXPECT_EQ(Copy(source, tree / "to/copy"), error);
  };
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree / "to", "size=1m"));
    expect(kVolumeFull);
  }));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MakeReadOnlyVolume(tree / "to"));
    expect({ErrorDomain::kPosix, EROFS});
  }));
  const auto beyondTheLimit = [&] { expect({ErrorDomain::kPosix, EFBIG}); };
  ORB_IN_CHILD(RunInChild([] { return LimitFiles(100000); }, beyondTheLimit));
  ORB_IN_CHILD(RunAsUser(kStranger, [&] { expect(kNotPermitted); }));
}

// Files without a name, renaming without replacing, links, copying inside the kernel: where one is
// missing the next way is taken, with the same outcome.
TEST(CopyItem, WorksWhereTheSystemCanDoLess) {
  const RefusedCall nameless{SYS_openat, EOPNOTSUPP, O_TMPFILE & ~unsigned{O_DIRECTORY}};
  const RefusedCall rename{SYS_renameat2, EINVAL};
  const std::vector<RefusedCall> kCases[] = {
      {nameless, rename},
      {nameless, rename, {SYS_linkat, EPERM}},
      {{SYS_copy_file_range, EXDEV}},
      {{SYS_copy_file_range, ENOSYS}, {SYS_ioctl, EOPNOTSUPP}},
      {{SYS_flistxattr, EOPNOTSUPP}, {SYS_fsetxattr, EOPNOTSUPP}},
      {{SYS_fchmod, EPERM}, {SYS_utimensat, EPERM}},
  };
  const std::string bytes = Bytes(300000);
  for (const auto& refused : kCases) {
    SCOPED_TRACE(&refused - kCases);
    const Tree tree;
    const std::string source = tree.Write("source", bytes);
    const auto body = [&] {
      EXPECT_TRUE(CopyItem(source, tree / "copy"));
      EXPECT_EQ(Copy(source, tree / "copy"), kItemExists);
      EXPECT_EQ(Copy(source, tree / "missing/copy"), kNoSuchItem);
    };
    ORB_IN_CHILD(RunInChild([&] { return RefuseCalls(refused); }, body));
    EXPECT_TRUE(tree.Read("copy") == bytes);
    EXPECT_EQ(NamesIn(tree.Path()).size(), 2u);
  }
}

TEST(CopyItem, LeavesCompleteCopiesOrNoneWhenTheProcessIsKilled) {
  const Tree tree("to/");
  const std::string whole = Bytes(8 * 1024 * 1024);
  const std::string source = tree.Write("source", whole);
  for (int round = 0; round < 12 || (round < 99 && fs::is_empty(tree / "to")); ++round) {
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      for (int i = 0;; ++i)
        (void)CopyItem(source, tree / "to/" + std::to_string(round * 10000 + i % 4));
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(3 + round * 2));
    ::kill(child, SIGKILL);
    ASSERT_EQ(::waitpid(child, nullptr, 0), child);
  }
  EXPECT_FALSE(fs::is_empty(tree / "to"));
  for (const std::string& copy : NamesIn(tree / "to"))
    EXPECT_TRUE(tree.Read("to/" + copy) == whole) << copy;
}

TEST(CopyItem, KeepsTheLockBesideMoreNamesThanAreListed) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree / "many", "size=4m"));
    const std::string source = tree.Write("many/source", "x");
    for (int i = 100; i < 400; ++i) {
      const std::string name = "user." + std::to_string(i) + std::string(240, 'n');
      ASSERT_EQ(::setxattr(source.c_str(), name.c_str(), "", 0, 0), 0);
    }
    ASSERT_TRUE(Items::Current().SetCreated(source, {1000000000, 0}));
    ASSERT_TRUE(SetLock(source, true));
    ASSERT_TRUE(CopyItem(source, tree / "many/copy"));
    const ItemRecord copy = Items::Current().ReadRecord(tree / "many/copy").Value();
    EXPECT_TRUE(copy.created.seconds == 1000000000 && copy.locked);
    const UniqueFd byDescriptor(::open(source.c_str(), O_PATH | O_CLOEXEC));
    EXPECT_TRUE(IsLocked(byDescriptor.Get()).Value());
    ASSERT_TRUE(SetLock(source, false));
    EXPECT_FALSE(Items::Current().Read(source).Value().locked);
  }));
}

}  // namespace
}  // namespace orb::platform
