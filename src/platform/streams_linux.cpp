// SPDX-License-Identifier: MIT
#include "platform/streams.h"

#include <fcntl.h>

#include <optional>
#include <utility>

#include "platform/linux/file_data.h"
#include "platform/linux/item_metadata.h"
#include "platform/linux/new_file.h"
#include "platform/linux/place.h"

namespace orb::platform {
namespace {

constexpr mode_t kUsualMode = 0666;

/// kNoSuchItem where nothing is.
Result<UniqueFd> OpenExisting(const Place& place) {
  constexpr int kFlags = O_WRONLY | O_APPEND | O_NOFOLLOW;
  UniqueFd file = OpenFile(place.folder.Get(), place.name.c_str(), kFlags);
  if (file) return file;
  const bool isLink = errno == ELOOP;
  const bool isPipe = errno == ENXIO;
  return isLink || isPipe ? kNotPermitted : LastError();
}

}  // namespace

struct InputStream::State {
  UniqueFd file;
  Identity identity;
};

InputStream::InputStream(std::unique_ptr<State> state) : state_(std::move(state)) {}
InputStream::InputStream(InputStream&&) noexcept = default;
InputStream::~InputStream() = default;

Result<InputStream> InputStream::Open(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  UniqueFd file = OpenFile(AT_FDCWD, path.c_str(), O_RDONLY);
  if (!file) return LastError();
  struct stat status;
  if (::fstat(file.Get(), &status) != 0) return LastError();
  if (S_ISDIR(status.st_mode)) return ErrorFromErrno(EISDIR);
  if (!S_ISREG(status.st_mode)) return kNotPermitted;
  return InputStream(std::make_unique<State>(State{std::move(file), IdentityOf(status)}));
}

Result<std::size_t> InputStream::Read(std::span<std::byte> block) {
  const ErrnoKeeper errnoKeeper;
  return ReadBlock(state_->file.Get(), block);
}

/// Either a new file, or an older one and what it was.
struct OutputStream::State {
  Place place;
  std::optional<NewFile> made;
  UniqueFd existing;
  struct stat before {};

  State() = default;
  State(const State&) = delete;
  State& operator=(const State&) = delete;
  ~State() {
    const ErrnoKeeper errnoKeeper;
    TakeBack();
  }

  int Descriptor() const { return made ? made->Descriptor() : existing.Get(); }

  Status Make() {
    if (Status open = RefuseLocked(place.folder.Get()); !open) return open;
    auto file = NewFile::Create(place.folder.Get(), kUsualMode);
    if (!file) return file.Reason();
    made.emplace(std::move(file).Value());
    return {};
  }

  Status Take(UniqueFd file) {
    if (::fstat(file.Get(), &before) != 0) return LastError();
    if (!S_ISREG(before.st_mode)) return kNotPermitted;
    if (Status open = RefuseLocked(file.Get()); !open) return open;
    existing = std::move(file);
    return {};
  }

  bool IsAtItsPath() const {
    const auto now = ReadStatus(place);
    return existing && now && IdentityOf(now.Value()) == IdentityOf(before);
  }

  void TakeBack() {
    const timespec times[2] = {before.st_atim, before.st_mtim};
    if (existing && Retry([&] { return ::ftruncate(existing.Get(), before.st_size); }) == 0)
      (void)::futimens(existing.Get(), times);
    existing.Reset();
    made.reset();
  }
};

OutputStream::OutputStream(std::unique_ptr<State> state) : state_(std::move(state)) {}
OutputStream::OutputStream(OutputStream&&) noexcept = default;
OutputStream::~OutputStream() = default;

Result<OutputStream> OutputStream::Append(const std::string& path) {
  const ErrnoKeeper errnoKeeper;
  auto place = Locate(path);
  if (!place) return place.Reason();
  if (place.Value().folderMeant) return kInvalidName;
  auto state = std::make_unique<State>();
  state->place = std::move(place).Value();
  auto file = OpenExisting(state->place);
  if (!file && file.Reason() != kNoSuchItem) return file.Reason();
  if (Status open = file ? state->Take(std::move(file).Value()) : state->Make(); !open)
    return open.Reason();
  return OutputStream(std::move(state));
}

bool OutputStream::Writes(const InputStream& source) const {
  return state_->existing && IdentityOf(state_->before) == source.state_->identity;
}

Status OutputStream::Write(std::span<const std::byte> block) {
  const ErrnoKeeper errnoKeeper;
  return WriteBlock(state_->Descriptor(), block);
}

Status OutputStream::Finish() {
  const ErrnoKeeper errnoKeeper;
  if (state_->made) return state_->made->Publish(state_->place.name.c_str());
  if (Status flushed = Flush(state_->existing.Get()); !flushed) return flushed;
  state_->existing.Reset();
  return {};
}

bool OutputStream::Undo() {
  const ErrnoKeeper errnoKeeper;
  const bool isAtItsPath = state_->IsAtItsPath();
  state_->TakeBack();
  return isAtItsPath;
}

}  // namespace orb::platform
