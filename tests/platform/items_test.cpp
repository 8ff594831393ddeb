// SPDX-License-Identifier: MIT
#include "platform/items.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "platform/linux/item_metadata.h"
#include "platform/linux/posix.h"
#include "support/faults.h"
#include "support/temp_folder.h"

namespace orb::platform {
namespace {

namespace fs = std::filesystem;
using test::TempFolder;

constexpr uid_t kStranger = 65534;

const Items& Subject() { return Items::Current(); }

Error ReasonOf(const Status& status) { return status.Ok() ? Error{} : status.Reason(); }

bool Locked(const std::string& path) { return Subject().Read(path).Value().locked; }

int ModeOf(const std::string& path) {
  struct stat status {};
  ::lstat(path.c_str(), &status);
  return static_cast<int>(status.st_mode & 07777);
}

/// From now on the kernel does not know the system call.
bool Forget(int call) {
  struct sock_filter rules[] = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(struct seccomp_data, nr)),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, static_cast<unsigned>(call), 0, 1),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ERRNO | ENOSYS),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
  };
  const struct sock_fprog program = {std::size(rules), rules};
  return ::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 &&
         ::prctl(PR_SET_SECCOMP, SECCOMP_MODE_FILTER, &program) == 0;
}

TEST(Read, SeesAReadOnlyVolumeWhateverTheKernelKnows) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(test::MakeReadOnlyVolume(folder.Path()));
    EXPECT_TRUE(Subject().Read(file).Value().volumeReadOnly.Value());
    ASSERT_TRUE(Forget(SYS_faccessat2));
    EXPECT_TRUE(Subject().Read(file).Value().volumeReadOnly.Value());
    EXPECT_TRUE(Subject().Read(file).Value().readable);
  }));
}

TEST(MayWrite, IsDecidedByTheFirstThatFits) {
  const std::uint32_t groups[] = {20, 21};
  const auto mayWrite = [&](std::uint32_t owner, std::uint32_t group, std::uint16_t mode) {
    ItemRecord item;
    item.owner = owner;
    item.group = group;
    item.mode = mode;
    return MayWrite(item, 1, groups);
  };
  EXPECT_TRUE(mayWrite(1, 20, 0200));
  EXPECT_FALSE(mayWrite(1, 20, 0577));  // The owner.
  EXPECT_TRUE(mayWrite(2, 21, 0020));
  EXPECT_FALSE(mayWrite(2, 21, 0757));  // A member of the group.
  EXPECT_TRUE(mayWrite(2, 30, 0002));
  EXPECT_FALSE(mayWrite(2, 30, 0775));  // Anybody else.
}

TEST(SetLocked, NeedsNoWritePermissionOfTheOwner) {
  const TempFolder folder;
  fs::permissions(folder.Path(), fs::perms(0777));
  ORB_IN_CHILD(test::RunAsUser(kStranger, [&] {
    for (const int mode : {0444, 0000}) {
      const std::string file = folder.Write(std::to_string(mode), "");
      fs::permissions(file, fs::perms(mode));
      EXPECT_TRUE(Subject().SetLocked(file, true).Ok());
      EXPECT_TRUE(Locked(file));
      EXPECT_EQ(ModeOf(file), mode);
      EXPECT_TRUE(Subject().SetLocked(file, false).Ok());
      EXPECT_FALSE(Locked(file));
      EXPECT_TRUE(Subject().SetCreated(file, {1, 0}).Ok());
      EXPECT_EQ(ModeOf(file), mode);
    }
  }));
}

TEST(SetLocked, ClearsTheImmutableFlagWhereItMay) {
  const TempFolder folder;
  fs::permissions(folder.Path(), fs::perms(0755));
  const std::string file = folder.Write("file", "");
  for (const char* flag : {"i", "a"}) {
    ASSERT_TRUE(Subject().SetLocked(file, true).Ok());
    if (std::system(("chattr +" + std::string(flag) + " " + file + " 2>/dev/null").c_str()) != 0) {
      GTEST_SKIP() << "no such flags here";
    }
    const auto unlockAsStranger = [&] {
      EXPECT_TRUE(Locked(file));
      EXPECT_EQ(ReasonOf(Subject().SetLocked(file, false)), kNotPermitted);
    };
    EXPECT_NE(test::RunAsUser(kStranger, unlockAsStranger), test::ChildOutcome::kFailed);
    EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile(file)), kNotPermitted);
    EXPECT_TRUE(Subject().SetLocked(file, false).Ok());
    EXPECT_FALSE(Locked(file));
  }
}

TEST(SetModified, ChangesTheEntryItselfAndKeepsNanoseconds) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  const Timestamp accessed = Subject().AccessTime(file).Value();
  fs::create_symlink("file", folder / "link");
  for (const std::string& path : {file, folder / "link"}) {
    const Timestamp time{1588334400, path == file ? 123456789U : 5U};
    ASSERT_TRUE(Subject().SetModified(path, time).Ok());
    EXPECT_EQ(Subject().Read(path).Value().modified, time);
  }
  EXPECT_EQ(Subject().Read(file).Value().modified.nanoseconds, 123456789U);
  EXPECT_EQ(Subject().AccessTime(file).Value(), accessed);
}

TEST(SetModified, RefusesATimeThatTheVolumeCannotHold) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  const Timestamp before = Subject().Read(file).Value().modified;
  const Timestamp beyondEverything{1LL << 47, 0};
  const Status status = Subject().SetModified(file, beyondEverything);
  if (status.Ok()) GTEST_SKIP() << "this volume holds every time";
  EXPECT_EQ(status.Reason(), kNotPermitted);
  EXPECT_EQ(Subject().Read(file).Value().modified, before);
}

/// A card as it comes from a camera, served by a process. False where the programs are missing.
bool MountCard(const std::string& folder) {
  const std::string make = "cd '" + folder + "' && mkdir card && truncate -s 8M image && " +
                           "mkfs.exfat image && loop=$(losetup -f --show image) && " +
                           "{ mount.exfat-fuse $loop card; status=$?; losetup -d $loop; } && " +
                           "[ $status -eq 0 ]";
  return std::system(("{ " + make + "; } >/dev/null 2>&1").c_str()) == 0;
}

TEST(SetModified, WorksOnACard) {
  const TempFolder folder;
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    if (!MountCard(folder.Path())) return;
    const std::string file = folder.Write("card/a.jpg", "");
    EXPECT_TRUE(Subject().SetModified(file, {1588334400, 0}).Ok());
    EXPECT_EQ(Subject().Read(file).Value().modified, (Timestamp{1588334400, 0}));
    EXPECT_EQ(ReasonOf(Subject().SetCreated(file, {1588334400, 0})), kNotPermitted);
    EXPECT_EQ(ReasonOf(Subject().SetLocked(file, true)), kNotPermitted);  // Not done, so not said.
    EXPECT_EQ(::umount((folder / "card").c_str()), 0);
  }));
}

TEST(SetCreated, IsReadBackUnlessTheAttributeIsGarbage) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  const Timestamp born = Subject().Read(file).Value().created;
  const Timestamp time{-86400, 999999999};
  ASSERT_TRUE(Subject().SetCreated(file, time).Ok());
  EXPECT_EQ(Subject().Read(file).Value().created, time);
  for (const std::string value : {"",
                                  "x",
                                  "12",
                                  "12 ",
                                  "12 1000000000",
                                  "12 3x",
                                  "1 -1",
                                  "9e9 0",
                                  "99999999999999999999 0",
                                  "+1 0",
                                  " 1 0"}) {
    SCOPED_TRACE(value);
    ASSERT_EQ(::setxattr(file.c_str(), kCreatedAttribute, value.data(), value.size(), 0), 0);
    EXPECT_EQ(Subject().Read(file).Value().created, born);
  }
}

TEST(FindOwnAttributes, SeesThemAmongMoreThanTheKernelLists) {
  const TempFolder folder;
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(test::MountTmpfs(folder / "volume", ""));
    const std::string file = folder / "volume/file";
    ASSERT_TRUE(Subject().CreateEmptyFile(file).Ok());
    if (!Subject().SetLocked(file, true)) return;  // This kernel's tmpfs has no attributes.
    for (int i = 0; i < 300; ++i) {
      const std::string name = "user." + std::string(240, 'n') + std::to_string(i);
      ASSERT_EQ(::setxattr(file.c_str(), name.c_str(), "", 0, 0), 0);
    }
    EXPECT_TRUE(Locked(file));
    const UniqueFd byDescriptor(::open(file.c_str(), O_PATH));
    EXPECT_TRUE(IsLocked(byDescriptor.Get()).Value());
    ASSERT_TRUE(Subject().SetLocked(file, false).Ok());
    EXPECT_FALSE(Locked(file));
  }));
}

TEST(HasReadOnlyAttribute, IsAMatterOfTheVolumesType) {
  const auto has = [](long type, unsigned deviceMajor, bool attributes) {
    struct statfs volume {};
    volume.f_type = type;
    StatusRecord status{};
    status.stx_dev_major = deviceMajor;
    return HasReadOnlyAttribute(volume, status, {.supported = attributes});
  };
  EXPECT_TRUE(has(0x4d44, 8, false));       // FAT.
  EXPECT_TRUE(has(0x2011bab0, 8, false));   // exFAT.
  EXPECT_TRUE(has(0x65735546, 8, false));   // A disk behind FUSE.
  EXPECT_FALSE(has(0x65735546, 8, true));   // NTFS there.
  EXPECT_FALSE(has(0x65735546, 0, false));  // A remote folder behind FUSE.
  EXPECT_FALSE(has(0xef53, 8, true));       // ext4.
}

TEST(ReplaceByEmptyFile, PutsANewFileInPlace) {
  const TempFolder folder;
  const std::string kept = folder.Write("kept", "content");
  fs::create_hard_link(kept, folder / "name");
  fs::create_symlink("kept", folder / "link");
  fs::create_directory(folder / "folder");
  const std::string longest = folder / std::string(255, 'n');
  for (const std::string& path : {folder / "name", folder / "link", folder / "new", longest}) {
    for (int time = 0; time < 2; ++time) EXPECT_TRUE(Subject().ReplaceByEmptyFile(path).Ok());
    EXPECT_EQ(Subject().Read(path).Value().kind, ItemKind::kFile);
    EXPECT_EQ(Subject().Read(path).Value().size, 0U);
  }
  EXPECT_EQ(test::ReadAll(kept), "content");
  EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile(folder / "folder")), kItemExists);
  EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile(folder / "folder/")), kInvalidName);
  EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile("")), kNoSuchItem);
  ASSERT_TRUE(Subject().SetLocked(kept, true).Ok());
  EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile(kept)), kNotPermitted);
  EXPECT_EQ(test::ReadAll(kept), "content");
  EXPECT_EQ(std::distance(fs::directory_iterator(folder.Path()), {}), 6);  // Nothing is left over.
}

TEST(CreateEmptyFile, TakesOnlyAFreeNameInAnUnlockedFolder) {
  const TempFolder folder;
  fs::create_symlink("nowhere", folder / "dangling");
  EXPECT_TRUE(Subject().CreateEmptyFile(folder / "new").Ok());
  EXPECT_EQ(ReasonOf(Subject().CreateEmptyFile(folder / "new")), kItemExists);
  EXPECT_EQ(ReasonOf(Subject().CreateEmptyFile(folder / "dangling")), kItemExists);
  EXPECT_EQ(ReasonOf(Subject().CreateEmptyFile(folder / "no/new")), kNoSuchItem);
  EXPECT_EQ(ReasonOf(Subject().CreateEmptyFile(folder / std::string(256, 'n'))), kInvalidName);
  ASSERT_TRUE(Subject().SetLocked(folder.Path(), true).Ok());
  EXPECT_EQ(ReasonOf(Subject().CreateEmptyFile(folder / "other")), kNotPermitted);
  EXPECT_EQ(ReasonOf(Subject().ReplaceByEmptyFile(folder / "new")), kNotPermitted);
  EXPECT_EQ(ReasonOf(Subject().CreateFolders(folder / "a/b", IfExists::kFail)), kNotPermitted);
  EXPECT_FALSE(Subject().Exists(folder / "other") || Subject().Exists(folder / "a"));
}

TEST(CreateFolders, MakesWhatIsMissing) {
  const TempFolder folder;
  folder.Write("file", "");
  EXPECT_TRUE(Subject().CreateFolders(folder / "a//b/../c/d/", IfExists::kFail).Ok());
  EXPECT_TRUE(fs::is_directory(folder / "a/b") && fs::is_directory(folder / "a/c/d"));
  EXPECT_EQ(ReasonOf(Subject().CreateFolders(folder / "a", IfExists::kFail)), kItemExists);
  EXPECT_TRUE(Subject().CreateFolders(folder / "a", IfExists::kAccept).Ok());
  EXPECT_EQ(ReasonOf(Subject().CreateFolders(folder / "file", IfExists::kAccept)), kItemExists);
  EXPECT_FALSE(Subject().CreateFolders(folder / "file/a/b", IfExists::kAccept).Ok());
  EXPECT_FALSE(Subject().CreateFolders("", IfExists::kAccept).Ok());
}

}  // namespace
}  // namespace orb::platform
