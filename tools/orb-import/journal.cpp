// SPDX-License-Identifier: MIT
#include "journal.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <iterator>
#include <sstream>
#include <string_view>

#include "text.h"

namespace orbimport {
namespace {

std::string PathIn(const std::string& destination) { return destination + "/.orb-import.journal"; }

std::string ReadWhole(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>()};
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

/// Another import may have removed the file between our opening and our locking it.
bool IsRemoved(int descriptor) {
  struct stat status;
  return ::fstat(descriptor, &status) == 0 && status.st_nlink == 0;
}

}  // namespace

Journal::~Journal() {
  if (IsOpen()) ::close(descriptor_);
}

Journal::Opened Journal::Open(const std::string& destination) {
  path_ = PathIn(destination);
  for (;;) {
    const int flags = O_RDWR | O_CREAT | O_APPEND | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK;
    const int descriptor = ::open(path_.c_str(), flags, 0644);
    if (descriptor < 0) return Opened::kFailed;
    // A volume without locks answers otherwise than "busy", and then the journal does without.
    if (::flock(descriptor, LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK) {
      ::close(descriptor);
      return Opened::kBusy;
    }
    if (!IsRemoved(descriptor)) {
      descriptor_ = descriptor;
      old_ = ParsePromises(ReadWhole(path_));
      return Opened::kYes;
    }
    ::close(descriptor);
  }
}

bool Journal::Add(const std::vector<Promise>& promises) {
  std::string text = "\n";  // Ends a line that an earlier import left half written.
  for (const Promise& promise : promises) text += FormatPromise(promise);
  return IsOpen() && WriteWhole(descriptor_, text) && ::fsync(descriptor_) == 0;
}

void Journal::Remove() {
  if (!IsOpen()) return;
  ::unlink(path_.c_str());
  ::close(descriptor_);
  descriptor_ = -1;
}

std::map<std::string, Promise> Journal::Read(const std::string& destination) {
  return ParsePromises(ReadWhole(PathIn(destination)));
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
