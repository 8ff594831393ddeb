// SPDX-License-Identifier: MIT
#include <orb/fileops/copy.h>
#include <orb/fileops/move.h>

#include <functional>
#include <map>

#include "fileops/transfer_checks.h"
#include "support/files.h"

/// \file
/// The forms of copy and move that take a folder and a name, side by side.

namespace orb::test {
namespace {

struct Arguments {
  COrbFilePath source;
  COrbFilePath folder;
  COrbStringData name;
  bool ownName = false;
  Progress progress{};
  COrbFilePath result{};

  const COrbStringData* Name() const { return ownName ? nullptr : &name; }
};

using Form = std::function<OrbResult(Arguments&)>;
#define FORM(name, ...)                                                             \
  {                                                                                 \
#name, [](Arguments & a) { return Orb##name(a.source, a.folder, __VA_ARGS__); } \
  }

const std::map<std::string, Form> kForms = {
    FORM(CopyFile, a.name, &a.result),
    FORM(CopyFileOverwrite, a.Name(), &a.result),
    FORM(CopyFileOverwriteEx, a.Name(), Progress::Call, &a.progress),
    FORM(CopyFolder, a.name, &a.result),
    FORM(CopyFolderEx, a.name, Progress::Call, &a.progress),
    FORM(CopyFolderOverwriteEx, a.Name(), Progress::Call, &a.progress),
    FORM(MoveFile, a.name, &a.result),
    FORM(MoveFileEx, a.name, Progress::Call, &a.progress),
    FORM(MoveFileOverwrite, a.Name(), &a.result),
    FORM(MoveFileOverwriteEx, a.Name(), Progress::Call, &a.progress),
};

enum class Has : bool { kNo, kYes };
using enum Has;

/// What the forms differ in. A code of 0 says that the form does not ask.
struct FormRow {
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
const FormRow kRows[] = {
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

constexpr std::uint64_t kAlmostFull = 104857599;

/// A tree and a file beside an empty folder, and a row's form to try on them.
class FolderForms : public ::testing::TestWithParam<FormRow> {
 protected:
  Arguments Ask(const std::string& from, const std::string& to, const std::string& name) const {
    return {PathOf(folder_.At(from)), PathOf(folder_.At(to)), S(name)};
  }
  OrbResult Run(Arguments& arguments) const { return kForms.at(row_.form)(arguments); }
  OrbResult Run(Arguments&& arguments) const { return Run(arguments); }

  const Tree folder_{"tree/100%.jpg, tree/sub/old=old, file=new, to/"};
  const FormRow row_ = GetParam();
  const bool moves_ = row_.moves == kYes;
  const bool replaces_ = row_.existing == kOrbNoErr;
};

INSTANTIATE_TEST_SUITE_P(Forms, FolderForms, ::testing::ValuesIn(kRows), [](const auto& row) {
  return std::string(row.param.form);
});

TEST_P(FolderForms, BringTheItem) {
  const auto tree = Describe(folder_ / "tree");
  for (const char* name : {"file", "tree"}) {
    SCOPED_TRACE(name);
    fs::remove_all(folder_ / "to/n\xc3\xa4me");
    Arguments arguments = Ask(name, "to/", "n\xc3\xa4me");
    ASSERT_EQ(Run(arguments), kOrbNoErr);
    EXPECT_EQ(arguments.progress.calls, row_.callsOnSuccess);
    const std::string result = row_.result == kYes ? folder_ / "to/n\xc3\xa4me" : "";
    EXPECT_EQ(Text(arguments.result.GetFullPath()), result);
    EXPECT_EQ(folder_.Has(name), !moves_);
  }
  EXPECT_EQ(Describe(folder_ / "to/n\xc3\xa4me"), tree);
}

TEST_P(FolderForms, MayTakeTheSourcesOwnName) {
  if (row_.ownName == kNo) return;
  folder_.Make("a%20b");
  Arguments arguments = Ask("a%20b", "to", "");
  arguments.ownName = true;
  EXPECT_EQ(Run(arguments), kOrbNoErr);
  EXPECT_EQ(folder_.Read("to/a%20b"), "a%20b");
  arguments.source = PathOf(folder_ / "to/");
  arguments.folder = PathOf(folder_.Path());
  EXPECT_EQ(Run(arguments), kOrbErrInvalidName);
}

TEST_P(FolderForms, ReplaceWhatIsThereOrLeaveIt) {
  folder_.Make("to/old=old, to/link -> ../tree, to/hard => file, to/tree/sub/");
  for (const std::string name : {"hard", "old", "link", "tree"}) {
    SCOPED_TRACE(name);
    folder_.Make("file=new");
    EXPECT_EQ(Run(Ask("file", "to", name)), row_.existing);
    EXPECT_EQ(folder_.Has("file"), !moves_ || !replaces_);
    EXPECT_EQ(folder_.Read("to/" + name) == "new", replaces_ || name == "hard");
  }
  EXPECT_EQ(folder_.Read("tree/sub/old"), "old");
}

TEST_P(FolderForms, ChangeNothingWhenTheyRefuse) {
  folder_.Make("link -> tree, to/old=old, tree/sub/OLD, locked!, pipe|, pinned/file, pinned/!");
  folder_.Make("to/full/a, to/full/b!, to/full/c, mixed/a, mixed/sub/pipe|");
  const OrbResult denied = replaces_ ? kDenied : kUnknown;
  const struct {
    std::string source, folder, name;
    OrbResult expected;
  } kCases[] = {
      {"missing", "to", "old", row_.missing},
      {"", "to", "old", row_.missing},
      {"tree/\xff", "to", "old", row_.missing == kOrbErrNoSuchFile ? row_.missing : kDenied},
      {moves_ ? "locked" : "pipe", "to", "old", moves_ ? kDenied : denied},
      {moves_ ? "pinned/file" : "mixed", "to", "old", moves_ ? kDenied : denied},
      {"file", "to", "full", denied},
      {"file", "pinned", "file", kDenied},
      {"tree", "tree", "new", row_.same},
      {"tree", "tree/sub", "new", row_.inside},
      // The same item, as text and on disk, and a folder above or inside it.
      {"tree/sub/old", "tree/sub", "old", row_.itself},
      {"tree/sub/old", "tree/sub", "OLD", row_.itself},
      {"tree/sub/old", "link/sub", "old", row_.itself},
      {"tree/sub/old", "link/sub", "OLD", row_.itself},
      {"link/sub/old", "tree/sub", "old", row_.itself},
      {"tree/sub/old", "tree/sub/../sub", "old", row_.itself},
      {"tree/sub/old", "link", "sub", row_.itself},
      {"tree", "link/sub", "old", replaces_ ? kInside : kUnknown},
      {"file", "", "old", kOrbErrEmptyPath},
      {"file", "missing", "new", kMissing},
  };
  const Unchanged unchanged(folder_.Path());
  for (const auto& c : kCases)
    EXPECT_EQ(Run(Ask(c.source, c.folder, c.name)), c.expected)
        << c.source << " to " << c.folder << "/" << c.name;
  for (const std::string name : {"", ".", "..", "\xff", "/", "//", "../", "to/.."}) {
    const bool isLetter = row_.form == std::string("MoveFile") && name.find('/') != name.npos;
    if (isLetter) break;
    EXPECT_EQ(Run(Ask("file", "to", name)), kOrbErrInvalidName) << name;
  }
}

TEST_P(FolderForms, CallAndCanBeCanceledBefore) {
  Arguments arguments = Ask("file", "to", "new");
  arguments.progress.falseAt = 1;
  // What is there is gone by then: the caller asked for its removal first.
  if (replaces_) folder_.Make("to/new");
  const SpaceLeft space(kAlmostFull);
  const bool calls = row_.callsOnSuccess > 0;
  EXPECT_EQ(Run(arguments), calls ? kOrbErrCanceled : kOrbNoErr);
  EXPECT_EQ(arguments.progress.calls, calls ? 1 : 0);
  EXPECT_EQ(folder_.Has("to/new"), !calls);
  arguments = Ask("tree", "to", "tree");
  arguments.progress.falseAt = 2;
  EXPECT_EQ(Run(arguments), kOrbNoErr);
}

// An item that leads into itself fails for a reason that no table knows.
TEST_P(FolderForms, TellWhyTheyFail) {
  folder_.Make("link -> tree");
  for (const std::uint64_t space : {kAlmostFull, kAlmostFull + 1}) {
    const SpaceLeft left(space);
    Arguments arguments = Ask("tree", "link", "new");
    EXPECT_EQ(Run(arguments), space == kAlmostFull ? row_.explained : kUnknown);
    EXPECT_EQ(arguments.progress.calls, row_.callsOnFailure);
    EXPECT_TRUE(arguments.result.IsEmpty());
  }
}

TEST_P(FolderForms, MayAskWhetherTheSourceCanBeUsed) {
  folder_.Make("secret 0000, to/ 0777");
  ORB_IN_CHILD(RunAsUser(kStranger, [&] {
    EXPECT_EQ(Run(Ask("secret", "to", "new")), row_.unusable);
    EXPECT_EQ(folder_.Has("to/new"), row_.unusable == 0);
  }));
}

// Some forms blame the volume only when they are told nothing; others keep what they were told.
TEST(LowSpace, ExplainsWhatTheFormAllows) {
  const TempFolder folder;
  const SpaceLeft space(kAlmostFull);
  const std::pair<LowSpace, OrbResult> kCases[] = {
      {LowSpace::kNothing, kDenied}, {LowSpace::kUntold, kDenied}, {LowSpace::kAnything, kFull}};
  for (const auto& [lowSpace, expected] : kCases)
    EXPECT_EQ(ConsiderSpace({kDenied, true}, lowSpace, PathOf(folder.Path())), expected);
}

TEST(MoveFile, TakesASeparatorInTheNameForALetter) {
  const Tree tree("f");
  const std::string name = "../a/\xcc\x88";  // Before a combining mark as well.
  COrbFilePath result;
  EXPECT_EQ(OrbMoveFile(PathOf(tree / "f"), PathOf(tree.Path()), S(name), &result), kOrbNoErr);
  EXPECT_EQ(Text(result.GetFullPath()), tree / "..:a:\xcc\x88");
  EXPECT_EQ(tree.Read("..:a:\xcc\x88"), "f");
}

TEST(MoveFile, TakesTwoFullPaths) {
  const Tree tree("a, taken, tree/");
  const auto asPaths = [](auto&& a, auto&& b) { return OrbMoveFile(PathOf(a), PathOf(b)); };
  const auto asTexts = [](auto&& a, auto&& b) { return OrbMoveFile(S(a), S(b)); };
  const Row<OrbResult> kAsPaths[] = {
      {"a", "taken", kDenied},
      {"a", "a", kDenied},
      {"tree", "tree/new", kDenied},
      {"missing", "new", kDenied},
      {"a", "missing/new", kDenied},
      {"a", "\xff", kDenied},
  };
  const Row<OrbResult> kAsTexts[] = {
      {"a", "taken", kDenied},
      {"a", "a", kSame},
      {"a", "A", kSame},
      {"tree", "tree/new", kInside},
      {"missing", "new", kMissing},
      {"a", "missing/new", kMissing},
      {"a", "\xff", kSame},  // What is no text compares as equal.
  };
  ExpectRefusals(tree, kAsPaths, asPaths);
  ExpectRefusals(tree, kAsTexts, asTexts);
  EXPECT_EQ(asPaths(tree / "a", tree / "A"), kOrbNoErr);
  EXPECT_EQ(asTexts(tree / "tree", tree / "new"), kOrbNoErr);
  EXPECT_EQ(NamesIn(tree.Path()), (std::set<std::string>{"A", "new", "taken"}));
}

TEST(FormsWithoutAName, AreNotSupported) {
  const Tree tree("a");
  Progress progress;
  const COrbFilePath from = PathOf(tree / "a");
  const COrbFilePath to = PathOf(tree / "b");
  EXPECT_EQ(OrbMoveFileEx(from, to, Progress::Call, &progress), kOrbErrNotSupported);
  EXPECT_EQ(OrbCopyFolderEx(from, to, Progress::Call, &progress), kOrbErrNotSupported);
  EXPECT_EQ(progress.calls, 0);
  EXPECT_FALSE(tree.Has("b"));
}

TEST(MoveFileOverwrite, MakesNoWayForWhatTheOtherVolumeCannotTake) {
  const Tree tree("pipe|");
  const COrbStringData name = S("name");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MountTmpfs(tree / "to", "size=1m"));
    tree.Make("to/name=old");
    EXPECT_EQ(OrbMoveFileOverwrite(PathOf(tree / "pipe"), PathOf(tree / "to"), &name, nullptr),
              kDenied);
    EXPECT_EQ(tree.Read("to/name"), "old");
  }));
}

TEST(MoveFileOverwrite, MakesNoWayForAnImmutableItem) {
  const Tree tree("to/name=old, file");
  if (std::system(("chattr +i " + (tree / "file") + " 2>/dev/null").c_str()) != 0)
    GTEST_SKIP() << "no such flag here";
  const COrbStringData name = S("name");
  EXPECT_EQ(OrbMoveFileOverwrite(PathOf(tree / "file"), PathOf(tree / "to"), &name, nullptr),
            kDenied);
  EXPECT_EQ(tree.Read("to/name"), "old");
  EXPECT_EQ(std::system(("chattr -i " + (tree / "file")).c_str()), 0);
}

}  // namespace
}  // namespace orb::test
