// SPDX-License-Identifier: MIT
#pragma once

#include <orb/fileops/progress.h>
#include <orb/path/file_path.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

#include "fileops/transfer_checks.h"

/// \file
/// The forms of copy and move that take a folder and a name. They are one sequence of steps, and a
/// row of a table says which of them a form takes.

namespace orb {

enum class Work { kCopy, kMove };
/// Whether the source has to be readable or writable.
enum class Source { kAny, kUsable };
/// Whether the folder is refused when its text says that it is the source or lies in it.
enum class Target { kUntested, kTested };
/// What becomes of an item at the destination: it makes the work fail, or it has to go first.
enum class Existing { kKept, kRemoved };

struct TransferForm {
  Work work;
  Source source;
  Target target;
  Existing existing;
  LowSpace lowSpace;
};

namespace form {

using enum Work;
using enum Source;
using enum Target;
using enum Existing;
using enum LowSpace;

// clang-format off
//                                                work   source   target     existing  low space explains
constexpr TransferForm kOrbCopyFile             {kCopy, kAny,    kUntested, kKept,    kUntold};
constexpr TransferForm kOrbCopyFileOverwrite    {kCopy, kAny,    kUntested, kRemoved, kUntold};
constexpr TransferForm kOrbCopyFileOverwriteEx  {kCopy, kUsable, kUntested, kRemoved, kAnything};
constexpr TransferForm kOrbCopyFolder           {kCopy, kAny,    kTested,   kKept,    kNothing};
constexpr TransferForm kOrbCopyFolderEx         {kCopy, kUsable, kTested,   kRemoved, kNothing};
constexpr TransferForm kOrbCopyFolderOverwriteEx{kCopy, kAny,    kTested,   kRemoved, kAnything};
constexpr TransferForm kOrbMoveFile             {kMove, kAny,    kTested,   kKept,    kNothing};
constexpr TransferForm kOrbMoveFileEx           {kMove, kAny,    kTested,   kRemoved, kAnything};
constexpr TransferForm kOrbMoveFileOverwrite    {kMove, kAny,    kTested,   kRemoved, kAnything};
constexpr TransferForm kOrbMoveFileOverwriteEx  {kMove, kAny,    kTested,   kRemoved, kAnything};
// clang-format on

}  // namespace form

/// What a caller asked for.
struct TransferRequest {
  const COrbFilePath& source;
  const COrbFilePath& folder;
  /// Null for the source's own name.
  const COrbStringData* name;
  OrbProgressProc progress = nullptr;
  void* data = nullptr;
  /// Receives the destination on success. May be null, and may be the source or the folder.
  COrbFilePath* result = nullptr;
};

OrbResult Transfer(const TransferForm& form, const TransferRequest& request);

}  // namespace orb
