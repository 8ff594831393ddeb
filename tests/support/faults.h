// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <grp.h>
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <string>

/// \file
/// Faults made the real way: another user, a full, a read-only or a busy volume. They are made in a
/// child process, whose expectations count as those of the test:
///
///   ORB_IN_CHILD(RunAsUser(65534, [&] { EXPECT_EQ(...); }));
///
/// Where the machine does not allow the fault the test is skipped.

namespace orb::test {

enum class ChildOutcome { kPassed, kFailed, kImpossible };

constexpr int kImpossibleStatus = 77;

/// Runs `prepare` and, when it is true, `body` in a child process that ends without the clean-up
/// of the parent's objects.
template <typename Prepare, typename Body>
ChildOutcome RunInChild(Prepare prepare, Body body) {
  std::fflush(nullptr);
  const pid_t child = ::fork();
  if (child == 0) {
    if (!prepare()) ::_exit(kImpossibleStatus);
    body();
    std::fflush(nullptr);
    ::_exit(::testing::Test::HasFailure() ? 1 : 0);
  }
  int status = 0;
  if (child < 0 || ::waitpid(child, &status, 0) != child) return ChildOutcome::kImpossible;
  if (!WIFEXITED(status)) return ChildOutcome::kFailed;
  if (WEXITSTATUS(status) == kImpossibleStatus) return ChildOutcome::kImpossible;
  return WEXITSTATUS(status) == 0 ? ChildOutcome::kPassed : ChildOutcome::kFailed;
}

/// As a user and group without privileges and further groups. Needs root.
template <typename Body>
ChildOutcome RunAsUser(uid_t user, Body body) {
  const auto become = [user] {
    return ::setgroups(0, nullptr) == 0 && ::setresgid(user, user, user) == 0 &&
           ::setresuid(user, user, user) == 0;
  };
  return RunInChild(become, body);
}

/// With mounts of its own, which end with it. Needs root.
template <typename Body>
ChildOutcome RunWithPrivateMounts(Body body) {
  const auto part = [] {
    return ::unshare(CLONE_NEWNS) == 0 &&
           ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
  };
  return RunInChild(part, body);
}

// For the body of RunWithPrivateMounts.

/// An empty volume, with options such as "size=1m" or "nr_inodes=3".
inline bool MountTmpfs(const std::string& folder, const std::string& options) {
  std::filesystem::create_directories(folder);
  return ::mount("orb-test", folder.c_str(), "tmpfs", 0, options.c_str()) == 0;
}

/// What is at `source` appears at `target` as well, which becomes busy.
inline bool BindMount(const std::string& source, const std::string& target) {
  return ::mount(source.c_str(), target.c_str(), nullptr, MS_BIND, nullptr) == 0;
}

/// A network volume whose server is gone: nothing that is asked of it is answered.
inline bool MountDeadShare(const std::string& folder) {
  const int server = ::open("/dev/fuse", O_RDWR | O_CLOEXEC);
  const std::string options =
      "fd=" + std::to_string(server) + ",rootmode=40000,user_id=0,group_id=0";
  return ::mount("nas:", folder.c_str(), "fuse.sshfs", 0, options.c_str()) == 0;
}

/// The folder becomes a read-only volume that holds what it held.
inline bool MakeReadOnlyVolume(const std::string& folder) {
  return BindMount(folder, folder) &&
         ::mount(nullptr, folder.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY, nullptr) == 0;
}

}  // namespace orb::test

#define ORB_IN_CHILD(outcome)                                         \
  switch (outcome) {                                                  \
    case ::orb::test::ChildOutcome::kImpossible:                      \
      GTEST_SKIP() << "this machine does not allow making the fault"; \
    case ::orb::test::ChildOutcome::kFailed:                          \
      ADD_FAILURE() << "in the child process, see above";             \
      break;                                                          \
    case ::orb::test::ChildOutcome::kPassed:                          \
      break;                                                          \
  }
