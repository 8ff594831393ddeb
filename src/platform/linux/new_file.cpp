// SPDX-License-Identifier: MIT
#include "platform/linux/new_file.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/random.h>

#include <cstdint>
#include <utility>

#include "platform/linux/rename.h"

namespace orb::platform {
namespace {

constexpr int kNameTries = 16;

UniqueFd OpenNameless(int folder, mode_t mode) {
  return UniqueFd(
      Retry([&] { return ::openat(folder, ".", O_TMPFILE | O_RDWR | O_CLOEXEC, mode); }));
}

UniqueFd OpenExclusively(int folder, const std::string& name, mode_t mode) {
  constexpr int kFlags = O_CREAT | O_EXCL | O_NOFOLLOW | O_RDWR | O_CLOEXEC;
  return UniqueFd(Retry([&] { return ::openat(folder, name.c_str(), kFlags, mode); }));
}

/// By descriptor, which older kernels allow only to the privileged, else through /proc.
Status LinkNameless(int file, int folder, const char* name) {
  if (::linkat(file, "", folder, name, AT_EMPTY_PATH) == 0) return {};
  if (errno == EEXIST) return kItemExists;
  const std::string path = "/proc/self/fd/" + std::to_string(file);
  const int linked = ::linkat(AT_FDCWD, path.c_str(), folder, name, AT_SYMLINK_FOLLOW);
  return linked == 0 ? Status() : Status(LastError());
}

}  // namespace

std::string RandomHiddenName() {
  std::uint64_t random = 0;
  if (::getrandom(&random, sizeof random, GRND_NONBLOCK) != sizeof random)
    random = reinterpret_cast<std::uintptr_t>(&random) ^ static_cast<std::uint64_t>(::getpid());
  char name[32];
  std::snprintf(name, sizeof name, ".orb-%016llx", static_cast<unsigned long long>(random));
  return name;
}

Status Flush(int file) {
  UniqueFd second(::fcntl(file, F_DUPFD_CLOEXEC, 0));
  return second && second.Close() ? Status() : Status(LastError());
}

Result<NewFile> NewFile::Create(int folder, mode_t mode, mode_t hiddenMode) {
  if (UniqueFd file = OpenNameless(folder, mode)) return NewFile(folder, std::move(file), {});
  return CreateHidden(folder, hiddenMode);
}

Result<NewFile> NewFile::CreateHidden(int folder, mode_t mode) {
  for (int i = 0; i < kNameTries; ++i) {
    std::string name = RandomHiddenName();
    if (UniqueFd file = OpenExclusively(folder, name, mode))
      return NewFile(folder, std::move(file), std::move(name));
    if (errno != EEXIST) break;
  }
  return LastError();
}

NewFile::NewFile(int folder, UniqueFd file, std::string hiddenName)
    : folder_(folder), file_(std::move(file)), hiddenName_(std::move(hiddenName)) {}

NewFile::~NewFile() {
  if (file_ && !hiddenName_.empty()) ::unlinkat(folder_, hiddenName_.c_str(), 0);
}

Status NewFile::Publish(const char* name, Closing closing) {
  const Status flushed = closing == Closing::kMayFail ? Flush(file_.Get()) : Status();
  if (!flushed) return flushed;
  const Status published =
      hiddenName_.empty() ? LinkNameless(file_.Get(), folder_, name)
                          : RenameWithoutReplacing(folder_, hiddenName_.c_str(), folder_, name);
  if (published) hiddenName_.clear();
  return published;
}

Status NewFile::Replace(const char* name) {
  const char* const hidden = hiddenName_.c_str();
  if (Retry([&] { return ::renameat(folder_, hidden, folder_, name); }) != 0) return LastError();
  hiddenName_.clear();
  return {};
}

}  // namespace orb::platform
