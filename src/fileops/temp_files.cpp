// SPDX-License-Identifier: MIT
#include <orb/fileops/temp_files.h>

#include <atomic>
#include <cstdint>
#include <mutex>
#include <string>

#include "fileinfo/item_path.h"
#include "fileops/creation_result.h"
#include "fileops/path_in.h"
#include "fileops/project_folder.h"
#include "platform/error.h"
#include "platform/held_folder.h"
#include "strings/string_access.h"

namespace orb {
namespace {

using platform::HeldFolder;
using platform::Result;
using platform::Status;

constexpr std::uint64_t kNumbers = 10'000;

/// Of the process; guarded by its own lock.
class ProjectName {
 public:
  void Set(std::string name) {
    const std::lock_guard hold(lock_);
    name_.swap(name);
  }
  std::string Get() const {
    const std::lock_guard hold(lock_);
    return name_;
  }

 private:
  mutable std::mutex lock_;
  std::string name_;
};

ProjectName projectName;

/// Counts the names that were tried. It is never reset, and does not live to overflow.
constinit std::atomic<std::uint64_t> tried = 0;

std::string NextName(const std::string& suffix) {
  const std::uint64_t number = tried.fetch_add(1, std::memory_order_relaxed) % kNumbers;
  return "OrbTmp" + std::to_string(kNumbers + number).substr(1) + suffix;
}

/// Tries names in the folder at `path` and lets the creation itself decide which is free.
OrbResult CreateNumbered(const Result<HeldFolder>& folder,
                         const std::string& path,
                         const std::string& suffix,
                         COrbFilePath* result) {
  for (std::uint64_t i = 0; i < kNumbers; ++i) {
    const std::string name = NextName(suffix);
    const Status created = folder ? folder.Value().CreateEmptyFile(name) : Status(folder.Reason());
    if (created) return Deliver(JoinPath(path, name), result);
    if (created.Reason() != platform::kItemExists)
      return DiagnoseCreation(created, JoinPath(path, name));
  }
  return kOrbErrDiskFull;
}

OrbResult CreateInProjectFolder(const std::string& suffix, COrbFilePath* result) {
  ProjectFolder project;
  if (Failed(LocateProjectFolder(projectName.Get(), &project))) return kOrbErrAccessDenied;
  const auto folder = HeldFolder::OpenOrMakeOwn(project.base, project.levels);
  if (!folder) return kOrbErrAccessDenied;
  return CreateNumbered(folder, project.Path(), suffix, result);
}

OrbResult CreateIn(const COrbFilePath& folder, const std::string& suffix, COrbFilePath* result) {
  const auto path = ItemPath(folder.GetFullPath());
  if (!path) return kOrbErrInvalidName;
  if (path->empty()) return kOrbErrEmptyPath;
  return CreateNumbered(HeldFolder::Open(*path), *path, suffix, result);
}

}  // namespace
}  // namespace orb

OrbResult OrbSetProjectName(const COrbStringData& name) {
  orb::projectName.Set(std::string(orb::StringAccess::Read(name).bytes));
  return kOrbNoErr;
}

OrbResult OrbGetProjectTempFolder(COrbFilePath* result) {
  orb::ProjectFolder project;
  const OrbResult located = orb::LocateProjectFolder(orb::projectName.Get(), &project);
  if (orb::Failed(located)) return located;
  // What is wrong with the folder shows when a file is created in it.
  (void)orb::HeldFolder::OpenOrMakeOwn(project.base, project.levels);
  const COrbStringData path = orb::StringAccess::FromUtf8(project.Path());
  return result->Initialize(&path);
}

void OrbClearProjectTempFolder() {
  orb::ProjectFolder project;
  if (orb::Failed(orb::LocateProjectFolder(orb::projectName.Get(), &project))) return;
  (void)orb::platform::RemoveOwnFolder(project.base, project.levels);
}

OrbResult OrbCreateTempFile(const COrbFilePath* folder, COrbFilePath* result) {
  return OrbCreateTempFile(folder, result, COrbStringData());
}

// NOLINTBEGIN(performance-unnecessary-value-param): the interface takes the suffix by value.
OrbResult OrbCreateTempFile(const COrbFilePath* folder,
                            COrbFilePath* result,
                            COrbStringData suffix) {
  const auto text = orb::ItemPath(suffix);
  if (!text) return kOrbErrInvalidName;
  return folder == nullptr ? orb::CreateInProjectFolder(*text, result)
                           : orb::CreateIn(*folder, *text, result);
}
// NOLINTEND(performance-unnecessary-value-param)
