// SPDX-License-Identifier: MIT
#include "fileops/failure_diagnosis.h"

#include "support/files.h"

namespace orb::test {
namespace {

constexpr ErrorObject kNoError;

OrbResult Diagnose(const std::string& path, eOrbFailedOperation operation) {
  return OrbDiagnoseFailure(kNoError, S(path), nullptr, operation);
}

OrbResult DiagnoseRename(const std::string& from, const std::string& to) {
  const COrbStringData newPath = S(to);
  return OrbDiagnoseFailure(kNoError, S(from), &newPath, kOrbOpRename);
}

TEST(DiagnoseFailure, BelievesAnErrorThatTells) {
  const TempFolder folder;
  const auto diagnose = [&](const ErrorObject& error) {
    return OrbDiagnoseFailure(error, S(folder.Path()), nullptr, kOrbOpCreateFolder);
  };
  EXPECT_EQ(diagnose(platform::kVolumeFull), kOrbErrDiskFull);
  EXPECT_EQ(diagnose(platform::Error{platform::ErrorDomain::kPosix, 3}), kOrbErrFileExists);
  EXPECT_EQ(diagnose(platform::kBusy), kOrbErrFileExists);
  EXPECT_EQ(OrbDiagnoseFailure(kNoError, {}, nullptr, kOrbOpRead), kOrbErrNotFound);
  EXPECT_EQ(Diagnose("/\xFF", kOrbOpCreateFile), kOrbErrNotFound);
}

TEST(DiagnoseFailure, TestsExistenceThenNameThenPermission) {
  const Tree tree("file, other");
  std::string umlauts;
  for (int i = 0; i < 120; ++i) umlauts += "\xC3\xA4\xC3\xA4";  // 240 characters, 480 bytes.
  std::string far = tree.Path();
  for (int i = 0; i < 6; ++i) far += "/" + std::string(200, 'f');
  const std::tuple<std::string, eOrbFailedOperation, OrbResult> kCases[] = {
      {"no", kOrbOpRead, kOrbErrNoSuchFile},
      {"no", kOrbOpDelete, kOrbErrNoSuchFile},
      {"file", kOrbOpWrite, kOrbErrUnknown},
      {"file", kOrbOpDelete, kOrbErrUnknown},
      {"file", kOrbOpCreateFile, kOrbErrFileExists},
      {tree.Path(), kOrbOpCreateFolder, kOrbErrFileExists},
      {"no", kOrbOpCreateFile, kOrbErrUnknown},
      {"no/no", kOrbOpCreateFile, kOrbErrAccessDenied},
      {std::string(256, 'n'), kOrbOpCreateFile, kOrbErrInvalidName},
      {umlauts, kOrbOpCreateFile, kOrbErrUnknown},
      {far, kOrbOpCreateFile, kOrbErrNameTooLong},
      {far, kOrbOpDelete, kOrbErrNoSuchFile},
  };
  for (const auto& [path, operation, expected] : kCases)
    EXPECT_EQ(Diagnose(tree.At(path), operation), expected) << path << " " << operation;
  EXPECT_EQ(Diagnose("bare", kOrbOpCreateFile), kOrbErrAccessDenied);
  const Row<OrbResult> kRenames[] = {
      {"no", "other", kOrbErrNoSuchFile},
      {"file", "other", kOrbErrFileExists},
      {"file", "new", kOrbErrUnknown},
      {"file", "no/new", kOrbErrAccessDenied},
  };
  ExpectRefusals(tree, kRenames, DiagnoseRename);
}

TEST(DiagnoseFailure, NamesALock) {
  const Tree tree("file!, open, in/!, above/file, above/!");
  EXPECT_EQ(Diagnose(tree / "file", kOrbOpDelete), kOrbErrAccessDenied);
  EXPECT_EQ(Diagnose(tree / "file", kOrbOpWrite), kOrbErrUnknown);
  EXPECT_EQ(Diagnose(tree / "in/new", kOrbOpCreateFolder), kOrbErrAccessDenied);
  EXPECT_EQ(Diagnose(tree / "above/file", kOrbOpDelete), kOrbErrAccessDenied);
  const Row<OrbResult> kRenames[] = {
      {"file", "new", kOrbErrAccessDenied},
      {"open", "in/new", kOrbErrAccessDenied},
      {"above/file", "above/new", kOrbErrAccessDenied},
  };
  ExpectRefusals(tree, kRenames, DiagnoseRename);
}

TEST(DiagnoseFailure, NamesAReadOnlyVolume) {
  const Tree tree("file");
  ORB_IN_CHILD(RunWithPrivateMounts([&] {
    ASSERT_TRUE(MakeReadOnlyVolume(tree.Path()));
    EXPECT_EQ(Diagnose(tree / "file", kOrbOpDelete), kOrbErrAccessDenied);
    EXPECT_EQ(Diagnose(tree / "new", kOrbOpCreateFile), kOrbErrAccessDenied);
    // Readable is enough there.
    EXPECT_EQ(DiagnoseRename(tree / "file", tree / "new"), kOrbErrUnknown);
  }));
}

}  // namespace
}  // namespace orb::test
