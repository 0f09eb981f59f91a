#include "ArcCopier/Destination.h"

#include <linux/openat2.h>
#include <stdio.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <filesystem>

#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/Text.h"

namespace ArcCopierImplementation {
namespace {

using MarletFoundation::DirectoryFlags;
using MarletFoundation::retrying;

/// Opens a directory below another in one call of the system, which follows no link on the way.
int openBeneath(int root, const char* path) {
  open_how how{};
  how.flags = DirectoryFlags;
  how.resolve = RESOLVE_BENEATH | RESOLVE_NO_SYMLINKS;
  return static_cast<int>(retrying([&] { return ::syscall(SYS_openat2, root, path, &how, sizeof how); }));
}

int openName(int directory, const std::string& name) {
  return retrying([&] { return ::openat(directory, name.c_str(), DirectoryFlags); });
}

/// Renames within a directory, never over another item.
int renameToFreeName(int directory, const char* from, const char* to) {
  if (::renameat2(directory, from, directory, to, RENAME_NOREPLACE) == 0) return 0;
  if (errno != EINVAL && errno != ENOSYS) return errno;
  // Not every file system can do that in one step.
  if (::linkat(directory, from, directory, to, 0) != 0) return errno;
  return ::unlinkat(directory, from, 0) == 0 ? 0 : errno;
}

}  // namespace

int Destination::open(const std::string& path) {
  std::error_code error;
  std::filesystem::create_directories(path, error);
  if (error) return error.value();
  root_ = Descriptor(retrying([&] { return ::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC); }));
  passingName_ = ".arc-copier-" + MarletFoundation::randomUUIDString();
  return root_ ? 0 : errno;
}

bool Destination::exists(const std::string& path) {
  std::string name;
  struct stat status;
  return openParent(path, name, false) == 0 &&
         ::fstatat(parent_.get(), name.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0;
}

int Destination::makeDirectory(const std::string& path, mode_t mode) {
  std::string name;
  if (const int error = openParent(path, name, true)) return error;
  if (::mkdirat(parent_.get(), name.c_str(), mode) == 0) return 0;
  if (errno != EEXIST) return errno;
  return Descriptor(openName(parent_.get(), name)) ? 0 : EEXIST;
}

int Destination::makeFile(const std::string& path, mode_t mode, Naming naming, File& file) {
  if (const int error = openParent(path, file.name_, true)) return error;
  const auto& name = naming == Naming::atOnce ? file.name_ : passingName_;
  const int flags = O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC;
  file.descriptor_ = Descriptor(retrying([&] { return ::openat(parent_.get(), name.c_str(), flags, mode); }));
  if (!file.descriptor_) return errno;
  file.directory_ = parent_.get();
  file.currentName_ = name;
  return 0;
}

int Destination::openParent(const std::string& path, std::string& name, bool makingIt) {
  const auto slash = path.rfind('/');
  name = slash == std::string::npos ? path : path.substr(slash + 1);
  const auto parentPath = slash == std::string::npos ? "." : path.substr(0, slash);
  if (parentPath == parentPath_) return 0;
  Descriptor parent;
  if (const int error = openDirectory(parentPath, makingIt, parent)) return error;
  parent_ = std::move(parent);
  parentPath_ = parentPath;
  return 0;
}

int Destination::openDirectory(const std::string& path, bool makingIt, Descriptor& directory) {
  // Up to what is there already, and down again name by name.
  auto there = path;
  while (!(directory = Descriptor(openBeneath(root_.get(), there.empty() ? "." : there.c_str())))) {
    if (errno == ENOSYS || errno == EPERM) {  // unsupported
      there.clear();
      directory = Descriptor(openName(root_.get(), "."));
      break;
    }
    if (errno != ENOENT || !makingIt || there.empty()) return errno;
    const auto slash = there.rfind('/');
    there.resize(slash == std::string::npos ? 0 : slash);
  }
  for (const auto component : MarletFoundation::split(std::string_view(path).substr(there.size()), '/')) {
    if (!directory) return errno;
    if (component.empty() || component == ".") continue;
    const std::string name(component);
    if (makingIt && ::mkdirat(directory.get(), name.c_str(), 0777) != 0 && errno != EEXIST) return errno;
    directory = Descriptor(openName(directory.get(), name));
  }
  return directory ? 0 : errno;
}

Destination::File::~File() {
  if (!currentName_.empty()) ::unlinkat(directory_, currentName_.c_str(), 0);
}

int Destination::File::write(std::string_view bytes) {
  return MarletFoundation::writeAll(descriptor_.get(), bytes) == 0 ? 0 : errno;
}

int Destination::File::finish() {
  // Some file systems tell only now that what was written didn't reach the disk.
  if (::close(descriptor_.release()) != 0 && errno != EINTR) return errno;
  if (currentName_ != name_) {
    if (const int error = renameToFreeName(directory_, currentName_.c_str(), name_.c_str())) return error;
  }
  currentName_.clear();
  return 0;
}

}  // namespace ArcCopierImplementation
