// SPDX-License-Identifier: MIT
#include "platform/linux/posix.h"

namespace orb::platform {

Error ErrorFromErrno(int number) {
  switch (number) {
    case ENOENT:
    case ENOTDIR:
      return kNoSuchItem;
    case EACCES:
    case EPERM:
    case ENOTSUP:  // The volume cannot carry it.
      return kNotPermitted;
    case EEXIST:
    case ENOTEMPTY:
      return kItemExists;
    case ENAMETOOLONG:
    case EILSEQ:
      return kInvalidName;
    case ENOSPC:
    case EDQUOT:
      return kVolumeFull;
    default:
      return {ErrorDomain::kPosix, number};
  }
}

Error LastError() { return ErrorFromErrno(errno); }

Error LastRemovalError() {
  return errno == EBUSY || errno == ETXTBSY ? kBusy : ErrorFromErrno(errno);
}

void UniqueFd::Reset(int fd) {
  const int keptErrno = errno;
  const int old = std::exchange(fd_, fd);
  if (old >= 0) ::close(old);
  errno = keptErrno;
}

bool UniqueFd::Close() {
  // Never retried: on Linux the descriptor is gone even when close was interrupted.
  return ::close(std::exchange(fd_, -1)) == 0 || errno == EINTR;
}

}  // namespace orb::platform
