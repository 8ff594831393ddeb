// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <filesystem>
#include <set>

#include "support/temp_folder.h"
#include "text.h"

namespace orbimport {
namespace {

namespace fs = std::filesystem;
using Names = std::set<std::string>;

TEST(Rename, TakesAWholeShotAlongOrNothing) {
  const Names there = {
      "I.CR2", "I.CR2.xmp", "I.JPG", "i.wav", "I_1.JPG", "I.exe", "K.JPG", "k2.xmp"};
  const Names renamed = {
      "A.CR2", "A.CR2.xmp", "A.JPG", "A.wav", "I_1.JPG", "I.exe", "K.JPG", "k2.xmp"};
  const std::tuple<const char*, int, const Names&> kCases[] = {
      {"I.CR2 A", 0, renamed},
      {"$PWD/i.wav A.wav", 0, renamed},
      {"-n I.CR2 A", 0, there},
      {"I.CR2 B", 1, there},  // A folder is B.wav, so the others go back.
      {"I.JPG k", 1, there},  // No name is taken, but I.CR2 is not K's.
      {"I.JPG K2", 1, there},
      {"I.exe A", 1, there},
      {"gone.JPG A", 1, there},
      {"I.JPG ../A", 2, there},
      {"I.JPG .A", 2, there},
      {"I.JPG ''", 2, there},
      {"I.JPG", 2, there},
  };
  for (const auto& [args, exitCode, after] : kCases) {
    SCOPED_TRACE(args);
    const orb::test::TempFolder folder;
    for (const std::string& name : there) folder.Write(name, name);
    fs::create_directory(folder / "B.wav");
    COrbFileHandle locked(OrbPath(folder / "I.JPG"));
    const bool locks = locked.SetAttribute(kOrbFileAttrLocked) < kOrbErrFirst;
    const std::string command = "cd " + folder.Path() + " && " + ORB_RENAME + " " + args;
    EXPECT_EQ(WEXITSTATUS(std::system((command + " >/dev/null 2>&1").c_str())), exitCode);
    Names names;
    for (const auto& entry : fs::directory_iterator(folder.Path())) {
      const std::string name = entry.path().filename();
      if (!entry.is_directory()) names.insert(name);
      COrbFileHandle file(OrbPath(entry.path()));
      EXPECT_EQ((file.GetAttribute() & kOrbFileAttrLocked) != 0,
                locks && (name == "I.JPG" || name == "A.JPG"));
      file.SetAttribute(0);
    }
    EXPECT_EQ(names, after);
  }
}

}  // namespace
}  // namespace orbimport
