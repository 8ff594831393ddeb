// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gtest/gtest.h>
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/remove.h>
#include <sys/stat.h>

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>

#include "fileops/path_workers.h"
#include "platform/volumes.h"
#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"
#include "support/trees.h"

namespace {

namespace fs = std::filesystem;
using orb::test::Describe;
using orb::test::OpenDescriptors;
using orb::test::ReadAll;
using orb::test::RunAsUser;
using orb::test::RunWithPrivateMounts;
using orb::test::TempFolder;

/// Counts its calls and answers false at one of them.
struct Progress {
  int falseAt = 0;
  int calls = 0;

  static bool Call(void* data) {
    auto* self = static_cast<Progress*>(data);
    return ++self->calls != self->falseAt;
  }
};

OrbResult Copy(const std::string& source,
               const std::string& folder,
               const std::optional<std::string>& name = {},
               Progress* progress = nullptr) {
  const COrbStringData text = name ? S(*name) : COrbStringData();
  return OrbCopyFileOverwriteEx(PathOf(source),
                                PathOf(folder),
                                name ? &text : nullptr,
                                progress != nullptr ? Progress::Call : nullptr,
                                progress);
}

class AlmostFull final : public orb::platform::Volumes {
 public:
  explicit AlmostFull(std::uint64_t available) : available_(available) {}
  std::optional<std::uint64_t> AvailableCapacity(const std::string&) const override {
    return available_;
  }

 private:
  std::uint64_t available_;
};

TEST(CopyFileOverwriteEx, BringsTheItemWithAllItHas) {
  const TempFolder folder;
  fs::create_directories(folder / "from/tree/sub");
  fs::create_directory(folder / "to");
  folder.Write("from/100%.jpg", "photo");
  folder.Write("from/tree/sub/file", "x");
  fs::create_symlink("100%.jpg", folder / "from/link");
  ASSERT_EQ(COrbFileHandle(PathOf(folder / "from/100%.jpg")).SetAttribute(kOrbFileAttrLocked), 0u);
  for (const char* name : {"100%.jpg", "link", "tree"}) {
    Progress progress;
    EXPECT_EQ(Copy(folder / "from/" + name, folder / "to", {}, &progress), kOrbNoErr) << name;
    EXPECT_EQ(progress.calls, 2);
  }
  EXPECT_EQ(Describe(folder / "to"), Describe(folder / "from"));
  EXPECT_TRUE(COrbFileHandle(PathOf(folder / "to/100%.jpg")).GetAttribute() & kOrbFileAttrLocked);
}

TEST(CopyFileOverwriteEx, RemovesWhatIsThere) {
  const TempFolder folder;
  folder.Write("source", "new");
  fs::create_directories(folder / "to/folder/sub");
  folder.Write("to/file", "old");
  folder.Write("outside", "kept");
  fs::create_symlink("../outside", folder / "to/link");
  fs::create_hard_link(folder / "source", folder / "to/hard");
  for (const char* name : {"folder", "file", "link", "hard"}) {
    SCOPED_TRACE(name);
    EXPECT_EQ(Copy(folder / "source", folder / "to", name), kOrbNoErr);
    EXPECT_EQ(ReadAll(folder / "to/" + name), "new");
    EXPECT_FALSE(fs::is_symlink(folder / "to/" + name));
  }
  EXPECT_EQ(ReadAll(folder / "outside"), "kept");
}

TEST(CopyFileOverwriteEx, RemovesNothingUnlessItCanBeReplaced) {
  const TempFolder folder;
  fs::create_directories(folder / "a/b");
  folder.Write("a/b/photo.jpg", "only copy");
  folder.Write("a/b/PHOTO.JPG", "another one, but not on a card");
  folder.Write("a/old", "old");
  fs::create_directory(folder / "a/full");
  folder.Write("a/full/file", "old");
  fs::create_directory_symlink("a", folder / "link");
  ASSERT_EQ(::mkfifo((folder / "a/pipe").c_str(), 0600), 0);
  const struct {
    const char* source;
    const char* folder;
    std::optional<std::string> name;
    OrbResult expected;
  } kCases[] = {
      // The same entry, as text and as the file system sees it.
      {"a/b/photo.jpg", "a/b", {}, kOrbErrInsideSource},
      {"a/b/photo.jpg", "a/b/", "PHOTO.JPG", kOrbErrInsideSource},
      {"a/b/photo.jpg", "link/b", {}, kOrbErrInsideSource},
      {"link/b/photo.jpg", "a/b", {}, kOrbErrInsideSource},
      {"a/b/photo.jpg", "a/full/../b", {}, kOrbErrInsideSource},
      // A folder above the source.
      {"a/b/photo.jpg", "a", "b", kOrbErrInsideSource},
      {"a/b/photo.jpg", "link", "b", kOrbErrInsideSource},
      // A source that is not there, or not named.
      {"a/missing", "a", "old", kOrbErrNotFound},
      {"", "a", "old", kOrbErrNotFound},
      {"a/b/", "a", {}, kOrbErrInvalidName},
      {"a/\xff", "a", "old", kOrbErrAccessDenied},
      // A name that names no entry, a folder that is none.
      {"a/b/photo.jpg", "a/full", "", kOrbErrInvalidName},
      {"a/b/photo.jpg", "a/full", ".", kOrbErrInvalidName},
      {"a/b/photo.jpg", "a/full", "..", kOrbErrInvalidName},
      {"a/b/photo.jpg", "a/full", "\xff", kOrbErrInvalidName},
      {"a/b/photo.jpg", nullptr, "old", kOrbErrEmptyPath},
      {"a/b/photo.jpg", "a/missing", {}, kOrbErrNotFound},
      {"a/pipe", "a", "old", kOrbErrAccessDenied},  // A source that is never copied.
      {"a", "a/b", "inside", kOrbErrUnknown},
  };
  const auto before = Describe(folder.Path());
  for (const auto& c : kCases) {
    SCOPED_TRACE(std::string(c.source) + " to " + (c.folder ? c.folder : "") + "/" +
                 c.name.value_or(""));
    const std::string source = *c.source == '\0' ? "" : folder / c.source;
    EXPECT_EQ(Copy(source, c.folder ? folder / c.folder : "", c.name), c.expected);
    EXPECT_EQ(Describe(folder.Path()), before);
  }
}

TEST(CopyFileOverwriteEx, KeepsWhatIsLocked) {
  const TempFolder folder;
  folder.Write("source", "new");
  fs::create_directory(folder / "to");
  folder.Write("to/file", "old");
  for (const char* locked : {"to/file", "to"}) {
    SCOPED_TRACE(locked);
    ASSERT_EQ(COrbFileHandle(PathOf(folder / locked)).SetAttribute(kOrbFileAttrLocked), 0u);
    EXPECT_EQ(Copy(folder / "source", folder / "to", "file"), kOrbErrAccessDenied);
    EXPECT_EQ(ReadAll(folder / "to/file"), "old");
    ASSERT_EQ(COrbFileHandle(PathOf(folder / locked)).SetAttribute(0), 0u);
  }
}

// The destination is gone by then: the caller asked for its removal first.
TEST(CopyFileOverwriteEx, CanBeCanceledBeforeButNotAfterTheCopy) {
  const TempFolder folder;
  folder.Write("source", "new");
  for (const bool isThere : {false, true}) {
    if (isThere) folder.Write("to", "old");
    Progress progress{1};
    EXPECT_EQ(Copy(folder / "source", folder.Path(), "to", &progress), kOrbErrCanceled);
    EXPECT_EQ(progress.calls, 1);
    EXPECT_FALSE(fs::exists(folder / "to"));
  }
  Progress progress{2};
  EXPECT_EQ(Copy(folder / "source", folder.Path(), "to", &progress), kOrbNoErr);
  EXPECT_EQ(ReadAll(folder / "to"), "new");
}

TEST(CopyFileOverwriteEx, PutsFailuresDownToALowVolumeButNotACancel) {
  constexpr std::uint64_t kEnough = 104857600;
  const TempFolder folder;
  fs::create_symlink("nowhere", folder / "taken");  // No way is made for what does not exist.
  folder.Write("file", "x");
  for (const std::uint64_t available : {kEnough, kEnough - 1}) {
    SCOPED_TRACE(available);
    const AlmostFull volumes(available);
    const orb::platform::ScopedVolumes scoped(volumes);
    const OrbResult failed = available < kEnough ? kOrbErrDiskFull : kOrbErrUnknown;
    EXPECT_EQ(Copy(folder / "file", folder.Path(), "taken"), failed);
    Progress progress{1};
    EXPECT_EQ(Copy(folder / "file", folder.Path(), "copy", &progress), kOrbErrCanceled);
    EXPECT_EQ(Copy(folder / "file", folder.Path(), "copy"), kOrbNoErr);
  }
}

TEST(CopyPath, CallsBeforeAndAfterAlsoWhenTheCopyFails) {
  const TempFolder folder;
  Progress progress;
  orb::OrbCopyPath worker(folder / "missing", folder / "copy");
  worker.SetProgress(Progress::Call, &progress);
  EXPECT_EQ(worker.Perform().code, kOrbErrNotFound);
  EXPECT_EQ(progress.calls, 2);
}

OrbResult Append(const std::string& source,
                 const std::string& folder,
                 const std::string& name,
                 Progress* progress = nullptr) {
  return OrbCopyFileEx(PathOf(source),
                       PathOf(folder),
                       S(name),
                       progress != nullptr ? Progress::Call : nullptr,
                       progress);
}

TEST(CopyFileEx, AppendsInPieces) {
  const TempFolder folder;
  for (const std::size_t size : {0u, 5u, 65536u, 65537u, 200000u}) {
    SCOPED_TRACE(size);
    const std::string bytes(size, 's');
    folder.Write("source", bytes);
    folder.Write("old", "0123456789");
    fs::remove(folder / "new");
    Progress progress;
    EXPECT_EQ(Append(folder / "source", folder.Path(), "old", &progress), kOrbNoErr);
    EXPECT_EQ(progress.calls, static_cast<int>((size + 65535) / 65536));
    EXPECT_EQ(ReadAll(folder / "old"), "0123456789" + bytes);
    EXPECT_EQ(Append(folder / "source", folder / "/", "new"), kOrbNoErr);
    EXPECT_TRUE(fs::exists(folder / "new"));
    EXPECT_EQ(ReadAll(folder / "new"), bytes);
  }
}

TEST(CopyFileEx, LeavesTheDestinationAsItWasWhenItDoesNotSucceed) {
  const TempFolder folder;
  folder.Write("source", std::string(200000, 's'));
  folder.Write("old", "0123456789");
  fs::create_directories(folder / "locked");
  folder.Write("locked/file", "old");
  fs::create_hard_link(folder / "old", folder / "hard");
  fs::create_symlink("old", folder / "link");
  fs::create_symlink("nowhere", folder / "dangling");
  ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0600), 0);
  for (const char* name : {"locked/file", "locked"})
    ASSERT_EQ(COrbFileHandle(PathOf(folder / name)).SetAttribute(kOrbFileAttrLocked), 0u);
  const struct {
    const char* source;
    const char* name;
    int cancelAt;
    OrbResult expected;
  } kCases[] = {
      {"source", "new", 1, kOrbErrCanceled},
      {"old", "old", 0, kOrbErrSamePath},
      {"old", "hard", 0, kOrbErrSamePath},
      {"link", "old", 0, kOrbErrSamePath},
      {"source", "link", 0, kOrbErrAccessDenied},
      {"source", "dangling", 0, kOrbErrAccessDenied},
      {"source", "pipe", 0, kOrbErrAccessDenied},
      {"pipe", "new", 0, kOrbErrAccessDenied},
      {"source", "locked/file", 0, kOrbErrAccessDenied},
      {"source", "locked/new", 0, kOrbErrAccessDenied},
      {"source", "locked", 0, kOrbErrUnknown},
      {"source", "missing/new", 0, kOrbErrNotFound},
      {"source", "\xff", 0, kOrbErrInvalidName},
      {"source", "old/", 0, kOrbErrInvalidName},
      {"locked", "new", 0, kOrbErrUnknown},  // A folder cannot be read.
      {"missing", "new", 0, kOrbNoErr},
      {"missing", "old", 0, kOrbNoErr},
      {"dangling", "new", 0, kOrbNoErr},
  };
  const auto before = Describe(folder.Path());
  const int descriptors = OpenDescriptors();
  for (const auto& c : kCases) {
    SCOPED_TRACE(std::string(c.source) + " to " + c.name);
    Progress progress{c.cancelAt};
    EXPECT_EQ(Append(folder / c.source, folder.Path(), c.name, &progress), c.expected);
    EXPECT_EQ(progress.calls, c.cancelAt);
    EXPECT_EQ(Describe(folder.Path()), before);
  }
  EXPECT_EQ(OpenDescriptors(), descriptors);
  EXPECT_EQ(Append(folder / "source", "", "new"), kOrbErrEmptyPath);
  EXPECT_EQ(Append("", folder.Path(), "new"), kOrbNoErr);
  EXPECT_EQ(Append(folder / "source", folder.Path(), std::string(256, 'n')), kOrbErrNameTooLong);
  // 100 characters, 300 bytes.
  std::string wide;
  for (int i = 0; i < 100; ++i) wide += "\xe3\x81\x82";
  EXPECT_EQ(Append(folder / "source", folder.Path(), wide), kOrbErrInvalidName);
}

TEST(CopyFileEx, LeavesNoDestinationWhenCanceledButWhatSomebodyElsePutThere) {
  const TempFolder folder;
  folder.Write("source", std::string(200000, 's'));
  folder.Write("old", "0123456789");
  fs::create_hard_link(folder / "old", folder / "hard");
  Progress progress{3};
  EXPECT_EQ(Append(folder / "source", folder.Path(), "old", &progress), kOrbErrCanceled);
  EXPECT_FALSE(fs::exists(folder / "old"));
  EXPECT_EQ(ReadAll(folder / "hard"), "0123456789");
  static const std::string photo = folder / "photo";
  for (const char* reserved : {"", "photo"}) {
    if (*reserved != '\0') folder.Write(reserved, "");
    const auto replaceAndCancel = [](void*) {
      fs::remove(photo);
      std::ofstream(photo) << "theirs";
      return false;
    };
    EXPECT_EQ(OrbCopyFileEx(PathOf(folder / "source"),
                            PathOf(folder.Path()),
                            S("photo"),
                            replaceAndCancel,
                            nullptr),
              kOrbErrCanceled);
    EXPECT_EQ(ReadAll(photo), "theirs");
  }
}

TEST(CopyFileEx, TakesBackWhatAFullVolumeOrAStrangersFileLeft) {
  const TempFolder folder;
  ASSERT_EQ(::chmod(folder.Path().c_str(), 0777), 0);
  const std::string source = folder.Write("source", std::string(3 * 1024 * 1024, 's'));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(orb::test::MountTmpfs(folder / "to", "size=1m"));
    folder.Write("to/old", "0123456789");
    for (const char* name : {"old", "new"})
      EXPECT_EQ(Append(source, folder / "to", name), kOrbErrDiskFull);
    EXPECT_EQ(ReadAll(folder / "to/old"), "0123456789");
    EXPECT_FALSE(fs::exists(folder / "to/new"));
  }));
  ASSERT_EQ(::chmod(source.c_str(), 0600), 0);
  ORB_IN_CHILD(RunAsUser(65534, [&] {
    EXPECT_EQ(Append(source, folder.Path(), "new"), kOrbErrAccessDenied);
    EXPECT_FALSE(fs::exists(folder / "new"));
  }));
}

TEST(MakeFilePath, JoinsUnderTheLimits) {
  const struct {
    std::string folder;
    std::string name;
    OrbResult asText;
    OrbResult asPath;
    std::string joined;
  } kCases[] = {
      {"/a", "b", 0, 0, "/a/b"},
      {"/a/", "b", 0, 0, "/a/b"},
      {"/", "b", 0, 0, "/b"},
      {"", "b", 0, 0, "b"},
      {"/a", std::string(255, 'n'), 0, 0, "/a/" + std::string(255, 'n')},
      {"/a", std::string(256, 'n'), kOrbErrNameTooLong, kOrbErrNameTooLong, ""},
      {std::string(1021, 'f'), "b", 0, 0, std::string(1021, 'f') + "/b"},
      {std::string(1022, 'f'), "b", kOrbErrNameTooLong, kOrbErrPathTooLong, ""},
      {"/a", "\xff", kOrbErrInvalidName, kOrbErrInvalidName, ""},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.folder + " and " + c.name);
    COrbStringData text;
    COrbFilePath path;
    EXPECT_EQ(OrbMakeFilePath(S(c.folder), S(c.name), &text), c.asText);
    EXPECT_EQ(Text(text), c.joined);
    EXPECT_EQ(OrbMakeFilePath(PathOf(c.folder), S(c.name), &path), c.asPath);
    EXPECT_EQ(Text(path.GetFullPath()), c.joined);
  }
  EXPECT_EQ(OrbMakeFilePath(S("/a"), S("b"), nullptr), kOrbErrNotFound);
  // 300 characters of three bytes: too long as bytes only.
  std::string wide = "/";
  for (int i = 0; i < 350; ++i) wide += "\xe3\x81\x82";
  COrbStringData text;
  COrbFilePath path;
  EXPECT_EQ(OrbMakeFilePath(S(wide), S("b"), &text), kOrbNoErr);
  EXPECT_EQ(OrbMakeFilePath(PathOf(wide), S("b"), &path), kOrbErrPathTooLong);
}

}  // namespace
