// SPDX-License-Identifier: MIT
#include "platform/linux/move_across.h"

#include <fcntl.h>

#include <cstdint>
#include <utility>

#include "platform/linux/copy_at.h"
#include "platform/linux/new_file.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/rename.h"
#include "platform/linux/tree_survey.h"

namespace orb::platform {
namespace {

/// A volume that has nothing to bring to a device says EINVAL.
Status AfterSync(int result) {
  return result == 0 || errno == EINVAL ? Status() : Status(LastError());
}

Status SyncFile(const Place& file) {
  constexpr int kFlags = O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
  const UniqueFd open(
      Retry([&] { return ::openat(file.folder.Get(), file.name.c_str(), kFlags); }));
  return open ? AfterSync(::fsync(open.Get())) : Status(LastError());
}

/// One copy under way to another volume.
class Crossing {
 public:
  Crossing(const Place& from, const Place& to, const struct stat& source)
      : from_(from), to_(to), source_(source) {}

  Status Copy() {
    if (Status possible = Prepare(); !possible) return possible;
    const Status copied = S_ISDIR(source_.st_mode) ? CopyTree() : CopyLeaf();
    if (!copied) return copied;
    const Status same = ExpectUnchanged();
    if (!same && IsSourceInItsPlace()) (void)RemoveItemAt(target_.Get(), to_.name);
    return same;
  }

 private:
  /// Asked before anything is copied, so that no copy is made in vain. An error of the volume that
  /// is noticed from here on shows when the folder is synchronised: that is why it is opened first.
  Status Prepare() {
    if (::faccessat(from_.folder.Get(), ".", W_OK | X_OK, AT_EACCESS) != 0) return LastError();
    if (S_ISDIR(source_.st_mode)) {
      if (Status removable = ExpectRemovableTree(); !removable) return removable;
    }
    constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
    target_ = UniqueFd(Retry([&] { return ::openat(to_.folder.Get(), ".", kFlags); }));
    return target_ ? ExpectFree() : Status(LastError());
  }

  Status ExpectRemovableTree() {
    const auto survey = SurveyTree(from_.folder.Get(), from_.name, SurveyFor::kRemoval);
    if (!survey) return survey.Reason();
    state_ = survey.Value().state;
    return survey.Value().canBeRemoved ? Status() : kNotPermitted;
  }

  Status ExpectFree() const {
    struct stat ignored;
    const int result = ::fstatat(target_.Get(), to_.name.c_str(), &ignored, AT_SYMLINK_NOFOLLOW);
    if (result == 0) return kItemExists;
    return errno == ENOENT ? Status() : Status(LastError());
  }

  Status CopyLeaf() const {
    if (Status copied = CopyItemAt(from_, to_); !copied) return copied;
    Status synced = S_ISREG(source_.st_mode) ? SyncFile(to_) : Status();
    if (synced) synced = AfterSync(::fsync(target_.Get()));
    if (!synced) (void)RemoveItemAt(target_.Get(), to_.name);
    return synced;
  }

  Status CopyTree() const {
    const auto hidden = EntryOf(to_.folder.Get(), RandomHiddenName());
    if (!hidden) return hidden.Reason();
    const std::string& name = hidden.Value().name;
    Status copied = CopyItemAt(from_, hidden.Value());
    if (copied) copied = AfterSync(::syncfs(target_.Get()));
    if (copied) copied = Publish(name);
    if (!copied) (void)RemoveItemAt(target_.Get(), name);
    return copied;
  }

  Status Publish(const std::string& hiddenName) const {
    const int folder = target_.Get();
    const char* name = to_.name.c_str();
    Status done = RenameWithoutReplacing(folder, hiddenName.c_str(), folder, name);
    if (!done) return done;
    done = AfterSync(::fsync(folder));
    if (!done) (void)RemoveItemAt(folder, to_.name);
    return done;
  }

  /// What was written to the source, or put in its place, while it was copied would be lost.
  Status ExpectUnchanged() const {
    const auto now = ReadStatus(from_);
    if (!now) return {};  // The removal will say why. The copy may be the last there is.
    const timespec& was = source_.st_mtim;
    const timespec& is = now.Value().st_mtim;
    const bool same = IdentityOf(now.Value()) == IdentityOf(source_) && was.tv_sec == is.tv_sec &&
                      was.tv_nsec == is.tv_nsec;
    if (!same) return ErrorFromErrno(ESTALE);
    return S_ISDIR(source_.st_mode) ? ExpectUnchangedTree() : Status();
  }

  /// Otherwise, its medium pulled or the item taken away, the copy may be all that is left.
  bool IsSourceInItsPlace() const {
    const auto now = ReadStatus(from_);
    return now && IdentityOf(now.Value()) == IdentityOf(source_);
  }

  Status ExpectUnchangedTree() const {
    const auto survey = SurveyTree(from_.folder.Get(), from_.name, SurveyFor::kSize);
    if (!survey) return survey.Reason();
    return survey.Value().state == state_ ? Status() : ErrorFromErrno(ESTALE);
  }

  const Place& from_;
  const Place& to_;
  const struct stat source_;
  std::uint64_t state_ = 0;  // Of a folder and all it holds, before it was copied.
  UniqueFd target_;
};

}  // namespace

Status CopyAcross(const Place& from, const Place& to) {
  const auto status = ReadStatus(from);
  if (!status) return status.Reason();
  return Crossing(from, to, status.Value()).Copy();
}

Status MoveAcross(const Place& from, const Place& to) {
  const Status copied = CopyAcross(from, to);
  return copied ? RemoveItemAt(from.folder.Get(), from.name) : copied;
}

}  // namespace orb::platform
