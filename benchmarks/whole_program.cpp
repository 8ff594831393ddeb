// SPDX-License-Identifier: MIT
// What a program of the library's does in the place of cp -a and rm -rf:
//   whole_program copy SOURCE FOLDER NAME
//   whole_program remove PATH
#include <orb/orb.h>

#include <string_view>

namespace {

COrbFilePath PathOf(const char* utf8) {
  const COrbStringData text = OrbCharUtf8(utf8);
  COrbFilePath path;
  path.Initialize(&text);
  return path;
}

OrbResult Copy(const char* source, const char* folder, const char* name) {
  return OrbCopyFile(PathOf(source), PathOf(folder), OrbCharUtf8(name), nullptr);
}

}  // namespace

int main(int count, char** arguments) {
  const std::string_view what = count > 2 ? arguments[1] : "";
  OrbResult result = kOrbErrUnknown;
  if (what == "copy" && count == 5) result = Copy(arguments[2], arguments[3], arguments[4]);
  if (what == "remove" && count == 3) result = OrbRemoveFileRecursive(PathOf(arguments[2]));
  return result < kOrbErrFirst ? 0 : 1;
}
