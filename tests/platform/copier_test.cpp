// SPDX-License-Identifier: MIT
#include "platform/copier.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <sys/xattr.h>

#include <chrono>
#include <filesystem>
#include <string>
#include <thread>
#include <vector>

#include "platform/items.h"
#include "platform/removal.h"
#include "support/faults.h"
#include "support/refused_calls.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::platform::CopyItem;
using orb::platform::Error;
using orb::platform::ErrorDomain;
using orb::platform::Items;
using orb::platform::kItemExists;
using orb::platform::kNoSuchItem;
using orb::platform::kNotPermitted;
using orb::platform::kVolumeFull;
using orb::platform::RemoveItem;
using orb::test::ChainDepth;
using orb::test::Describe;
using orb::test::OpenDescriptors;
using orb::test::ReadAll;
using orb::test::RefusedCall;
using orb::test::RunAsUser;
using orb::test::RunInChild;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;

constexpr Error kTooLarge{ErrorDomain::kPosix, EFBIG};
constexpr Error kReadOnly{ErrorDomain::kPosix, EROFS};
constexpr Error kInvalid{ErrorDomain::kPosix, EINVAL};

std::string Bytes(std::size_t size) {
  std::string bytes(size, '\0');
  for (std::size_t i = 0; i < size; ++i) bytes[i] = static_cast<char>(i * 7 + i / 4096);
  return bytes;
}

Error ErrorOf(const orb::platform::Status& status) { return status ? Error() : status.Reason(); }

struct stat StatusOf(const std::string& path) {
  struct stat status {};
  EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
  return status;
}

std::size_t EntriesIn(const std::string& folder) {
  return static_cast<std::size_t>(std::distance(fs::directory_iterator(folder), {}));
}

std::string Attribute(const std::string& path, const char* name) {
  char value[256];
  const ssize_t size = ::lgetxattr(path.c_str(), name, value, sizeof value);
  return size < 0 ? "(none)" : std::string(value, static_cast<std::size_t>(size));
}

// The second volume makes the kernel refuse to carry bytes by itself.
TEST(CopyItem, CopiesFilesOfEverySizeToThisVolumeAndAnother) {
  const TempFolder folder;
  for (const std::size_t size : {0u, 1u, 65535u, 65536u, 65537u, 131073u, 5242883u}) {
    SCOPED_TRACE(size);
    const std::string source = folder.Write("source", Bytes(size));
    EXPECT_TRUE(CopyItem(source, folder / std::to_string(size)));
    EXPECT_EQ(ReadAll(folder / std::to_string(size)), ReadAll(source));
  }
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(folder / "other", "size=64m"));
    EXPECT_TRUE(CopyItem(folder / "5242883", folder / "other/there"));
    EXPECT_TRUE(CopyItem(folder / "other/there", folder / "back"));
    EXPECT_EQ(ReadAll(folder / "back"), Bytes(5242883));
  }));
}

TEST(CopyItem, ReadsWhatShowsNoSizeToItsEnd) {
  const TempFolder folder;
  EXPECT_TRUE(CopyItem("/proc/self/limits", folder / "limits"));
  EXPECT_EQ(ReadAll(folder / "limits"), ReadAll("/proc/self/limits"));
}

TEST(CopyItem, KeepsWhatLiesBesideTheContent) {
  const TempFolder folder;
  const std::string source = folder.Write("source", "x");
  ASSERT_EQ(::setxattr(source.c_str(), "user.rating", "5", 1, 0), 0);
  ASSERT_EQ(::setxattr(source.c_str(), "user.empty", "", 0, 0), 0);
  // Owner rw-, user 1234 r--, group ---, mask r--, others ---.
  const char acl[] =
      "\2\0\0\0\1\0\6\0\377\377\377\377\2\0\4\0\322\4\0\0\4\0\0\0\377\377\377\377"
      "\20\0\4\0\377\377\377\377\40\0\0\0\377\377\377\377";
  ASSERT_EQ(::setxattr(source.c_str(), "system.posix_acl_access", acl, sizeof acl - 1, 0), 0);
  ASSERT_EQ(::chmod(source.c_str(), 0440), 0);
  ASSERT_TRUE(Items::Current().SetCreated(source, {1000000000, 0}));
  const timespec times[2] = {{1500000000, 123456789}, {1400000000, 987654321}};
  ASSERT_EQ(::utimensat(AT_FDCWD, source.c_str(), times, 0), 0);
  ASSERT_TRUE(Items::Current().SetLocked(source, true));

  const std::string copy = folder / "copy";
  ASSERT_TRUE(CopyItem(source, copy));
  EXPECT_EQ(StatusOf(copy).st_mode, mode_t{S_IFREG | 0440});
  EXPECT_EQ(StatusOf(copy).st_mtim.tv_sec, 1400000000);
  EXPECT_EQ(StatusOf(copy).st_mtim.tv_nsec, 987654321);
  EXPECT_EQ(StatusOf(copy).st_atim.tv_nsec, 123456789);
  EXPECT_EQ(StatusOf(source).st_atim.tv_nsec, 123456789);  // Copying is no use of the source.
  EXPECT_EQ(Attribute(copy, "user.rating"), "5");
  EXPECT_EQ(Attribute(copy, "user.empty"), "");
  EXPECT_EQ(Attribute(copy, "system.posix_acl_access").size(), sizeof acl - 1);
  EXPECT_EQ(Attribute(copy, "system.posix_acl_access"),
            Attribute(source, "system.posix_acl_access"));
  const auto record = Items::Current().ReadRecord(copy);
  ASSERT_TRUE(record);
  EXPECT_EQ(record.Value().created.seconds, 1000000000);
  EXPECT_TRUE(record.Value().locked);
}

TEST(CopyItem, LeavesTheSetUserBitToTheOwner) {
  const TempFolder folder;
  ASSERT_EQ(::chmod(folder.Path().c_str(), 0777), 0);
  const std::string source = folder.Write("source", "x");
  ASSERT_EQ(::chmod(source.c_str(), 04755), 0);
  ASSERT_TRUE(CopyItem(source, folder / "mine"));
  EXPECT_EQ(StatusOf(folder / "mine").st_mode & 07777, 04755u);
  ORB_IN_CHILD(RunAsUser(65534, [&] {
    ASSERT_TRUE(CopyItem(source, folder / "theirs"));
    EXPECT_EQ(StatusOf(folder / "theirs").st_mode & 07777, 0755u);
  }));
}

TEST(CopyItem, KeepsHoles) {
  const TempFolder folder;
  const std::string source = folder.Write("source", "begin");
  ASSERT_EQ(::truncate(source.c_str(), off_t{1} << 40), 0);
  std::fstream(source, std::ios::in | std::ios::out).seekp(off_t{1} << 39) << "middle";
  ASSERT_TRUE(CopyItem(source, folder / "copy"));
  EXPECT_EQ(StatusOf(folder / "copy").st_size, off_t{1} << 40);
  EXPECT_LT(StatusOf(folder / "copy").st_blocks, 1024);
  std::ifstream copy(folder / "copy");
  std::string text(6, ' ');
  copy.seekg(off_t{1} << 39).read(text.data(), 6);
  EXPECT_EQ(text, "middle");
}

TEST(CopyItem, TakesNoNameThatIsTaken) {
  const TempFolder folder;
  const std::string source = folder.Write("source", "new");
  folder.Write("file", "old");
  fs::create_directory(folder / "folder");
  fs::create_symlink("nowhere", folder / "dangling");
  fs::create_symlink("source", folder / "link");
  for (const std::string from : {"source", "folder", "link"}) {
    for (const std::string to : {"file", "folder", "dangling", ".", ".."}) {
      SCOPED_TRACE(from + " to " + to);
      EXPECT_EQ(ErrorOf(CopyItem(folder / from, folder / to)), kItemExists);
    }
  }
  EXPECT_EQ(ReadAll(folder / "file"), "old");
  EXPECT_EQ(EntriesIn(folder.Path()), 5u);
}

TEST(CopyItem, RefusesWhatIsNoFileLinkOrFolder) {
  const TempFolder folder;
  fs::create_directories(folder / "tree/sub");
  ASSERT_EQ(::mkfifo((folder / "tree/pipe").c_str(), 0600), 0);
  folder.Write("file", "");
  EXPECT_EQ(ErrorOf(CopyItem(folder / "tree/pipe", folder / "a")), kNotPermitted);
  EXPECT_EQ(ErrorOf(CopyItem("/dev/null", folder / "a")), kNotPermitted);
  EXPECT_EQ(ErrorOf(CopyItem(folder / "tree", folder / "b")), kNotPermitted);
  EXPECT_EQ(ErrorOf(CopyItem(folder / "tree", folder / "tree/sub/c")), kInvalid);
  EXPECT_EQ(ErrorOf(CopyItem(folder / "file/", folder / "a")), kNoSuchItem);
  EXPECT_EQ(ErrorOf(CopyItem("", folder / "a")), kNoSuchItem);
  EXPECT_EQ(ErrorOf(CopyItem(folder / "file", "")), kNoSuchItem);
  ASSERT_TRUE(Items::Current().SetLocked(folder / "tree", true));
  EXPECT_EQ(ErrorOf(CopyItem(folder / "file", folder / "tree/a")), kNotPermitted);
  EXPECT_FALSE(fs::exists(folder / "a"));
  EXPECT_TRUE(fs::is_empty(folder / "tree/sub"));
}

TEST(CopyItem, CopiesTreesOfOddNamesAndFollowsNoLink) {
  const TempFolder folder;
  const std::string names[] = {
      "plain", "new\nline", "per%scent", "\xff\xfe not UTF-8", std::string(255, 'n'), "e\xcc\x81"};
  for (const std::string& name : names) {
    fs::create_directories(folder / ("tree/" + name + "/empty"));
    folder.Write("tree/" + name + "/file", name);
    fs::create_symlink("/", folder / ("tree/" + name + "/link"));
  }
  fs::permissions(folder / "tree/plain", fs::perms(0500));
  ASSERT_TRUE(CopyItem(folder / "tree", folder / "copy"));
  EXPECT_EQ(Describe(folder / "copy"), Describe(folder / "tree"));
  EXPECT_EQ(Describe(folder / "copy").size(), 24u);
}

TEST(CopyItem, CopiesAndRemovesTreesDeeperThanDescriptorsAndPathsReach) {
  const TempFolder folder;
  fs::create_directory(folder / "deep");
  ASSERT_TRUE(orb::test::MakeChain(folder / "deep", 2000));
  ORB_IN_CHILD(RunInChild([] { return orb::test::LimitDescriptors(64); },
                          [&] {
                            const int before = OpenDescriptors();
                            ASSERT_TRUE(CopyItem(folder / "deep", folder / "copy"));
                            EXPECT_EQ(ChainDepth(folder / "copy"), 2001);
                            EXPECT_TRUE(RemoveItem(folder / "deep"));
                            EXPECT_TRUE(RemoveItem(folder / "copy"));
                            EXPECT_EQ(OpenDescriptors(), before);
                          }));
  EXPECT_TRUE(fs::is_empty(folder.Path()));
}

TEST(CopyItem, LeavesNothingWhenTheVolumeOrTheRightsEnd) {
  const TempFolder folder;
  const std::string source = folder.Write("source", Bytes(3 * 1024 * 1024));
  const std::string to = folder / "to";
  fs::create_directory(to);
  ASSERT_EQ(::chmod(folder.Path().c_str(), 0755), 0);
  const auto expect = [&](const Error& error) {
    const int before = OpenDescriptors();
    EXPECT_EQ(ErrorOf(CopyItem(source, to + "/copy")), error);
    EXPECT_TRUE(fs::is_empty(to));
    EXPECT_EQ(OpenDescriptors(), before);
  };
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(to, "size=1m"));
    expect(kVolumeFull);
  }));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MakeReadOnlyVolume(to));
    expect(kReadOnly);
  }));
  ORB_IN_CHILD(RunInChild([] { return ::signal(SIGXFSZ, SIG_IGN) != SIG_ERR; },
                          [&] {
                            const rlimit limit{100000, 100000};
                            ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &limit), 0);
                            expect(kTooLarge);
                          }));
  ORB_IN_CHILD(RunAsUser(65534, [&] { expect(kNotPermitted); }));
}

// Files without a name, renaming without replacing, links, copying inside the kernel: where one is
// missing the next way is taken, with the same outcome.
TEST(CopyItem, WorksWhereTheSystemCanDoLess) {
  constexpr unsigned kNameless = O_TMPFILE & ~unsigned{O_DIRECTORY};
  const RefusedCall nameless{SYS_openat, EOPNOTSUPP, kNameless};
  const RefusedCall rename{SYS_renameat2, EINVAL};
  const std::vector<RefusedCall> kCases[] = {
      {nameless},
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
    const TempFolder folder;
    const std::string source = folder.Write("source", bytes);
    ORB_IN_CHILD(RunInChild([&] { return orb::test::RefuseCalls(refused); },
                            [&] {
                              EXPECT_TRUE(CopyItem(source, folder / "copy"));
                              EXPECT_EQ(ErrorOf(CopyItem(source, folder / "copy")), kItemExists);
                              EXPECT_EQ(ErrorOf(CopyItem(source, folder / "missing/copy")),
                                        kNoSuchItem);
                            }));
    EXPECT_TRUE(ReadAll(folder / "copy") == bytes);
    EXPECT_EQ(EntriesIn(folder.Path()), 2u);
  }
}

TEST(CopyItem, LeavesCompleteCopiesOrNoneWhenTheProcessIsKilled) {
  const TempFolder folder;
  const std::string source = folder.Write("source", Bytes(8 * 1024 * 1024));
  fs::create_directory(folder / "to");
  for (int round = 0; round < 12 || (round < 99 && fs::is_empty(folder / "to")); ++round) {
    const pid_t child = ::fork();
    ASSERT_GE(child, 0);
    if (child == 0) {
      for (int i = 0;; ++i)
        (void)CopyItem(source, folder / "to/" + std::to_string(round * 10000 + i % 4));
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(3 + round * 2));
    ::kill(child, SIGKILL);
    ASSERT_EQ(::waitpid(child, nullptr, 0), child);
  }
  EXPECT_GT(EntriesIn(folder / "to"), 0u);
  const std::string whole = ReadAll(source);
  for (const auto& copy : fs::directory_iterator(folder / "to"))
    EXPECT_TRUE(ReadAll(copy.path().string()) == whole) << copy.path();
}

TEST(CopyItem, KeepsTheLockBesideMoreNamesThanAreListed) {
  const TempFolder folder;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(folder / "many", "size=4m"));
    const std::string source = folder.Write("many/source", "x");
    for (int i = 100; i < 400; ++i) {
      const std::string name = "user." + std::to_string(i) + std::string(240, 'n');
      ASSERT_EQ(::setxattr(source.c_str(), name.c_str(), "", 0, 0), 0);
    }
    ASSERT_TRUE(Items::Current().SetCreated(source, {1000000000, 0}));
    ASSERT_TRUE(Items::Current().SetLocked(source, true));
    ASSERT_TRUE(CopyItem(source, folder / "many/copy"));
    const auto record = Items::Current().ReadRecord(folder / "many/copy");
    ASSERT_TRUE(record);
    EXPECT_EQ(record.Value().created.seconds, 1000000000);
    EXPECT_TRUE(record.Value().locked);
  }));
}

}  // namespace
