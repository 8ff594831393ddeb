// SPDX-License-Identifier: MIT
#include "fileops/transfer.h"

#include <orb/fileinfo/file_handle.h>
#include <orb/fileops/path_relations.h>

#include <string>
#include <string_view>

#include "fileinfo/item_path.h"
#include "fileops/creation_result.h"
#include "fileops/path_in.h"
#include "strings/string_access.h"

namespace orb {
namespace {

OrbResult CheckAccess(const COrbFilePath& source) {
  constexpr unsigned int kUsable = kOrbFileAttrReadable | kOrbFileAttrWritable;
  const bool usable = (COrbFileHandle(source).GetAttribute() & kUsable) != 0;
  return usable ? kOrbNoErr : kOrbErrAccessDenied;
}

/// A form that removes something looks at the source before that.
OrbResult CheckSource(const TransferForm& form,
                      const COrbFilePath& source,
                      const std::string& path) {
  if (form.existing == Existing::kRemoved) {
    const OrbResult usable = form.work == Work::kCopy ? ExpectCopyable(path) : ExpectMovable(path);
    if (Failed(usable)) return usable;
  }
  return form.source == Source::kUsable ? CheckAccess(source) : kOrbNoErr;
}

/// Whether the last component is that of an entry: "/", "." and "a/.." lead to a folder itself or
/// above it, which is not what shall be replaced.
bool NamesAnEntry(std::string_view name) {
  name.remove_prefix(name.rfind('/') + 1);
  return !name.empty() && name != "." && name != "..";
}

/// The name in the destination folder, the given one or the source's own, without a "/" at its end.
OrbResult ChooseName(const TransferRequest& request, COrbStringData* name) {
  if (request.name != nullptr)
    *name = *request.name;
  else
    OrbGetFileNameFromPath(request.source, name);
  auto text = ItemPath(*name);
  if (!text) return kOrbErrInvalidName;
  if (text->ends_with('/')) {
    text->erase(text->find_last_not_of('/') + 1);
    *name = StringAccess::FromUtf8(*text);
  }
  return NamesAnEntry(*text) ? kOrbNoErr : kOrbErrInvalidName;
}

OrbResult FindDestination(const TransferRequest& request, std::string* destination) {
  COrbStringData name;
  const OrbResult named = ChooseName(request, &name);
  return Failed(named) ? named : PathIn(request.folder, name, destination);
}

/// All that is asked before anything is changed, and where the item shall be.
OrbResult Prepare(const TransferForm& form,
                  const TransferRequest& request,
                  const std::string& source,
                  std::string* destination) {
  const OrbResult usable = CheckSource(form, request.source, source);
  if (Failed(usable)) return usable;
  if (form.target == Target::kTested) {
    const OrbResult target =
        OrbCheckCopyTarget(request.source.GetFullPath(), request.folder.GetFullPath());
    if (Failed(target)) return target;
  }
  return FindDestination(request, destination);
}

/// Nothing goes for an item that cannot come.
OrbResult MakeWay(const TransferForm& form,
                  const std::string& source,
                  const std::string& destination) {
  if (form.existing == Existing::kKept) return kOrbNoErr;
  const OrbResult comes = form.work == Work::kCopy ? ExpectCopyableTo(source, destination)
                                                   : ExpectMovableTo(source, destination);
  return Failed(comes) ? comes : RemoveExistingDestination(source, destination, Alike::kByTextToo);
}

template <typename Worker>
Outcome Run(const std::string& source,
            const std::string& destination,
            const TransferRequest& request) {
  Worker worker(source, destination);
  worker.SetProgress(request.progress, request.data);
  return worker.Perform();
}

}  // namespace

OrbResult Transfer(const TransferForm& form, const TransferRequest& request) {
  const auto source = ItemPath(request.source.GetFullPath());
  if (!source) return kOrbErrAccessDenied;
  std::string destination;
  const OrbResult prepared = Prepare(form, request, *source, &destination);
  if (Failed(prepared)) return prepared;
  if (const OrbResult free = MakeWay(form, *source, destination); Failed(free)) return free;
  const Outcome outcome = form.work == Work::kCopy
                              ? Run<OrbCopyPath>(*source, destination, request)
                              : Run<OrbMovePath>(*source, destination, request);
  if (Failed(outcome.code)) return ConsiderSpace(outcome, form.lowSpace, request.folder);
  return request.result == nullptr ? kOrbNoErr : Deliver(destination, request.result);
}

}  // namespace orb
