// SPDX-License-Identifier: MIT
#pragma once

#include <cerrno>

namespace orb::platform {

/// Gives the host program its errno back.
class ErrnoKeeper {
 public:
  ErrnoKeeper() : kept_(errno) {}
  ~ErrnoKeeper() { errno = kept_; }
  ErrnoKeeper(const ErrnoKeeper&) = delete;
  ErrnoKeeper& operator=(const ErrnoKeeper&) = delete;

 private:
  int kept_;
};

}  // namespace orb::platform
