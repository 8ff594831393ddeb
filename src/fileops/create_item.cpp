// SPDX-License-Identifier: MIT
#include <orb/fileops/create.h>

#include <cstdint>
#include <string>
#include <vector>

#include "fileinfo/item_path.h"
#include "fileops/creation_result.h"
#include "fileops/failure_diagnosis.h"
#include "fileops/numbered_name.h"
#include "fileops/path_in.h"
#include "platform/folder_names.h"
#include "platform/held_folder.h"
#include "platform/items.h"
#include "platform/taken_runs.h"
#include "strings/string_access.h"

namespace orb {
namespace {

using platform::HeldFolder;
using platform::Items;
using platform::Result;
using platform::Status;
using platform::TakenRun;

/// So many names are tried before anything else is asked: mostly one is free.
constexpr std::uint32_t kProbes = 4;
/// Where this number is taken there are many: listing the folder is faster than trying them, and
/// what the list says worth remembering.
constexpr std::uint32_t kLongSeries = 100;

TakenNumbers ReadTakenNumbers(const std::string& folder, const NumberedName& names) {
  std::vector<std::uint32_t> numbers;
  // Without the list the names are tried one by one.
  (void)platform::ForEachName(folder, [&](std::string_view name) {
    if (const auto number = names.NumberOf(name)) numbers.push_back(*number);
  });
  return TakenNumbers(numbers);
}

/// Tries names and lets the creation itself decide which is free.
class UniqueFile {
 public:
  UniqueFile(const std::string& path, const COrbStringData& name)
      : folderPath_(path), names_(name), folder_(HeldFolder::Open(path)) {}

  OrbResult Create(COrbFilePath* result) {
    TakenRun run =
        CanRemember() ? platform::RecallRun(folder_.Value(), names_.With(0)) : TakenRun();
    const std::uint32_t probesEnd = run.end + kProbes;
    while (run.end < probesEnd && IsTaken(run.end)) ++run.end;
    if (run.end == probesEnd) CreateBeyond(&run);
    if (!created_) return DiagnoseCreation(created_, path_);
    platform::KeepRun({run.end + 1, run.ticket});
    return Deliver(path_, result);
  }

 private:
  bool CanRemember() const { return folder_ && names_.AreOfEntries(); }

  bool IsLong() const {
    return Items::Current().Exists(JoinPath(folderPath_, names_.With(kLongSeries)));
  }

  /// Gives the number that is free.
  void CreateBeyond(TakenRun* run) {
    const bool isLong = IsLong();
    if (isLong && run->ticket == 0 && CanRemember()) {
      // What was taken before the watch may have left before it.
      *run = {0, platform::WatchRun(folder_.Value(), names_.With(0), names_.Stem())};
    }
    const TakenNumbers taken = isLong ? ReadTakenNumbers(folderPath_, names_) : TakenNumbers({});
    run->end = taken.NextFree(run->end);
    while (IsTaken(run->end)) run->end = taken.NextFree(run->end + 1);
  }

  /// Where nothing may be made a name that is there counts as taken too: the diagnosis needs one
  /// that is free.
  bool IsTaken(std::uint32_t number) {
    const std::string name = names_.With(number);
    path_ = JoinPath(folderPath_, name);
    created_ = CreateAs(name);
    if (created_) return false;
    return created_.Reason() == platform::kItemExists || Items::Current().Exists(path_);
  }

  Status CreateAs(const std::string& name) const {
    if (!names_.AreOfEntries()) return Items::Current().CreateEmptyFile(path_);
    return folder_ ? folder_.Value().CreateEmptyFile(name) : Status(folder_.Reason());
  }

  const std::string& folderPath_;
  NumberedName names_;
  const Result<HeldFolder> folder_;
  std::string path_;
  Status created_;
};

}  // namespace
}  // namespace orb

OrbResult OrbCreateFolder(const COrbFilePath& folder,
                          const COrbStringData& name,
                          COrbFilePath* result) {
  using namespace orb;
  std::string path;
  if (OrbResult joined = PathIn(folder, name, &path); Failed(joined)) return joined;
  if (Items::Current().Exists(path)) return kOrbErrFileExists;
  const auto created = Items::Current().CreateFolders(path, platform::IfExists::kFail);
  if (!created) {
    const COrbStringData text = StringAccess::FromUtf8(path);
    return OrbDiagnoseFailure(created.Reason(), text, nullptr, kOrbOpCreateFolder);
  }
  return result == nullptr ? kOrbNoErr : Deliver(path, result);
}

OrbResult OrbCreateFile(const COrbFilePath& folder,
                        const COrbStringData& name,
                        COrbFilePath* result) {
  using namespace orb;
  std::string path;
  if (OrbResult joined = PathIn(folder, name, &path); Failed(joined)) return joined;
  const auto created = Items::Current().ReplaceByEmptyFile(path);
  return created ? Deliver(path, result) : DiagnoseCreation(created, path);
}

OrbResult OrbCreateUniqueFile(const COrbFilePath& folder,
                              const COrbStringData& name,
                              COrbFilePath* result) {
  using namespace orb;
  std::string first;
  if (OrbResult joined = PathIn(folder, name, &first); Failed(joined)) return joined;
  return UniqueFile(*ItemPath(folder.GetFullPath()), name).Create(result);
}
