#include <dirent.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <new>
#include <vector>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/TreeSurvey.h"

namespace MarletFoundation {
namespace {

/// The value of an attribute, or the list of all when `name` is null; nothing and errno on failure.
std::optional<std::string> attribute(int descriptor, const char* name) {
  const auto read = [&](char* buffer, std::size_t size) {
    return name ? ::fgetxattr(descriptor, name, buffer, size) : ::flistxattr(descriptor, buffer, size);
  };
  while (true) {
    const auto size = read(nullptr, 0);
    if (size < 0) return std::nullopt;
    std::string value(static_cast<std::size_t>(size), '\0');
    const auto length = size == 0 ? 0 : read(value.data(), value.size());
    if (length < 0 && errno == ERANGE) continue;  // it grew
    if (length < 0) return std::nullopt;
    value.resize(static_cast<std::size_t>(length));
    return value;
  }
}

int copyExtendedAttributes(int from, int to) {
  const auto names = attribute(from, nullptr);
  if (!names) return errno == ENOTSUP ? 0 : -1;
  for (std::size_t start = 0; start < names->size();) {
    const char* name = names->c_str() + start;
    start += std::string_view(name).size() + 1;
    const auto value = attribute(from, name);
    if (!value && errno == ENODATA) continue;
    const bool copied = value && ::fsetxattr(to, name, value->data(), value->size(), 0) == 0;
    // Attributes of the system's own kinds need rights that we may not have, and it sets them by itself.
    if (!copied && std::string_view(name).starts_with("user.")) return -1;
  }
  return 0;
}

}  // namespace

int copyAttributes(int from, int to) {
  struct stat status;
  if (::fstat(from, &status) != 0 || copyExtendedAttributes(from, to) != 0) return -1;
  auto mode = status.st_mode & 07777;
  // Another's file doesn't become one that runs with our rights.
  if (::fchown(to, status.st_uid, status.st_gid) != 0) mode &= 0777;
  return ::fchmod(to, mode);
}

namespace {

int removeDirectory(int parent, const std::string& name, Descriptor opened) {
  struct Level {
    std::shared_ptr<DiskDirectory> directory, above;
    std::string name;
    bool emptied = false;
    int listing = 0;  // errno of it
  };
  struct stat root;
  if (::fstat(opened.get(), &root) != 0) return errno;
  const auto isElsewhere = [&](int above, const std::string& below) {
    struct stat status;
    return isMountPoint(above, below.c_str()) ||
           (::fstatat(above, below.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0 && S_ISDIR(status.st_mode) &&
            status.st_dev != root.st_dev);
  };
  int firstError = 0;
  const auto failed = [&](int error) {
    if (firstError == 0) firstError = error;
  };
  std::vector<Level> levels{{DiskDirectory::root(std::move(opened)), nullptr, name}};
  while (!levels.empty()) {
    const Level level = levels.back();
    if (level.emptied) {
      const int above = level.above ? level.above->descriptor() : parent;
      if (::unlinkat(above, level.name.c_str(), AT_REMOVEDIR) != 0 && errno != ENOENT)
        failed(level.listing != 0 ? level.listing : errno);
      levels.pop_back();
      continue;
    }
    levels.back().emptied = true;
    // What is mounted there is somebody else's.
    if (level.above && isElsewhere(level.above->descriptor(), level.name)) {
      levels.back().listing = EBUSY;
      continue;
    }
    if (level.directory->descriptor() < 0 && errno == EACCES) {
      ::fchmodat(level.above->descriptor(), level.name.c_str(), 0700, AT_SYMLINK_NOFOLLOW);
    }
    const auto entries = level.directory->entries();
    if (!entries) {
      levels.back().listing = errno;
      continue;
    }
    ::fchmod(level.directory->descriptor(), 0700);
    for (const auto& entry : *entries) {
      // Not every file system tells kinds; what can't be unlinked for being a directory is one.
      if (entry.type != DT_DIR) {
        if (::unlinkat(level.directory->descriptor(), entry.name.c_str(), 0) == 0 || errno == ENOENT)
          continue;
        if (errno != EISDIR) {
          failed(errno);
          continue;
        }
      }
      levels.push_back(
          {DiskDirectory::child(level.directory, SharedString(entry.name)), level.directory, entry.name});
    }
  }
  return firstError;
}

}  // namespace

int removeTree(int parent, const std::string& name) {
  if (::unlinkat(parent, name.c_str(), 0) == 0 || errno == ENOENT) return 0;
  if (errno != EISDIR) return errno;
  Descriptor opened(::openat(parent, name.c_str(), DirectoryFlags));
  if (!opened && errno == EACCES && ::fchmodat(parent, name.c_str(), 0700, AT_SYMLINK_NOFOLLOW) == 0) {
    opened = Descriptor(::openat(parent, name.c_str(), DirectoryFlags));
  }
  if (!opened) return errno;
  if (isMountPoint(parent, name.c_str())) return EBUSY;
  try {
    return removeDirectory(parent, name, std::move(opened));
  } catch (const std::bad_alloc&) {
    return ENOMEM;
  }
}

}  // namespace MarletFoundation
