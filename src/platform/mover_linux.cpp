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

/// Whether the caller may take an item out of its folder.
Status ExpectTakenOut(int folder, int item) {
  if (::faccessat(folder, ".", W_OK | X_OK, AT_EACCESS) != 0) return LastError();
  const auto above = ReadStatus(ItemRef(folder));
  if (!above) return above.Reason();
  const auto status = ReadStatus(ItemRef(item));
  if (!status) return status.Reason();
  return StickyBitForbids(above.Value(), status.Value()) ? kNotPermitted : Status();
}

/// To a rename two mounts of one volume are two volumes.
Result<bool> AreOnOneMount(int folder, int other) {
  const auto a = ReadStatus(ItemRef(folder));
  if (!a) return a.Reason();
  const auto b = ReadStatus(ItemRef(other));
  if (!b) return b.Reason();
  return MountOf(a.Value()) == MountOf(b.Value());
}

/// What a rename asks of an item itself: the ".." of a folder changes when it comes to lie in
/// another one.
Status ExpectRenamed(const Place& from, mode_t mode, const Identity& folder) {
  const auto above = IdentityOf(from.folder.Get());
  if (!above) return above.Reason();
  if (!S_ISDIR(mode) || above.Value() == folder) return {};
  const int denied = ::faccessat(from.folder.Get(), from.name.c_str(), W_OK, AT_EACCESS);
  return denied == 0 ? Status() : Status(LastError());
}

/// What a copy to another volume, and the removal after it, ask of an item.
Status ExpectCrossing(const Place& from, mode_t mode) {
  if (S_ISLNK(mode)) return {};
  const auto survey = SurveyTree(from.folder.Get(), from.name, SurveyFor::kRemoval);
  if (!survey) return survey.Reason();
  return survey.Value().canBeCopied && survey.Value().canBeRemoved ? Status() : kNotPermitted;
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
  return ExpectTakenOut(folder, item.Get());
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
  const auto oneMount = AreOnOneMount(from.Value().folder.Get(), to.Value().folder.Get());
  if (!oneMount) return oneMount.Reason();
  const mode_t mode = status.Value().st_mode;
  const bool stays = oneMount.Value() && folder.Value().device == status.Value().st_dev;
  return stays ? ExpectRenamed(from.Value(), mode, folder.Value())
               : ExpectCrossing(from.Value(), mode);
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
