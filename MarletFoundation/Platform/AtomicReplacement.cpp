#include "MarletFoundation/Platform/AtomicReplacement.h"

#include <stdio.h>
#include <sys/file.h>
#include <unistd.h>

#include "MarletFoundation/Platform/CommitLock.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/LinkProtection.h"
#include "MarletFoundation/Platform/StageNames.h"
#include "MarletFoundation/Platform/TreeSurvey.h"

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

/// Whether the file system or a layer above it can't do what was asked for, rather than that it failed.
bool isRefusal(int error) {
  return error == EINVAL || error == ENOSYS || error == EOPNOTSUPP || error == EXDEV;
}

/// The host's own failures don't reach a writer that is done.
void reportLeftBehind(const std::string& itemPath, const std::string& name, int error) noexcept {
  try {
    const auto path = SplitPath(itemPath).parent + name;
    HostEnvironment::current().leftBehind(path, ErrorObject::posix(error, path));
  } catch (...) {
  }
}

[[noreturn]] void failStale(const std::string& path) {
  throwPosix(ESTALE, path, "It was replaced after it had been opened.");
}

}  // namespace

AtomicReplacement::AtomicReplacement(std::string path, ExistingItem existing)
    : path_(std::move(path)), existing_(existing), place_(currentPlace()) {
  stagePrefix_ = stagePrefix(place_.name);
  displaced_ = displacedName(place_.name);
  if (!place_.item) undoHalfReplacement();
  if (place_.item && existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
  if (place_.item && isMountPoint(place_.parent.get(), place_.name.c_str())) {
    throwPosix(EBUSY, path_, "A mount point can't be replaced as a whole.");
  }
  clearLeftovers();
  requireNotCancelled(path_);
  if (replacesDirectory()) {
    replacedDirectory_ = openReplaced();
    struct stat opened;
    if (::fstat(replacedDirectory_.get(), &opened) != 0) throwPosix(errno, path_);
    if (!isSameItem(opened, *place_.item)) failStale(path_);
  }
}

AtomicReplacement::~AtomicReplacement() { discard(); }

/// Removes what lies at the name of the stage.
void AtomicReplacement::discard() noexcept {
  if (staging_.empty()) return;
  if (const int error = removeTree(place_.parent.get(), staging_); error != 0)
    reportLeftBehind(path_, staging_, error);
  staging_.clear();
}

AtomicReplacement::Place AtomicReplacement::currentPlace() const {
  std::string way = path_;
  for (int links = 0;; ++links) {
    const SplitPath split(way);
    Place place;
    place.name = split.name;
    if (!isFileName(place.name)) throwPosix(EINVAL, path_);
    place.parent =
        Descriptor(walkingAgain([&] { return ::open(split.parent.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
    if (!place.parent) throwPosix(errno, path_);
    struct stat status;
    if (::fstatat(place.parent.get(), place.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
      if (errno != ENOENT) throwPosix(errno, path_);
      return place;
    }
    if (!S_ISLNK(status.st_mode)) {
      if (!S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode)) throwPosix(EINVAL, path_);
      place.item = status;
      return place;
    }
    if (existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
    if (links == MostLinks) throwPosix(ELOOP, path_);
    if (!mayFollowLink(place.parent.get(), status)) throwPosix(EACCES, path_);
    std::string target(static_cast<std::size_t>(PATH_MAX), '\0');
    const auto length = ::readlinkat(place.parent.get(), place.name.c_str(), target.data(), target.size());
    if (length < 0) throwPosix(errno, path_);
    target.resize(static_cast<std::size_t>(length));
    way = target.starts_with('/') ? target : split.parent + target;
  }
}

void AtomicReplacement::undoHalfReplacement() {
  if (moveToFreeName(displaced_, place_.name) == 0) place_ = currentPlace();
}

int AtomicReplacement::moveToFreeName(const std::string& from, const std::string& to) {
  const int parent = place_.parent.get();
  const int result = ::renameat2(parent, from.c_str(), parent, to.c_str(), RENAME_NOREPLACE);
  if (result == 0 || !isRefusal(errno)) return result;
  struct stat status;
  if (::fstatat(parent, to.c_str(), &status, AT_SYMLINK_NOFOLLOW) == 0) {
    errno = EEXIST;
    return -1;
  }
  return ::renameat(parent, from.c_str(), parent, to.c_str());
}

void AtomicReplacement::clearLeftovers() {
  // With the item in its place the displaced one is done with. It must not be taken for the item once a part
  // of it is gone.
  if (place_.item) moveToFreeName(displaced_, newStageName(stagePrefix_));
  const auto entries =
      DiskDirectory::root(Descriptor(::openat(place_.parent.get(), ".", DirectoryFlags)))->entries();
  if (!entries) return;
  for (const auto& entry : *entries) {
    if (!isStage(entry.name, stagePrefix_)) continue;
    struct stat status;
    if (::fstatat(place_.parent.get(), entry.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
    if (!S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode)) continue;
    // Whoever is still building holds a lock on it.
    const Descriptor left(::openat(place_.parent.get(), entry.name.c_str(), ReadingFlags | O_NOFOLLOW));
    if (!left || ::flock(left.get(), LOCK_EX | LOCK_NB) != 0) continue;
    if (const int error = removeTree(place_.parent.get(), entry.name); error != 0)
      reportLeftBehind(path_, entry.name, error);
  }
}

Descriptor AtomicReplacement::openReplaced() const {
  Descriptor opened(retrying(
      [&] { return ::openat(place_.parent.get(), place_.name.c_str(), ReadingFlags | O_NOFOLLOW); }));
  if (!opened && errno == ENOENT) failStale(path_);
  if (!opened) throwPosix(errno, path_);
  return opened;
}

int AtomicReplacement::makeFile() {
  const mode_t mode = replacesFile() ? 0600 : 0666;
  start([&] {
    return Descriptor(
        ::openat(place_.parent.get(), staging_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, mode));
  });
  if (replacesFile() && copyAttributes(openReplaced().get(), built_.get()) != 0) throwPosix(errno, path_);
  return built_.get();
}

std::shared_ptr<DiskDirectory> AtomicReplacement::makeDirectory(mode_t mode) {
  start([&] {
    if (::mkdirat(place_.parent.get(), staging_.c_str(), mode) != 0) return Descriptor();
    return Descriptor(::openat(place_.parent.get(), staging_.c_str(), DirectoryFlags));
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
    staging_ = newStageName(stagePrefix_);
    built_ = make();
    if (!built_ && errno == EEXIST) continue;
    if (!built_ && errno != ENOENT) break;
    struct stat status;
    // A file system without locks has none for the other writer, either, who then clears nothing.
    if (built_ && (::flock(built_.get(), LOCK_EX | LOCK_NB) == 0 || errno != EWOULDBLOCK) &&
        ::fstat(built_.get(), &status) == 0 && status.st_nlink > 0) {
      return;
    }
  }
  const int error = built_ ? EBUSY : errno;
  if (error != EEXIST) removeTree(place_.parent.get(), staging_);
  staging_.clear();
  if (error == ENOENT) failStale(path_);  // the directory itself is gone
  throwPosix(error, path_);
}

void AtomicReplacement::commit(const std::function<void()>& check) {
  if (::fsync(built_.get()) != 0) throwPosix(errno, path_);
  requireNotCancelled(path_);
  {
    const CommitLock lock(place_.parent.get(), replacedDirectory_, path_);
    requireSamePlace();
    requireSameItem();
    if (check) check();
    putInPlace();
    settle(check);
    ::flock(built_.get(), LOCK_UN);
  }
  discard();
}

/// What was put in place stays only if the old item is still what it was, and the change can be flushed.
void AtomicReplacement::settle(const std::function<void()>& check) {
  try {
    requireSamePlace();
    struct stat displaced;
    if (replacesDirectory() &&
        (::fstatat(place_.parent.get(), staging_.c_str(), &displaced, AT_SYMLINK_NOFOLLOW) != 0 ||
         !isSameItem(displaced, *place_.item))) {
      failStale(path_);
    }
    if (check) check();
    if (::fsync(place_.parent.get()) != 0 && errno != EINVAL) throwPosix(errno, path_);
  } catch (...) {
    takeBack();
    throw;
  }
}

/// Puts the old item back; what took its place is a stage again. Without an exchange the old item bears the displaced
/// name meanwhile, so that the next writer takes it for the item, and not for a stage, if this one ends here.
void AtomicReplacement::takeBack() {
  const int parent = place_.parent.get();
  const auto old = std::exchange(staging_, {});
  if (!old.empty() && ::renameat2(parent, old.c_str(), parent, place_.name.c_str(), RENAME_EXCHANGE) == 0) {
    staging_ = old;
    return;
  }
  if (old.empty() && place_.item) return;  // a file is gone once another was renamed to its name
  if (!old.empty() && old != displaced_ && moveToFreeName(old, displaced_) != 0) return;
  auto built = newStageName(stagePrefix_);
  if (moveToFreeName(place_.name, built) != 0) return;
  if (!old.empty()) moveToFreeName(displaced_, place_.name);
  staging_ = std::move(built);
}

void AtomicReplacement::requireSamePlace() const {
  Place now;
  try {
    now = currentPlace();
  } catch (const ErrorObject& error) {
    if (error.code() != ENOENT) throw;
  }
  struct stat parent, parentNow;
  const bool isSame = now.name == place_.name && ::fstat(place_.parent.get(), &parent) == 0 &&
                      ::fstat(now.parent.get(), &parentNow) == 0 && isSameItem(parent, parentNow);
  if (!isSame)
    throwPosix(ESTALE, path_, "What lies on the way to the document changed while it was written.");
}

/// A directory is replaced only by who took it for what it is.
void AtomicReplacement::requireSameItem() const {
  struct stat now;
  const bool isThere = ::fstatat(place_.parent.get(), place_.name.c_str(), &now, AT_SYMLINK_NOFOLLOW) == 0;
  if (!isThere && errno != ENOENT) throwPosix(errno, path_);
  if (isThere && existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
  const bool wasDirectory = replacesDirectory(), isDirectory = isThere && S_ISDIR(now.st_mode);
  if (wasDirectory != isDirectory || (isDirectory && !isSameItem(now, *place_.item))) failStale(path_);
}

void AtomicReplacement::putInPlace() {
  const int parent = place_.parent.get();
  struct stat built;
  if (::fstat(built_.get(), &built) != 0) throwPosix(errno, path_);
  for (int attempt = 0; attempt < MostAttempts; ++attempt) {
    struct stat old;
    const bool exists = ::fstatat(parent, place_.name.c_str(), &old, AT_SYMLINK_NOFOLLOW) == 0;
    if (!exists && errno != ENOENT) throwPosix(errno, path_);
    if (exists && existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
    if (!exists) {
      if (moveToFreeName(staging_, place_.name) == 0) return staging_.clear();
    } else if (::renameat2(parent, staging_.c_str(), parent, place_.name.c_str(), RENAME_EXCHANGE) == 0) {
      return;
    } else if (isRefusal(errno)) {
      if (S_ISDIR(old.st_mode) || S_ISDIR(built.st_mode)) return replaceInTwoSteps();
      if (::renameat(parent, staging_.c_str(), parent, place_.name.c_str()) == 0) return staging_.clear();
    }
    if (errno != ENOENT && errno != EEXIST) throwPosix(errno, path_);
  }
  throwPosix(EBUSY, path_);
}

/// The displaced item's name is the journal: while nothing bears the item's own name, that one is the item.
void AtomicReplacement::replaceInTwoSteps() {
  if (moveToFreeName(place_.name, displaced_) != 0) throwPosix(errno, path_);
  if (::fsync(place_.parent.get()) != 0 || moveToFreeName(staging_, place_.name) != 0) {
    const int error = errno;
    moveToFreeName(displaced_, place_.name);
    throwPosix(error, path_);
  }
  if (moveToFreeName(displaced_, staging_) != 0) staging_ = displaced_;
}

std::optional<std::string> AtomicReplacement::displacedPath(const std::string& path) {
  const SplitPath split(path);
  auto displaced = split.parent + displacedName(split.name);
  struct stat status;
  const bool exists =
      ::lstat(displaced.c_str(), &status) == 0 && (S_ISDIR(status.st_mode) || S_ISREG(status.st_mode));
  return exists ? std::optional(std::move(displaced)) : std::nullopt;
}

}  // namespace MarletFoundation
