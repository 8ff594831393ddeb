// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <memory>
#include <span>
#include <string>

#include "platform/error.h"

namespace orb::platform {

/// A file that is read from its start. Links are followed. Only regular files are read: a pipe or a
/// device would wait, or never end.
class InputStream {
 public:
  static Result<InputStream> Open(const std::string& path);

  InputStream(InputStream&&) noexcept;
  InputStream& operator=(InputStream&&) = delete;
  InputStream(const InputStream&) = delete;
  InputStream& operator=(const InputStream&) = delete;
  ~InputStream();

  /// Fills the block as far as the file goes; 0 at the end.
  Result<std::size_t> Read(std::span<std::byte> block);

 private:
  friend class OutputStream;
  struct State;
  explicit InputStream(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

/// A file that is written to at its end. Until Finish() succeeds everything it does can be undone,
/// and is when it goes away: a file that was there has its former length and times again, one that
/// was not is not made. A new file gets its name at the end, so that it is complete or absent, also
/// when the process is killed; an older one grows in place.
class OutputStream {
 public:
  /// A link at the path is not written through: kNotPermitted, as for a locked file, for a new file
  /// in a locked folder, and for what is not a regular file. kInvalidName for a path that ends in
  /// "/".
  static Result<OutputStream> Append(const std::string& path);

  OutputStream(OutputStream&&) noexcept;
  OutputStream& operator=(OutputStream&&) = delete;
  OutputStream(const OutputStream&) = delete;
  OutputStream& operator=(const OutputStream&) = delete;
  ~OutputStream();

  /// Whether both are one file, under whichever names.
  bool Writes(const InputStream& source) const;
  /// Writes the whole block.
  Status Write(std::span<const std::byte> block);
  /// kItemExists when somebody else made the file meanwhile.
  Status Finish();
  /// Takes everything back now. Whether the path still leads to the file that was there before:
  /// false when there was none, or somebody has put another in its place.
  bool Undo();

 private:
  struct State;
  explicit OutputStream(std::unique_ptr<State> state);
  std::unique_ptr<State> state_;
};

}  // namespace orb::platform
