// SPDX-License-Identifier: MIT
#include "platform/linux/place.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>

#include <optional>
#include <utility>

namespace orb::platform {
namespace {

std::string WithoutTrailingSlashes(const std::string& path) {
  return path.substr(0, path.find_last_not_of('/') + 1);
}

/// The text up to the last component, such that it names the folder: "/a" gives "/", "a" gives ".".
std::string FolderPart(const std::string& path, std::size_t lastSlash) {
  if (lastSlash == std::string::npos) return ".";
  return lastSlash == 0 ? "/" : path.substr(0, lastSlash);
}

UniqueFd NotNow() {
  errno = EWOULDBLOCK;
  return {};
}

/// Only regular files are leased. The kernel takes the lease back within seconds.
UniqueFd OpenLeased(int folder, const char* name, int flags) {
  const int itemFlags = O_PATH | O_CLOEXEC | (flags & O_NOFOLLOW);
  const UniqueFd item(Retry([&] { return ::openat(folder, name, itemFlags); }));
  struct stat status;
  if (!item || ::fstat(item.Get(), &status) != 0 || !S_ISREG(status.st_mode)) return NotNow();
  const std::string path = "/proc/self/fd/" + std::to_string(item.Get());
  return UniqueFd(Retry([&] { return ::open(path.c_str(), (flags & ~O_NOFOLLOW) | O_CLOEXEC); }));
}

}  // namespace

UniqueFd OpenFile(int folder, const char* name, int flags) {
  const int all = flags | O_NONBLOCK | O_NOCTTY | O_CLOEXEC;
  UniqueFd file(Retry([&] { return ::openat(folder, name, all); }));
  return file || errno != EWOULDBLOCK ? std::move(file) : OpenLeased(folder, name, flags);
}

bool IsMountPoint(int folder, const char* name) {
  open_how how{};
  how.flags = O_PATH | O_NOFOLLOW | O_CLOEXEC;
  how.resolve = RESOLVE_NO_XDEV;
  const auto open = [&] { return ::syscall(SYS_openat2, folder, name, &how, sizeof how); };
  const UniqueFd item(static_cast<int>(Retry(open)));
  return !item && errno == EXDEV;
}

Result<Place> Locate(const std::string& path) {
  if (path.empty()) return kNoSuchItem;
  const std::string item = WithoutTrailingSlashes(path);
  const std::size_t slash = item.find_last_of('/');
  Place place;
  place.folderMeant = item.size() < path.size();
  place.name = item.empty() ? "." : item.substr(slash + 1);
  const std::string folder = item.empty() ? "/" : FolderPart(item, slash);
  place.folder =
      UniqueFd(Retry([&] { return ::open(folder.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC); }));
  if (!place.folder) return LastError();
  return place;
}

Result<Place> EntryOf(int folder, std::string name) {
  Place place;
  place.folder = UniqueFd(::fcntl(folder, F_DUPFD_CLOEXEC, 0));
  if (!place.folder) return LastError();
  place.name = std::move(name);
  return place;
}

Result<struct stat> ReadStatus(const Place& place) {
  struct stat status;
  const int folder = place.folder.Get();
  const char* name = place.name.c_str();
  if (Retry([&] { return ::fstatat(folder, name, &status, AT_SYMLINK_NOFOLLOW); }) != 0)
    return LastError();
  if (place.folderMeant && !S_ISDIR(status.st_mode)) return kNoSuchItem;
  return status;
}

Result<Identity> IdentityOf(int item) {
  struct stat status;
  if (::fstat(item, &status) != 0) return LastError();
  return IdentityOf(status);
}

Result<UniqueFd> OpenAbove(int folder, const Identity& expected) {
  UniqueFd above(Retry([&] { return ::openat(folder, "..", O_RDONLY | O_DIRECTORY | O_CLOEXEC); }));
  if (!above) return LastError();
  const auto identity = IdentityOf(above.Get());
  if (!identity) return identity.Reason();
  if (identity.Value() != expected) return ErrorFromErrno(ESTALE);  // Somebody moved the folder.
  return above;
}

Result<bool> IsInOrBelow(int folder, const Identity& sought) {
  constexpr int kFlags = O_PATH | O_DIRECTORY | O_CLOEXEC;
  UniqueFd above(Retry([&] { return ::openat(folder, ".", kFlags); }));
  for (std::optional<Identity> last; above;) {
    const auto identity = IdentityOf(above.Get());
    if (!identity) return identity.Reason();
    if (identity.Value() == sought) return true;
    if (identity.Value() == last) return false;  // The root is above itself.
    last = identity.Value();
    above = UniqueFd(Retry([&] { return ::openat(above.Get(), "..", kFlags); }));
  }
  return LastError();
}

}  // namespace orb::platform
