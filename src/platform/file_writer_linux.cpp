// SPDX-License-Identifier: MIT
#include "platform/file_writer.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <utility>

#include "platform/linux/file_data.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/place.h"
#include "platform/linux/posix.h"

namespace orb::platform {
namespace {

Status WriteAt(int file, std::size_t offset, std::span<const std::byte> block) {
  if (block.empty()) return {};
  if (::lseek(file, static_cast<off_t>(offset), SEEK_SET) < 0) return LastError();
  return WriteBlock(file, block);
}

}  // namespace

struct FileWriter::State {
  UniqueFd file;
  std::size_t size;
};

FileWriter::FileWriter(std::unique_ptr<State> state) : state_(std::move(state)) {}
FileWriter::FileWriter(FileWriter&&) noexcept = default;
FileWriter::~FileWriter() = default;

Result<FileWriter> FileWriter::Open(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  UniqueFd file = OpenFile(AT_FDCWD, path.c_str(), O_WRONLY);
  if (!file) return errno == ENXIO ? kNotPermitted : LastError();  // A pipe that nobody reads.
  struct stat status;
  if (::fstat(file.Get(), &status) != 0) return LastError();
  if (!S_ISREG(status.st_mode)) return kNotPermitted;
  if (const Status open = RefuseLocked(file.Get()); !open) return open.Reason();
  const auto size = static_cast<std::size_t>(status.st_size);
  return FileWriter(std::make_unique<State>(State{std::move(file), size}));
}

Status FileWriter::Write(std::span<const std::byte> block) {
  const ErrnoKeeper errnoKeeper;
  const int file = state_->file.Get();
  const std::size_t inside = std::min(block.size(), state_->size);
  // What the file has to grow by comes first: it overwrites nothing and can be taken back.
  if (const Status grown = WriteAt(file, state_->size, block.subspan(inside)); !grown) {
    (void)Retry([&] { return ::ftruncate(file, static_cast<off_t>(state_->size)); });
    return grown;
  }
  if (const Status written = WriteAt(file, 0, block.first(inside)); !written) return written;
  // Some volumes keep an error back until here.
  return state_->file.Close() ? Status() : Status(LastError());
}

}  // namespace orb::platform
