// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/platform/core_foundation.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

/// The full path of a file or folder, "/"-separated and kept exactly as it was set. Nothing is
/// normalised and nothing is looked up until it is asked for. An empty path means no file.
/// Different objects may be used on different threads; sharing one needs the caller's own lock.
// Assignment is virtual, so there is one alone.
// NOLINTNEXTLINE(cppcoreguidelines-special-member-functions)
class ORB_EXPORT COrbFilePath {
 public:
  COrbFilePath() = default;
  COrbFilePath(const COrbFilePath& other);
  /// Leaves the other path empty, through its Free().
  COrbFilePath(COrbFilePath&& other) noexcept;
  // The virtual operations keep their order: callers are compiled against it.
  virtual ~COrbFilePath();

  /// Goes through Initialize(), so that a derived class forgets what it knew of the old path.
  virtual COrbFilePath& operator=(const COrbFilePath& other);
  /// Makes the path empty.
  virtual void Free();
  virtual bool IsEmpty() const;
  /// Takes the text as it is, after Free(). `fullPath` must not be null. Always 0.
  virtual OrbResult Initialize(const COrbStringData* fullPath);

  /// The path of a referenced item. kOrbErrNoSuchFile when it does not fit into 2047 bytes; the
  /// path is then empty.
  OrbResult Initialize(const FSRef* reference);
  /// A null string and one that has no UTF-8 form give an empty path; an unpaired surrogate becomes
  /// U+FFFD. Always 0.
  OrbResult Initialize(const CFStringRef* fullPath);
  OrbResult Initialize(const CFURLRef& url);

  COrbStringData GetFullPath() const;
  /// A reference holds the absolute path without separators at its end, links in it as they are.
  /// kOrbErrNotFound when nothing exists there (a link that leads nowhere does not exist), also for
  /// an empty path; `reference` is then untouched.
  OrbResult GetFSRef(FSRef* reference) const;
  /// A new CFURL that the caller releases.
  CFURLRef CreateCopyCFURL() const;

  /// Puts the folder that holds this item into `parent`, ignoring one trailing "/". `parent` may be
  /// this path. It stays as it was on failure: kOrbErrEmptyPath for an empty path,
  /// kOrbErrNoSuchFile for the root and for a bare name, neither of which has a parent,
  /// kOrbErrNotFound when the text has no UTF-8 form, and for a null `parent`.
  OrbResult GetParent(COrbFilePath* parent) const;

 private:
  friend class COrbFileHandle;

  COrbStringData path;
};

/// The path of a referenced item as text. kOrbErrNoSuchFile when it does not fit into 2047 bytes;
/// `out` is then untouched.
ORB_EXPORT OrbResult OrbFSRefToFullPath(const FSRef& reference, COrbStringData* out);

/// The path's own IsEmpty() and Free().
ORB_EXPORT bool OrbIsPathEmpty(const COrbFilePath& path);
ORB_EXPORT void OrbClearPath(COrbFilePath* path);
