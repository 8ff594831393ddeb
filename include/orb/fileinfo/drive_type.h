// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>

/// The kind of drive that an item lies on, as COrbFileHandle::GetDriveType() tells it.
enum eOrbDriveType : std::int32_t {
  /// A local disk that stays where it is; also what is said when nothing can be found out.
  eOrbDriveType_Fixed = 0x100,
  /// A CD, DVD or the like in its drive.
  eOrbDriveType_Optical = 0x200,
  /// A stick, a card or an external disk that the caller may write to.
  eOrbDriveType_Removable = 0x400,
  /// A network volume.
  eOrbDriveType_Remote = 0x800,
  /// A stick, a card or an external disk that is write-protected.
  eOrbDriveType_RemovableReadOnly = 0x1000,
};
