// SPDX-License-Identifier: MIT
#include "path/file_types.h"

#include <gtest/gtest.h>
#include <orb/strings/string_functions.h>

#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "support/texts.h"

namespace {

using Texts = std::vector<std::string>;

eOrbFileType TypeOf(const std::string& extension) {
  return OrbPathConvertExtensionToType(S(extension));
}

/// "old" where the list was left alone.
Texts ExtensionsOf(std::uint32_t type, OrbResult result) {
  std::vector<COrbStringData> found{S("old")};
  EXPECT_EQ(OrbPathFindTypeExtension(static_cast<eOrbFileType>(type), found), result);
  Texts texts;
  for (const COrbStringData& extension : found) texts.push_back(Text(extension));
  return texts;
}

TEST(FileType, GoesBothWays) {
  const std::pair<std::uint32_t, Texts> kTypes[] = {
      {0x01100001, {".jpeg", ".jpg"}}, {0x01100002, {".tif", ".tiff"}},
      {0x01100003, {".rwq"}},          {0x01100004, {".rwc"}},
      {0x01100005, {".mpo"}},          {0x01200001, {".pct", ".pict"}},
      {0x01200002, {".png"}},          {0x01200003, {".bmp"}},
      {0x01200004, {".crw"}},          {0x01200005, {".cr2"}},
      {0x02000001, {".mov"}},          {0x02000002, {".mpeg", ".mpg"}},
      {0x02000003, {".mp4"}},          {0x02000004, {".wmv"}},
      {0x02000005, {".avi"}},          {0x02000006, {".rwv"}},
      {0x08000001, {".wav"}},          {0x08000002, {".txt"}},
      {0x08000003, {".csv"}},          {0x08000004, {".dsq"}},
      {0x08000005, {".xmp"}},          {0x08000006, {".pqf"}},
      {0x08000007, {".log"}},          {0x08000008, {".lga"}},
      {0x08000009, {".lgb"}},          {0x08000010, {".sdcq"}},
  };
  for (const auto& [type, extensions] : kTypes) {
    EXPECT_EQ(ExtensionsOf(type, kOrbNoErr), extensions);
    for (const std::string& extension : extensions) {
      const std::string upper = Text(OrbStringDataUpper(S(extension)));
      EXPECT_EQ(TypeOf(extension), type) << extension;
      EXPECT_EQ(orb::FileTypeOfName("a.b" + upper), type) << upper;
    }
  }
  for (const std::uint32_t none : {0u, 1u, 0x0800000Au, 0xFFFFFFFFu}) {
    EXPECT_EQ(ExtensionsOf(none, kOrbErrNotFound), Texts{"old"});
  }
}

TEST(FileType, OfOtherTextsIsUnknown) {
  EXPECT_EQ(OrbPathConvertExtensionToType(COrbStringData()), eOrbFileType_Unknown);
  std::istringstream texts(
      ". jpg ..jpg .jp .jpgx .jpegs .d/b .jpgjpg .JP\xC7\xA6 .jpg\xFF \xFF .jpg\xCC\x81 "
      "\xEF\xBC\x8Ejpg");
  for (std::string text; texts >> text;) EXPECT_EQ(TypeOf(text), eOrbFileType_Unknown) << text;
  EXPECT_EQ(TypeOf(""), eOrbFileType_Unknown);
}

TEST(FileType, OfANameIsThatOfItsLastPart) {
  EXPECT_EQ(TypeOf(".TI\xEF\xAC\x80"), eOrbFileType_Tiff);  // Full folding: the ligature ff.
  EXPECT_EQ(orb::FileTypeOfName("x.D\xC5\xBFQ"), eOrbFileType_Dsq);  // The long s.
  EXPECT_EQ(orb::FileTypeOfName("\xC3\xA9.tif.JPG"), eOrbFileType_Jpeg);
  for (const char* name : {"", "jpg", "a.jpg.", "a.jpg/b"}) {
    EXPECT_EQ(orb::FileTypeOfName(name), eOrbFileType_Unknown) << name;
  }
}

}  // namespace
