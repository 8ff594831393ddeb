// SPDX-License-Identifier: MIT
#include "platform/mover.h"

#include <fcntl.h>
#include <sys/random.h>

#include <cstdint>

#include "platform/linux/item_metadata.h"
#include "platform/linux/move_across.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/rename.h"
#include "platform/linux/spelling.h"
#include "platform/linux/tree_survey.h"

namespace orb::platform {
namespace {

/// Names up to here leave room for a suffix on every volume.
constexpr std::size_t kRoomyName = 200;

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

/// What a copy to another volume, and the removal after it, ask of an item.
Status ExpectCrossing(const Place& from, mode_t mode) {
  const int folder = from.folder.Get();
  if (S_ISLNK(mode)) return {};
  if (!S_ISDIR(mode) && !S_ISREG(mode)) return kNotPermitted;
  if (::faccessat(folder, from.name.c_str(), R_OK, AT_EACCESS) != 0) return LastError();
  if (S_ISREG(mode)) return {};
  const auto survey = SurveyTree(folder, from.name, SurveyFor::kRemoval);
  if (!survey) return survey.Reason();
  return survey.Value().canBeRemoved ? Status() : kNotPermitted;
}

}  // namespace

Status ExpectMovable(const std::string& source) {
  const ErrnoKeeper errnoKeeper;
  const auto place = LocateRemovable(source);
  if (!place) return place.Reason();
  const int folder = place.Value().folder.Get();
  const char* name = place.Value().name.c_str();
  const UniqueFd item(
      Retry([&] { return ::openat(folder, name, O_PATH | O_NOFOLLOW | O_CLOEXEC); }));
  if (!item) return LastError();
  if (Status open = RefuseLocked(item.Get()); !open) return open;
  return ::faccessat(folder, ".", W_OK | X_OK, AT_EACCESS) == 0 ? Status() : Status(LastError());
}

Status ExpectMovableTo(const std::string& source, const std::string& destination) {
  const ErrnoKeeper errnoKeeper;
  const auto from = Locate(source);
  if (!from) return from.Reason();
  const auto status = ReadStatus(from.Value());
  if (!status) return status.Reason();
  const auto to = Locate(destination);
  if (!to) return to.Reason();
  const auto folder = IdentityOf(to.Value().folder.Get());
  if (!folder) return folder.Reason();
  const bool stays = folder.Value().device == status.Value().st_dev;
  return stays ? Status() : ExpectCrossing(from.Value(), status.Value().st_mode);
}

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
  const auto itself = IsOneItemInTwoSpellings(from.Value(), to.Value());
  return itself && itself.Value() ? ChangeCase(folder, name, newName) : moved;
}

}  // namespace orb::platform
