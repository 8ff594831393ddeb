// SPDX-License-Identifier: MIT
#include "platform/linux/trash_folder.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <new>
#include <span>
#include <utility>

#include "platform/calendar.h"
#include "platform/linux/file_data.h"
#include "platform/linux/move_across.h"
#include "platform/linux/new_file.h"
#include "platform/linux/removal_at.h"
#include "platform/linux/rename.h"
#include "platform/linux/system_file.h"
#include "platform/linux/tree_survey.h"

namespace orb::platform {

namespace {

constexpr mode_t kPrivateFolder = 0700;
constexpr mode_t kPrivateFile = 0600;
constexpr int kFolderFlags = O_PATH | O_DIRECTORY | O_CLOEXEC;
/// Enough for every folder, and an end for one that takes nothing and does not say why.
constexpr unsigned kMostNumbers = 1'000'000;
constexpr char kFolderSizes[] = "directorysizes";

UniqueFd OpenFolder(int above, const std::string& name) {
  return UniqueFd(Retry([&] { return ::openat(above, name.c_str(), kFolderFlags | O_NOFOLLOW); }));
}

Status ExpectOwn(int folder) {
  struct stat status;
  if (::fstat(folder, &status) != 0) return LastError();
  return status.st_uid == ::geteuid() ? Status() : Status(kNotPermitted);
}

/// A folder of the caller's own and no link, made when it is missing.
Result<UniqueFd> OpenOrMakeOwn(int above, const std::string& name) {
  UniqueFd folder = OpenFolder(above, name);
  if (!folder && errno == ENOENT) {
    if (::mkdirat(above, name.c_str(), kPrivateFolder) != 0 && errno != EEXIST) return LastError();
    folder = OpenFolder(above, name);
  }
  if (!folder) return LastError();
  if (const Status own = ExpectOwn(folder.Get()); !own) return own.Reason();
  return folder;
}

/// All that is missing on the way too, private to the caller.
Status MakeFolders(const std::string& path) {
  for (std::size_t end = 0; end != std::string::npos;) {
    end = path.find('/', end + 1);
    const std::string folder = path.substr(0, end);
    if (::mkdir(folder.c_str(), kPrivateFolder) != 0 && errno != EEXIST) {
      // A folder that is there may say something else, such as that its volume is read-only.
      if (::access(folder.c_str(), F_OK) != 0) return LastError();
    }
  }
  return {};
}

/// The folder that all users share needs the sticky bit, else they could take each other's.
UniqueFd OpenShared(int top) {
  UniqueFd shared = OpenFolder(top, ".Trash");
  struct stat status;
  if (!shared || ::fstat(shared.Get(), &status) != 0) return {};
  return (status.st_mode & S_ISVTX) != 0 ? std::move(shared) : UniqueFd();
}

CivilTime LocalNow() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return LocalFromInstant(std::chrono::floor<std::chrono::seconds>(now).count());
}

bool IsThere(int folder, const std::string& name) {
  return ::faccessat(folder, name.c_str(), F_OK, AT_SYMLINK_NOFOLLOW) == 0;
}

std::string InfoName(const std::string& name) { return name + std::string(kInfoSuffix); }

/// A new file with this content, or none.
Status WriteNewFile(int folder, const std::string& name, const std::string& content) {
  constexpr int kFlags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC;
  UniqueFd file(Retry([&] { return ::openat(folder, name.c_str(), kFlags, kPrivateFile); }));
  if (!file) return LastError();
  Status written = WriteBlock(file.Get(), std::as_bytes(std::span(content)));
  if (!file.Close() && written) written = LastError();
  if (!written) ::unlinkat(folder, name.c_str(), 0);
  return written;
}

}  // namespace

// --- Taking items in

/// Reserves the first name that is free, beginning after the last that this batch has tried.
Result<std::string> TrashFolder::Record(const std::string& name,
                                        const std::string& text,
                                        unsigned& number) {
  while (number < kMostNumbers) {
    std::string kept = NumberedName(name, ++number);
    const Status written = WriteNewFile(info_.Get(), InfoName(kept), text);
    if (written) return kept;
    if (written.Reason() != kItemExists) return written.Reason();
  }
  return kInvalidName;
}

Result<std::string> TrashFolder::TakeIn(
    const std::string& name,
    std::string_view path,
    const std::function<Status(const std::string& name)>& move) {
  const std::string text = InfoText(RecordedPath(path), LocalNow());
  unsigned& number = lastNumbers_[name];
  while (true) {
    Result<std::string> kept = Record(name, text, number);
    if (!kept) return kept;
    const Status moved = move(kept.Value());
    if (moved) return kept;
    // A copy whose source was replaced meanwhile stays: it may be the last there is.
    const bool isReplaced = moved.Reason() == ErrorFromErrno(ESTALE);
    if (!isReplaced || !IsThere(files_.Get(), kept.Value())) Forget(kept.Value());
    if (moved.Reason() == kItemExists) continue;
    --number;  // The name is free again.
    return moved.Reason();
  }
}

Status TrashFolder::RenameIn(int folder, const std::string& entry, const std::string& name) const {
  return RenameWithoutReplacing(folder, entry.c_str(), files_.Get(), name.c_str());
}

Status TrashFolder::CopyIn(int folder, const std::string& entry, const std::string& name) const {
  const auto from = EntryOf(folder, entry);
  if (!from) return from.Reason();
  const auto to = EntryOf(files_.Get(), name);
  if (!to) return to.Reason();
  const Status copied = CopyAcross(from.Value(), to.Value());
  // Names in a folder may be one to the other volume: no other name for the folder helps.
  const bool isInside = !copied && copied.Reason() == kItemExists && !IsThere(files_.Get(), name);
  return isInside ? kNotPermitted : copied;
}

void TrashFolder::Drop(const std::string& name) const {
  if (RemoveItemAt(files_.Get(), name)) Forget(name);
}

void TrashFolder::Forget(const std::string& name) const {
  ::unlinkat(info_.Get(), InfoName(name).c_str(), 0);
}

// --- Opening

Result<TrashFolder> TrashFolder::Open(UniqueFd root, std::string path, std::string topFolder) {
  TrashFolder trash;
  trash.path_ = std::move(path);
  trash.topFolder_ = std::move(topFolder);
  trash.root_ = std::move(root);
  for (const auto& [name, part] : {std::pair("files", &trash.files_), {"info", &trash.info_}}) {
    Result<UniqueFd> opened = OpenOrMakeOwn(trash.root_.Get(), name);
    if (!opened) return opened.Reason();
    *part = std::move(opened).Value();
  }
  for (const UniqueFd* part : {&trash.root_, &trash.files_, &trash.info_}) {
    const Result<Identity> identity = IdentityOf(part->Get());
    if (!identity) return identity.Reason();
    trash.parts_.push_back(identity.Value());
  }
  return trash;
}

Result<TrashFolder> TrashFolder::OpenHome(const std::string& path) {
  if (const Status made = MakeFolders(path); !made) return made.Reason();
  UniqueFd root(Retry([&] { return ::open(path.c_str(), kFolderFlags); }));
  if (!root) return LastError();
  if (const Status own = ExpectOwn(root.Get()); !own) return own.Reason();
  return Open(std::move(root), path, "");
}

Result<TrashFolder> TrashFolder::OpenAt(const std::string& topFolder) {
  const std::string top = topFolder == "/" ? topFolder : topFolder + '/';
  const UniqueFd folder(Retry([&] { return ::open(top.c_str(), kFolderFlags); }));
  if (!folder) return LastError();
  const std::string user = std::to_string(::geteuid());
  if (const UniqueFd shared = OpenShared(folder.Get()); shared) {
    Result<UniqueFd> own = OpenOrMakeOwn(shared.Get(), user);
    if (own) return Open(std::move(own).Value(), top + ".Trash/" + user, top);
  }
  Result<UniqueFd> own = OpenOrMakeOwn(folder.Get(), ".Trash-" + user);
  if (!own) return own.Reason();
  return Open(std::move(own).Value(), top + ".Trash-" + user, top);
}

// --- What is inside

bool TrashFolder::IsPart(const Identity& folder) const {
  return std::ranges::find(parts_, folder) != parts_.end();
}

bool TrashFolder::IsPartOrAbove(const Identity& folder) const {
  if (IsPart(folder)) return true;
  const Result<bool> isAbove = IsInOrBelow(root_.Get(), folder);
  return !isAbove || isAbove.Value();
}

bool TrashFolder::IsTrashOfVolume(std::string_view path) const {
  if (topFolder_.empty() || !path.starts_with(topFolder_)) return false;
  const std::string_view name = path.substr(topFolder_.size());
  return name == ".Trash" || name == ".Trash-" + std::to_string(::geteuid());
}

/// On another volume than the home's the record holds wherever the volume is mounted.
std::string TrashFolder::RecordedPath(std::string_view path) const {
  return std::string(path.starts_with(topFolder_) ? path.substr(topFolder_.size()) : path);
}

TrashFolder::~TrashFolder() {
  if (newFolders_.empty()) return;
  try {
    UpdateFolderSizes();
  } catch (const std::bad_alloc&) {
    // The list is a help for readers, no more.
  }
}

void TrashFolder::NoteFolder(const std::string& name) { newFolders_.push_back(name); }

/// A list for readers that want to say how full the trash is without looking at all of it. They
/// count themselves what is missing there, so that a failure is none.
void TrashFolder::UpdateFolderSizes() const {
  std::vector<FolderSize> sizes;
  for (const std::string& name : newFolders_) {
    struct stat info;
    const Result<TreeSurvey> survey = SurveyTree(files_.Get(), name, SurveyFor::kSize);
    if (!survey || ::fstatat(info_.Get(), InfoName(name).c_str(), &info, 0) != 0) continue;
    sizes.push_back({survey.Value().bytes, info.st_mtim.tv_sec, name});
  }
  const Result<std::string> old = ReadSystemFile(path_ + '/' + kFolderSizes);
  const auto isThere = [&](const std::string& name) {
    return IsThere(info_.Get(), InfoName(name));
  };
  const std::string list = WithFolderSizes(old ? old.Value() : "", sizes, isThere);
  auto file = NewFile::CreateHidden(root_.Get(), kPrivateFile);
  if (!file) return;
  const Status written = WriteBlock(file.Value().Descriptor(), std::as_bytes(std::span(list)));
  if (written) (void)file.Value().Replace(kFolderSizes);
}

}  // namespace orb::platform
