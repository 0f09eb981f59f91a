#include "MarletFoundation/Platform/MoveAside.h"

#include <fcntl.h>
#include <stdio.h>
#include <unistd.h>

#include "MarletFoundation/Platform/CommitLock.h"
#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {
namespace {

/// Never over another item.
int renameToFreeName(int directory, const std::string& from, const std::string& to) {
  const int result = ::renameat2(directory, from.c_str(), directory, to.c_str(), RENAME_NOREPLACE);
  if (result == 0 || (errno != EINVAL && errno != ENOSYS)) return result;
  // The file system can't promise it, so we look first.
  struct stat status;
  if (::fstatat(directory, to.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    errno = EEXIST;
    return -1;
  }
  return ::renameat(directory, from.c_str(), directory, to.c_str());
}

}  // namespace

std::string moveAside(const URL& directory, std::string_view name) {
  const auto open = [&] {
    Descriptor opened(walkingAgain([&] { return ::open(systemPath(directory).c_str(), DirectoryFlags); }));
    if (!opened) throwPosix(errno, directory.path());
    return opened;
  };
  const auto parent = open();
  const CommitLock lock(parent.get(), Descriptor(), directory.path());
  struct stat locked, now;
  if (::fstat(parent.get(), &locked) != 0 || ::fstat(open().get(), &now) != 0)
    throwPosix(errno, directory.path());
  if (!isSameItem(locked, now)) throwPosix(ESTALE, directory.path());
  const auto dot = std::min(name.rfind('.'), name.size());
  const auto stem = std::string(name.substr(0, dot)) + ".aside", extension = std::string(name.substr(dot));
  for (int number = 1;; ++number) {
    auto free = stem + (number == 1 ? "" : "-" + std::to_string(number)) + extension;
    if (renameToFreeName(parent.get(), std::string(name), free) == 0) {
      if (::fsync(parent.get()) != 0) throwPosix(errno, directory.path());
      return free;
    }
    if (errno != EEXIST) throwPosix(errno, directory.appendingPathComponent(name).path());
  }
}

}  // namespace MarletFoundation
