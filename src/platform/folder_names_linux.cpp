// SPDX-License-Identifier: MIT
#include "platform/folder_names.h"

#include <fcntl.h>

#include "platform/linux/folder_stream.h"

namespace orb::platform {

Status ForEachName(const std::string& folder, const std::function<void(std::string_view)>& use) {
  const ErrnoKeeper errnoKeeper;
  constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  auto entries =
      FolderStream::Open(UniqueFd(Retry([&] { return ::open(folder.c_str(), kFlags); })));
  if (!entries) return entries.Reason();
  for (;;) {
    const auto entry = entries.Value().Next();
    if (!entry) return entry.Reason();
    if (entry.Value().name == nullptr) return {};
    use(entry.Value().name);
  }
}

}  // namespace orb::platform
