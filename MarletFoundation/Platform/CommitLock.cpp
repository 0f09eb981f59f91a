#include "MarletFoundation/Platform/CommitLock.h"

#include <sys/file.h>

#include <chrono>
#include <thread>

#include "MarletFoundation/Platform/TreeSurvey.h"
#include "MarletFoundation/Platform/WriteCancellation.h"

namespace MarletFoundation {
namespace {

/// A writer holds the lock for a few system calls and a flush.
constexpr std::chrono::seconds LongestWait{10};

/// Whether a directory is no part of a document, and so none above it is: nobody puts another in the place of a
/// mount, nor of a directory that strangers share.
bool isBoundary(int directory) {
  struct stat status;
  return ::fstat(directory, &status) != 0 || (status.st_mode & S_ISVTX) != 0 || isMountPoint(directory, "");
}

}  // namespace

CommitLock::CommitLock(int parent, const Descriptor& replaced, const std::string& path) {
  std::vector<Descriptor> above;
  for (Descriptor next(::openat(parent, ".", DirectoryFlags)); next && !isBoundary(next.get());) {
    Descriptor further(::openat(next.get(), "..", DirectoryFlags));
    above.push_back(std::move(next));
    next = std::move(further);
  }
  // From the top, as every writer does, so that no two wait for each other.
  for (auto next = above.rbegin(); next != above.rend(); ++next) {
    lock(next->get(), LOCK_SH, path);
    held_.push_back(std::move(*next));
  }
  if (replaced) lock(replaced.get(), LOCK_EX, path);
}

void CommitLock::lock(int descriptor, int operation, const std::string& path) {
  const auto end = std::chrono::steady_clock::now() + LongestWait;
  for (std::chrono::microseconds pause{200};;
       pause = std::min(pause * 2, std::chrono::microseconds{20'000})) {
    if (retrying([&] { return ::flock(descriptor, operation | LOCK_NB); }) == 0 || errno != EWOULDBLOCK)
      return;
    requireNotCancelled(path);
    if (std::chrono::steady_clock::now() > end)
      throwPosix(EBUSY, path, "Another program keeps it, or what it lies in, locked. Nothing was changed.");
    std::this_thread::sleep_for(pause);
  }
}

}  // namespace MarletFoundation
