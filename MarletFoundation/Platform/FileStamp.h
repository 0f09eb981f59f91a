#pragma once

#include <sys/stat.h>

namespace MarletFoundation {

/// What a look at an item found, enough to tell whether it is another or was changed since. The time of its last
/// status change isn't part of it: that moves when another tree comes to share the file or lets go of it.
struct FileStamp {
  ino_t number = 0;
  off_t size = 0;
  timespec modified{};

  FileStamp() = default;
  explicit FileStamp(const struct stat& status)
      : number(status.st_ino), size(status.st_size), modified(status.st_mtim) {}
  bool operator==(const FileStamp& other) const {
    return number == other.number && size == other.size && modified.tv_sec == other.modified.tv_sec &&
           modified.tv_nsec == other.modified.tv_nsec;
  }
};

}  // namespace MarletFoundation
