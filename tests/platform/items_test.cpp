// SPDX-License-Identifier: MIT
#include "platform/items.h"

#include <sys/syscall.h>
#include <sys/xattr.h>

#include "platform/linux/item_metadata.h"
#include "platform/linux/posix.h"
#include "support/files.h"
#include "support/refused_calls.h"

namespace orb::platform {
namespace {

using namespace test;

const Items& Subject() { return Items::Current(); }

bool Locked(const std::string& path) { return Subject().Read(path).Value().locked; }

TEST(Read, SeesAReadOnlyVolumeWhateverTheKernelKnows) {
  const Tree tree("file");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MakeReadOnlyVolume(tree.Path()));
    EXPECT_TRUE(Subject().Read(tree / "file").Value().volumeReadOnly.Value());
    ASSERT_TRUE(RefuseCalls({{SYS_faccessat2, ENOSYS}}));
    EXPECT_TRUE(Subject().Read(tree / "file").Value().volumeReadOnly.Value());
    EXPECT_TRUE(Subject().Read(tree / "file").Value().readable);
  }));
}

TEST(MayWrite, IsDecidedByTheFirstThatFits) {
  const std::uint32_t groups[] = {20, 21};
  const std::tuple<std::uint32_t, std::uint32_t, std::uint16_t, bool> kCases[] = {
      {1, 20, 0200, true},
      {1, 20, 0577, false},  // The owner.
      {2, 21, 0020, true},
      {2, 21, 0757, false},  // A member of the group.
      {2, 30, 0002, true},
      {2, 30, 0775, false},  // Anybody else.
  };
  for (const auto& [owner, group, mode, expected] : kCases) {
    ItemRecord item;
    item.owner = owner;
    item.group = group;
    item.mode = mode;
    EXPECT_EQ(MayWrite(item, 1, groups), expected) << owner << " " << mode;
  }
}

TEST(SetLocked, NeedsNoWritePermissionOfTheOwner) {
  const Tree tree;
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    tree.Make("file 0000");
    for (const bool locked : {true, false}) {
      EXPECT_TRUE(SetLock(tree / "file", locked));
      EXPECT_EQ(Locked(tree / "file"), locked);
    }
    EXPECT_TRUE(Subject().SetCreated(tree / "file", {1, 0}));
    EXPECT_EQ(ModeOf(tree / "file"), 0u);
  }));
}

TEST(SetLocked, ClearsTheImmutableFlagWhereItMay) {
  const Tree tree("file");
  const std::string file = tree / "file";
  for (const std::string flag : {"i", "a"}) {
    ASSERT_TRUE(SetLock(file, true));
    if (std::system(("chattr +" + flag + " " + file + " 2>/dev/null").c_str()) != 0)
      GTEST_SKIP() << "no such flags here";
    EXPECT_NE(RunAsUser(kStranger,
                        [&] {
                          EXPECT_TRUE(Locked(file));
                          EXPECT_EQ(ErrorOf(Subject().SetLocked(file, false)), kNotPermitted);
                        }),
              ChildOutcome::kFailed);
    EXPECT_EQ(ErrorOf(Subject().ReplaceByEmptyFile(file)), kNotPermitted);
    EXPECT_TRUE(SetLock(file, false));
    EXPECT_FALSE(Locked(file));
  }
}

TEST(SetModified, ChangesTheEntryItselfAndKeepsNanoseconds) {
  const Tree tree("file, link -> file");
  const Timestamp accessed = Subject().AccessTime(tree / "file").Value();
  const Timestamp kTimes[] = {{1588334400, 123456789}, {1588334400, 5}};
  EXPECT_TRUE(Subject().SetModified(tree / "file", kTimes[0]));
  EXPECT_TRUE(Subject().SetModified(tree / "link", kTimes[1]));
  EXPECT_EQ(Subject().Read(tree / "file").Value().modified, kTimes[0]);
  EXPECT_EQ(Subject().Read(tree / "link").Value().modified, kTimes[1]);
  EXPECT_EQ(Subject().AccessTime(tree / "file").Value(), accessed);
  const Status far = Subject().SetModified(tree / "file", {1LL << 47, 0});
  EXPECT_TRUE(far.Ok() || far.Reason() == kNotPermitted) << "as the volume can hold it or not";
  EXPECT_TRUE(far.Ok() || Subject().Read(tree / "file").Value().modified == kTimes[0]);
}

TEST(SetModified, WorksOnACard) {
  const Tree tree;
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    MountCard(tree, "card");
    const std::string file = tree.Write("card/a.jpg", "");
    const Timestamp time{1588334400, 0};
    EXPECT_TRUE(Subject().SetModified(file, time));
    EXPECT_EQ(Subject().Read(file).Value().modified, time);
    EXPECT_EQ(ErrorOf(Subject().SetCreated(file, time)), kNotPermitted);
    EXPECT_EQ(ErrorOf(Subject().SetLocked(file, true)), kNotPermitted);  // Not done, so not said.
    EXPECT_EQ(::umount((tree / "card").c_str()), 0);
  }));
}

TEST(SetCreated, IsReadBackUnlessTheAttributeIsGarbage) {
  const Tree tree("file");
  const std::string file = tree / "file";
  const Timestamp born = Subject().Read(file).Value().created;
  const Timestamp time{-86400, 999999999};
  ASSERT_TRUE(Subject().SetCreated(file, time));
  EXPECT_EQ(Subject().Read(file).Value().created, time);
  std::istringstream garbage("|x|12|12 1000000000|12 3x|1 -1|99999999999999999999 0|+1 0");
  for (std::string value; std::getline(garbage, value, '|');) {
    ASSERT_EQ(::setxattr(file.c_str(), kCreatedAttribute, value.data(), value.size(), 0), 0);
    EXPECT_EQ(Subject().Read(file).Value().created, born) << value;
  }
}

TEST(HasReadOnlyAttribute, IsAMatterOfTheVolumesType) {
  const std::tuple<long, unsigned, bool, bool> kCases[] = {
      {0x4d44, 8, false, true},       // FAT.
      {0x2011bab0, 8, false, true},   // exFAT.
      {0x65735546, 8, false, true},   // A disk behind FUSE.
      {0x65735546, 8, true, false},   // NTFS there.
      {0x65735546, 0, false, false},  // A remote folder behind FUSE.
      {0xef53, 8, true, false},       // ext4.
  };
  for (const auto& [type, deviceMajor, attributes, expected] : kCases) {
    struct statfs volume {};
    volume.f_type = type;
    StatusRecord status{};
    status.stx_dev_major = deviceMajor;
    EXPECT_EQ(HasReadOnlyAttribute(volume, status, {.supported = attributes}), expected) << type;
  }
}

TEST(ReplaceByEmptyFile, PutsANewFileInPlace) {
  const Tree tree("kept, name => kept, link -> kept, folder/");
  const std::string longest(255, 'n');
  for (const std::string name : {"name", "link", "new", longest.c_str()}) {
    EXPECT_TRUE(Subject().ReplaceByEmptyFile(tree / name)) << name;
    EXPECT_TRUE(fs::is_regular_file(fs::symlink_status(tree / name)));
    EXPECT_EQ(tree.Read(name), "");
  }
  EXPECT_EQ(NamesIn(tree.Path()).size(), 6u);  // Nothing is left over.
  EXPECT_EQ(tree.Read("kept"), "kept");
}

TEST(EmptyItems, AreMadeUnderAFreeNameInAnUnlockedFolder) {
  const Tree tree("old, dangling -> nowhere, folder/, locked/old, lock!, locked/!");
  const auto make = [](const std::string& how, const std::string& path) {
    if (how.ends_with("/replace")) return ErrorOf(Subject().ReplaceByEmptyFile(path));
    if (how.ends_with("/file")) return ErrorOf(Subject().CreateEmptyFile(path));
    const bool accept = how.ends_with("/accept");
    return ErrorOf(Subject().CreateFolders(path, accept ? IfExists::kAccept : IfExists::kFail));
  };
  const Row<Error> kRefused[] = {
      {"replace", "folder", kItemExists},
      {"replace", "lock", kNotPermitted},
      {"replace", "locked/old", kNotPermitted},
      {"file", "old", kItemExists},
      {"file", "dangling", kItemExists},
      {"file", "locked/other", kNotPermitted},
      {"folders", "locked/a/b", kNotPermitted},
      {"folders", "folder", kItemExists},
      {"accept", "folder", kDone},
      {"accept", "old", kItemExists},
      {"accept", "old/a/b", kNoSuchItem},
  };
  ExpectRefusals(tree, kRefused, make);
  EXPECT_TRUE(Subject().CreateEmptyFile(tree / "new"));
  EXPECT_TRUE(Subject().CreateFolders(tree / "a//b/../c/d/", IfExists::kFail));
  EXPECT_TRUE(tree.Has("new") && tree.Has("a/b") && tree.Has("a/c/d"));
}

}  // namespace
}  // namespace orb::platform
