// SPDX-License-Identifier: MIT
#pragma once

#include <dirent.h>

#include <memory>

#include "platform/linux/posix.h"

namespace orb::platform {

/// What a folder holds, without "." and "..", in no order.
class FolderStream {
 public:
  struct Entry {
    const char* name = nullptr;  ///< Null at the end. Valid until the next call.
    unsigned char type = DT_UNKNOWN;
  };

  /// Takes over what was just opened for reading, and begins at the start. When opening failed, its
  /// error is this one's.
  static Result<FolderStream> Open(UniqueFd folder);

  int Descriptor() const { return ::dirfd(stream_.get()); }
  Result<Entry> Next();
  /// Begins again, with what the folder holds now.
  void Restart() { ::rewinddir(stream_.get()); }

 private:
  struct Close {
    void operator()(DIR* stream) const { ::closedir(stream); }
  };
  explicit FolderStream(DIR* stream) : stream_(stream) {}

  std::unique_ptr<DIR, Close> stream_;
};

}  // namespace orb::platform
