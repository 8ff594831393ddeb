// SPDX-License-Identifier: MIT
#include "platform/linux/system_file.h"

#include <fcntl.h>

#include <array>
#include <cstddef>

#include "platform/linux/posix.h"

namespace orb::platform {

Result<std::string> ReadSystemFile(const std::string& path) {
  const UniqueFd file(Retry([&] { return ::open(path.c_str(), O_RDONLY | O_CLOEXEC); }));
  if (!file) return LastError();
  std::string content;
  std::array<char, 4096> block;
  while (true) {
    const ssize_t size = Retry([&] { return ::read(file.Get(), block.data(), block.size()); });
    if (size < 0) return LastError();
    if (size == 0) return content;
    content.append(block.data(), static_cast<std::size_t>(size));
  }
}

}  // namespace orb::platform
