// SPDX-License-Identifier: MIT
#include "fileops/project_folder.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "fileops/path_in.h"
#include "platform/temp_directory.h"
#include "platform/transcode.h"

namespace orb {
namespace {

constexpr std::size_t kLongestName = 255;
constexpr char kTop[] = "Calyx";
constexpr char kInnermost[] = "RTL";

/// In the name a "/" parts levels and "." stands for none.
std::vector<std::string> LevelsOf(std::string_view name) {
  std::vector<std::string> levels = {kTop};
  while (!name.empty()) {
    const std::string_view level = name.substr(0, name.find('/'));
    if (!level.empty() && level != ".") levels.emplace_back(level);
    name.remove_prefix(std::min(name.size(), level.size() + 1));
  }
  levels.emplace_back(kInnermost);
  return levels;
}

bool IsTooLong(const std::string& name) { return name.size() > kLongestName; }

bool LeadsOut(const std::vector<std::string>& levels) {
  return std::ranges::find(levels, "..") != levels.end();
}

}  // namespace

std::string ProjectFolder::Path() const {
  std::string path = base;
  for (const std::string& level : levels) path = JoinPath(path, level);
  return path;
}

OrbResult LocateProjectFolder(const std::string& projectName, ProjectFolder* folder) {
  std::vector<std::string> levels = LevelsOf(projectName);
  const bool isText = platform::Utf16LengthOfUtf8(projectName).has_value();
  if (!isText || IsTooLong(projectName) || LeadsOut(levels)) return kOrbErrInvalidName;
  auto base = platform::TemporaryDirectory();
  if (!base) return kOrbErrAccessDenied;
  *folder = {std::move(base).Value(), std::move(levels)};
  return kOrbNoErr;
}

}  // namespace orb
