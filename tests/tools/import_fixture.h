// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <ctime>
#include <filesystem>
#include <functional>
#include <map>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "clearing.h"
#include "importer.h"
#include "support/temp_folder.h"

namespace orbimport {

namespace fs = std::filesystem;
using orb::test::ReadAll;
using orb::test::TempFolder;

/// Files by their paths below a folder, each with its bytes.
using Files = std::map<std::string, std::string>;

constexpr std::time_t kMayFirst = 1714557600;  // 2024-05-01 10:00:00 UTC.
const std::string kDay = "2024/2024-05-01/";
constexpr char kJournal[] = ".orb-import.journal";

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

inline bool Says(const std::string& said, const std::string& what) {
  return said.find(what) != std::string::npos;
}

/// The journal's line for a photo of kMayFirst.
inline std::string PromiseOf(const std::string& path, std::size_t size) {
  return FormatPromise({path, size, std::uint64_t{2082844800} + kMayFirst});
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

  /// Files below the folder of all.
  void Put(const Files& files, std::time_t time = kMayFirst) {
    for (const auto& [name, bytes] : files) {
      fs::create_directories(fs::path(folder_ / name).parent_path());
      SetTime(folder_.Write(name, bytes), time);
    }
  }
  void PutOnCard(const Files& files) {
    for (const auto& [name, bytes] : files) Put({{"card/" + name, bytes}});
  }

  /// For a shell in the folder of all.
  std::string Command(const std::string& args) const {
    return "cd " + folder_.Path() + " && export TZ=UTC0 XDG_DATA_HOME=$PWD/data && exec " +
           ORB_IMPORT + " " + args;
  }
  pid_t Start(const std::string& args) const {
    const std::string command = Command(args) + " >out 2>err";
    const pid_t child = ::fork();
    if (child != 0) return child;
    ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
    ::_exit(127);
  }
  Ended Wait(pid_t child) const {
    int status = 0;
    EXPECT_EQ(::waitpid(child, &status, 0), child);
    const int code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return {code, ReadAll(folder_ / "out"), ReadAll(folder_ / "err")};
  }
  Ended Run(const std::string& options = "") const { return Wait(Start(options + " card photos")); }
  /// Killed so long after its journal was there, which stands from before the first file is made
  /// until all are whole, unless it has ended by then.
  Ended RunAndKill(const std::string& options, unsigned microseconds) const {
    const pid_t child = Start(options + " card photos");
    siginfo_t ended{};
    while (!fs::exists(Photos(kJournal)) && ended.si_pid == 0) {
      ::waitid(P_PID, static_cast<id_t>(child), &ended, WEXITED | WNOHANG | WNOWAIT);
    }
    std::this_thread::sleep_for(std::chrono::microseconds(microseconds));
    ::kill(child, SIGKILL);
    return Wait(child);
  }

  Files Tree(const std::string& folder = "photos") const {
    Files tree;
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
