// SPDX-License-Identifier: MIT
// Collects once on the path given, between two system calls that pass_system_calls.sh looks for.
#include <orb/fileinfo/file_handle.h>
#include <unistd.h>

int main(int argc, char** argv) {
  if (argc != 2) return 2;
  const COrbStringData path = OrbCharUtf8(argv[1]);
  COrbFileHandle handle;
  handle.Initialize(&path);
  // The first pass of a process also reads its groups.
  if (handle.Update() != kOrbNoErr) return 1;
  ::getppid();
  const OrbResult result = handle.Update();
  ::getppid();
  return result == kOrbNoErr ? 0 : 1;
}
