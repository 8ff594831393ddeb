// SPDX-License-Identifier: MIT
#include "fileops/failure_diagnosis.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "platform/items.h"
#include "support/faults.h"
#include "support/temp_folder.h"
#include "support/texts.h"

namespace orb {
namespace {

namespace fs = std::filesystem;
using platform::Items;
using test::TempFolder;

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
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  const std::string other = folder.Write("other", "");
  std::string umlauts = folder / "";
  for (int i = 0; i < 120; ++i) umlauts += "\xC3\xA4\xC3\xA4";  // 240 characters, 480 bytes.
  std::string far = folder.Path();
  for (int i = 0; i < 6; ++i) far += "/" + std::string(200, 'f');
  const struct {
    std::string path;
    eOrbFailedOperation operation;
    OrbResult result;
  } kCases[] = {
      {folder / "no", kOrbOpRead, kOrbErrNoSuchFile},
      {folder / "no", kOrbOpWrite, kOrbErrNoSuchFile},
      {folder / "no", kOrbOpDelete, kOrbErrNoSuchFile},
      {file, kOrbOpRead, kOrbErrUnknown},
      {file, kOrbOpWrite, kOrbErrUnknown},
      {file, kOrbOpDelete, kOrbErrUnknown},
      {file, kOrbOpCreateFile, kOrbErrFileExists},
      {folder.Path(), kOrbOpCreateFolder, kOrbErrFileExists},
      {folder / "no", kOrbOpCreateFile, kOrbErrUnknown},
      {folder / "no/no", kOrbOpCreateFile, kOrbErrAccessDenied},
      {"bare", kOrbOpCreateFile, kOrbErrAccessDenied},
      {folder / std::string(255, 'n'), kOrbOpCreateFile, kOrbErrUnknown},
      {folder / std::string(256, 'n'), kOrbOpCreateFile, kOrbErrInvalidName},
      {folder / std::string(256, 'n') + "/", kOrbOpCreateFolder, kOrbErrInvalidName},
      {umlauts, kOrbOpCreateFile, kOrbErrUnknown},
      {far, kOrbOpCreateFile, kOrbErrNameTooLong},
      {far, kOrbOpDelete, kOrbErrNoSuchFile},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.path);
    EXPECT_EQ(Diagnose(c.path, c.operation), c.result);
  }
  EXPECT_EQ(DiagnoseRename(folder / "no", other), kOrbErrNoSuchFile);
  EXPECT_EQ(DiagnoseRename(file, other), kOrbErrFileExists);
  EXPECT_EQ(DiagnoseRename(file, folder / "new"), kOrbErrUnknown);
  EXPECT_EQ(DiagnoseRename(file, folder / "no/new"), kOrbErrAccessDenied);
}

TEST(DiagnoseFailure, NamesALock) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  fs::create_directory(folder / "target");
  const std::string target = folder / "target/new";
  const auto lock = [](const std::string& path, bool locked) {
    ASSERT_TRUE(Items::Current().SetLocked(path, locked).Ok());
  };
  lock(file, true);
  EXPECT_EQ(Diagnose(file, kOrbOpDelete), kOrbErrAccessDenied);
  EXPECT_EQ(DiagnoseRename(file, target), kOrbErrAccessDenied);
  EXPECT_EQ(Diagnose(file, kOrbOpWrite), kOrbErrUnknown);
  lock(file, false);
  lock(folder / "target", true);
  EXPECT_EQ(DiagnoseRename(file, target), kOrbErrAccessDenied);
  EXPECT_EQ(Diagnose(target, kOrbOpCreateFolder), kOrbErrAccessDenied);
  lock(folder.Path(), true);
  EXPECT_EQ(Diagnose(file, kOrbOpDelete), kOrbErrAccessDenied);
  EXPECT_EQ(DiagnoseRename(file, folder / "new"), kOrbErrAccessDenied);
}

TEST(DiagnoseFailure, NamesAReadOnlyVolume) {
  const TempFolder folder;
  const std::string file = folder.Write("file", "");
  ORB_IN_CHILD(test::RunWithPrivateMounts([&] {
    ASSERT_TRUE(test::MakeReadOnlyVolume(folder.Path()));
    EXPECT_EQ(Diagnose(file, kOrbOpDelete), kOrbErrAccessDenied);
    EXPECT_EQ(Diagnose(folder / "new", kOrbOpCreateFile), kOrbErrAccessDenied);
    EXPECT_EQ(DiagnoseRename(file, folder / "new"), kOrbErrUnknown);  // Readable is enough there.
  }));
}

}  // namespace
}  // namespace orb
