// SPDX-License-Identifier: MIT
#include "shots.h"

#include <algorithm>
#include <iterator>
#include <map>
#include <tuple>

#include "text.h"

namespace orbimport {
namespace {

/// The groups of types: still images are the two with this bit.
bool IsStill(eOrbFileType type) { return (type & 0x01000000) != 0; }
bool IsMovie(eOrbFileType type) { return (type & 0x02000000) != 0; }

/// What a shot is dated and placed by comes first.
int Rank(eOrbFileType type) {
  switch (type) {
    case eOrbFileType_Rwq:
    case eOrbFileType_Rwc:
    case eOrbFileType_Crw:
    case eOrbFileType_Cr2:
      return 0;
    case eOrbFileType_Jpeg:
      return 1;
    default:
      return IsStill(type) ? 2 : IsMovie(type) ? 3 : 4;
  }
}

struct NameKey {
  std::string folder;
  COrbStringData name;

  bool operator<(const NameKey& other) const {
    if (folder != other.folder) return folder < other.folder;
    return OrbStringDataCmpi(name, other.name) < 0;
  }
};

struct SplitPath {
  std::string folder;
  std::string name;
};

SplitPath Split(const std::string& path) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return {"", path};
  return {path.substr(0, slash), path.substr(slash + 1)};
}

void PutMainFirst(Shot& shot, const std::vector<Item>& items) {
  std::stable_sort(shot.members.begin(), shot.members.end(), [&](const Member& a, const Member& b) {
    return Rank(items[a.item].type) < Rank(items[b.item].type);
  });
}

}  // namespace

Member SplitName(const std::string& name) {
  std::size_t dot = name.rfind('.');
  if (dot == std::string::npos) return {0, name, ""};
  const std::string stem = name.substr(0, dot);
  if (Rank(TypeOfName(name)) == 4 && IsStill(TypeOfName(stem))) dot = stem.rfind('.');
  return {0, name.substr(0, dot), name.substr(dot)};
}

std::vector<Shot> MakeShots(const std::vector<Item>& items) {
  std::vector<Shot> shots;
  // How often a whole name came up so far tells which of the shots with its stem is its own.
  std::map<NameKey, std::size_t> seen;
  std::map<NameKey, std::vector<std::size_t>> shotsOfStem;
  for (std::size_t i = 0; i < items.size(); ++i) {
    const auto [folder, name] = Split(items[i].path);
    Member member = SplitName(name);
    member.item = i;
    std::vector<std::size_t>& own = shotsOfStem[{folder, OrbText(member.stem)}];
    const std::size_t turn = seen[{folder, OrbText(name)}]++;
    if (turn == own.size()) {
      own.push_back(shots.size());
      shots.emplace_back();
    }
    shots[own[turn]].members.push_back(std::move(member));
  }
  for (Shot& shot : shots) PutMainFirst(shot, items);
  return shots;
}

}  // namespace orbimport
