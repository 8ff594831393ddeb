// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/items.h"

namespace orb::test {

/// Passes every question on to the items that were current when it was made. A test derives from it
/// to change a single answer and puts it in place with ScopedItems.
class ForwardingItems : public platform::Items {
 public:
  bool Exists(const std::string& path) const override { return real_.Exists(path); }
  platform::Result<platform::ItemInfo> Read(const std::string& path) const override {
    return real_.Read(path);
  }
  platform::Result<platform::ItemRecord> ReadRecord(const std::string& path) const override {
    return real_.ReadRecord(path);
  }
  platform::Result<platform::Timestamp> AccessTime(const std::string& path) const override {
    return real_.AccessTime(path);
  }
  platform::Status SetLocked(const std::string& path, bool locked) const override {
    return real_.SetLocked(path, locked);
  }
  platform::Status SetModified(const std::string& path, platform::Timestamp time) const override {
    return real_.SetModified(path, time);
  }
  platform::Status SetCreated(const std::string& path, platform::Timestamp time) const override {
    return real_.SetCreated(path, time);
  }
  platform::Status ReplaceByEmptyFile(const std::string& path) const override {
    return real_.ReplaceByEmptyFile(path);
  }
  platform::Status CreateEmptyFile(const std::string& path) const override {
    return real_.CreateEmptyFile(path);
  }
  platform::Status CreateFolders(const std::string& path,
                                 platform::IfExists ifExists) const override {
    return real_.CreateFolders(path, ifExists);
  }

 private:
  const platform::Items& real_ = platform::Items::Current();
};

}  // namespace orb::test
