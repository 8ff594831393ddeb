// SPDX-License-Identifier: MIT
#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/rename.h>

#include <optional>
#include <string>

#include "fileinfo/item_path.h"
#include "fileops/failure_diagnosis.h"
#include "fileops/path_in.h"
#include "platform/items.h"
#include "platform/mover.h"
#include "strings/string_access.h"

namespace orb {
namespace {

using platform::Items;

/// The root for what lies in it; empty for a bare name, which stays where it is.
std::string FolderOf(const std::string& path) {
  const std::string item = path.substr(0, path.find_last_not_of('/') + 1);
  const std::size_t slash = item.rfind('/');
  if (slash == std::string::npos) return item.empty() ? "/" : "";
  return slash == 0 ? "/" : item.substr(0, slash);
}

/// Takes an item's lock away while it is moved and puts it back, wherever the item is by then.
class LockPause {
 public:
  explicit LockPause(const std::string& path) : path_(&path) {
    (void)Items::Current().SetLocked(path, false);  // If that fails, moving it will say so.
  }
  ~LockPause() { (void)Items::Current().SetLocked(*path_, true); }
  LockPause(const LockPause&) = delete;
  LockPause& operator=(const LockPause&) = delete;

  void Follow(const std::string& path) { path_ = &path; }

 private:
  const std::string* path_;
};

platform::Status MoveLocked(const std::string& path, const std::string& newPath) {
  LockPause pause(path);
  const platform::Status moved = platform::MoveItem(path, newPath);
  if (moved) pause.Follow(newPath);
  return moved;
}

/// The path as the platform would hand it over.
OrbResult DeliverPlatformText(const COrbStringData& path, COrbFilePath* result) {
  if (result == nullptr) return kOrbNoErr;
  const CFStringRef text = path.CreateCopyCFString();
  const OrbResult delivered = result->Initialize(&text);
  CFRelease(text);
  return delivered;
}

OrbResult Rename(const std::string& path,
                 const std::string& name,
                 bool locked,
                 COrbFilePath* result) {
  const std::string newPath = JoinPath(FolderOf(path), name);
  const COrbStringData newText = StringAccess::FromUtf8(newPath);
  const auto moved = locked ? MoveLocked(path, newPath) : platform::MoveItem(path, newPath);
  if (moved) return DeliverPlatformText(newText, result);
  const COrbStringData text = StringAccess::FromUtf8(path);
  return OrbDiagnoseFailure(moved.Reason(), text, &newText, kOrbOpRename);
}

}  // namespace
}  // namespace orb

OrbResult OrbRenameFile(const COrbFilePath& path,
                        const COrbStringData& name,
                        COrbFilePath* result) {
  const unsigned int attributes = COrbFileHandle(path).GetAttribute();
  if (path.IsEmpty()) return kOrbErrNoSuchFile;
  if ((attributes & kOrbFileAttrWritable) == 0) return kOrbErrAccessDenied;
  const auto item = orb::ItemPath(path.GetFullPath());
  const auto newName = orb::ItemPath(name);
  if (!item || !newName) return kOrbErrInvalidName;
  return orb::Rename(*item, *newName, (attributes & kOrbFileAttrLocked) != 0, result);
}
