// SPDX-License-Identifier: MIT
#include "platform/temp_directory.h"

#include <fcntl.h>
#include <stdlib.h>

#include <string_view>

#include "platform/linux/own_folder.h"
#include "platform/transcode.h"

namespace orb::platform {
namespace {

constexpr mode_t kPrivateFolder = 0700;

UniqueFd OpenFolder(const char* path) {
  constexpr int kFlags = O_PATH | O_DIRECTORY | O_CLOEXEC;
  return UniqueFd(Retry([&] { return ::open(path, kFlags); }));
}

/// Nobody may lead a program that has more rights than its caller anywhere.
bool NamesAFolder(const char* path) {
  return path != nullptr && *path == '/' && Utf16LengthOfUtf8(path) && OpenFolder(path);
}

}  // namespace

Result<std::string> TemporaryDirectory(const std::string& shared) {
  const ErrnoKeeper errnoKeeper;
  const char* chosen = ::secure_getenv("TMPDIR");
  if (NamesAFolder(chosen)) return std::string(chosen);
  const UniqueFd above = OpenFolder(shared.c_str());
  if (!above) return LastError();
  const std::string name = "orb-" + std::to_string(::geteuid());
  const auto own = OpenOrMakeOwnFolder(above.Get(), name.c_str(), kPrivateFolder);
  if (!own) return own.Reason();
  return shared + '/' + name;
}

}  // namespace orb::platform
