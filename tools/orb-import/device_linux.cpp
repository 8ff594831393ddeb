// SPDX-License-Identifier: MIT
#include "device_linux.h"

#include <fcntl.h>
#include <linux/magic.h>
#include <sys/stat.h>
#include <sys/vfs.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

#include "text.h"

namespace orbimport {
namespace {

constexpr std::size_t kPiece = 1 << 20;
/// Suits every device's blocks.
constexpr std::size_t kAlignment = 4096;

class Descriptor {
 public:
  Descriptor(const std::string& path, int flags)
      : number_(::open(path.c_str(), flags | O_RDONLY | O_NONBLOCK | O_CLOEXEC)) {}
  Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  Descriptor& operator=(Descriptor&&) = delete;
  ~Descriptor() {
    if (number_ >= 0) ::close(number_);
  }

  int Get() const { return number_; }
  explicit operator bool() const { return number_ >= 0; }

 private:
  int number_;
};

/// To be read from the device where the volume can.
Descriptor OpenCopy(const std::string& path) {
  Descriptor direct(path, O_NOFOLLOW | O_DIRECT);
  return direct || errno != EINVAL ? std::move(direct) : Descriptor(path, O_NOFOLLOW);
}

class Piece {
 public:
  Piece() : bytes_(static_cast<char*>(std::aligned_alloc(kAlignment, kPiece))) {}

  /// Fills the piece up to the end of the file. False when reading fails.
  bool Read(int descriptor) {
    size_ = 0;
    while (bytes_ && size_ < kPiece) {
      const ssize_t count = ReadSome(descriptor);
      if (count < 0) return false;
      if (count == 0) break;
      size_ += static_cast<std::size_t>(count);
    }
    return bytes_ != nullptr;
  }

  bool IsEmpty() const { return size_ == 0; }
  bool operator==(const Piece& other) const {
    return size_ == other.size_ && std::memcmp(bytes_.get(), other.bytes_.get(), size_) == 0;
  }

 private:
  struct Free {
    void operator()(char* bytes) const { std::free(bytes); }
  };

  ssize_t ReadSome(int descriptor) const {
    while (true) {
      const ssize_t count = ::read(descriptor, bytes_.get() + size_, kPiece - size_);
      if (count >= 0 || (errno != EINTR && !(errno == EINVAL && StopDirect(descriptor))))
        return count;
    }
  }

  /// Direct reading asks for whole blocks, which the end of a file may not be.
  static bool StopDirect(int descriptor) {
    const int flags = ::fcntl(descriptor, F_GETFL);
    return flags >= 0 && (flags & O_DIRECT) != 0 &&
           ::fcntl(descriptor, F_SETFL, flags & ~O_DIRECT) == 0;
  }

  std::unique_ptr<char, Free> bytes_;
  std::size_t size_ = 0;
};

OrbResult CodeOfErrno() {
  switch (errno) {
    case ENOSPC:
    case EDQUOT:
      return kOrbErrDiskFull;
    case ENOENT:
      return kOrbErrNotFound;
    case EACCES:
    case EPERM:
      return kOrbErrAccessDenied;
    default:
      return kOrbErrUnknown;
  }
}

/// Flushes the copy and forgets what memory keeps of it.
OrbResult Settle(int copy) {
  if (::fsync(copy) != 0 && errno != EINVAL)
    return CodeOfErrno();  // Such as on a volume of a disc.
  ::posix_fadvise(copy, 0, 0, POSIX_FADV_DONTNEED);
  return kOrbNoErr;
}

OrbResult CompareAll(int source, int copy, const std::function<bool()>& goOn) {
  Piece expected, found;
  while (goOn()) {
    if (!expected.Read(source)) return CodeOfErrno();
    if (!found.Read(copy)) return kImportErrCopyUnreadable;
    if (!(expected == found)) return kImportErrCopyDiffers;
    if (expected.IsEmpty()) return kOrbNoErr;
  }
  return kOrbErrCanceled;
}

/// The volumes on which a file takes its bytes, up to the end of the last block.
bool IsExact(const struct statfs& status) {
  constexpr decltype(status.f_type) kExact[] = {
      EXT4_SUPER_MAGIC, XFS_SUPER_MAGIC, TMPFS_MAGIC, MSDOS_SUPER_MAGIC, EXFAT_SUPER_MAGIC};
  return std::find(std::begin(kExact), std::end(kExact), status.f_type) != std::end(kExact);
}

}  // namespace

Room RoomAt(const std::string& folder) {
  const Descriptor open(folder, O_DIRECTORY);
  struct statfs status;
  struct stat item;
  if (!open || ::fstatfs(open.Get(), &status) != 0 || ::fstat(open.Get(), &item) != 0) return {};
  // The rest is kept for the superuser, where there is any.
  const auto blocks = ::geteuid() == 0 ? status.f_bfree : status.f_bavail;
  const auto block = static_cast<std::uint64_t>(status.f_frsize);
  if (status.f_blocks == 0 || block == 0) return {};
  return {item.st_dev, blocks * block, block, IsExact(status)};
}

bool FlushVolumes(const std::set<std::string>& folders) {
  std::set<dev_t> flushed;
  return std::all_of(folders.begin(), folders.end(), [&](const std::string& folder) {
    const Descriptor open(folder, O_DIRECTORY);
    struct stat item;
    if (!open || ::fstat(open.Get(), &item) != 0) return false;
    return !flushed.insert(item.st_dev).second || ::syncfs(open.Get()) == 0;
  });
}

OrbResult CompareOnDevice(const std::string& source,
                          const std::string& copy,
                          const std::function<bool()>& goOn) {
  const Descriptor expected(source, O_NOFOLLOW);
  if (!expected) return CodeOfErrno();
  const Descriptor found = OpenCopy(copy);
  if (!found) return kImportErrCopyUnreadable;
  const OrbResult settled = Settle(found.Get());
  return settled < kOrbErrFirst ? CompareAll(expected.Get(), found.Get(), goOn) : settled;
}

}  // namespace orbimport
