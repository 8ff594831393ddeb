// SPDX-License-Identifier: MIT
#pragma once

#include <orb/export.h>
#include <orb/result.h>
#include <orb/strings/string_data.h>

#include <cstdint>
#include <vector>

/// What a file is by its extension: 0x011000nn and 0x012000nn still images, 0x020000nn movies,
/// 0x080000nn other files.
enum eOrbFileType : std::int32_t {
  eOrbFileType_Unknown = 0x00000000,
  eOrbFileType_Jpeg = 0x01100001,
  eOrbFileType_Tiff = 0x01100002,
  eOrbFileType_Rwq = 0x01100003,
  eOrbFileType_Rwc = 0x01100004,
  eOrbFileType_Mpo = 0x01100005,
  eOrbFileType_Pict = 0x01200001,
  eOrbFileType_Png = 0x01200002,
  eOrbFileType_Bmp = 0x01200003,
  eOrbFileType_Crw = 0x01200004,
  eOrbFileType_Cr2 = 0x01200005,
  eOrbFileType_Mov = 0x02000001,
  eOrbFileType_Mpeg = 0x02000002,
  eOrbFileType_Mp4 = 0x02000003,
  eOrbFileType_Wmv = 0x02000004,
  eOrbFileType_Avi = 0x02000005,
  eOrbFileType_Rwv = 0x02000006,
  eOrbFileType_Wav = 0x08000001,
  eOrbFileType_Txt = 0x08000002,
  eOrbFileType_Csv = 0x08000003,
  eOrbFileType_Dsq = 0x08000004,
  eOrbFileType_Xmp = 0x08000005,
  eOrbFileType_Pqf = 0x08000006,
  eOrbFileType_Log = 0x08000007,
  eOrbFileType_Lga = 0x08000008,
  eOrbFileType_Lgb = 0x08000009,
  eOrbFileType_Sdcq = 0x08000010,
};

/// The type of an extension given with its dot, without regard to case; eOrbFileType_Unknown for
/// any other text. May be called from any thread.
ORB_EXPORT eOrbFileType OrbPathConvertExtensionToType(const COrbStringData& extension);

/// Replaces `extensions` by those of the type, with their dots, in alphabetical order.
/// kOrbErrNotFound for a type that has none; `extensions` then stays as it was.
ORB_EXPORT OrbResult OrbPathFindTypeExtension(eOrbFileType type,
                                              std::vector<COrbStringData>& extensions);
