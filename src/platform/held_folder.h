// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "platform/error.h"

namespace orb::platform {

/// A folder that is held open: what is made in it is made in this very folder, whatever becomes of
/// its path meanwhile. May be used from any thread.
class HeldFolder {
 public:
  /// The folder at a path, links followed. kNotPermitted for a locked one.
  static Result<HeldFolder> Open(const std::string& path);
  /// The last of the folders `levels`, which lie one in the other in the folder `base`. Missing
  /// ones are made, with mode 0755 whatever the process's mask. kNotPermitted when one of them is
  /// somebody else's, or open to others; kNoSuchItem when one is a link or no folder; kInvalidName
  /// when one is not the name of an entry. Those above it are made nevertheless.
  static Result<HeldFolder> OpenOrMakeOwn(const std::string& base,
                                          const std::vector<std::string>& levels);

  HeldFolder(HeldFolder&&) noexcept;
  HeldFolder& operator=(HeldFolder&&) = delete;
  HeldFolder(const HeldFolder&) = delete;
  HeldFolder& operator=(const HeldFolder&) = delete;
  ~HeldFolder();

  /// kItemExists when anything is there, also a link that leads nowhere; kInvalidName when it is
  /// not the name of an entry.
  Status CreateEmptyFile(const std::string& name) const;

  /// For the other services of this layer. It stays the folder's.
  int Descriptor() const;

 private:
  struct State;
  explicit HeldFolder(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

/// Removes the folder that OpenOrMakeOwn() would open, with all that it holds, if it is there,
/// under the same conditions for every level and the rules of RemoveItem().
Status RemoveOwnFolder(const std::string& base, const std::vector<std::string>& levels);

}  // namespace orb::platform
