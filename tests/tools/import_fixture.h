// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <ctime>
#include <filesystem>
#include <functional>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "clearing.h"
#include "importer.h"
#include "support/temp_folder.h"

namespace orbimport {

namespace fs = std::filesystem;
using orb::test::ReadAll;
using orb::test::TempFolder;

constexpr std::time_t kMayFirst = 1714557600;  // 2024-05-01 10:00:00 UTC.

inline void SetTime(const std::string& path, std::time_t seconds) {
  const timespec times[2] = {{seconds, 250'000'000}, {seconds, 250'000'000}};
  ASSERT_EQ(::utimensat(AT_FDCWD, path.c_str(), times, AT_SYMLINK_NOFOLLOW), 0);
}

inline std::time_t TimeOf(const std::string& path) {
  struct stat status = {};
  EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
  return status.st_mtime;
}

/// Bytes that differ from file to file and from place to place.
inline std::string Bytes(std::size_t count, unsigned seed) {
  std::string bytes(count, '\0');
  for (char& c : bytes) c = static_cast<char>((seed = seed * 1664525 + 1013904223) >> 24);
  return bytes;
}

struct Ended {
  int exitCode = -1;  // -1 for a process that a signal killed.
  std::string out, err;
};

/// A card, a destination and the tool between them, in UTC.
class Import : public testing::Test {
 protected:
  std::string Card(const std::string& name) const { return folder_ / ("card/" + name); }
  std::string Photos(const std::string& name = "") const { return folder_ / ("photos/" + name); }

  std::string Put(const std::string& name, const std::string& bytes, std::time_t time = kMayFirst) {
    const std::string path = Card(name);
    fs::create_directories(fs::path(path).parent_path());
    folder_.Write("card/" + name, bytes);
    SetTime(path, time);
    return path;
  }

  pid_t Start(
      std::vector<std::string> args, const std::function<void()>& prepare = [] {}) {
    args.insert(args.begin(), ORB_IMPORT);
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    const pid_t child = ::fork();
    if (child != 0) return child;
    ::setenv("TZ", "UTC0", 1);
    ::setenv("XDG_DATA_HOME", (folder_ / "data").c_str(), 1);  // Where the home trash is.
    constexpr int kFlags = O_WRONLY | O_CREAT | O_TRUNC;
    ::dup2(::open((folder_ / "out").c_str(), kFlags, 0644), STDOUT_FILENO);
    ::dup2(::open((folder_ / "err").c_str(), kFlags, 0644), STDERR_FILENO);
    prepare();
    ::execv(ORB_IMPORT, argv.data());
    ::_exit(127);
  }

  Ended Wait(pid_t child) {
    int status = 0;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1,
            ReadAll(folder_ / "out"),
            ReadAll(folder_ / "err")};
  }

  Ended Run(const std::vector<std::string>& options = {}) {
    std::vector<std::string> args = options;
    args.insert(args.end(), {folder_ / "card", folder_ / "photos"});
    return Wait(Start(args));
  }

  /// What is below the destination, or another folder: the files' paths, each with its bytes.
  std::map<std::string, std::string> Tree(const std::string& folder = "photos") const {
    std::map<std::string, std::string> tree;
    const std::string root = folder_ / folder;
    if (!fs::exists(root)) return tree;
    for (const auto& entry : fs::recursive_directory_iterator(root)) {
      if (entry.is_directory()) continue;
      tree[entry.path().lexically_relative(root).string()] = ReadAll(entry.path().string());
    }
    return tree;
  }

  TempFolder folder_;
};

using Files = std::map<std::string, std::string>;

/// The journal stands from before the first file is made until all are whole.
inline void WaitUntilUnderWay(pid_t child, const std::string& journal) {
  siginfo_t ended{};
  while (!fs::exists(journal) && ended.si_pid == 0) {
    if (::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT) != 0) return;
  }
}

/// Runs the parts of the tool with something happening between the plan and its execution.
class Meanwhile : public Import {
 protected:
  bool RunWith(const std::function<void()>& happens) {
    options_.source = folder_ / "card";
    options_.destination = folder_ / "photos";
    std::string why;
    options_.layout.Set("D", why);
    const ScanResult scan = Scan(options_.source, options_.destination, [] { return false; });
    const std::vector<Shot> shots = MakeShots(scan.items);
    Journal journal;
    EXPECT_TRUE(journal.Open(options_.destination));
    FolderView view(options_.source, options_.destination, journal.Old());
    Planner planner(scan.items, options_.layout, view);
    std::vector<ShotPlan> plans;
    for (std::size_t i = 0; i < shots.size(); ++i) plans.push_back(planner.Plan(shots[i], i));
    happens();
    std::ostringstream out;
    Report report(options_, out, out);
    Progress progress(Progress::Form::kNone);
    const Work work{
        options_, scan.items, shots, planner, view, journal, progress, report, compare_};
    Importer importer(work);
    importer.Run(std::move(plans));
    ClearSource(work, importer.Safe());
    journal.Remove();
    EXPECT_TRUE(importer.Left().empty());
    report.Close(false);
    said_ = out.str();
    return !report.HasFailures();
  }

  Options options_;
  std::function<decltype(CompareOnDevice)> compare_ = CompareOnDevice;
  std::string said_;
};

}  // namespace orbimport
