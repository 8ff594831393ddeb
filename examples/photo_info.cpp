// SPDX-License-Identifier: MIT
// photo_info FILE: what a file handle knows of an item, in one pass.
#include <orb/orb.h>

#include <cstdio>

int main(int argc, char** argv) {
  if (argc != 2) return 2;
  COrbFilePath path;
  const COrbStringData text((OrbCharUtf8(argv[1])));
  path.Initialize(&text);

  const COrbFileHandle item(path);
  COrbStringData name;
  COrbTime modified;
  if (item.GetDisplayName(name) >= kOrbErrFirst || item.GetUpdateTime(&modified) >= kOrbErrFirst) {
    std::fprintf(stderr, "nothing there\n");
    return 1;
  }
  COrbStringData when;
  modified.ConvertToString(&when, false, false);
  std::printf("%s: %llu bytes, %s%s\n",
              name.GetPtrUtf8(),
              static_cast<unsigned long long>(item.GetFileSize()),
              when.GetPtrUtf8(),
              (item.GetAttribute() & kOrbFileAttrLocked) != 0 ? ", locked" : "");
}
