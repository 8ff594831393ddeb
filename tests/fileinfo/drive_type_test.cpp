// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileinfo/drive_type.h>
#include <orb/fileinfo/file_handle.h>

#include <atomic>
#include <string>
#include <thread>
#include <utility>

#include "platform/drives.h"
#include "support/paths.h"

namespace {

using orb::platform::DriveTraits;
using orb::platform::Result;
using orb::platform::VolumeId;

/// This machine while it lives: one of one volume, which counts how often it is looked at. Every
/// test takes a number of its own, because what was found out stays.
class OneVolume final : public orb::platform::Drives {
 public:
  OneVolume(std::uint64_t number, Result<DriveTraits> traits) : number_(number), traits_(traits) {}

  Result<VolumeId> VolumeOf(const std::string& path) const override {
    if (path == "/gone") return orb::platform::kNoSuchItem;
    return VolumeId{number_, 1};
  }
  Result<DriveTraits> Read(const std::string&, const VolumeId&) const override {
    ++reads;
    return traits_;
  }

  mutable std::atomic<int> reads = 0;

 private:
  std::uint64_t number_;
  Result<DriveTraits> traits_;
  orb::platform::ScopedDrives scoped_{*this};
};

unsigned int DriveTypeOf(const std::string& path) {
  return COrbFileHandle(PathOf(path)).GetDriveType();
}

TEST(GetDriveType, TakesTheFirstThatHolds) {
  const std::pair<DriveTraits, unsigned int> kCases[] = {
      {{}, 0x100},
      {{.writable = true}, 0x100},
      {{.optical = true, .remote = true, .ejectable = true}, 0x200},
      {{.remote = true, .ejectable = true, .writable = true}, 0x800},
      {{.ejectable = true, .writable = true}, 0x400},
      {{.ejectable = true}, 0x1000},
  };
  std::uint64_t number = 1000;
  for (const auto& [traits, type] : kCases) {
    SCOPED_TRACE(type);
    const OneVolume volume(++number, traits);
    EXPECT_EQ(DriveTypeOf("/a"), type);
    EXPECT_EQ(DriveTypeOf("/b"), type);
    EXPECT_EQ(volume.reads, 1) << "kept for the volume";
  }
}

TEST(GetDriveType, KeepsAVolumesTypeAndNoFailure) {
  {
    const OneVolume broken(2001, orb::platform::kNotPermitted);
    EXPECT_EQ(DriveTypeOf("/a"), 0x100u);
    EXPECT_EQ(DriveTypeOf("/gone"), 0x100u);
    EXPECT_EQ(broken.reads, 1);
  }
  {
    const OneVolume stick(2001, DriveTraits{.ejectable = true, .writable = true});
    EXPECT_EQ(DriveTypeOf("/gone"), 0x100u);
    EXPECT_EQ(DriveTypeOf(""), 0x100u);
    EXPECT_EQ(DriveTypeOf("/\xff"), 0x100u) << "no text that names an item";
    EXPECT_EQ(DriveTypeOf("/a"), 0x400u) << "the failure was not kept";
  }
  const OneVolume locked(2001, DriveTraits{.ejectable = true});
  EXPECT_EQ(DriveTypeOf("/a"), 0x400u) << "also after its writability has changed";
  EXPECT_EQ(locked.reads, 0);
}

TEST(GetDriveType, MayBeAskedFromSeveralThreads) {
  const OneVolume stick(3001, DriveTraits{.ejectable = true, .writable = true});
  const auto ask = [] {
    for (int i = 0; i < 500; ++i) EXPECT_EQ(DriveTypeOf("/a"), 0x400u);
  };
  std::thread other(ask), third(ask);
  ask();
  other.join();
  third.join();
}

}  // namespace
