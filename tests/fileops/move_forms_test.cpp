// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <orb/fileops/copy.h>
#include <orb/fileops/move.h>
#include <sys/stat.h>

#include <cstdint>
#include <filesystem>
#include <functional>
#include <map>
#include <optional>
#include <string>

#include "fileops/transfer_checks.h"
#include "platform/volumes.h"
#include "support/faults.h"
#include "support/paths.h"
#include "support/temp_folder.h"
#include "support/trees.h"

/// \file
/// The forms of copy and move that take a folder and a name, side by side.

namespace {

namespace fs = std::filesystem;
using orb::test::Describe;
using orb::test::ReadAll;
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

struct Arguments {
  COrbFilePath source;
  COrbFilePath folder;
  COrbStringData name;
  bool ownName = false;
  Progress progress;
  COrbFilePath result;

  const COrbStringData* Name() const { return ownName ? nullptr : &name; }
};

using Form = std::function<OrbResult(Arguments&)>;

const std::map<std::string, Form> kForms = {
    {"CopyFile", [](Arguments& a) { return OrbCopyFile(a.source, a.folder, a.name, &a.result); }},
    {"CopyFileOverwrite",
     [](Arguments& a) { return OrbCopyFileOverwrite(a.source, a.folder, a.Name(), &a.result); }},
    {"CopyFileOverwriteEx",
     [](Arguments& a) {
       return OrbCopyFileOverwriteEx(a.source, a.folder, a.Name(), Progress::Call, &a.progress);
     }},
    {"CopyFolder",
     [](Arguments& a) { return OrbCopyFolder(a.source, a.folder, a.name, &a.result); }},
    {"CopyFolderEx",
     [](Arguments& a) {
       return OrbCopyFolderEx(a.source, a.folder, a.name, Progress::Call, &a.progress);
     }},
    {"CopyFolderOverwriteEx",
     [](Arguments& a) {
       return OrbCopyFolderOverwriteEx(a.source, a.folder, a.Name(), Progress::Call, &a.progress);
     }},
    {"MoveFile", [](Arguments& a) { return OrbMoveFile(a.source, a.folder, a.name, &a.result); }},
    {"MoveFileEx",
     [](Arguments& a) {
       return OrbMoveFileEx(a.source, a.folder, a.name, Progress::Call, &a.progress);
     }},
    {"MoveFileOverwrite",
     [](Arguments& a) { return OrbMoveFileOverwrite(a.source, a.folder, a.Name(), &a.result); }},
    {"MoveFileOverwriteEx",
     [](Arguments& a) {
       return OrbMoveFileOverwriteEx(a.source, a.folder, a.Name(), Progress::Call, &a.progress);
     }},
};

enum class Has : bool { kNo, kYes };
using enum Has;

/// What the forms differ in. A code of 0 says that the form does not ask.
struct Row {
  const char* form;
  Has moves;
  Has ownName;         // A null name is the source's own.
  Has result;          // The destination is handed back.
  int callsOnSuccess;  // 0: there is no callback.
  int callsOnFailure;
  OrbResult missing;    // The source is not there.
  OrbResult unusable;   // The source can neither be read nor written.
  OrbResult same;       // The folder is the source.
  OrbResult inside;     // The folder is in the source.
  OrbResult existing;   // Something is at the destination.
  OrbResult itself;     // The destination is the source.
  OrbResult explained;  // The platform tells why it fails, on a nearly full volume.
};

constexpr OrbResult kSame = kOrbErrSamePath;
constexpr OrbResult kInside = kOrbErrInsideSource;
constexpr OrbResult kFull = kOrbErrDiskFull;
constexpr OrbResult kDenied = kOrbErrAccessDenied;
constexpr OrbResult kMissing = kOrbErrNotFound;
constexpr OrbResult kUnknown = kOrbErrUnknown;

// clang-format off
const Row kRows[] = {
//   form                     moves own   result calls  missing            unusable  same    inside    existing  itself    explained
    {"CopyFile",              kNo,  kNo,  kYes, 0, 0, kOrbErrNoSuchFile, kDenied, kUnknown, kUnknown, kUnknown, kUnknown, kUnknown},
    {"CopyFileOverwrite",     kNo,  kYes, kYes, 0, 0, kMissing,          kDenied, kUnknown, kUnknown, 0,        kInside,  kUnknown},
    {"CopyFileOverwriteEx",   kNo,  kYes, kNo,  2, 2, kMissing,          kDenied, kUnknown, kUnknown, 0,        kInside,  kFull},
    {"CopyFolder",            kNo,  kNo,  kYes, 0, 0, kMissing,          kDenied, kSame,    kInside,  kUnknown, kUnknown, kUnknown},
    {"CopyFolderEx",          kNo,  kNo,  kNo,  2, 2, kMissing,          kDenied, kSame,    kInside,  0,        kInside,  kUnknown},
    {"CopyFolderOverwriteEx", kNo,  kYes, kNo,  2, 2, kMissing,          kDenied, kSame,    kInside,  0,        kInside,  kFull},
    {"MoveFile",              kYes, kNo,  kYes, 0, 0, kMissing,          0,       kSame,    kInside,  kUnknown, kUnknown, kUnknown},
    {"MoveFileEx",            kYes, kNo,  kNo,  2, 1, kMissing,          0,       kSame,    kInside,  0,        kInside,  kFull},
    {"MoveFileOverwrite",     kYes, kYes, kYes, 0, 0, kMissing,          0,       kSame,    kInside,  0,        kInside,  kFull},
    {"MoveFileOverwriteEx",   kYes, kYes, kNo,  2, 1, kMissing,          0,       kSame,    kInside,  0,        kInside,  kFull},
};
// clang-format on

class AlmostFull final : public orb::platform::Volumes {
 public:
  std::optional<std::uint64_t> AvailableCapacity(const std::string&) const override {
    return 104857599;
  }
};

Arguments Ask(const std::string& source, const std::string& folder, const std::string& name) {
  Arguments arguments;
  arguments.source = PathOf(source);
  arguments.folder = PathOf(folder);
  arguments.name = S(name);
  return arguments;
}

/// A tree and a file beside an empty folder, and a row's form to try on them.
class FolderForms : public ::testing::TestWithParam<Row> {
 protected:
  FolderForms() {
    fs::create_directories(folder_ / "tree/sub");
    fs::create_directory(folder_ / "to");
    folder_.Write("tree/100%.jpg", "photo");
    folder_.Write("tree/sub/old", "old");
    folder_.Write("file", "new");
  }

  OrbResult Run(Arguments& arguments) const { return kForms.at(row_.form)(arguments); }
  OrbResult Run(const std::string& source, const std::string& folder, const std::string& name) {
    Arguments arguments = Ask(source, folder, name);
    return Run(arguments);
  }
  OrbResult RunHere(const char* source, const char* folder, const char* name) {
    return Run(folder_ / source, folder_ / folder, name);
  }

  TempFolder folder_;
  const Row row_ = GetParam();
};

INSTANTIATE_TEST_SUITE_P(Forms, FolderForms, ::testing::ValuesIn(kRows), [](const auto& row) {
  return std::string(row.param.form);
});

TEST_P(FolderForms, BringTheItem) {
  const auto tree = Describe(folder_ / "tree");
  for (const char* name : {"tree", "file"}) {
    SCOPED_TRACE(name);
    Arguments arguments = Ask(folder_ / name, folder_ / "to/", "n\xc3\xa4me");
    ASSERT_EQ(Run(arguments), kOrbNoErr);
    EXPECT_EQ(arguments.progress.calls, row_.callsOnSuccess);
    const std::string expected = row_.result == kYes ? folder_ / "to/n\xc3\xa4me" : "";
    EXPECT_EQ(Text(arguments.result.GetFullPath()), expected);
    EXPECT_EQ(fs::exists(folder_ / name), row_.moves == kNo);
    if (*name == 't') {
      EXPECT_TRUE(Describe(folder_ / "to/n\xc3\xa4me") == tree);
    }
    fs::remove_all(folder_ / "to/n\xc3\xa4me");
  }
  if (row_.ownName == kNo) return;
  folder_.Write("a%20b", "x");
  Arguments arguments = Ask(folder_ / "a%20b", folder_ / "to", "");
  arguments.ownName = true;
  EXPECT_EQ(Run(arguments), kOrbNoErr);
  EXPECT_EQ(ReadAll(folder_ / "to/a%20b"), "x");
  arguments.source = PathOf(folder_ / "to/");
  arguments.folder = PathOf(folder_.Path());
  EXPECT_EQ(Run(arguments), kOrbErrInvalidName);
}

TEST_P(FolderForms, ReplaceWhatIsThereOrLeaveIt) {
  EXPECT_EQ(RunHere("file", "tree/sub", "old"), row_.existing);
  EXPECT_EQ(ReadAll(folder_ / "tree/sub/old"), row_.existing == 0 ? "new" : "old");
  EXPECT_EQ(fs::exists(folder_ / "file"), row_.moves == kNo || row_.existing != 0);
}

TEST_P(FolderForms, ChangeNothingWhenTheyRefuse) {
  fs::create_directory_symlink("tree", folder_ / "link");
  folder_.Write("to/old", "old");
  ASSERT_TRUE(Lock(folder_.Write("locked", "x")));
  ASSERT_EQ(::mkfifo((folder_ / "pipe").c_str(), 0600), 0);
  const auto before = Describe(folder_.Path());
  EXPECT_EQ(RunHere("missing", "to", "old"), row_.missing);
  EXPECT_EQ(Run("", folder_ / "to", "old"), row_.missing);
  if (row_.existing == 0) {
    EXPECT_EQ(RunHere(row_.moves == kYes ? "locked" : "pipe", "to", "old"), kDenied);
  }
  EXPECT_EQ(RunHere("tree", "tree", "new"), row_.same);
  EXPECT_EQ(RunHere("tree", "tree/sub", "new"), row_.inside);
  EXPECT_EQ(RunHere("tree/sub/old", "tree/sub", "old"), row_.itself);
  EXPECT_EQ(RunHere("tree/sub/old", "link/sub", "old"), row_.itself);
  EXPECT_EQ(RunHere("tree/sub/old", "link", "sub"), row_.itself);
  // What is in the source, on disk, is not removed for a move or copy that cannot succeed.
  const OrbResult doomed = row_.existing == 0 ? kInside : kUnknown;
  EXPECT_EQ(RunHere("tree", "link/sub", "old"), doomed);
  for (const std::string name : {"", ".", "..", "/", "//", "../", "to/.."}) {
    const bool isLetter = row_.form == std::string("MoveFile") && name.find('/') != name.npos;
    if (!isLetter) {
      EXPECT_EQ(RunHere("file", "to", name.c_str()), kOrbErrInvalidName) << name;
    }
  }
  EXPECT_EQ(Run(folder_ / "file", "", "old"), kOrbErrEmptyPath);
  EXPECT_EQ(RunHere("file", "missing", "new"), kMissing);
  EXPECT_TRUE(Describe(folder_.Path()) == before);
}

TEST_P(FolderForms, CallAndCanBeCanceledBefore) {
  Arguments arguments = Ask(folder_ / "file", folder_ / "to", "new");
  arguments.progress.falseAt = 1;
  const AlmostFull volumes;
  const orb::platform::ScopedVolumes scoped(volumes);
  const bool calls = row_.callsOnSuccess > 0;
  EXPECT_EQ(Run(arguments), calls ? kOrbErrCanceled : kOrbNoErr);
  EXPECT_EQ(arguments.progress.calls, calls ? 1 : 0);
  EXPECT_EQ(fs::exists(folder_ / "to/new"), !calls);
  arguments = Ask(folder_ / "tree", folder_ / "to", "tree");
  arguments.progress.falseAt = 2;
  EXPECT_EQ(Run(arguments), kOrbNoErr);
  EXPECT_EQ(arguments.progress.calls, row_.callsOnSuccess);
}

// An item that leads into itself fails for a reason that no table knows.
TEST_P(FolderForms, TellWhyTheyFail) {
  fs::create_directory_symlink("tree", folder_ / "link");
  const AlmostFull volumes;
  const orb::platform::ScopedVolumes scoped(volumes);
  Arguments arguments = Ask(folder_ / "tree", folder_ / "link", "new");
  EXPECT_EQ(Run(arguments), row_.explained);
  EXPECT_EQ(arguments.progress.calls, row_.callsOnFailure);
  EXPECT_TRUE(arguments.result.IsEmpty());
}

TEST_P(FolderForms, MayAskWhetherTheSourceCanBeUsed) {
  const std::string secret = folder_.Write("secret", "x");
  ASSERT_EQ(::chmod(secret.c_str(), 0), 0);
  for (const char* name : {"", "to"}) ASSERT_EQ(::chmod((folder_ / name).c_str(), 0777), 0);
  ORB_IN_CHILD(orb::test::RunAsUser(65534, [&] {
    EXPECT_EQ(RunHere("secret", "to", "new"), row_.unusable);
    EXPECT_EQ(fs::exists(folder_ / "to/new"), row_.unusable == 0);
  }));
}

// Only forms that are told nothing blame the volume there; the others keep what they were told.
TEST(LowSpace, ExplainsWhatTheFormAllows) {
  using orb::LowSpace;
  const TempFolder folder;
  const AlmostFull volumes;
  const orb::platform::ScopedVolumes scoped(volumes);
  const struct {
    LowSpace lowSpace;
    bool explained;
    OrbResult expected;
  } kCases[] = {
      {LowSpace::kNothing, false, kDenied},
      {LowSpace::kNothing, true, kDenied},
      {LowSpace::kUntold, false, kFull},
      {LowSpace::kUntold, true, kDenied},
      {LowSpace::kAnything, false, kFull},
      {LowSpace::kAnything, true, kFull},
  };
  for (const auto& c : kCases)
    EXPECT_EQ(orb::ConsiderSpace({kDenied, c.explained}, c.lowSpace, PathOf(folder.Path())),
              c.expected);
}

TEST(MoveFile, TakesASeparatorInTheNameForALetter) {
  const TempFolder folder;
  COrbFilePath result;
  // Before a combining mark as well.
  const std::string name = "../a/\xcc\x88";
  EXPECT_EQ(OrbMoveFile(PathOf(folder.Write("f", "x")), PathOf(folder.Path()), S(name), &result),
            0u);
  EXPECT_EQ(Text(result.GetFullPath()), folder / "..:a:\xcc\x88");
  EXPECT_EQ(ReadAll(folder / "..:a:\xcc\x88"), "x");
}

TEST(MoveFile, TakesTwoFullPaths) {
  const TempFolder folder;
  folder.Write("a", "a");
  folder.Write("taken", "old");
  fs::create_directory(folder / "tree");
  const struct {
    const char* from;
    const char* to;
    OrbResult asPaths;
    OrbResult asTexts;
  } kRefused[] = {
      {"a", "taken", kDenied, kDenied},
      {"a", "a", kDenied, kSame},
      {"a", "A", 0, kSame},
      {"A", "a", 0, kSame},
      {"tree", "tree/new", kDenied, kInside},
      {"missing", "new", kDenied, kMissing},
      {"a", "missing/new", kDenied, kMissing},
      {"a", "\xff", kDenied, kSame},  // What is no text compares as equal.
      {"tree", "new", 0, 0},
  };
  for (const auto& c : kRefused) {
    SCOPED_TRACE(std::string(c.from) + " to " + c.to);
    EXPECT_EQ(OrbMoveFile(PathOf(folder / c.from), PathOf(folder / c.to)), c.asPaths);
    if (std::string(c.to) == "new" && c.asPaths == 0) fs::rename(folder / "new", folder / "tree");
    EXPECT_EQ(OrbMoveFile(S(folder / c.from), S(folder / c.to)), c.asTexts);
  }
  EXPECT_EQ(ReadAll(folder / "taken"), "old");
  EXPECT_EQ(ReadAll(folder / "a"), "a");
  EXPECT_TRUE(fs::exists(folder / "new"));
}

TEST(FormsWithoutAName, AreNotSupported) {
  const TempFolder folder;
  Progress progress;
  const COrbFilePath from = PathOf(folder.Write("a", "a"));
  const COrbFilePath to = PathOf(folder / "b");
  EXPECT_EQ(OrbMoveFileEx(from, to, Progress::Call, &progress), kOrbErrNotSupported);
  EXPECT_EQ(OrbCopyFolderEx(from, to, Progress::Call, &progress), kOrbErrNotSupported);
  EXPECT_EQ(progress.calls, 0);
  EXPECT_FALSE(fs::exists(folder / "b"));
}

}  // namespace
