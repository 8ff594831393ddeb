// SPDX-License-Identifier: MIT
#pragma once

#include <sys/types.h>

#include <string>

#include "platform/linux/posix.h"

namespace orb::platform {

/// A name for what is not to be seen before it is complete. Not to be guessed.
std::string RandomHiddenName();

/// What a network or user-space file system has kept back shows when a descriptor is closed. This
/// lets it show while the file can still be dropped or taken back.
Status Flush(int file);

/// A file that is being written and that nobody sees before it is complete: it has no name where
/// the file system can do that, so that it ends with the process, else a hidden one. Unless it is
/// published it goes away with this object.
class NewFile {
 public:
  /// Whether closing the file can show an error that writing to it did not.
  enum class Closing { kMayFail, kCannotFail };

  /// In a folder that must stay open as long as this object lives.
  static Result<NewFile> Create(int folder, mode_t mode) { return Create(folder, mode, mode); }
  /// With another mode where it has a hidden name, under which others might open it.
  static Result<NewFile> Create(int folder, mode_t mode, mode_t hiddenMode);
  /// The same with a hidden name everywhere: a file without a name cannot replace another.
  static Result<NewFile> CreateHidden(int folder, mode_t mode);

  NewFile(NewFile&& other) noexcept = default;
  NewFile& operator=(NewFile&&) = delete;
  NewFile(const NewFile&) = delete;
  NewFile& operator=(const NewFile&) = delete;
  ~NewFile();

  int Descriptor() const { return file_.Get(); }
  /// Gives it its name, once, and never in the place of another item: kItemExists. An error that
  /// only closing shows is found before that.
  Status Publish(const char* name, Closing closing = Closing::kMayFail);
  /// Puts a hidden file in the place of what has the name, once and in one step. A link is replaced
  /// and not written through.
  Status Replace(const char* name);

 private:
  NewFile(int folder, UniqueFd file, std::string hiddenName);

  int folder_;
  UniqueFd file_;
  std::string hiddenName_;  // Empty when it has none.
};

}  // namespace orb::platform
