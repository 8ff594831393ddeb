// SPDX-License-Identifier: MIT
#include <cerrno>

#include "fileinfo/item_times.h"
#include "support/files.h"
#include "support/forwarding_items.h"

namespace orb::test {
namespace {

using platform::Timestamp;

constexpr unsigned int kUsual =
    kOrbFileAttrVolumeWritable | kOrbFileAttrReadable | kOrbFileAttrWritable;
constexpr gid_t kNobodysGroup = 54321;

COrbFileHandle HandleOf(const std::string& path) { return COrbFileHandle(PathOf(path)); }

unsigned int AttributesOf(const std::string& path) { return HandleOf(path).GetAttribute(); }

std::string NameOf(const COrbFileHandle& handle) {
  COrbStringData name;
  EXPECT_EQ(handle.GetActualName(name), kOrbNoErr);
  return Text(name);
}

std::uint64_t Seconds(const UTCDateTime& time) {
  return std::uint64_t{time.highSeconds} << 32 | time.lowSeconds;
}

/// Answers for the real item, with a change that a test makes.
struct AlteredItems : ForwardingItems {
  platform::Result<platform::ItemInfo> Read(platform::PathText path) const override {
    if (failure) return *failure;
    auto info = ForwardingItems::Read(path);
    if (volumeFailure) info.Value().volumeReadOnly = *volumeFailure;
    return info;
  }
  std::optional<platform::Error> failure;
  std::optional<platform::Error> volumeFailure;
};

TEST(Collect, TellsFilesFoldersPackagesAndLinks) {
  const Tree tree("a.jpg=12345, \xC3\xA4%n.JPEG= 0444, x.jpg/, p.app/, P.Bundle/, .app/, p.apps/");
  tree.Make("q.mov/Contents/Info.plist, file.app=, link.jpg -> a.jpg, fifo.txt|");
  constexpr unsigned int kUsualFolder = kUsual | kOrbFileAttrFolder;
  constexpr eOrbFileType kUnknown = eOrbFileType_Unknown;
  const std::tuple<const char*, const char*, unsigned, eOrbFileType, std::uint64_t> kCases[] = {
      {"a.jpg", "a.jpg", kUsual, eOrbFileType_Jpeg, 5},
      {"\xC3\xA4%n.JPEG", "\xC3\xA4%n.JPEG", 0x0C, eOrbFileType_Jpeg, 0},
      {"x.jpg", "x.jpg", kUsualFolder, kUnknown, 0},
      {"x.jpg//", "x.jpg", kUsualFolder, kUnknown, 0},
      {"p.app/", "p.app", kUsual, kUnknown, 0},
      {"P.Bundle", "P.Bundle", kUsual, kUnknown, 0},
      {".app", ".app", kUsualFolder, kUnknown, 0},
      {"p.apps", "p.apps", kUsualFolder, kUnknown, 0},
      {"file.app", "file.app", kUsual, kUnknown, 0},
      {"q.mov", "q.mov", kUsual, eOrbFileType_Mov, 0},  // Marked, and typed by its name.
      {"link.jpg", "link.jpg", kUsual, kUnknown, 5},
      {"fifo.txt", "fifo.txt", kUsual, eOrbFileType_Txt, 0},  // Nobody waits for its other end.
      {"/", "/", kUsualFolder, kUnknown, 0},
  };
  errno = 1234;
  for (const auto& [path, name, attributes, type, size] : kCases) {
    SCOPED_TRACE(path);
    const COrbFileHandle handle = HandleOf(tree.At(path));
    EXPECT_EQ(NameOf(handle), name);
    EXPECT_EQ(handle.GetAttribute(), attributes);
    EXPECT_EQ(handle.GetFileType(), type);
    EXPECT_EQ(handle.GetFileSize(), size);
  }
  EXPECT_EQ(errno, 1234);  // The host's own is left alone.
}

TEST(GetAttribute, AsksForTheCallerAndTheVolume) {
  const Tree tree("in/open 0666, in/closed 0664, in/link -> open, in/ 0755");
  const std::string open = tree / "in/open";
  const std::string closed = tree / "in/closed";
  for (const std::string& path : {open, closed}) {
    if (::chown(path.c_str(), 0, kNobodysGroup) != 0) GTEST_SKIP() << "needs root";
  }
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    EXPECT_EQ(AttributesOf(open), kUsual);
    EXPECT_EQ(AttributesOf(closed), 0x0CU);
    EXPECT_EQ(HandleOf(closed).SetAttribute(kOrbFileAttrLocked), kOrbErrAccessDenied);
    EXPECT_EQ(HandleOf(closed).SetUpdateTime(COrbTime(1ULL)), kOrbErrAccessDenied);
  }));
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MakeReadOnlyVolume(tree.Path()));
    EXPECT_EQ(AttributesOf(open), kOrbFileAttrReadable);
    EXPECT_EQ(AttributesOf(tree / "in/link"), kOrbFileAttrReadable);
    EXPECT_EQ(AttributesOf(tree / "in"), kOrbFileAttrReadable | kOrbFileAttrFolder);
    EXPECT_EQ(HandleOf(open).SetUpdateTime(COrbTime(1ULL)), kOrbErrAccessDenied);
  }));
}

TEST(GetAttribute, OfAPathReadsTheRecordAlone) {
  const Tree folder("file, p.app/");
  const std::string file = folder / "file";
  for (const auto& [mode, attributes] : {std::pair(0644, kUsual),
                                         {0440, kOrbFileAttrReadable},
                                         {0040, kOrbFileAttrReadable},
                                         {0024, 0U},
                                         {0200, kUsual & ~kOrbFileAttrReadable}}) {
    fs::permissions(file, fs::perms(mode));
    EXPECT_EQ(COrbFileHandle::GetAttribute(S(file)), attributes) << mode;
  }
  EXPECT_EQ(COrbFileHandle::GetAttribute(S(folder / "p.app")), kUsual | kOrbFileAttrFolder);
  EXPECT_EQ(HandleOf(file).SetAttribute(kOrbFileAttrLocked), kOrbNoErr);
  EXPECT_EQ(COrbFileHandle::GetAttribute(S(file)), kOrbFileAttrLocked | kOrbFileAttrWritable);
  for (const std::string& path : {folder / "missing", std::string(), folder / "\xFF"}) {
    EXPECT_EQ(COrbFileHandle::GetAttribute(S(path)), kOrbErrNotFound);
  }
}

TEST(Collect, GivesNeutralAnswersWhereNothingIs) {
  const Tree tree("\xFF, dangling -> nowhere");
  const std::pair<std::string, OrbResult> kCases[] = {
      {"", kOrbErrNoSuchFile},
      {"no", kOrbErrNotFound},
      {"\xFF", kOrbErrNoSuchFile},  // A name that is no UTF-8 is out of reach.
      {"dangling", kOrbNoErr},      // The entry itself has times.
      {std::string(300, 'n'), kOrbErrInvalidName},
  };
  for (const auto& [path, timesResult] : kCases) {
    SCOPED_TRACE(path);
    COrbFileHandle handle = HandleOf(tree.At(path));
    EXPECT_FALSE(handle.IsExist());
    EXPECT_EQ(handle.CollectFileInformatioin(), kOrbErrNoSuchFile);
    EXPECT_EQ(handle.Update(), kOrbErrNoSuchFile);
    EXPECT_EQ(std::tuple(handle.GetAttribute(), handle.GetFileType(), handle.GetFileSize()),
              std::tuple(0U, eOrbFileType_Unknown, 0U));
    COrbStringData name;
    EXPECT_EQ(handle.GetDisplayName(name), kOrbErrNotFound);
    COrbTime time(7ULL);
    EXPECT_EQ(handle.GetCreateTime(&time), kOrbErrNoSuchFile);
    EXPECT_EQ(handle.GetUpdateTime(&time), kOrbErrNoSuchFile);
    EXPECT_EQ(time.ticks, 7U);
    EXPECT_EQ(Seconds(handle.GetUpdateTime()), 0U);
    EXPECT_EQ(handle.GetAccessTime(&time), timesResult);
    EXPECT_EQ(handle.SetUpdateTime(time), timesResult);
  }
}

TEST(Collect, KeepsTheAnswersUntilAskedAgain) {
  const Tree tree("a.jpg=123");
  COrbFileHandle handle = HandleOf(tree / "a.jpg");
  EXPECT_EQ(handle.GetFileSize(), 3U);
  tree.Make("a.jpg=12345");
  EXPECT_EQ(handle.GetFileSize(), 3U);
  EXPECT_EQ(handle.Update(), kOrbNoErr);
  EXPECT_EQ(handle.GetFileSize(), 5U);
  fs::remove(tree / "a.jpg");
  EXPECT_EQ(handle.Update(), kOrbErrNoSuchFile);
  EXPECT_EQ(handle.GetAttribute(), kUsual);
  EXPECT_EQ(handle.GetFileType(), eOrbFileType_Jpeg);
}

TEST(Collect, LeavesWhatAFailedPassHadFound) {
  const Tree tree("a.jpg=123");
  const COrbFileHandle fresh = HandleOf(tree / "a.jpg");
  COrbFileHandle old = HandleOf(tree / "a.jpg");
  EXPECT_EQ(old.GetAttribute(), kUsual);
  AlteredItems items;
  const platform::ScopedItems scope(items);

  items.volumeFailure = platform::Error{platform::ErrorDomain::kPosix, ENOSPC};
  EXPECT_EQ(fresh.CollectFileInformatioin(), kOrbErrDiskFull);
  EXPECT_EQ(fresh.GetFileSize(), 0U);  // Not collected: it is asked again.
  EXPECT_EQ(old.Update(), kOrbErrNoSuchFile);
  EXPECT_EQ(old.GetAttribute(), kOrbFileAttrReadable);
  EXPECT_EQ(old.GetFileSize(), 3U);

  items.volumeFailure = platform::kBusy;  // No answer and no reason: goes on.
  EXPECT_EQ(fresh.CollectFileInformatioin(), kOrbNoErr);
  EXPECT_EQ(fresh.GetAttribute(), kOrbFileAttrReadable);

  items.failure = platform::kNotPermitted;
  EXPECT_EQ(old.CollectFileInformatioin(), kOrbErrAccessDenied);
  EXPECT_EQ(old.GetAttribute(), 0U);
  EXPECT_EQ(old.GetFileType(), eOrbFileType_Jpeg);
}

TEST(Collect, TakesReferencesAndTexts) {
  const Tree tree("a.mov=123, b.jpg");
  const CFStringRef text = S(tree / "a.mov").CreateCopyCFString();
  FSRef reference;
  ASSERT_EQ(HandleOf(tree / "a.mov").GetFSRef(&reference), kOrbNoErr);
  EXPECT_EQ(COrbFileHandle(&reference).GetFileSize(), 3U);
  EXPECT_EQ(COrbFileHandle(&text).GetFileSize(), 3U);
  EXPECT_TRUE(COrbFileHandle(static_cast<const FSRef*>(nullptr)).IsEmpty());
  COrbFileHandle other = HandleOf(tree / "b.jpg");
  EXPECT_EQ(other.SetCatalogInfo(text), kOrbNoErr);
  EXPECT_EQ(NameOf(other), "a.mov");
  EXPECT_EQ(other.GetFileType(), eOrbFileType_Mov);
  EXPECT_EQ(other.Update(), kOrbNoErr);
  EXPECT_EQ(NameOf(other), "b.jpg");
  fs::remove(tree / "a.mov");
  EXPECT_EQ(other.SetCatalogInfo(text), kOrbErrNotFound);
  EXPECT_EQ(other.SetCatalogInfo(nullptr), kOrbErrNotFound);
  CFRelease(text);
}

TEST(Assignment, CopiesOrForgetsWhatWasCollected) {
  const Tree tree("a.jpg=123");
  const std::string file = tree / "a.jpg";
  COrbFileHandle collected = HandleOf(file);
  const std::uint64_t modified = Seconds(collected.GetUpdateTime());
  fs::remove(file);  // From here on only what was collected can answer.
  const COrbFileHandle copy(collected);
  COrbFileHandle assigned;
  assigned = collected;
  for (const COrbFileHandle& each : {copy, assigned}) {
    EXPECT_EQ(Text(each.GetFullPath()), file);
    EXPECT_EQ(each.GetFileSize(), 3U);
    EXPECT_EQ(each.GetAttribute(), kUsual);
    EXPECT_EQ(Seconds(each.GetUpdateTime()), modified);
    EXPECT_EQ(NameOf(each), "a.jpg");
  }
  collected = *&collected;
  static_cast<COrbFilePath&>(collected) = collected;
  EXPECT_EQ(collected.GetFileSize(), 3U);

  const COrbFilePath& asPath = copy;
  EXPECT_EQ(COrbFileHandle(asPath).GetFileSize(), 0U);
  static_cast<COrbFilePath&>(assigned) = copy;
  EXPECT_EQ(Text(assigned.GetFullPath()), file);
  EXPECT_EQ(assigned.GetFileSize(), 0U);
  const COrbStringData sameText = S(file);
  collected.Initialize(&sameText);
  EXPECT_EQ(collected.GetFileSize(), 0U);
}

TEST(SetAttribute, AdjustsTheLockAlone) {
  const Tree tree("a.jpg, link -> a.jpg");
  COrbFileHandle handle = HandleOf(tree / "a.jpg");
  EXPECT_EQ(handle.GetAttribute(), kUsual);
  EXPECT_EQ(handle.SetAttribute(kOrbFileAttrLocked), kOrbNoErr);
  EXPECT_EQ(handle.GetAttribute(), kUsual | kOrbFileAttrLocked);
  EXPECT_EQ(AttributesOf(tree / "a.jpg"), kUsual | kOrbFileAttrLocked);
  EXPECT_EQ(handle.SetUpdateTime(COrbTime(1ULL)), kOrbErrAccessDenied);
  EXPECT_EQ(handle.SetCreateTime(COrbTime(1ULL)), kOrbErrAccessDenied);
  EXPECT_EQ(handle.SetAttribute(kOrbFileAttrWritable), kOrbNoErr);
  EXPECT_EQ(handle.GetAttribute(), kUsual);
  EXPECT_EQ(COrbFileHandle().SetAttribute(2), kOrbErrNoSuchFile);
  EXPECT_EQ(HandleOf(tree / "missing").SetAttribute(2), kOrbErrNotFound);
  EXPECT_EQ(HandleOf(tree / "link").SetAttribute(2), kOrbErrAccessDenied);
  EXPECT_EQ(AttributesOf(tree / "a.jpg"), kUsual);  // Not through the link.
}

TEST(IsEqual, ComparesTextWithoutCase) {
  const std::tuple<const char*, const char*, bool> kCases[] = {
      {"/Users/a/Pic", "/users/A/pic/", true},
      {"/\xC3\x84/x", "/\xC3\xA4/X", true},
      {"/gro\xC3\x9F", "/GROSS", true},
      {"/", "/", true},
      {"/\xC3\xA4", "/a\xCC\x88", false},  // Composed and decomposed.
      {"/a//", "/a/", false},
      {"/a", "", false},
      {"", "", false},
      {"/\xFF", "/\xFF", false},
  };
  for (const auto& [a, b, equal] : kCases) {
    EXPECT_EQ(OrbPathIsEqualActually(HandleOf(a), HandleOf(b)), equal) << a;
    EXPECT_EQ(OrbPathIsEqualVirtually(HandleOf(b), HandleOf(a)), equal) << a;
  }
  EXPECT_TRUE(OrbPathIsEqualOrRootActually(HandleOf("/a"), HandleOf("/A/b")));
  EXPECT_FALSE(OrbPathIsEqualOrRootVirtually(HandleOf("/a/b"), HandleOf("/a")));
}

TEST(FileType, OfATextLooksAtFoldersWhenAsked) {
  const Tree tree("y.mov/");
  const std::tuple<const char*, eOrbFileType, eOrbFileType> kCases[] = {
      {"a/b.JPEG", eOrbFileType_Jpeg, eOrbFileType_Jpeg},
      {"a.jpg/b", eOrbFileType_Unknown, eOrbFileType_Unknown},
      {"y.mov", eOrbFileType_Mov, eOrbFileType_Unknown},
      {"", eOrbFileType_Unknown, eOrbFileType_Unknown},
  };
  for (const auto& [path, type, ofFile] : kCases) {
    EXPECT_EQ(OrbPathFindExtensionType(S(tree.At(path)), false), type) << path;
    EXPECT_EQ(OrbPathFindExtensionType(PathOf(tree.At(path)), true), ofFile) << path;
  }
  EXPECT_EQ(COrbFileHandle::GetFileType(S("a.JPG")), eOrbFileType_Jpeg);
  EXPECT_EQ(COrbFileHandle::GetFileType(S("\xFF.jpg")), eOrbFileType_Unknown);
}

TEST(ItemTimes, AreExactAndStayInRange) {
  const std::tuple<Timestamp, std::uint64_t, std::uint64_t, unsigned> kCases[] = {
      {{0, 0}, 20'828'448'000'000'000, 2'082'844'800, 0},
      {{1'588'334'400, 750'000'099}, 36'711'792'007'500'000, 3'671'179'200, 49152},
      {{1'588'334'400, 999'999'999}, 36'711'792'009'999'999, 3'671'179'200, 65535},
      {{-2'082'844'800, 100}, 1, 0, 0},
      {{-2'082'844'801, 999'999'999}, 0, 0, 0},
      {{-9'223'372'036'854'775'807, 0}, 0, 0, 0},
      {{9'223'372'036'854'775'807, 0}, 18'446'744'073'709'551'615U, 1'844'674'407'370, 62597},
  };
  for (const auto& [time, ticks, seconds, fraction] : kCases) {
    SCOPED_TRACE(time.seconds);
    EXPECT_EQ(TicksOf(time), ticks);
    EXPECT_EQ(Seconds(UtcOf(time)), seconds);
    EXPECT_EQ(UtcOf(time).fraction, fraction);
  }
  EXPECT_EQ(TimestampOf({1, 5, 9}), (Timestamp{2'212'122'501, 0}));
}

TEST(Times, AreSetInWholeSecondsAndSeenAfterUpdate) {
  const Tree tree("a.jpg");
  COrbFileHandle handle = HandleOf(tree / "a.jpg");
  const std::uint64_t before = Seconds(handle.GetUpdateTime());
  const COrbTime noon(36'711'792'007'500'000ULL);  // 2020-05-01 12:00:00.75
  EXPECT_EQ(handle.SetUpdateTime(noon), kOrbNoErr);
  EXPECT_EQ(handle.SetCreateTime(COrbTime(36'711'792'017'500'000ULL)), kOrbNoErr);
  EXPECT_EQ(Seconds(handle.GetUpdateTime()), before);
  EXPECT_EQ(handle.Update(), kOrbNoErr);
  COrbTime time;
  ASSERT_EQ(handle.GetUpdateTime(&time), kOrbNoErr);
  EXPECT_EQ(std::tuple(time.ticks, time.fraction), std::tuple(36'711'792'000'000'000U, 0));
  ASSERT_EQ(handle.GetCreateTime(&time), kOrbNoErr);
  EXPECT_EQ(time.ticks, 36'711'792'010'000'000U);
}

TEST(Times, OfTheLastAccessAreReadNow) {
  const Tree tree("a.jpg");
  const COrbFileHandle handle = HandleOf(tree / "a.jpg");
  for (const long nanoseconds : {123'456'789L, 5L}) {
    const struct timespec times[] = {{1'588'334'400, nanoseconds}, {0, UTIME_OMIT}};
    ASSERT_EQ(::utimensat(AT_FDCWD, (tree / "a.jpg").c_str(), times, 0), 0);
    COrbTime time;
    EXPECT_EQ(handle.GetAccessTime(&time), kOrbNoErr);
    EXPECT_EQ(time.ticks, 36'711'792'000'000'000U + static_cast<unsigned long>(nanoseconds) / 100);
  }
  EXPECT_EQ(COrbFileHandle().SetAccessTime(COrbTime(0ULL)), kOrbErrNotSupported);
}

}  // namespace
}  // namespace orb::test
