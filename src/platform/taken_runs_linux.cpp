// SPDX-License-Identifier: MIT
#include "platform/taken_runs.h"

#include <linux/magic.h>
#include <sys/inotify.h>
#include <sys/vfs.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstring>
#include <mutex>
#include <utility>
#include <vector>

#include "platform/linux/place.h"

namespace orb::platform {
namespace {

constexpr std::size_t kMostSeries = 8;
constexpr std::uint32_t kDepartures = IN_DELETE | IN_MOVED_FROM | IN_ONLYDIR;

/// Where all changes go through this kernel. FAT is not among them: a name has a second, short
/// spelling there, under which it may be removed.
bool SeesAllChanges(int folder) {
  constexpr decltype(statfs::f_type) kTypes[] = {BTRFS_SUPER_MAGIC,
                                                 EXFAT_SUPER_MAGIC,
                                                 EXT4_SUPER_MAGIC,
                                                 F2FS_SUPER_MAGIC,
                                                 OVERLAYFS_SUPER_MAGIC,
                                                 TMPFS_MAGIC,
                                                 XFS_SUPER_MAGIC};
  struct statfs volume;
  if (::fstatfs(folder, &volume) != 0) return false;
  return std::ranges::find(kTypes, volume.f_type) != std::end(kTypes);
}

struct Series {
  Identity folder;
  std::string name;
  std::string stem;
  int watch = -1;
  TakenRun run;
};

/// The owner of the lock calls it. It has a descriptor only while it has a series.
class Memory {
 public:
  std::mutex lock;

  /// Forgets what has changed since it was called last. Comes before every question.
  void TakeDepartures() {
    ForgetInForkedChild();
    if (!events_) return;
    alignas(inotify_event) std::array<char, 4096> block;
    ssize_t size = 0;
    while ((size = Retry([&] { return ::read(events_.Get(), block.data(), block.size()); })) > 0)
      ForgetDeparted({block.data(), static_cast<std::size_t>(size)});
    if (errno != EAGAIN || series_.empty()) Clear();
  }

  Series* Find(const Identity& folder, const std::string& name) {
    return Find([&](const Series& one) { return one.folder == folder && one.name == name; });
  }
  Series* Find(std::uint64_t ticket) {
    return Find([&](const Series& one) { return one.run.ticket == ticket; });
  }

  /// Null when the folder cannot be watched.
  Series* Add(int folder, Series series) {
    if (series_.size() == kMostSeries) RemoveOldest();
    if (!events_) events_ = UniqueFd(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
    const std::string path = "/proc/self/fd/" + std::to_string(folder);
    series.watch = ::inotify_add_watch(events_.Get(), path.c_str(), kDepartures);
    if (series.watch < 0) {
      if (series_.empty()) Clear();
      return nullptr;
    }
    series.run.ticket = ++tickets_;
    return &series_.emplace_back(std::move(series));
  }

 private:
  template <typename Condition>
  Series* Find(Condition condition) {
    const auto found = std::ranges::find_if(series_, condition);
    return found != series_.end() ? &*found : nullptr;
  }

  void Clear() {
    series_.clear();
    events_.Reset();
  }

  /// It shares the events with its parent: each would take some away from the other.
  void ForgetInForkedChild() {
    if (const pid_t process = ::getpid(); std::exchange(process_, process) != process) Clear();
  }

  void ForgetDeparted(std::string_view events) {
    while (!events.empty()) {
      inotify_event event;
      std::memcpy(&event, events.data(), sizeof event);
      const char* name = events.data() + sizeof event;
      Forget(event, event.len == 0 ? "" : name);
      events.remove_prefix(sizeof event + event.len);
    }
  }

  /// Without a name the watch has ended or, without its number, events were lost.
  void Forget(const inotify_event& event, std::string_view name) {
    for (Series& series : series_) {
      const bool isMeant = event.wd < 0 || event.wd == series.watch;
      if (isMeant && MayBeginWith(name, series.stem)) series.run = {0, ++tickets_};
    }
    if ((event.mask & IN_IGNORED) == 0) return;
    std::erase_if(series_, [&](const Series& series) { return series.watch == event.wd; });
  }

  void RemoveOldest() {
    const int watch = series_.front().watch;
    series_.erase(series_.begin());
    const bool isUsed = std::ranges::find(series_, watch, &Series::watch) != series_.end();
    if (!isUsed) ::inotify_rm_watch(events_.Get(), watch);
  }

  pid_t process_ = 0;
  UniqueFd events_;
  std::vector<Series> series_;
  std::uint64_t tickets_ = 0;
};

/// Never destroyed: a static object's destructor may still make a file.
Memory& TheMemory() {
  static Memory& memory = *new Memory;
  return memory;
}

bool IsAscii(char c) { return static_cast<unsigned char>(c) < 0x80; }

char AsciiLower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; }

}  // namespace

TakenRun RecallRun(const HeldFolder& folder, const std::string& name) {
  const ErrnoKeeper errnoKeeper;
  const auto identity = IdentityOf(folder.Descriptor());
  if (!identity) return {};
  Memory& memory = TheMemory();
  const std::lock_guard hold(memory.lock);
  memory.TakeDepartures();
  const Series* series = memory.Find(identity.Value(), name);
  return series != nullptr ? series->run : TakenRun();
}

std::uint64_t WatchRun(const HeldFolder& folder, const std::string& name, const std::string& stem) {
  const ErrnoKeeper errnoKeeper;
  const int descriptor = folder.Descriptor();
  const auto identity = IdentityOf(descriptor);
  if (!identity || !SeesAllChanges(descriptor)) return 0;
  Memory& memory = TheMemory();
  const std::lock_guard hold(memory.lock);
  memory.TakeDepartures();
  const Series* series = memory.Find(identity.Value(), name);
  if (series == nullptr) series = memory.Add(descriptor, {identity.Value(), name, stem, -1, {}});
  return series != nullptr ? series->run.ticket : 0;
}

void KeepRun(const TakenRun& run) {
  if (run.ticket == 0) return;
  const ErrnoKeeper errnoKeeper;
  Memory& memory = TheMemory();
  const std::lock_guard hold(memory.lock);
  memory.TakeDepartures();
  Series* series = memory.Find(run.ticket);
  if (series != nullptr) series->run.end = std::max(series->run.end, run.end);
}

bool MayBeginWith(std::string_view name, std::string_view stem) {
  const std::size_t size = std::min(name.size(), stem.size());
  for (std::size_t i = 0; i < size; ++i) {
    if (!IsAscii(name[i]) || !IsAscii(stem[i])) return true;
    if (AsciiLower(name[i]) != AsciiLower(stem[i])) return false;
  }
  return true;
}

}  // namespace orb::platform
