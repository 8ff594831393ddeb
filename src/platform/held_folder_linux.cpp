// SPDX-License-Identifier: MIT
#include "platform/held_folder.h"

#include <fcntl.h>

#include <span>
#include <utility>

#include "platform/linux/item_metadata.h"
#include "platform/linux/own_folder.h"
#include "platform/linux/removal_at.h"

namespace orb::platform {
namespace {

constexpr mode_t kUsualFile = 0666;
constexpr mode_t kLevel = 0755;

bool NamesAnEntry(const std::string& name) {
  return !name.empty() && name != "." && name != ".." && name.find('/') == std::string::npos;
}

Result<UniqueFd> OpenFolder(const std::string& path) {
  constexpr int kFlags = O_PATH | O_DIRECTORY | O_CLOEXEC;
  UniqueFd folder(Retry([&] { return ::open(path.c_str(), kFlags); }));
  if (!folder) return LastError();
  return folder;
}

/// Goes down through `levels`, each opened in the one before by `open`.
template <typename Open>
Result<UniqueFd> Descend(const std::string& base, std::span<const std::string> levels, Open open) {
  auto folder = OpenFolder(base);
  for (const std::string& level : levels) {
    if (!folder) return folder;
    if (!NamesAnEntry(level)) return kInvalidName;
    folder = open(folder.Value().Get(), level.c_str());
  }
  return folder;
}

}  // namespace

struct HeldFolder::State {
  UniqueFd folder;
};

HeldFolder::HeldFolder(std::unique_ptr<State> state) : state_(std::move(state)) {}
HeldFolder::HeldFolder(HeldFolder&&) noexcept = default;
HeldFolder::~HeldFolder() = default;

Result<HeldFolder> HeldFolder::Open(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  auto folder = OpenFolder(path);
  if (!folder) return folder.Reason();
  if (const Status open = RefuseLocked(folder.Value().Get()); !open) return open.Reason();
  return HeldFolder(std::make_unique<State>(State{std::move(folder).Value()}));
}

Result<HeldFolder> HeldFolder::OpenOrMakeOwn(const std::string& base,
                                             const std::vector<std::string>& levels) {
  const ErrnoKeeper errnoKeeper;
  auto folder = Descend(base, levels, [](int above, const char* name) {
    return OpenOrMakeOwnFolder(above, name, kLevel);
  });
  if (!folder) return folder.Reason();
  if (const Status open = RefuseLocked(folder.Value().Get()); !open) return open.Reason();
  return HeldFolder(std::make_unique<State>(State{std::move(folder).Value()}));
}

Status HeldFolder::CreateEmptyFile(const std::string& name) const {
  const ErrnoKeeper errnoKeeper;
  if (!NamesAnEntry(name)) return kInvalidName;
  constexpr int kFlags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC;
  const int folder = state_->folder.Get();
  const UniqueFd file(Retry([&] { return ::openat(folder, name.c_str(), kFlags, kUsualFile); }));
  return file ? Status() : Status(LastError());
}

int HeldFolder::Descriptor() const { return state_->folder.Get(); }

Status RemoveOwnFolder(const std::string& base, const std::vector<std::string>& levels) {
  const ErrnoKeeper errnoKeeper;
  const std::span above(levels.data(), levels.size() - 1);
  const auto folder = Descend(base, above, OpenOwnFolder);
  if (!folder) return folder.Reason();
  const std::string& name = levels.back();
  if (!NamesAnEntry(name)) return kInvalidName;
  const auto last = OpenOwnFolder(folder.Value().Get(), name.c_str());
  if (!last) return last.Reason();
  if (const Status open = RefuseLocked(folder.Value().Get()); !open) return open;
  return RemoveItemAt(folder.Value().Get(), name);
}

}  // namespace orb::platform
