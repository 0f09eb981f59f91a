#include "MarletFoundation/Platform/AtomicReplacement.h"

#include <stdio.h>
#include <sys/file.h>
#include <unistd.h>

#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {
namespace {

constexpr int MostLinks = 40;
constexpr int MostAttempts = 100;

struct SplitPath {
  std::string parent, name;

  explicit SplitPath(const std::string& path) {
    const auto slash = path.rfind('/');
    name = path.substr(slash + 1);
    parent = slash == std::string::npos ? "." : path.substr(0, slash + 1);
  }
};

/// The names that replacements of an item build under begin alike, whatever the length of the item's name.
std::string prefixFor(std::string_view name) {
  MD5 digest;
  digest.update(name);
  std::string prefix = ".marlet-";
  for (int i = 0; const auto byte : digest.final()) {
    if (i++ == 8) break;
    prefix += "0123456789abcdef"[byte >> 4];
    prefix += "0123456789abcdef"[byte & 15];
  }
  return prefix + "-";
}

constexpr std::string_view DisplacedSuffix = "displaced";

}  // namespace

AtomicReplacement::AtomicReplacement(std::string path) : path_(std::move(path)) {
  findDestination();
  prefix_ = prefixFor(name_);
  if (!replaced_) undoHalfReplacement();
  clearLeftovers();
}

AtomicReplacement::~AtomicReplacement() {
  if (!staging_.empty()) removeTree(parent_.get(), staging_);
}

void AtomicReplacement::findDestination() {
  std::string path = path_;
  for (int links = 0;; ++links) {
    const SplitPath split(path);
    name_ = split.name;
    if (!isFileName(name_)) throwPosix(EINVAL, path_);
    parent_ =
        Descriptor(retrying([&] { return ::open(split.parent.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
    if (!parent_) throwPosix(errno, path_);
    struct stat status;
    if (::fstatat(parent_.get(), name_.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
      if (errno != ENOENT) throwPosix(errno, path_);
      return;
    }
    if (!S_ISLNK(status.st_mode)) {
      if (!S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode)) throwPosix(EINVAL, path_);
      replaced_ = status;
      return;
    }
    if (links == MostLinks) throwPosix(ELOOP, path_);
    std::string target(static_cast<std::size_t>(PATH_MAX), '\0');
    const auto length = ::readlinkat(parent_.get(), name_.c_str(), target.data(), target.size());
    if (length < 0) throwPosix(errno, path_);
    target.resize(static_cast<std::size_t>(length));
    path = target.starts_with('/') ? target : split.parent + target;
  }
}

void AtomicReplacement::undoHalfReplacement() {
  const auto displaced = prefix_ + std::string(DisplacedSuffix);
  if (::renameat2(parent_.get(), displaced.c_str(), parent_.get(), name_.c_str(), RENAME_NOREPLACE) != 0 &&
      (errno != EINVAL || ::renameat(parent_.get(), displaced.c_str(), parent_.get(), name_.c_str()) != 0)) {
    return;
  }
  findDestination();
}

void AtomicReplacement::clearLeftovers() {
  const auto entries =
      DiskDirectory::root(Descriptor(::openat(parent_.get(), ".", DirectoryFlags)))->entries();
  if (!entries) return;
  for (const auto& entry : *entries) {
    if (!entry.name.starts_with(prefix_)) continue;
    struct stat status;
    if (::fstatat(parent_.get(), entry.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
    if (!S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode)) continue;
    // Whoever is still building holds a lock on it.
    const Descriptor left(::openat(parent_.get(), entry.name.c_str(), ReadingFlags | O_NOFOLLOW));
    if (left && ::flock(left.get(), LOCK_EX | LOCK_NB) == 0) removeTree(parent_.get(), entry.name);
  }
}

Descriptor AtomicReplacement::openReplaced() const {
  Descriptor opened(
      retrying([&] { return ::openat(parent_.get(), name_.c_str(), ReadingFlags | O_NOFOLLOW); }));
  if (!opened) throwPosix(errno, path_);
  return opened;
}

int AtomicReplacement::makeFile() {
  const mode_t mode = replacesFile() ? 0600 : 0666;
  start([&] {
    return Descriptor(::openat(parent_.get(), staging_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, mode));
  });
  if (replacesFile() && copyAttributes(openReplaced().get(), built_.get()) != 0) throwPosix(errno, path_);
  return built_.get();
}

std::shared_ptr<DiskDirectory> AtomicReplacement::makeDirectory(mode_t mode) {
  start([&] {
    if (::mkdirat(parent_.get(), staging_.c_str(), mode) != 0) return Descriptor();
    return Descriptor(::openat(parent_.get(), staging_.c_str(), DirectoryFlags));
  });
  Descriptor root(::fcntl(built_.get(), F_DUPFD_CLOEXEC, 0));
  if (!root) throwPosix(errno, path_);
  return DiskDirectory::root(std::move(root));
}

/// Makes the item under a new name and locks it. Another writer that comes in between takes it for a leftover
/// and clears it away; then it is made again.
template <class Make>
void AtomicReplacement::start(Make make) {
  for (int attempt = 0; attempt < MostAttempts; ++attempt) {
    staging_ = prefix_ + randomUUIDString();
    built_ = make();
    if (!built_ && errno != ENOENT) break;
    struct stat status;
    // A file system without locks has none for the other writer, either, who then clears nothing.
    if (built_ && (::flock(built_.get(), LOCK_EX | LOCK_NB) == 0 || errno != EWOULDBLOCK) &&
        ::fstat(built_.get(), &status) == 0 && status.st_nlink > 0) {
      return;
    }
  }
  const int error = built_ ? EBUSY : errno;
  removeTree(parent_.get(), staging_);
  staging_.clear();
  throwPosix(error, path_);
}

void AtomicReplacement::commit() {
  if (::fsync(built_.get()) != 0) throwPosix(errno, path_);
  putInPlace();
  ::flock(built_.get(), LOCK_UN);
  if (::fsync(parent_.get()) != 0 && errno != EINVAL) throwPosix(errno, path_);
  if (staging_.empty()) return;
  removeTree(parent_.get(), staging_);
  staging_.clear();
}

void AtomicReplacement::putInPlace() {
  struct stat built;
  if (::fstat(built_.get(), &built) != 0) throwPosix(errno, path_);
  for (int attempt = 0; attempt < MostAttempts; ++attempt) {
    struct stat old;
    const bool exists = ::fstatat(parent_.get(), name_.c_str(), &old, AT_SYMLINK_NOFOLLOW) == 0;
    if (!exists && errno != ENOENT) throwPosix(errno, path_);
    const bool exchanges = exists && (S_ISDIR(old.st_mode) || S_ISDIR(built.st_mode));
    const unsigned flags = exchanges ? RENAME_EXCHANGE : exists ? 0 : RENAME_NOREPLACE;
    if (::renameat2(parent_.get(), staging_.c_str(), parent_.get(), name_.c_str(), flags) == 0) {
      if (!exchanges) staging_.clear();
      return;
    }
    if (exchanges && (errno == EINVAL || errno == ENOSYS)) return replaceInTwoSteps();
    if (!exists && (errno == EINVAL || errno == ENOSYS)) {
      if (::renameat(parent_.get(), staging_.c_str(), parent_.get(), name_.c_str()) != 0)
        throwPosix(errno, path_);
      staging_.clear();
      return;
    }
    if (errno != ENOENT && errno != EEXIST) throwPosix(errno, path_);
  }
  throwPosix(EBUSY, path_);
}

void AtomicReplacement::replaceInTwoSteps() {
  const auto displaced = prefix_ + std::string(DisplacedSuffix);
  removeTree(parent_.get(), displaced);
  if (::renameat(parent_.get(), name_.c_str(), parent_.get(), displaced.c_str()) != 0)
    throwPosix(errno, path_);
  if (::renameat(parent_.get(), staging_.c_str(), parent_.get(), name_.c_str()) != 0) {
    const int error = errno;
    ::renameat(parent_.get(), displaced.c_str(), parent_.get(), name_.c_str());
    throwPosix(error, path_);
  }
  staging_ = displaced;
}

std::optional<std::string> AtomicReplacement::displacedPath(const std::string& path) {
  const SplitPath split(path);
  auto displaced = split.parent + prefixFor(split.name) + std::string(DisplacedSuffix);
  struct stat status;
  const bool exists =
      ::lstat(displaced.c_str(), &status) == 0 && (S_ISDIR(status.st_mode) || S_ISREG(status.st_mode));
  return exists ? std::optional(std::move(displaced)) : std::nullopt;
}

}  // namespace MarletFoundation
