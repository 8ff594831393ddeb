// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "platform/linux/place.h"
#include "platform/linux/posix.h"
#include "platform/trash_text.h"

namespace orb::platform {

/// One trash folder, open. It belongs to the caller, as do the folders in it.
class TrashFolder {
 public:
  /// Makes what is missing. kNotPermitted for one that is somebody else's, or has a link in the
  /// place of "files" or "info".
  static Result<TrashFolder> OpenHome(const std::string& path);
  /// That of a volume, by its top folder: .Trash/UID where .Trash is a real folder with the sticky
  /// bit, else .Trash-UID; neither of them a link.
  static Result<TrashFolder> OpenAt(const std::string& topFolder);

  TrashFolder(TrashFolder&&) noexcept = default;
  TrashFolder& operator=(TrashFolder&&) = delete;
  TrashFolder(const TrashFolder&) = delete;
  TrashFolder& operator=(const TrashFolder&) = delete;
  /// Records the sizes of the folders that were put in.
  ~TrashFolder();

  /// Finds a name for an item of this name and resolved path, and records it; `move` brings the
  /// item to the name or answers kItemExists, and the next name is tried. Gives the name. On any
  /// other failure the record goes away again.
  Result<std::string> TakeIn(const std::string& name,
                             std::string_view path,
                             const std::function<Status(const std::string& name)>& move);
  /// For `move`: renames an entry of an open folder, never over another.
  Status RenameIn(int folder, const std::string& entry, const std::string& name) const;
  /// The same with a copy, as CopyAcross() makes it.
  Status CopyIn(int folder, const std::string& entry, const std::string& name) const;
  /// Removes what was copied in, with its record.
  void Drop(const std::string& name) const;

  /// To be called for a folder that was put in under this name.
  void NoteFolder(const std::string& name);

  /// Whether it is this trash folder, or the folder in it that has the items or the records.
  bool IsPart(const Identity& folder) const;
  /// Whether it is one of these or a folder above; also when nobody can tell.
  bool IsPartOrAbove(const Identity& folder) const;
  /// Whether the path is that of a trash folder in the top folder of this volume.
  bool IsTrashOfVolume(std::string_view path) const;
  /// Where an item of this name is.
  std::string PathOf(const std::string& name) const { return path_ + "/files/" + name; }

 private:
  TrashFolder() = default;
  static Result<TrashFolder> Open(UniqueFd root, std::string path, std::string topFolder);
  std::string RecordedPath(std::string_view path) const;
  Result<std::string> Record(const std::string& name, const std::string& text, unsigned& number);
  void Forget(const std::string& name) const;
  void UpdateFolderSizes() const;

  std::string path_;
  std::string topFolder_;  // Ends in "/"; empty for the home trash.
  UniqueFd root_;
  UniqueFd files_;
  UniqueFd info_;
  std::vector<Identity> parts_;
  std::map<std::string, unsigned, std::less<>> lastNumbers_;  // Of names that were taken.
  std::vector<std::string> newFolders_;
};

}  // namespace orb::platform
