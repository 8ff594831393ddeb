// SPDX-License-Identifier: MIT
#include "platform/linux/file_data.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <memory>

#include "platform/linux/posix.h"

namespace orb::platform {
namespace {

constexpr std::size_t kBlock = std::size_t{128} << 10;
/// Files up to this size go with one read and one write: asking for more costs more than it saves.
constexpr off_t kSmallFile = off_t{64} << 10;
/// What one copy_file_range is asked for. A signal waits no longer than that.
constexpr off_t kRangeStep = off_t{4} << 20;

Status EndedEarly() { return ErrorFromErrno(EIO); }

/// A file system that takes nothing and names no error would be asked forever.
Status WriteFailure(ssize_t count) { return count < 0 ? LastError() : ErrorFromErrno(EIO); }

/// Carries stretches of one file into another. What the kernel cannot do by itself it does not try
/// again.
class Carrier {
 public:
  Carrier(int from, int to) : from_(from), to_(to) {}

  Status Carry(off_t begin, off_t end) {
    off_t offset = begin;
    // Whatever the kernel answers instead of copying, reading and writing decide: they succeed or
    // tell the true reason.
    while (ranges_ && offset < end) ranges_ = CarryRange(&offset, end);
    while (offset < end) {
      if (Status carried = CarryBlock(&offset, end); !carried) return carried;
    }
    return {};
  }

 private:
  /// False when nothing was carried. An end of the source is not believed either.
  bool CarryRange(off_t* offset, off_t end) {
    off_t in = *offset;
    off_t out = *offset;
    const auto step = static_cast<std::size_t>(std::min(end - in, kRangeStep));
    const ssize_t count = Retry([&] { return ::copy_file_range(from_, &in, to_, &out, step, 0); });
    if (count > 0) *offset += count;
    return count > 0;
  }

  Status CarryBlock(off_t* offset, off_t end) {
    if (!block_) block_ = std::make_unique_for_overwrite<std::array<std::byte, kBlock>>();
    const auto wanted = std::min(static_cast<std::size_t>(end - *offset), kBlock);
    const ssize_t count = Retry([&] { return ::pread(from_, block_->data(), wanted, *offset); });
    if (count < 0) return LastError();
    if (count == 0) return EndedEarly();
    return Put(offset, static_cast<std::size_t>(count));
  }

  Status Put(off_t* offset, std::size_t count) {
    for (std::size_t done = 0; done < count;) {
      const ssize_t written =
          Retry([&] { return ::pwrite(to_, block_->data() + done, count - done, *offset); });
      if (written <= 0) return WriteFailure(written);
      done += static_cast<std::size_t>(written);
      *offset += written;
    }
    return {};
  }

  int from_;
  int to_;
  bool ranges_ = true;
  std::unique_ptr<std::array<std::byte, kBlock>> block_;
};

Status SetLength(int to, off_t size) {
  if (Retry([&] { return ::ftruncate(to, size); }) != 0) return LastError();
  return {};
}

/// The clone takes what the source holds now, which may have grown since it was opened.
Status TrimClone(int to, off_t size) {
  struct stat clone;
  if (::fstat(to, &clone) != 0) return LastError();
  if (clone.st_size < size) return EndedEarly();
  return clone.st_size == size ? Status() : SetLength(to, size);
}

Status CopyUntilEnd(int from, int to) {
  const auto block = std::make_unique_for_overwrite<std::array<std::byte, kSmallFile>>();
  for (;;) {
    const auto count = ReadBlock(from, *block);
    if (!count) return count.Reason();
    if (Status written = WriteBlock(to, std::span(*block).first(count.Value())); !written)
      return written;
    if (count.Value() < block->size()) return {};
  }
}

Status CopySmall(int from, int to, std::size_t size) {
  std::array<std::byte, kSmallFile> block;
  const auto count = ReadBlock(from, std::span(block).first(size));
  if (!count) return count.Reason();
  if (count.Value() < size) return EndedEarly();
  return WriteBlock(to, std::span(block).first(size));
}

/// A file system that does not tell of holes has one stretch of data. The copy has its length from
/// the start: XFS fills holes at the end of a growing file with room for more.
Status CopyStretches(int from, int to, off_t size) {
  if (Status sized = SetLength(to, size); !sized) return sized;
  Carrier carrier(from, to);
  for (off_t offset = 0; offset < size;) {
    const off_t data = ::lseek(from, offset, SEEK_DATA);
    if (data < 0 && errno != ENXIO) return carrier.Carry(offset, size);
    if (data < 0 || data >= size) break;
    const off_t hole = std::min(::lseek(from, data, SEEK_HOLE), size);
    if (hole <= data) return carrier.Carry(data, size);
    if (Status carried = carrier.Carry(data, hole); !carried) return carried;
    offset = hole;
  }
  struct stat now;
  if (::fstat(from, &now) != 0) return LastError();
  return now.st_size < size ? EndedEarly() : Status();
}

bool MayHaveHoles(const StatusRecord& source) {
  constexpr std::uint64_t kStatUnit = 512;
  return source.stx_blocks < source.stx_size / kStatUnit;
}

}  // namespace

Status CopyFileData(int from, int to, const StatusRecord& source, off_t cloneAbove) {
  const auto size = static_cast<off_t>(source.stx_size);
  if (size == 0) return CopyUntilEnd(from, to);
  if (size > cloneAbove && ::ioctl(to, FICLONE, from) == 0) return TrimClone(to, size);
  if (size <= kSmallFile) return CopySmall(from, to, static_cast<std::size_t>(size));
  return MayHaveHoles(source) ? CopyStretches(from, to, size) : Carrier(from, to).Carry(0, size);
}

Result<std::size_t> ReadBlock(int from, std::span<std::byte> block) {
  std::size_t filled = 0;
  while (filled < block.size()) {
    const ssize_t count =
        Retry([&] { return ::read(from, block.data() + filled, block.size() - filled); });
    if (count < 0) return LastError();
    if (count == 0) break;
    filled += static_cast<std::size_t>(count);
  }
  return filled;
}

Status WriteBlock(int to, std::span<const std::byte> block) {
  while (!block.empty()) {
    const ssize_t count = Retry([&] { return ::write(to, block.data(), block.size()); });
    if (count <= 0) return WriteFailure(count);
    block = block.subspan(static_cast<std::size_t>(count));
  }
  return {};
}

}  // namespace orb::platform
