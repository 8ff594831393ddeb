// SPDX-License-Identifier: MIT
#include "platform/mount_table.h"

#include <gtest/gtest.h>

#include <string>

namespace orb::platform {
namespace {

// The shapes that the kernel writes: optional words before the dash or none, escapes, a bind mount,
// an overlay, a volume without a device, a share with a colon, and lines that are none.
constexpr char kTable[] =
    "22 1 8:2 / / rw,relatime shared:1 - ext4 /dev/sda2 rw,errors=remount-ro\n"
    "30 22 0:5 / /proc rw,nosuid - proc proc rw\n"
    "36 22 8:33 / /media/my\\040stick\\011\\134x ro,nosuid shared:9 master:2 - vfat /dev/sdc1 "
    "rw,fmask=0022\n"
    "37 22 8:2 /srv/photos /home/photos rw - ext4 /dev/sda2 rw\n"
    "38 22 0:48 / /mnt/nas rw - nfs4 nas:/export\\040one rw,addr=10.0.0.1\n"
    "39 22 0:49 / /mnt/disc rw unbindable - iso9660 /dev/sr0 ro\n"
    "40 38 0:50 / /mnt/nas rw - tmpfs none rw,norom\n"
    "not a mount\n"
    "41 22 8:x / /bad rw - ext4 /dev/sda2 rw\n"
    "42 22 8:1 / relative rw - ext4 /dev/sda1 rw\n"
    "43 22 8:1 / /cut rw";

TEST(MountTable, ReadsWhatTheKernelWrites) {
  const MountTable table(kTable);
  ASSERT_EQ(table.Mounts().size(), 7u);
  const Mount* stick = table.FindById(36);
  ASSERT_NE(stick, nullptr);
  EXPECT_EQ(stick->folder + "|" + stick->type + "|" + stick->source,
            "/media/my stick\t\\x|vfat|/dev/sdc1");
  EXPECT_EQ(stick->device, (DeviceNumber{8, 33}));
  EXPECT_TRUE(stick->readOnly) << "the mount's own flag";
  EXPECT_TRUE(table.FindById(39)->readOnly) << "the volume's flag";
  EXPECT_FALSE(table.FindById(40)->readOnly) << "norom is another word";
  EXPECT_EQ(table.FindById(38)->source, "nas:/export one");
  EXPECT_EQ(table.FindById(99), nullptr);
}

TEST(MountTable, FindsByPathTheClosestMountAndTheLastOfSeveral) {
  const MountTable table(kTable);
  const std::pair<const char*, std::uint64_t> kCases[] = {
      {"/", 22},
      {"/home/photosx/a", 22},
      {"/home/photos", 37},
      {"/home/photos/a", 37},
      {"/media/my stick\t\\x/DCIM", 36},
      {"/mnt/nas/a", 40},
  };
  for (const auto& [path, id] : kCases)
    EXPECT_EQ(table.FindByPath(path), table.FindById(id)) << path;
  EXPECT_EQ(table.FindByPath("relative"), nullptr);
  EXPECT_EQ(MountTable().FindByPath("/"), nullptr);
  EXPECT_FALSE(MountTable::Read("/nothing/here").Ok());
}

}  // namespace
}  // namespace orb::platform
