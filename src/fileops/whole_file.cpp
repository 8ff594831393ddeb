// SPDX-License-Identifier: MIT
#include <orb/fileops/whole_file.h>

#include <cstddef>
#include <span>
#include <string>

#include "fileinfo/item_path.h"
#include "fileops/failure_diagnosis.h"
#include "platform/file_writer.h"
#include "platform/streams.h"

namespace {

using orb::platform::FileWriter;
using orb::platform::InputStream;
using orb::platform::Result;

/// No item can be reached through a text that is not UTF-8.
template <typename File>
Result<File> Open(const COrbFilePath& path) {
  const auto item = orb::ItemPath(path.GetFullPath());
  return item ? File::Open(*item) : orb::platform::kNoSuchItem;
}

}  // namespace

OrbResult OrbReadFile(const COrbFilePath& path, void* buffer, unsigned int size) {
  auto file = Open<InputStream>(path);
  if (!file)
    return orb::OrbDiagnoseFailure(file.Reason(), path.GetFullPath(), nullptr, orb::kOrbOpRead);
  const std::span block(static_cast<std::byte*>(buffer), size);
  return file.Value().Read(block) ? kOrbNoErr : kOrbErrUnknown;
}

OrbResult OrbWriteFile(const COrbFilePath& path, const void* data, unsigned int size) {
  auto file = Open<FileWriter>(path);
  if (!file)
    return orb::OrbDiagnoseFailure(file.Reason(), path.GetFullPath(), nullptr, orb::kOrbOpWrite);
  const std::span block(static_cast<const std::byte*>(data), size);
  return file.Value().Write(block) ? kOrbNoErr : kOrbErrUnknown;
}
