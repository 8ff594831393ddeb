// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include "platform/error.h"

namespace orb::platform {

/// The freedesktop.org trash, so that desktop file managers and trash-cli list and restore what was
/// put there. An object is for one batch of items on one thread: it keeps the trash folders that it
/// has opened, and ends its records when it ends.
///
/// The home trash is $XDG_DATA_HOME/Trash, else .local/share/Trash in $HOME, else in the home
/// folder that the system has for the user. On another volume it is .Trash/UID or .Trash-UID in the
/// volume's top folder, and where neither can be had, or the volume does not let an item be renamed
/// into it, the home trash by copy and removal, if it fits there.
class Trash {
 public:
  Trash();
  ~Trash();
  Trash(const Trash&) = delete;
  Trash& operator=(const Trash&) = delete;

  /// Puts the item itself into the trash: a link is not followed, links on the way to it are. The
  /// volume is that of the folder that holds it. An item that cannot be moved stays, and leaves no
  /// record behind; only a folder whose removal fails half-way after it was copied stays in the
  /// trash as well, complete.
  ///
  /// kNoSuchItem for an empty path and where nothing is; kNotPermitted for a locked item, for one
  /// in a locked folder, for the trash itself and what is in it, and for a path that ends in ".",
  /// ".." or is the root; kBusy for a folder where a volume is mounted, or that holds such a one;
  /// kVolumeFull where a copy does not fit.
  Status Put(const std::string& path);

 private:
  class Batch;
  std::unique_ptr<Batch> batch_;
};

}  // namespace orb::platform
