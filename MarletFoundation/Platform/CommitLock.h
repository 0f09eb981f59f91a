#pragma once

#include <string>
#include <vector>

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {

/// What two writers of one place, or of a place within another's, agree on, in one process or in several: an item
/// is put in place only under this lock. It is exclusive on the directory that is replaced, and shared on each that
/// the place lies in, so that a document isn't exchanged while a part of it is, and parts may be at the same time.
/// Readers need none. Where the file system has no locks there is none.
class CommitLock {
 public:
  /// Waits for other writers for a while, then throws EBUSY with `path`. `replaced` may be empty.
  CommitLock(int parent, const Descriptor& replaced, const std::string& path);

 private:
  void lock(int descriptor, int operation, const std::string& path);

  std::vector<Descriptor> held_;
};

}  // namespace MarletFoundation
