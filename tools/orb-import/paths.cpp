// SPDX-License-Identifier: MIT
#include "paths.h"

#include <filesystem>
#include <system_error>

#include "text.h"

namespace orbimport {
namespace {

namespace fs = std::filesystem;

std::string WithoutSlash(std::string path) {
  while (path.size() > 1 && path.back() == '/') path.pop_back();
  return path;
}

/// What is wrong with a path, for the user.
std::string NoFolder(const char* role, const std::string& path, const std::error_code& error) {
  const std::string reason = error ? ": " + error.message() : "";
  return std::string(role) + " is no folder: " + Quote(path) + reason;
}

bool ResolveSource(std::string& source, std::string& why) {
  std::error_code error;
  const fs::path resolved = fs::canonical(source, error);
  if (error || !fs::is_directory(resolved, error)) {
    why = NoFolder("SOURCE", source, error);
    return false;
  }
  source = resolved.string();
  return true;
}

bool ResolveDestination(std::string& destination, std::string& why) {
  std::error_code error;
  const fs::path resolved = fs::weakly_canonical(fs::absolute(destination, error), error);
  const bool isTaken = !error && fs::exists(resolved, error) && !fs::is_directory(resolved, error);
  if (error || destination.empty() || isTaken) {
    why = NoFolder("DESTINATION", destination, error);
    return false;
  }
  destination = WithoutSlash(resolved.string());
  return true;
}

}  // namespace

bool ResolvePaths(Options& options, std::string& why) {
  if (!ResolveSource(options.source, why) || !ResolveDestination(options.destination, why))
    return false;
  if (options.source == options.destination) {
    why = "SOURCE and DESTINATION are the same folder";
  } else if (!IsUtf8(options.source) || !IsUtf8(options.destination)) {
    why = "the paths of SOURCE and DESTINATION must be UTF-8";
  } else if (options.move && !OrbIsDeletable(COrbFileHandle(OrbPath(options.source)))) {
    why = "--move cannot take anything from SOURCE, which is write-protected";
  }
  return why.empty();
}

std::string NearestFolder(std::string path) {
  std::error_code error;
  while (path.size() > 1 && !fs::is_directory(path, error)) path.erase(path.rfind('/'));
  return path.empty() ? "/" : path;
}

bool IsSameFile(const std::string& a, const std::string& b) {
  // Some drivers number each spelling of a name as a file of its own.
  if (OrbPathCompareNoCase(OrbText(a), OrbText(b)) == 0) return true;
  std::error_code error;
  return std::filesystem::equivalent(a, b, error) || error;
}

}  // namespace orbimport
