// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/path/file_path.h>
#include <orb/strings/string_data.h>

#include <cstdint>
#include <vector>

/// \file
/// Paths as text. Nothing here touches the file system or fails. The forms on COrbFilePath work on
/// its full path; an empty one gives an empty text. All may be called from any thread.

/// The text after the last "." anywhere in the path, with it or without: /a/b.tar.gz gives .gz or
/// gz, /a.d/b gives d/b, /a/b gives nothing.
ORB_EXPORT COrbStringData OrbPathFindExtension(const COrbStringData& path, bool includeDot);
ORB_EXPORT COrbStringData OrbPathFindExtension(const COrbFilePath& path, bool includeDot);

/// The text after the last "/", with its extension or without: /a/b.c gives b.c or b, /a/b/ gives
/// nothing, /a/.profile without its extension gives nothing.
ORB_EXPORT COrbStringData OrbPathFindFileName(const COrbStringData& path, bool removeExtension);
ORB_EXPORT COrbStringData OrbPathFindFileName(const COrbFilePath& path, bool removeExtension);

/// Fills `out` with the pieces between separators that are not empty. A path without a separator is
/// one piece. A null `out` does nothing; the form on COrbFilePath leaves `out` alone for an empty
/// path.
ORB_EXPORT void OrbSplitFilePath(const COrbStringData& path, std::vector<COrbStringData>* out);
ORB_EXPORT void OrbSplitFilePath(const COrbFilePath& path, std::vector<COrbStringData>* out);

/// The path with another extension, given with its dot or without; an empty one removes it. The
/// path is rebuilt from its pieces: /a//b.jpg/ with tif gives /a/b.tif, b.c with x gives /b.x.
ORB_EXPORT COrbStringData OrbPathRenameExtension(const COrbStringData& path,
                                                 const COrbStringData& newExtension);
ORB_EXPORT COrbStringData OrbPathRenameExtension(const COrbFilePath& path,
                                                 const COrbStringData& newExtension);

/// The path with another name and its old extension: /a/b.jpg with c gives /a/c.jpg. Rebuilt from
/// its pieces as above.
ORB_EXPORT COrbStringData OrbPathRenameFileName(const COrbStringData& path,
                                                const COrbStringData& newName);
ORB_EXPORT COrbStringData OrbPathRenameFileName(const COrbFilePath& path,
                                                const COrbStringData& newName);

/// Without one trailing "/".
ORB_EXPORT COrbStringData OrbPathRemoveBackslash(const COrbStringData& path);
ORB_EXPORT COrbStringData OrbPathRemoveBackslash(const COrbFilePath& path);
/// With a trailing "/". An empty text gives "/"; an empty COrbFilePath gives an empty text.
ORB_EXPORT COrbStringData OrbPathAddBackslash(const COrbStringData& path);
ORB_EXPORT COrbStringData OrbPathAddBackslash(const COrbFilePath& path);

namespace OrbPathUtility {
/// Negative, 0 or positive. Paths are ordered by their length in UTF-8 bytes first (the result is
/// then the difference) and by their text next; one trailing "/" does not count.
ORB_EXPORT std::int32_t ComparePath(const COrbStringData& a,
                                    const COrbStringData& b,
                                    bool ignoreCase);
}  // namespace OrbPathUtility

ORB_EXPORT std::int32_t OrbPathCompare(const COrbStringData& a, const COrbStringData& b);
ORB_EXPORT std::int32_t OrbPathCompareNoCase(const COrbStringData& a, const COrbStringData& b);

/// Whether a is the same path as b or one of its ancestors, without regard to case. Without
/// `addSeparator` any prefix counts as an ancestor: /a/b of /a/bc.
ORB_EXPORT bool OrbPathIsEqualOrRootActually(const COrbStringData& a,
                                             const COrbStringData& b,
                                             bool addSeparator);

/// Always false: no last character is invalid here. The name is spelled exactly so.
ORB_EXPORT bool OrbPathIsEndofInvalidCharactor(const COrbStringData& path);
