// SPDX-License-Identifier: MIT
#include "platform/drives.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <string>

#include "platform/linux/mount_number.h"
#include "platform/mount_table.h"
#include "support/faults.h"
#include "support/temp_folder.h"

namespace orb::platform {
namespace {

namespace fs = std::filesystem;

/// Lays out sysfs and the mount table of a machine of its own. Its mounts are plain folders, known
/// by their paths: no mount here has a number that the kernel gives out.
class Machine {
 public:
  /// A disk or partition, "pci0/usb1/1-2/block/sdb/sdb1", found by number and by name.
  void AddDevice(const std::string& path, const std::string& number) const {
    const std::string folder = folder_ / ("sys/devices/" + path);
    const std::string name = fs::path(path).filename();
    fs::create_directories(folder);
    Link("sys/dev/block", number, "../../devices/" + path);
    Link("sys/class/block", name, "../../devices/" + path);
    if (fs::path(path).parent_path().filename() == "block") {
      Link("sys/block", name, "../devices/" + path);
      SetAttribute(path, "removable", "0");
    } else {
      SetAttribute(path, "partition", "1");
    }
  }
  void SetAttribute(const std::string& path,
                    const std::string& name,
                    const std::string& value) const {
    const std::string file = "sys/devices/" + path + "/" + name;
    fs::create_directories(fs::path(folder_ / file).parent_path());
    folder_.Write(file, value + "\n");
  }
  void AddSlave(const std::string& path, const std::string& slave) const {
    Link("sys/devices/" + path + "/slaves",
         fs::path(slave).filename(),
         folder_ / ("sys/devices/" + slave));
  }

  /// Gives the folder where the volume is seen.
  std::string Mount(const std::string& name,
                    const std::string& number,
                    const std::string& type,
                    const std::string& source,
                    const std::string& options = "rw") {
    fs::create_directories(folder_ / name);
    std::string escaped = folder_ / name;
    for (std::size_t at; (at = escaped.find(' ')) != std::string::npos;) {
      escaped.replace(at, 1, "\\040");
    }
    table_ += std::to_string(900'000'000 + ++mounts_) + " 1 " + number + " / " + escaped + " " +
              options + " - " + type + " " + source + " rw\n";
    folder_.Write("mountinfo", table_);
    return folder_ / name;
  }

  std::string KindOf(const std::string& path) const {
    const auto drives = MakeDrives({folder_ / "mountinfo", folder_ / "sys"});
    const auto volume = drives->VolumeOf(path);
    if (!volume) return "nothing";
    const Result<DriveTraits> read = drives->Read(path, volume.Value());
    if (!read) return "nothing";
    const DriveTraits& traits = read.Value();
    if (traits.remote) return "remote";
    if (traits.optical) return "optical";
    if (!traits.ejectable) return "fixed";
    return traits.writable ? "removable" : "read-only";
  }
  const test::TempFolder& Folder() const { return folder_; }

 private:
  void Link(const std::string& folder, const std::string& name, const std::string& target) const {
    fs::create_directories(folder_ / folder);
    fs::create_symlink(target, folder_ / (folder + "/" + name));
  }

  test::TempFolder folder_;
  std::string table_;
  int mounts_ = 0;
};

TEST(Drives, TellTheDisksOfAMachineApart) {
  Machine machine;
  const std::string kUsb = "pci0/usb2/2-1/2-1:1.0/host6/block/sdb";
  const std::string kCard = "pci0/mmc_host/mmc0/mmc0:1/block/mmcblk0";
  const std::string kSoldered = "pci0/mmc_host/mmc1/mmc1:1/block/mmcblk1";
  const std::string kVirtualDvd = "pci0/virtio2/host2/block/sr1";
  const std::pair<std::string, std::string> kDevices[] = {
      {"8:0", "pci0/ata1/block/sda"},
      {"8:2", "pci0/ata1/block/sda/sda2"},
      {"8:16", kUsb},
      {"8:17", kUsb + "/sdb1"},
      {"8:32", "pci0/ata2/block/sdc"},
      {"8:33", "pci0/ata2/block/sdc/sdc1"},
      {"8:48", "pci0/usb2/2-2/block/sdd"},
      {"8:64", "pci0/fw0/block/sde"},
      {"179:0", kCard},
      {"179:1", kCard + "/mmcblk0p1"},
      {"179:32", kSoldered},
      {"179:33", kSoldered + "/mmcblk1p1"},
      {"11:0", "pci0/ata3/block/sr0"},
      {"11:1", kVirtualDvd},
      {"254:0", "pci0/virtio1/block/vda"},
      {"259:1", "pci0/nvme/nvme0/nvme0n1/nvme0n1p1"},
      {"7:0", "virtual/block/loop0"},
      {"253:0", "virtual/block/dm-0"},
      {"253:1", "virtual/block/dm-1"},
  };
  for (const auto& [number, path] : kDevices) machine.AddDevice(path, number);
  const std::array<std::string, 3> kAttributes[] = {
      {"pci0/usb2/2-2/block/sdd", "ro", "1"},     // A stick with a write-protect switch.
      {"pci0/ata2/block/sdc", "removable", "1"},  // A bay that says it can be emptied.
      {kCard, "device/type", "SD"},
      {kSoldered, "device/type", "MMC"},
      {"pci0/ata3/block/sr0", "removable", "1"},
      {"pci0/ata3/block/sr0", "device/type", "5"},
      {kVirtualDvd, "device/type", "5"},
      {"virtual/block/dm-0", "dm/name", "vault"},
  };
  for (const auto& [path, name, value] : kAttributes) machine.SetAttribute(path, name, value);
  machine.AddSlave("virtual/block/dm-0", kUsb + "/sdb1");
  machine.AddSlave("virtual/block/dm-1", "pci0/ata1/block/sda/sda2");
  machine.AddSlave("virtual/block/dm-1", "virtual/block/dm-1");  // A loop ends.

  const std::array<const char*, 6> kCases[] = {
      {"disk", "8:2", "ext4", "/dev/sda2", "rw", "fixed"},
      {"flash disk", "259:1", "ext4", "/dev/nvme0n1p1", "rw", "fixed"},
      {"virtual disk", "254:0", "ext4", "/dev/vda", "rw", "fixed"},
      {"virtual dvd", "11:1", "iso9660", "/dev/sr1", "ro", "optical"},
      {"stick", "8:17", "vfat", "/dev/sdb1", "rw", "removable"},
      {"stick in ro", "8:17", "vfat", "/dev/sdb1", "ro,nosuid", "read-only"},
      {"switched stick", "8:48", "exfat", "/dev/sdd", "rw", "read-only"},
      {"stick by name", "0:61", "fuse.exfat", "/dev/sdb1", "rw", "removable"},
      {"stick, new node", "8:17", "vfat", "/dev/mine", "rw", "removable"},
      {"bay", "8:33", "xfs", "/dev/sdc1", "rw", "removable"},
      {"firewire", "8:64", "ext4", "/dev/sde", "rw", "removable"},
      {"card", "179:1", "exfat", "/dev/mmcblk0p1", "rw", "removable"},
      {"eMMC", "179:33", "ext4", "/dev/mmcblk1p1", "rw", "fixed"},
      {"dvd", "11:0", "udf", "/dev/sr0", "ro", "optical"},
      {"image", "7:0", "iso9660", "/dev/loop0", "ro", "fixed"},
      {"LUKS on USB", "253:0", "ext4", "/dev/mapper/vault", "rw", "removable"},
      {"btrfs on LUKS on USB", "0:62", "btrfs", "/dev/mapper/vault", "rw", "removable"},
      {"LVM", "253:1", "ext4", "/dev/mapper/vg-home", "rw", "fixed"},
      {"subvolume", "0:50", "btrfs", "/dev/sda2", "rw,subvol=/@home", "fixed"},
      {"subvolume on a stick", "0:51", "btrfs", "/dev/sdb1", "rw", "removable"},
      {"overlay", "0:52", "overlay", "overlay", "rw", "fixed"},
      {"memory", "0:53", "tmpfs", "tmpfs", "rw", "fixed"},
      {"pool", "0:54", "zfs", "pool/data", "rw", "fixed"},
      {"nfs", "0:55", "nfs4", "nas:/photos", "rw", "remote"},
      {"cifs", "0:56", "cifs", "//nas/photos", "ro", "remote"},
      {"sshfs", "0:57", "fuse.sshfs", "me@nas:", "rw", "remote"},
      {"share that looks like a stick", "0:58", "9p", "/dev/sdb1", "rw", "remote"},
  };
  for (const auto& [name, number, type, source, options, kind] : kCases) {
    SCOPED_TRACE(name);
    const std::string folder = machine.Mount(name, number, type, source, options);
    EXPECT_EQ(machine.KindOf(folder), kind);
    std::ofstream(folder + "/photo.jpg");
    EXPECT_EQ(machine.KindOf(folder + "/photo.jpg"), kind);
  }
}

TEST(Drives, DoNotLookAtWhatIsBelowANetworkMount) {
  Machine machine;
  const std::string share = machine.Mount("share", "0:55", "nfs", "nas:/photos");
  const auto drives = MakeDrives({machine.Folder() / "mountinfo", machine.Folder() / "sys"});
  fs::remove(share);  // As good as a server that does not answer.
  for (const char* below : {"/photo.jpg", "/..photo.jpg", "//./photo.jpg", "/b/../photo.jpg"})
    EXPECT_EQ(machine.KindOf(share + below), "remote") << below;
  EXPECT_EQ(machine.KindOf(share + "/../photo.jpg"), "nothing") << "left again";
  EXPECT_EQ(drives->VolumeOf(share + "/photo.jpg").Value(),
            drives->VolumeOf(share + "/b/c").Value());
}

/// All that a table tells but the number, which is of another kind.
std::string Describe(const Mount& mount) {
  return mount.folder + '|' + mount.type + '|' + mount.source + '|' +
         std::to_string(mount.device.major) + ':' + std::to_string(mount.device.minor) +
         (mount.readOnly ? "|ro" : "|rw");
}

TEST(Drives, LearnOfOneMountWhatTheTableTells) {
  const test::TempFolder folder;
  const auto compare = [&] {
    const std::string odd = folder / "a b\nc";
    ASSERT_TRUE(test::MountTmpfs(odd, "size=1m"));
    ASSERT_TRUE(test::MakeReadOnlyVolume(folder / "ro"));
    const MountTable table = MountTable::Read("/proc/self/mountinfo").Value();
    int compared = 0;
    for (const Mount& listed : table.Mounts()) {
      const auto number = MountNumberInMemory(listed.folder);
      const auto mount = number ? ReadMount(*number) : std::nullopt;
      if (!mount || mount->folder != listed.folder) continue;  // Another one hides it.
      EXPECT_EQ(Describe(*mount), Describe(*table.FindByPath(listed.folder)));
      ++compared;
    }
    EXPECT_TRUE(compared >= 3 || !MountNumberInMemory("/")) << compared;
  };
  fs::create_directory(folder / "ro");
  ORB_IN_CHILD(test::RunWithPrivateMounts(compare));
}

TEST(Drives, DoNotWaitForAServerThatDoesNotAnswer) {
  const test::TempFolder folder;
  fs::create_directory(folder / "share");
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    const int server = ::open("/dev/fuse", O_RDWR | O_CLOEXEC);
    const std::string options =
        "fd=" + std::to_string(server) + ",rootmode=40000,user_id=0,group_id=0";
    const std::string share = folder / "share";
    if (::mount("nas:", share.c_str(), "fuse.sshfs", 0, options.c_str()) != 0) return;
    ::alarm(20);
    for (const char* below : {"", "/photo.jpg"}) {
      const auto drives = MakeDrives({});
      const VolumeId volume = drives->VolumeOf(share + below).Value();
      EXPECT_TRUE(drives->Read(share + below, volume).Value().remote) << below;
    }
  }));
}

TEST(Drives, BelieveATableThatStandsInForTheKernels) {
  Machine machine;
  const std::string share = machine.Mount("share", "0:55", "nfs", "nas:/photos");
  const std::string table = machine.Folder() / "mountinfo";
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(test::BindMount(table, "/proc/self/mountinfo"));
    const auto drives = MakeDrives({});
    EXPECT_TRUE(drives->Read(share, drives->VolumeOf(share).Value()).Value().remote);
  }));
}

TEST(Drives, GiveNothingWhereNothingIs) {
  Machine machine;
  const std::string disk = machine.Mount("disk", "8:2", "ext4", "/dev/sda2");
  EXPECT_EQ(machine.KindOf(disk + "/gone"), "nothing");
  EXPECT_EQ(machine.KindOf(""), "nothing");
  EXPECT_FALSE(Drives::Current().VolumeOf(disk + "/gone").Ok());
}

TEST(Drives, KnowARealMountByItsNumber) {
  const test::TempFolder folder;
  const std::string inner = folder / "inner";
  const auto volumeOf = [](const std::string& path) {
    return Drives::Current().VolumeOf(path).Value();
  };
  fs::create_directory(inner);
  fs::create_symlink(inner, folder / "link");
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    const VolumeId before = volumeOf(inner);
    EXPECT_EQ(before, volumeOf(folder.Path()));
    ASSERT_TRUE(test::MountTmpfs(inner, "size=1m"));
    const VolumeId first = volumeOf(inner);
    EXPECT_NE(first, before);
    EXPECT_EQ(volumeOf(folder / "link"), before) << "the link itself is asked about";
    EXPECT_TRUE(Drives::Current().Read(inner, first).Ok()) << "newer than the table that was read";
    ::umount(inner.c_str());
    ASSERT_TRUE(test::BindMount(folder.Path(), inner));
    EXPECT_NE(volumeOf(inner), first);
    EXPECT_NE(volumeOf(inner), before) << "the same volume, seen through another mount";
  }));
}

}  // namespace
}  // namespace orb::platform
