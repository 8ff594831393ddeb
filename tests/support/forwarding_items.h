// SPDX-License-Identifier: MIT
#pragma once

#include "platform/items.h"

namespace orb::test {

/// Passes every question on to the items that were current when it was made. A test derives from it
/// to change a single answer and puts it in place with ScopedItems.
class ForwardingItems : public platform::Items {
 public:
  bool Exists(platform::PathText path) const override { return real_.Exists(path); }
  platform::Result<platform::ItemInfo> Read(platform::PathText path) const override {
    return real_.Read(path);
  }
  platform::Result<platform::ItemRecord> ReadRecord(platform::PathText path) const override {
    return real_.ReadRecord(path);
  }
  platform::Result<platform::Timestamp> AccessTime(platform::PathText path) const override {
    return real_.AccessTime(path);
  }
  platform::Status SetLocked(platform::PathText path, bool locked) const override {
    return real_.SetLocked(path, locked);
  }
  platform::Status SetModified(platform::PathText path, platform::Timestamp time) const override {
    return real_.SetModified(path, time);
  }
  platform::Status SetCreated(platform::PathText path, platform::Timestamp time) const override {
    return real_.SetCreated(path, time);
  }
  platform::Status ReplaceByEmptyFile(platform::PathText path) const override {
    return real_.ReplaceByEmptyFile(path);
  }
  platform::Status CreateEmptyFile(platform::PathText path) const override {
    return real_.CreateEmptyFile(path);
  }
  platform::Status CreateFolders(platform::PathText path,
                                 platform::IfExists ifExists) const override {
    return real_.CreateFolders(path, ifExists);
  }

 private:
  const platform::Items& real_ = platform::Items::Current();
};

}  // namespace orb::test
