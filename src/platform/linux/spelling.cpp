// SPDX-License-Identifier: MIT
#include "platform/linux/spelling.h"

#include <fcntl.h>

#include <string_view>

#include "platform/linux/folder_stream.h"
#include "platform/transcode.h"
#include "platform/unicode.h"

namespace orb::platform {
namespace {

bool DifferInCaseOnly(std::string_view a, std::string_view b) {
  const auto unitsA = Utf16FromUtf8(a);
  const auto unitsB = Utf16FromUtf8(b);
  if (a == b || !unitsA || !unitsB) return false;
  return FormOfRun(Form::kFolded, *unitsA) == FormOfRun(Form::kFolded, *unitsB);
}

Result<bool> ListsBoth(int folder, std::string_view a, std::string_view b) {
  constexpr int kFlags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  auto entries = FolderStream::Open(UniqueFd(Retry([&] { return ::openat(folder, ".", kFlags); })));
  if (!entries) return entries.Reason();
  for (int found = 0; found < 2;) {
    const auto entry = entries.Value().Next();
    if (!entry) return entry.Reason();
    const char* const name = entry.Value().name;
    if (name == nullptr) return false;
    found += name == a || name == b ? 1 : 0;
  }
  return true;
}

}  // namespace

Result<bool> IsOneItemInTwoSpellings(const Place& a, const Place& b) {
  if (!DifferInCaseOnly(a.name, b.name)) return false;
  const auto folderA = IdentityOf(a.folder.Get());
  const auto folderB = IdentityOf(b.folder.Get());
  if (!folderA || !folderB) return (folderA ? folderB : folderA).Reason();
  if (folderA.Value() != folderB.Value()) return false;
  const auto both = ListsBoth(a.folder.Get(), a.name, b.name);
  if (!both) return both;
  return !both.Value();
}

}  // namespace orb::platform
