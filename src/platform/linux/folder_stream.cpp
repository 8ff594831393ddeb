// SPDX-License-Identifier: MIT
#include "platform/linux/folder_stream.h"

#include <string_view>

namespace orb::platform {

Result<FolderStream> FolderStream::Open(UniqueFd folder) {
  if (!folder) return LastError();
  DIR* stream = ::fdopendir(folder.Get());
  if (stream == nullptr) return LastError();
  folder.Release();
  ::rewinddir(stream);
  return FolderStream(stream);
}

Result<FolderStream::Entry> FolderStream::Next() {
  for (;;) {
    errno = 0;  // The end and a failure look the same but for it.
    const dirent* entry = ::readdir(stream_.get());
    if (entry == nullptr) {
      if (errno != 0) return LastError();
      return Entry{};
    }
    const std::string_view name = entry->d_name;
    if (name != "." && name != "..") return Entry{entry->d_name, entry->d_type};
  }
}

}  // namespace orb::platform
