// SPDX-License-Identifier: MIT
#include <getopt.h>

#include <algorithm>
#include <exception>
#include <filesystem>
#include <iostream>
#include <string>
#include <utility>
#include <vector>

#include "options.h"
#include "shots.h"
#include "text.h"

namespace orbimport {
namespace {

constexpr char kRenameHelp[] =
    R"(Usage: orb-rename [options] PHOTO NAME

Gives a photo another name in its folder, together with all that belongs to it:
IMG_1.CR2, IMG_1.JPG and IMG_1.CR2.xmp become NAME.CR2, NAME.JPG and NAME.CR2.xmp.
Locks and times stay, and nothing is ever replaced: when another photo has the name,
all files keep those that they have.

Options:
  -n, --dry-run         print what would be done and do nothing
  -h, --help            print this text
  -V, --version         print the version

Exit status: 0 all done, 1 nothing was renamed, 2 wrong usage.
)";

enum ExitCode : int { kDone = 0, kFailed = 1, kUsage = 2 };

constexpr option kLongOptions[] = {{"dry-run", no_argument, nullptr, 'n'},
                                   {"help", no_argument, nullptr, 'h'},
                                   {"version", no_argument, nullptr, 'V'},
                                   {nullptr, 0, nullptr, 0}};

using NewNames = std::vector<std::pair<std::string, std::string>>;  // From, to.

int Complain(int exitCode, const std::string& what) {
  std::cerr << "orb-rename: " << what << '\n';
  if (exitCode == kUsage) std::cerr << "Try 'orb-rename --help'.\n";
  return exitCode;
}

OrbResult Rename(const std::string& folder, const std::string& from, const std::string& to) {
  return OrbRenameFile(OrbPath(folder + "/" + from), OrbText(to), nullptr);
}

bool IsSameText(const std::string& a, const std::string& b) {
  return OrbStringDataCmpi(OrbText(a), OrbText(b)) == 0;
}

/// The new names of the files of the photo's shot. False when another shot has the new one.
bool FindNames(const std::string& folder, const Member& photo, std::string stem, NewNames& names) {
  // Anna.CR2 is meant as Anna is, for IMG_1.CR2.
  if (const Member given = SplitName(stem); IsSameText(given.tail, photo.tail)) stem = given.stem;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    const std::string name = entry.path().filename().string();
    if (entry.is_directory() || !IsUtf8(name) || TypeOfName(name) == eOrbFileType_Unknown) continue;
    const Member member = SplitName(name);
    const bool isOfShot = IsSameText(member.stem, photo.stem);
    if (!isOfShot && IsSameText(member.stem, stem)) return false;
    if (isOfShot && name != stem + member.tail) names.emplace_back(name, stem + member.tail);
  }
  std::ranges::sort(names);
  return true;
}

/// Renames all or, as far as it can, none.
int RenameAll(const std::string& folder, const NewNames& names) {
  for (std::size_t i = 0; i < names.size(); ++i) {
    const OrbResult code = Rename(folder, names[i].first, names[i].second);
    if (code < kOrbErrFirst) continue;
    Complain(kFailed, CodeName(code) + " " + Quote(names[i].first) + ": " + CodeMeaning(code));
    while (i-- > 0) {
      if (Rename(folder, names[i].second, names[i].first) >= kOrbErrFirst)
        Complain(kFailed, "stays renamed: " + Quote(names[i].second));
    }
    return kFailed;
  }
  return kDone;
}

int Run(const std::string& path, const std::string& name, bool dryRun) {
  const std::size_t slash = path.rfind('/');
  const std::string folder = slash == std::string::npos ? "." : path.substr(0, slash + 1);
  if (!IsUtf8(path) || !IsUtf8(name) || name.find('/') < name.size() || name.find('.') == 0)
    return Complain(kUsage, "no name for a photo: " + Quote(name));
  if (TypeOfName(path) == eOrbFileType_Unknown || !COrbFileHandle(OrbPath(path)).IsExist())
    return Complain(kFailed, "no photo: " + Quote(path));
  NewNames names;
  if (!FindNames(folder, SplitName(path.substr(slash + 1)), name, names))
    return Complain(kFailed, "another photo has the name " + Quote(name));
  if (!dryRun && RenameAll(folder, names) != kDone) return kFailed;
  for (const auto& [from, to] : names) std::cout << Quote(from) << " -> " << Quote(to) << '\n';
  return kDone;
}

int Print(const char* text) { return std::cout << text << std::flush ? kDone : kFailed; }

int Main(int argc, char** argv) {
  bool dryRun = false;
  for (int found; (found = getopt_long(argc, argv, ":nhV", kLongOptions, nullptr)) != -1;) {
    if (found == 'h') return Print(kRenameHelp);
    if (found == 'V') return Print("orb-rename " ORB_VERSION "\n");
    if (found != 'n') return Complain(kUsage, ComplaintOf(found, argv));
    dryRun = true;
  }
  if (argc - optind != 2 || *argv[optind + 1] == '\0')
    return Complain(kUsage, "PHOTO and NAME are needed");
  return Run(argv[optind], argv[optind + 1], dryRun);
}

}  // namespace
}  // namespace orbimport

int main(int argc, char** argv) {
  try {
    return orbimport::Main(argc, argv);
  } catch (const std::exception& error) {
    std::cerr << "orb-rename: " << error.what() << '\n';
    return 1;
  }
}
