// SPDX-License-Identifier: MIT
#include "platform/linux/mount_number.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <array>
#include <cstddef>

#include "platform/linux/posix.h"

namespace orb::platform {
namespace {

// Newer than the C library's own headers.
constexpr long kStatmount = 457;
constexpr int kForIdentity = 0x200;    // AT_HANDLE_FID
constexpr int kUniqueMountId = 0x001;  // AT_HANDLE_MNT_ID_UNIQUE
constexpr std::uint64_t kOfFileSystem = 0x1;
constexpr std::uint64_t kOfMount = 0x2;
constexpr std::uint64_t kFolder = 0x10;
constexpr std::uint64_t kType = 0x20;
constexpr std::uint64_t kSubtype = 0x100;
constexpr std::uint64_t kSource = 0x200;
constexpr std::uint64_t kReadOnly = 0x1;  // MOUNT_ATTR_RDONLY and SB_RDONLY

/// struct mnt_id_req
struct MountRequest {
  std::uint32_t size;
  std::uint32_t spare;
  std::uint64_t number;
  std::uint64_t wanted;
};

/// struct statmount, of which we read the beginning. Texts are given by where they begin.
struct MountReply {
  std::uint32_t size;
  std::uint32_t options;
  std::uint64_t known;
  std::uint32_t major;
  std::uint32_t minor;
  std::uint64_t magic;
  std::uint32_t fileSystemFlags;
  std::uint32_t type;
  std::uint64_t number;
  std::uint64_t parent;
  std::uint32_t oldNumber;
  std::uint32_t oldParent;
  std::uint64_t mountFlags;
  std::uint64_t propagation[4];
  std::uint32_t root;
  std::uint32_t folder;
  std::uint64_t nameSpace;
  std::uint32_t subtype;
  std::uint32_t source;
  std::array<std::byte, 384> later;
  std::array<char, 12'288> texts;
};
static_assert(offsetof(MountReply, texts) == 512);

std::string TypeOf(const MountReply& reply) {
  std::string type = &reply.texts[reply.type];
  if ((reply.known & kSubtype) == 0) return type;
  return type.append(".").append(&reply.texts[reply.subtype]);
}

/// Whether all that is needed is known.
bool Ask(std::uint64_t number, std::uint64_t needed, std::uint64_t wanted, MountReply* reply) {
  const MountRequest request{sizeof request, 0, number, needed | wanted};
  return ::syscall(kStatmount, &request, reply, sizeof *reply, 0) == 0 &&
         (reply->known & needed) == needed;
}

}  // namespace

std::optional<std::uint64_t> MountNumberInMemory(const std::string& path) {
  open_how how{};
  how.flags = O_PATH | O_NOFOLLOW | O_CLOEXEC;
  how.resolve = RESOLVE_CACHED;
  const UniqueFd item(
      static_cast<int>(::syscall(SYS_openat2, AT_FDCWD, path.c_str(), &how, sizeof how)));
  if (!item) return std::nullopt;
  file_handle handle{};  // Too small on purpose: the mount is told nevertheless.
  std::uint64_t number = 0;
  constexpr int kFlags = AT_EMPTY_PATH | kForIdentity | kUniqueMountId;
  const long told = ::syscall(SYS_name_to_handle_at, item.Get(), "", &handle, &number, kFlags);
  return told != 0 && errno == EOVERFLOW ? std::optional(number) : std::nullopt;
}

std::optional<MountedVolume> ReadVolume(std::uint64_t number) {
  MountReply reply;
  if (!Ask(number, kOfFileSystem, 0, &reply)) return std::nullopt;
  return MountedVolume{{reply.major, reply.minor}, reply.magic};
}

std::optional<Mount> ReadMount(std::uint64_t number) {
  MountReply reply;
  constexpr std::uint64_t kNeeded = kOfFileSystem | kOfMount | kFolder | kType;
  if (!Ask(number, kNeeded, kSubtype | kSource, &reply)) return std::nullopt;
  Mount mount;
  mount.id = number;
  mount.device = {reply.major, reply.minor};
  mount.folder = &reply.texts[reply.folder];
  mount.type = TypeOf(reply);
  if ((reply.known & kSource) != 0) mount.source = &reply.texts[reply.source];
  mount.readOnly = ((reply.mountFlags | reply.fileSystemFlags) & kReadOnly) != 0;
  // Kernels that know no subtype and source yet leave them out, as mounts do that have none.
  const bool isWhole = mount.device.major != 0 || !mount.source.empty();
  return isWhole && mount.type != "fuse" ? std::optional(std::move(mount)) : std::nullopt;
}

}  // namespace orb::platform
