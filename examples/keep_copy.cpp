// SPDX-License-Identifier: MIT
// keep_copy FILE FOLDER: copies a file under a name that collides with nothing, counting the bytes.
#include <orb/orb.h>

#include <cstdio>

namespace {

bool CountPiece(void* pieces) {
  ++*static_cast<unsigned long*>(pieces);
  return true;  // false would cancel, and nothing would be left behind
}

COrbFilePath Path(const char* utf8) {
  COrbFilePath path;
  const COrbStringData text((OrbCharUtf8(utf8)));
  path.Initialize(&text);
  return path;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 3) return 2;
  const COrbFilePath source = Path(argv[1]);
  const COrbFilePath folder = Path(argv[2]);
  COrbStringData name;
  OrbGetFileNameFromPath(source, &name);

  COrbFilePath reserved;
  OrbResult result = kOrbErrNoSuchFile;  // The copy would not complain of a source that is missing.
  if (COrbFileHandle(source).IsExist()) result = OrbCreateUniqueFile(folder, name, &reserved);
  unsigned long pieces = 0;
  if (result < kOrbErrFirst) {
    OrbGetFileNameFromPath(reserved, &name);
    result = OrbCopyFileEx(source, folder, name, CountPiece, &pieces);
  }
  if (result >= kOrbErrFirst) {
    OrbDeleteFile(reserved);
    std::fprintf(stderr, "failed: 0x%x\n", result);
    return 1;
  }
  std::printf("%s in %lu pieces\n", reserved.GetFullPath().GetPtrUtf8(), pieces);
}
