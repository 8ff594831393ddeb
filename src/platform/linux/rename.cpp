// SPDX-License-Identifier: MIT
#include "platform/linux/rename.h"

#include <fcntl.h>
#include <stdio.h>

#include "platform/linux/posix.h"

namespace orb::platform {
namespace {

Status AfterCall(int result) { return result == 0 ? Status() : Status(LastError()); }

/// Takes the second name away again where the first has to stay. A first name that is not there any
/// more is gone as it should be: a network volume may say so after a request that it repeated.
Status DropOldName(int from, const char* name, int to, const char* newName) {
  if (::unlinkat(from, name, 0) == 0 || errno == ENOENT) return {};
  const Error error = LastError();
  ::unlinkat(to, newName, 0);
  return error;
}

Status RenameWhenFree(int from, const char* name, int to, const char* newName) {
  if (::faccessat(to, newName, F_OK, AT_SYMLINK_NOFOLLOW) == 0) return kItemExists;
  return AfterCall(::renameat(from, name, to, newName));
}

}  // namespace

Status RenameWithoutReplacing(int from, const char* name, int to, const char* newName) {
  if (::renameat2(from, name, to, newName, RENAME_NOREPLACE) == 0) return {};
  if (errno != EINVAL && errno != ENOSYS) return LastError();
  if (::linkat(from, name, to, newName, 0) == 0) return DropOldName(from, name, to, newName);
  return errno == EEXIST ? kItemExists : RenameWhenFree(from, name, to, newName);
}

}  // namespace orb::platform
