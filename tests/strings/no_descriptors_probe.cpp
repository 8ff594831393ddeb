// SPDX-License-Identifier: MIT
// Reads texts in a process that cannot open the Unicode data, and again when it can. A program of
// its own, because those of the unit tests are linked to that data.
#include <orb/strings/string_functions.h>
#include <orb/thread/thread.h>

#include <cstdio>

#include "support/resource_limit.h"

namespace {

int Failed(const char* what) {
  std::fprintf(stderr, "failed: %s\n", what);
  return 1;
}

}  // namespace

int main() {
  const COrbStringData composed{OrbCharUtf8("\xE3\x81\x82 \xC3\x89.JPG")};
  const COrbStringData decomposed{OrbCharUtf8("\xE3\x81\x82 E\xCC\x81.jpg")};
  {
    const orb::test::ResourceLimit none(RLIMIT_NOFILE, 0);
    if (composed.GetLengthChar() != 7) return Failed("length");
    if (OrbStringDataCmpi(composed, OrbStringDataLower(composed)) != 0) return Failed("ASCII case");
  }
  OrbSleep(1100);
  const COrbStringData again{composed.GetCharPlatform()};
  if (OrbStringDataCmpi(again, decomposed) != 0) return Failed("canonical equivalence");
  return 0;
}
