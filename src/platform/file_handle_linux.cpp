// SPDX-License-Identifier: MIT
#include "platform/file_handle.h"

#include <fcntl.h>

#include <algorithm>
#include <new>
#include <stdexcept>
#include <utility>

#include "platform/linux/file_data.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/new_file.h"
#include "platform/linux/place.h"

namespace orb::platform {
namespace {

constexpr std::size_t kPiece = 65536;
/// Room for a file that shows no size, as those of /proc do, and to notice the end of others.
constexpr std::size_t kSpareRoom = 4096;

Status ExpectRegular(const struct stat& status) {
  if (S_ISDIR(status.st_mode)) return ErrorFromErrno(EISDIR);
  return S_ISREG(status.st_mode) ? Status() : kNotPermitted;
}

Result<std::vector<std::byte>> ReadAll(int file, std::size_t expected) {
  std::vector<std::byte> bytes(expected + kSpareRoom);
  std::size_t filled = 0;
  for (;;) {
    const std::span room = std::span(bytes).subspan(filled);
    const auto count = ReadBlock(file, room);
    if (!count) return count.Reason();
    filled += count.Value();
    if (count.Value() < room.size()) break;
    bytes.resize(bytes.size() * 2);
  }
  bytes.resize(filled);
  return bytes;
}

}  // namespace

struct FileHandle::State {
  UniqueFd file;
  struct stat status;
  Handler writeability;
};

FileHandle::FileHandle(std::unique_ptr<State> state) : state_(std::move(state)) {}
FileHandle::FileHandle(FileHandle&&) noexcept = default;
FileHandle::~FileHandle() = default;

Result<FileHandle> FileHandle::Open(const std::string& path, int flags) {
  UniqueFd file = OpenFile(AT_FDCWD, path.c_str(), flags);
  if (!file) return errno == ELOOP || errno == ENXIO ? kNotPermitted : LastError();
  auto state = std::make_unique<State>();
  if (::fstat(file.Get(), &state->status) != 0) return LastError();
  if (Status regular = ExpectRegular(state->status); !regular) return regular.Reason();
  state->file = std::move(file);
  return FileHandle(std::move(state));
}

Result<FileHandle> FileHandle::OpenForReading(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  return Open(path, O_RDONLY);
}

Result<FileHandle> FileHandle::OpenForWriting(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  auto handle = Open(path, O_WRONLY | O_NOFOLLOW);
  if (!handle) return handle;
  const Status open = RefuseLocked(handle.Value().state_->file.Get());
  return open ? std::move(handle) : open.Reason();
}

bool FileHandle::IsSameFile(const FileHandle& other) const {
  return IdentityOf(state_->status) == IdentityOf(other.state_->status);
}

Result<std::vector<std::byte>> FileHandle::ReadToEnd() {
  const ErrnoKeeper errnoKeeper;
  try {
    return ReadAll(state_->file.Get(), static_cast<std::size_t>(state_->status.st_size));
  } catch (const std::bad_alloc&) {
  } catch (const std::length_error&) {
  }
  return ErrorFromErrno(ENOMEM);
}

void FileHandle::SetWriteabilityHandler(Handler handler) {
  state_->writeability = std::move(handler);
}

Status FileHandle::Write(std::span<const std::byte> bytes) {
  const ErrnoKeeper errnoKeeper;
  while (!bytes.empty()) {
    if (state_->writeability) state_->writeability();
    const std::span piece = bytes.first(std::min(bytes.size(), kPiece));
    if (Status written = WriteBlock(state_->file.Get(), piece); !written) return written;
    bytes = bytes.subspan(piece.size());
  }
  return Flush(state_->file.Get());
}

}  // namespace orb::platform
