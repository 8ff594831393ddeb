// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <string>

#include "platform/error.h"

namespace orb::platform {

/// A file that is written over from its start, in place: what the block does not reach stays as it
/// was.
class FileWriter {
 public:
  /// Opens what is there and never makes a file. Links are followed. kNotPermitted for a locked
  /// file and for what is neither a file nor a folder.
  static Result<FileWriter> Open(const std::string& path);

  FileWriter(FileWriter&&) noexcept;
  FileWriter& operator=(FileWriter&&) = delete;
  FileWriter(const FileWriter&) = delete;
  FileWriter& operator=(const FileWriter&) = delete;
  ~FileWriter();

  /// Writes the whole block and closes the file: once. A file that has to grow and cannot, because
  /// its volume is full, stays as it was.
  Status Write(std::span<const std::byte> block);

 private:
  struct State;
  explicit FileWriter(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

}  // namespace orb::platform
