// SPDX-License-Identifier: MIT
#include "journal.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string_view>
#include <system_error>

#include "text.h"

namespace orbimport {
namespace {

std::string PathIn(const std::string& destination) { return destination + "/.orb-import.journal"; }

std::string ReadWhole(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path, std::ios::binary).rdbuf();
  return text.str();
}

bool WriteWhole(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(descriptor, text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) return false;
    text.remove_prefix(static_cast<std::size_t>(written));
  }
  return true;
}

OrbResult CodeOfErrno() {
  return errno == ENOSPC || errno == EDQUOT ? kOrbErrDiskFull : kOrbErrAccessDenied;
}

}  // namespace

Journal::~Journal() { Close(); }

bool Journal::Open(const std::string& destination) {
  path_ = PathIn(destination);
  opened_ = MakeFolder(destination);
  while (opened_ < kOrbErrFirst && (opened_ = OpenFile()) < kOrbErrFirst) {
    const Locking locking = LockFile();
    if (locking == Locking::kHeld) {
      old_ = Read(destination);
      return true;
    }
    Close();
    if (locking == Locking::kBusy) return false;
  }
  return true;
}

OrbResult Journal::OpenFile() {
  const int flags = O_RDWR | O_CREAT | O_APPEND | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
  descriptor_ = ::open(path_.c_str(), flags, 0644);
  if (descriptor_ < 0) return CodeOfErrno();
  struct stat status;
  return ::fstat(descriptor_, &status) == 0 && S_ISREG(status.st_mode) ? kOrbNoErr
                                                                       : kOrbErrAccessDenied;
}

Journal::Locking Journal::LockFile() const {
  // A volume without locks answers otherwise than "busy"; the journal does without one then.
  if (::flock(descriptor_, LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK) return Locking::kBusy;
  // Another import may have removed the file between our opening and our locking it.
  struct stat status;
  const bool isGone = ::fstat(descriptor_, &status) == 0 && status.st_nlink == 0;
  return isGone ? Locking::kAgain : Locking::kHeld;
}

OrbResult Journal::Add(const std::vector<Promise>& promises) {
  if (opened_ >= kOrbErrFirst) return opened_;
  std::string text = "\n";  // Ends a line that an earlier import left half written.
  for (const Promise& promise : promises) text += FormatPromise(promise);
  return WriteWhole(descriptor_, text) && ::fsync(descriptor_) == 0 ? kOrbNoErr : CodeOfErrno();
}

void Journal::Close() {
  if (descriptor_ >= 0) ::close(descriptor_);
  descriptor_ = -1;
}

void Journal::Remove() {
  if (descriptor_ >= 0) ::unlink(path_.c_str());
  Close();
}

std::map<std::string, Promise> Journal::Read(const std::string& destination) {
  const std::string path = PathIn(destination);
  std::error_code error;
  if (!std::filesystem::is_regular_file(path, error)) return {};
  return ParsePromises(ReadWhole(path));
}

std::string FormatPromise(const Promise& promise) {
  return std::to_string(promise.size) + " " + std::to_string(promise.seconds) + " " +
         PercentEncode(promise.path) + "\n";
}

std::map<std::string, Promise> ParsePromises(const std::string& text) {
  std::map<std::string, Promise> promises;
  std::string_view rest = text;
  for (std::size_t end; (end = rest.find('\n')) != std::string_view::npos;) {
    std::istringstream line{std::string(rest.substr(0, end))};
    rest.remove_prefix(end + 1);
    Promise promise;
    std::string path, more;
    const bool complete = (line >> promise.size >> promise.seconds >> path) && !(line >> more);
    if (complete && PercentDecode(path, promise.path)) promises[promise.path] = promise;
  }
  return promises;
}

}  // namespace orbimport
