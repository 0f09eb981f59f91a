#include "MarletFoundation/Platform/FileManager.h"

#include <limits.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <memory>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/DiskTree.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation::FileManager {
namespace {

struct stat statusOf(const std::string& path) {
  struct stat status;
  if (walkingAgain([&] { return ::stat(path.c_str(), &status); }) != 0) throwPosix(errno, path);
  return status;
}

}  // namespace

std::optional<URL> documentsDirectory() { return HostEnvironment::current().documentsDirectory; }

Relationship relationship(const URL& directory, const URL& item) {
  const auto wanted = statusOf(systemPath(directory));
  const auto itemPath = systemPath(item);
  const std::unique_ptr<char, decltype(&std::free)> real(::realpath(itemPath.c_str(), nullptr), &std::free);
  if (!real) throwPosix(errno, itemPath);
  auto relationship = Relationship::same;
  for (std::string path = real.get();; relationship = Relationship::contains) {
    const auto status = statusOf(path);
    if (status.st_dev == wanted.st_dev && status.st_ino == wanted.st_ino) return relationship;
    if (path == "/") return Relationship::other;
    path.resize(std::max<std::size_t>(path.rfind('/'), 1));
  }
}

bool fileExists(const URL& url) {
  const auto path = fileSystemPath(url);
  struct stat status;
  return path && walkingAgain([&] { return ::stat(path->c_str(), &status); }) == 0;
}

bool isDirectory(const URL& url) { return S_ISDIR(statusOf(systemPath(url)).st_mode); }

bool resourceIsReachable(const URL& url) {
  statusOf(systemPath(url));
  return true;
}

std::vector<std::string> contentsOfDirectory(const URL& url, bool skipHidden) {
  const auto path = systemPath(url);
  Descriptor root(walkingAgain([&] { return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); }));
  if (!root) throwPosix(errno, path);
  const auto entries = DiskDirectory::root(std::move(root))->entries();
  if (!entries) throwPosix(errno, path);
  std::vector<std::string> names;
  for (const auto& entry : *entries) {
    if (!skipHidden || !entry.name.starts_with('.')) names.push_back(entry.name);
  }
  std::sort(names.begin(), names.end());
  return names;
}

Data readFile(const URL& url) {
  const auto path = systemPath(url);
  const auto status = statusOf(path);
  if (!S_ISREG(status.st_mode)) throwNoRegularFile(status, path);
  const Descriptor file(walkingAgain([&] { return ::open(path.c_str(), ReadingFlags); }));
  if (!file) throwPosix(errno, path);
  auto contents = readToEnd(file.get(), status.st_size);
  if (contents.error != 0) throwPosix(contents.error, path);
  return std::move(contents.data);
}

void writeFileAtomically(const URL& url, const Data& contents) {
  AtomicReplacement replacement(systemPath(url));
  if (replacement.replacesDirectory()) throwPosix(EISDIR, url.path());
  if (writeAll(replacement.makeFile(), contents.view()) != 0) throwPosix(errno, url.path());
  replacement.commit();
}

void removeAbandonedStages(const URL& url) {
  try {
    const AtomicReplacement clearing(systemPath(url));
  } catch (const ErrorObject&) {
    // Who goes on to write meets it again.
  }
}

}  // namespace MarletFoundation::FileManager
