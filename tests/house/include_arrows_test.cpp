// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

/// Who may include whom: each subsystem may use itself and what it lists.
const std::map<std::string, std::set<std::string>> kMayUse = {
    {"platform", {}},
    {"thread", {"platform"}},
    {"strings", {"thread", "platform"}},
    {"time", {"strings", "thread", "platform"}},
    {"path", {"strings", "thread", "platform"}},
    {"fileinfo", {"path", "time", "strings", "thread", "platform"}},
    {"fileops", {"fileinfo", "path", "time", "strings", "thread", "platform"}},
    {"records", {"path", "time", "strings", "thread", "platform"}},
};

/// Stands on the platform's errors alone, so the layer below may use it.
constexpr const char* kErrorMapping = "fileops/error_mapping.h";

std::vector<std::string> Includes(const fs::path& file) {
  static const std::regex kLine(R"(^\s*#\s*include\s*[<"]([^>"]+)[>"])");
  std::vector<std::string> names;
  std::ifstream in(file);
  std::smatch match;
  for (std::string line; std::getline(in, line);) {
    if (std::regex_search(line, match, kLine)) names.push_back(match[1]);
  }
  return names;
}

/// "strings" for orb/strings/x.h and strings/x.h; nothing for any other header.
std::string SubsystemOf(std::string header) {
  if (header.starts_with("orb/")) header.erase(0, 4);
  const std::string folder = header.substr(0, header.find('/'));
  return header.find('/') != std::string::npos && kMayUse.contains(folder) ? folder : "";
}

/// Headers that only a Unix has. C++ headers and ICU's have other names.
bool IsSystemHeader(const std::string& header) {
  static const std::regex kSystem(
      R"(^(sys|linux|asm|net|netinet|arpa)/|^(unistd|fcntl|dirent|pthread|semaphore|poll|signal|time|errno|pwd|grp|mntent|sched|dlfcn|ftw|glob|termios|utime)\.h$)");
  return std::regex_search(header, kSystem);
}

bool MayIncludeSystemHeaders(const std::string& file) {
  return file.find("platform/linux/") != std::string::npos || file.ends_with("_linux.cpp") ||
         file.find("/thread/") != std::string::npos;
}

template <typename Visit>
int VisitSources(Visit visit) {
  int count = 0;
  for (const char* root : {"/include/orb", "/src"}) {
    for (const auto& entry : fs::recursive_directory_iterator(std::string(ORB_SOURCE_DIR) + root)) {
      const std::string extension = entry.path().extension();
      if (extension != ".h" && extension != ".cpp") continue;
      const std::string relative = fs::relative(entry.path(), std::string(ORB_SOURCE_DIR) + root);
      visit(entry.path(), relative);
      ++count;
    }
  }
  return count;
}

TEST(IncludeArrows, NeverTurnBack) {
  const int files = VisitSources([](const fs::path& path, const std::string& relative) {
    const std::string own = SubsystemOf(relative);
    if (own.empty()) return;
    const bool isErrorMapping = relative.starts_with("fileops/error_mapping.");
    for (const std::string& header : Includes(path)) {
      const std::string used = SubsystemOf(header);
      if (used.empty() || header == kErrorMapping) continue;
      EXPECT_TRUE(used == own || kMayUse.at(own).contains(used)) << relative << " uses " << header;
      EXPECT_TRUE(!isErrorMapping || used == "platform") << relative << " uses " << header;
    }
  });
  EXPECT_GT(files, 30);
}

TEST(IncludeArrows, SystemHeadersStayInThePlatformLayer) {
  VisitSources([](const fs::path& path, const std::string& relative) {
    if (MayIncludeSystemHeaders("/" + relative)) return;
    for (const std::string& header : Includes(path)) {
      EXPECT_FALSE(IsSystemHeader(header)) << relative << " includes " << header;
    }
  });
}

TEST(IncludeArrows, OneHeaderBringsTheWholeInterface) {
  const fs::path root = std::string(ORB_SOURCE_DIR) + "/include";
  std::set<std::string> brought;
  for (const std::string& header : Includes(root / "orb/orb.h")) brought.insert(header);
  for (const auto& entry : fs::recursive_directory_iterator(root)) {
    const std::string header = fs::relative(entry.path(), root);
    if (entry.is_regular_file() && header != "orb/orb.h") {
      EXPECT_TRUE(brought.contains(header)) << header;
    }
  }
}

}  // namespace
