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

constexpr std::string_view StageMark = ".stage.";
constexpr std::string_view DisplacedMark = ".displaced";
constexpr std::size_t StageLetters = 6;
/// What the system takes for a name, less the longest that is put around one.
constexpr std::size_t LongestName = NAME_MAX - 1 - StageMark.size() - StageLetters;

/// How the names begin that stand for an item while it is replaced. A name too long to be added to is cut and
/// told from others by a digest.
std::string hiddenName(const std::string& name) {
  if (name.size() <= LongestName) return "." + name;
  MD5 digest;
  digest.update(name);
  std::string digits;
  for (const auto byte : digest.final()) {
    digits += "0123456789abcdef"[byte >> 4];
    digits += "0123456789abcdef"[byte & 15];
  }
  return "." + name.substr(0, LongestName - digits.size()) + digits;
}

std::string randomLetters() {
  auto letters = randomUUIDString();
  std::erase(letters, '-');
  letters.resize(StageLetters);
  return letters;
}

/// Whether the file system or a layer above it can't do what was asked for, rather than that it failed.
bool isRefusal(int error) {
  return error == EINVAL || error == ENOSYS || error == EOPNOTSUPP || error == EXDEV;
}

bool isMountPoint(int parent, const std::string& name) {
  struct statx status;
  return ::statx(parent, name.c_str(), AT_SYMLINK_NOFOLLOW, STATX_TYPE, &status) == 0 &&
         (status.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0;
}

}  // namespace

AtomicReplacement::AtomicReplacement(std::string path, ExistingItem existing)
    : path_(std::move(path)), existing_(existing), place_(currentPlace()) {
  stagePrefix_ = hiddenName(place_.name) + std::string(StageMark);
  displaced_ = hiddenName(place_.name) + std::string(DisplacedMark);
  if (!place_.item) undoHalfReplacement();
  if (place_.item && existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
  if (place_.item && isMountPoint(place_.parent.get(), place_.name)) {
    throwPosix(EBUSY, path_, "A mount point can't be replaced as a whole.");
  }
  clearLeftovers();
}

AtomicReplacement::~AtomicReplacement() {
  if (!staging_.empty()) removeTree(place_.parent.get(), staging_);
}

AtomicReplacement::Place AtomicReplacement::currentPlace() const {
  std::string way = path_;
  for (int links = 0;; ++links) {
    const SplitPath split(way);
    Place place;
    place.name = split.name;
    if (!isFileName(place.name)) throwPosix(EINVAL, path_);
    place.parent =
        Descriptor(retrying([&] { return ::open(split.parent.c_str(), DirectoryFlags & ~O_NOFOLLOW); }));
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

bool AtomicReplacement::isStage(std::string_view name) const {
  return name.size() == stagePrefix_.size() + StageLetters && name.starts_with(stagePrefix_);
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
  if (place_.item) moveToFreeName(displaced_, stagePrefix_ + randomLetters());
  const auto entries =
      DiskDirectory::root(Descriptor(::openat(place_.parent.get(), ".", DirectoryFlags)))->entries();
  if (!entries) return;
  for (const auto& entry : *entries) {
    if (!isStage(entry.name)) continue;
    struct stat status;
    if (::fstatat(place_.parent.get(), entry.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
    if (!S_ISREG(status.st_mode) && !S_ISDIR(status.st_mode)) continue;
    // Whoever is still building holds a lock on it.
    const Descriptor left(::openat(place_.parent.get(), entry.name.c_str(), ReadingFlags | O_NOFOLLOW));
    if (left && ::flock(left.get(), LOCK_EX | LOCK_NB) == 0) removeTree(place_.parent.get(), entry.name);
  }
}

Descriptor AtomicReplacement::openReplaced() const {
  Descriptor opened(retrying(
      [&] { return ::openat(place_.parent.get(), place_.name.c_str(), ReadingFlags | O_NOFOLLOW); }));
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
    staging_ = stagePrefix_ + randomLetters();
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
  throwPosix(error, path_);
}

void AtomicReplacement::commit() {
  if (::fsync(built_.get()) != 0) throwPosix(errno, path_);
  requireSamePlace();
  putInPlace();
  ::flock(built_.get(), LOCK_UN);
  if (::fsync(place_.parent.get()) != 0 && errno != EINVAL) throwPosix(errno, path_);
  if (staging_.empty()) return;
  removeTree(place_.parent.get(), staging_);
  staging_.clear();
}

void AtomicReplacement::requireSamePlace() const {
  const auto now = currentPlace();
  struct stat parent, parentNow;
  const bool isSame = now.name == place_.name && ::fstat(place_.parent.get(), &parent) == 0 &&
                      ::fstat(now.parent.get(), &parentNow) == 0 && parent.st_dev == parentNow.st_dev &&
                      parent.st_ino == parentNow.st_ino;
  if (!isSame) throwPosix(ESTALE, path_, "A link on the way to the document changed while it was written.");
}

void AtomicReplacement::putInPlace() {
  struct stat built;
  if (::fstat(built_.get(), &built) != 0) throwPosix(errno, path_);
  for (int attempt = 0; attempt < MostAttempts; ++attempt) {
    struct stat old;
    const bool exists = ::fstatat(place_.parent.get(), place_.name.c_str(), &old, AT_SYMLINK_NOFOLLOW) == 0;
    if (!exists && errno != ENOENT) throwPosix(errno, path_);
    if (exists && existing_ == ExistingItem::Kept) throwPosix(EEXIST, path_);
    if (!exists) {
      if (moveToFreeName(staging_, place_.name) == 0) return staging_.clear();
    } else if (S_ISDIR(old.st_mode) || S_ISDIR(built.st_mode)) {
      if (::renameat2(place_.parent.get(), staging_.c_str(), place_.parent.get(), place_.name.c_str(),
                      RENAME_EXCHANGE) == 0)
        return;
      if (isRefusal(errno)) return replaceInTwoSteps();
    } else if (::renameat(place_.parent.get(), staging_.c_str(), place_.parent.get(), place_.name.c_str()) ==
               0) {
      return staging_.clear();
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
  auto displaced = split.parent + hiddenName(split.name) + std::string(DisplacedMark);
  struct stat status;
  const bool exists =
      ::lstat(displaced.c_str(), &status) == 0 && (S_ISDIR(status.st_mode) || S_ISREG(status.st_mode));
  return exists ? std::optional(std::move(displaced)) : std::nullopt;
}

}  // namespace MarletFoundation
