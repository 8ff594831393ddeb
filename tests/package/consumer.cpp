// SPDX-License-Identifier: MIT
// What an application does with the library: include it, link it, use a bit of every subsystem.
#include <orb/orb.h>

#include <cstdio>
#include <string>
#include <vector>

/// Must not make the compiler warn.
static COrbStringData LastOf(const COrbStringData& a, const COrbStringData& b) {
  std::vector<COrbStringData> list(3, a);
  list.push_back(b);
  return list.back();
}

int main(int, char** argv) {
  const COrbStringData path(OrbCharUtf8("/card/DCIM/IMG_0001.CR2"));
  std::vector<COrbStringData> pieces;
  OrbSplitFilePath(path, &pieces);
  COrbTime time;
  COrbFileHandle own;
  const COrbStringData ownPath((OrbCharUtf8(argv[0])));
  own.Initialize(&ownPath);
  const COrbCriticalSection lock;
  lock.Enter();
  lock.Leave();
  const bool right = pieces.size() == 3 && !LastOf(path, pieces[0]).IsEmpty() &&
                     OrbPathFindExtensionType(path, false) == eOrbFileType_Cr2 &&
                     time.Initialize(2026, 11, 22, 9, 30, 5, 0, 0, 0) == kOrbNoErr &&
                     own.GetFileSize() > 0 && OrbIsSubFolder(pieces[0], pieces[0]);
  std::puts(right ? "ok" : "wrong");
  return right ? 0 : 1;
}
