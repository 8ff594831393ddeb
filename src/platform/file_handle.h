// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "platform/error.h"

namespace orb::platform {

/// An open file that is there already, read or written from its start. It closes itself.
class FileHandle {
 public:
  /// Called on the writing thread. One that throws ends the write; what was written before stays.
  using Handler = std::function<void()>;

  /// Links are followed. Only regular files are read: a pipe or a device would wait, or never end.
  static Result<FileHandle> OpenForReading(const std::string& path);
  /// The file is not cut off. kNotPermitted for a link, a locked file and what is no regular file.
  static Result<FileHandle> OpenForWriting(const std::string& path);

  FileHandle(FileHandle&&) noexcept;
  FileHandle& operator=(FileHandle&&) = delete;
  FileHandle(const FileHandle&) = delete;
  FileHandle& operator=(const FileHandle&) = delete;
  ~FileHandle();

  /// Whether both are one file, under whichever names.
  bool IsSameFile(const FileHandle& other) const;
  /// All bytes to the end. The kernel's ENOMEM when they do not fit into memory.
  Result<std::vector<std::byte>> ReadToEnd();
  /// Called before each piece of up to 64 KiB that is written; an empty one removes it.
  void SetWriteabilityHandler(Handler handler);
  /// Writes all bytes. An error that only closing shows is found here.
  Status Write(std::span<const std::byte> bytes);

 private:
  struct State;
  explicit FileHandle(std::unique_ptr<State> state);
  static Result<FileHandle> Open(const std::string& path, int flags);

  std::unique_ptr<State> state_;
};

}  // namespace orb::platform
