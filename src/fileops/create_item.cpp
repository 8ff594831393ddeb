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
#include "platform/items.h"
#include "strings/string_access.h"

namespace orb {
namespace {

using platform::Items;

/// So many names are tried one by one before the folder is listed: mostly one is free.
constexpr std::uint32_t kProbes = 4;

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
  UniqueFile(const std::string& folder, const COrbStringData& name)
      : folder_(folder), names_(name) {}

  OrbResult Create(COrbFilePath* result) {
    std::uint32_t number = 0;
    while (number < kProbes && IsTaken(number)) ++number;
    if (number == kProbes) CreateBeyondProbes();
    return created_ ? Deliver(path_, result) : DiagnoseCreation(created_, path_);
  }

 private:
  void CreateBeyondProbes() {
    const TakenNumbers taken = ReadTakenNumbers(folder_, names_);
    std::uint32_t number = taken.NextFree(kProbes);
    while (IsTaken(number)) number = taken.NextFree(number + 1);
  }

  /// Where nothing may be made a name that is there counts as taken too: the diagnosis needs one
  /// that is free.
  bool IsTaken(std::uint32_t number) {
    path_ = JoinPath(folder_, names_.With(number));
    created_ = Items::Current().CreateEmptyFile(path_);
    if (created_) return false;
    return created_.Reason() == platform::kItemExists || Items::Current().Exists(path_);
  }

  const std::string& folder_;
  NumberedName names_;
  std::string path_;
  platform::Status created_;
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
