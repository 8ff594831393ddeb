// SPDX-License-Identifier: MIT
#include "platform/mover.h"

#include <fcntl.h>
#include <sys/random.h>

#include <cstdint>
#include <optional>
#include <string_view>

#include "platform/linux/folder_stream.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/move_across.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/rename.h"
#include "platform/transcode.h"
#include "platform/unicode.h"

namespace orb::platform {
namespace {

/// Names up to here leave room for a suffix on every volume.
constexpr std::size_t kRoomyName = 200;

bool DifferInCaseOnly(std::string_view a, std::string_view b) {
  const auto unitsA = Utf16FromUtf8(a);
  const auto unitsB = Utf16FromUtf8(b);
  if (a == b || !unitsA || !unitsB) return false;
  return FormOfRun(Form::kFolded, *unitsA) == FormOfRun(Form::kFolded, *unitsB);
}

Result<bool> Lists(int folder, std::string_view name) {
  constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  auto entries = FolderStream::Open(UniqueFd(Retry([&] { return ::openat(folder, ".", kFlags); })));
  if (!entries) return entries.Reason();
  for (;;) {
    const auto entry = entries.Value().Next();
    if (!entry) return entry.Reason();
    if (entry.Value().name == nullptr) return false;
    if (entry.Value().name == name) return true;
  }
}

/// Whether what was found at the new name is the item itself, found without regard to case. Some
/// drivers show it as two items then: only the list of names tells.
bool IsOtherSpelling(const Place& from, const Place& to) {
  if (!DifferInCaseOnly(from.name, to.name)) return false;
  const auto folder = IdentityOf(from.folder.Get());
  const auto newFolder = IdentityOf(to.folder.Get());
  if (!folder || !newFolder || folder.Value() != newFolder.Value()) return false;
  const auto listed = Lists(to.folder.Get(), to.name);
  return listed && !listed.Value();
}

/// Close to the wanted name: should the machine stop now, that is how the item is found again.
std::string NameInBetween(const std::string& name) {
  std::uint32_t random = 0;
  (void)::getrandom(&random, sizeof random, GRND_NONBLOCK);  // A name that is taken is refused.
  const std::string suffix = ".orb-" + std::to_string(random);
  return name.size() <= kRoomyName ? name + suffix : suffix;
}

/// The kernel takes a rename to the same item for done, and some drivers would remove the item as
/// the one to be replaced.
Status ChangeCase(int folder, const std::string& name, const std::string& newName) {
  const std::string between = NameInBetween(newName);
  Status moved = RenameWithoutReplacing(folder, name.c_str(), folder, between.c_str());
  if (!moved) return moved;
  moved = RenameWithoutReplacing(folder, between.c_str(), folder, newName.c_str());
  if (!moved) (void)RenameWithoutReplacing(folder, between.c_str(), folder, name.c_str());
  return moved;
}

Result<Place> LocateSource(const std::string& path) {
  auto place = LocateRemovable(path);
  if (!place) return place;
  const Status open = RefuseLockedEntry(place.Value().folder.Get(), place.Value().name.c_str());
  return open ? std::move(place) : open.Reason();
}

/// A path that ends in "/" can only become that of a folder.
Result<Place> LocateDestination(const std::string& path, const Place& source) {
  auto place = Locate(path);
  if (!place) return place;
  if (place.Value().NamesNoEntry()) return kItemExists;
  const auto status = ReadStatus(source);
  if (!status) return status.Reason();
  if (place.Value().folderMeant && !S_ISDIR(status.Value().st_mode))
    return ReadStatus(place.Value()) ? kItemExists : kInvalidName;
  const Status open = RefuseLocked(place.Value().folder.Get());
  return open ? std::move(place) : open.Reason();
}

}  // namespace

Status MoveItem(const std::string& source, const std::string& destination) {
  const ErrnoKeeper errnoKeeper;
  const auto from = LocateSource(source);
  if (!from) return from.Reason();
  const auto to = LocateDestination(destination, from.Value());
  if (!to) return to.Reason();
  const int folder = from.Value().folder.Get();
  const std::string& name = from.Value().name;
  const std::string& newName = to.Value().name;
  const Status moved =
      RenameWithoutReplacing(folder, name.c_str(), to.Value().folder.Get(), newName.c_str());
  if (moved) return moved;
  if (moved.Reason() == ErrorFromErrno(EXDEV)) return MoveAcross(from.Value(), to.Value());
  if (moved.Reason() != kItemExists) return moved;
  return IsOtherSpelling(from.Value(), to.Value()) ? ChangeCase(folder, name, newName) : moved;
}

}  // namespace orb::platform
