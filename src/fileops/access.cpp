// SPDX-License-Identifier: MIT
#include <orb/fileops/access.h>

#include "fileops/path_in.h"

namespace {

bool Has(const COrbFileHandle& item, unsigned int flag) {
  return (item.GetAttribute() & flag) != 0;
}

bool IsWritableByItself(const COrbFileHandle& item) {
  return Has(item, kOrbFileAttrWritable) && !Has(item, kOrbFileAttrLocked);
}

}  // namespace

bool OrbIsDeletable(const COrbFileHandle& item) { return Has(item, kOrbFileAttrVolumeWritable); }

bool OrbIsReadable(const COrbFileHandle& item) { return Has(item, kOrbFileAttrReadable); }

bool OrbIsWritable(const COrbFileHandle& item) {
  COrbFileHandle current = item;
  while (IsWritableByItself(current)) {
    if (Has(current, kOrbFileAttrFolder)) return true;
    if (orb::Failed(current.GetParent(&current))) return false;
  }
  return false;
}
