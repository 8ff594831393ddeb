// SPDX-License-Identifier: MIT
#include "platform/linux/own_folder.h"

#include <fcntl.h>
#include <sys/stat.h>

#include "platform/linux/item_metadata.h"

namespace orb::platform {
namespace {

UniqueFd OpenFolder(int above, const char* name) {
  constexpr int kFlags = O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC;
  return UniqueFd(Retry([&] { return ::openat(above, name, kFlags); }));
}

Result<UniqueFd> ExpectOwn(UniqueFd folder) {
  struct stat status;
  if (::fstat(folder.Get(), &status) != 0) return LastError();
  const bool own = status.st_uid == ::geteuid() && (status.st_mode & (S_IWGRP | S_IWOTH)) == 0;
  if (!own) return kNotPermitted;
  return folder;
}

/// Somebody who was faster made it as well; whether it is good is seen later.
Status MakeFolder(int above, const char* name, mode_t mode) {
  if (const Status open = RefuseLocked(above); !open) return open;
  if (::mkdirat(above, name, mode) != 0) return errno == EEXIST ? Status() : Status(LastError());
  (void)::fchmodat(above, name, mode, AT_SYMLINK_NOFOLLOW);
  return {};
}

}  // namespace

Result<UniqueFd> OpenOwnFolder(int above, const char* name) {
  UniqueFd folder = OpenFolder(above, name);
  if (!folder) return LastError();
  return ExpectOwn(std::move(folder));
}

Result<UniqueFd> OpenOrMakeOwnFolder(int above, const char* name, mode_t mode) {
  UniqueFd folder = OpenFolder(above, name);
  if (!folder && errno == ENOENT) {
    if (const Status made = MakeFolder(above, name, mode); !made) return made.Reason();
    return OpenOwnFolder(above, name);
  }
  if (!folder) return LastError();
  return ExpectOwn(std::move(folder));
}

}  // namespace orb::platform
