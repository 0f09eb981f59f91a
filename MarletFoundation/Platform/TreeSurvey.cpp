#include "MarletFoundation/Platform/TreeSurvey.h"

#include <sys/sysmacros.h>

#include <algorithm>
#include <ctime>
#include <set>

#include "MarletFoundation/Platform/StageNames.h"

namespace MarletFoundation {
namespace {

/// By how much a change's time may lie behind the change: file systems take it from a clock that ticks slowly, the
/// coarsest every two seconds.
constexpr time_t Tick = 2;

bool sameTime(const timespec& a, const timespec& b) { return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec; }

struct stat statusOf(const struct statx& found) {
  struct stat status {};
  status.st_mode = found.stx_mode;
  status.st_ino = static_cast<ino_t>(found.stx_ino);
  status.st_size = static_cast<off_t>(found.stx_size);
  status.st_mtim = {static_cast<time_t>(found.stx_mtime.tv_sec), static_cast<long>(found.stx_mtime.tv_nsec)};
  status.st_ctim = {static_cast<time_t>(found.stx_ctime.tv_sec), static_cast<long>(found.stx_ctime.tv_nsec)};
  return status;
}

int look(int directory, const char* name, struct statx& found) {
  const int flags = AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT | (*name ? 0 : AT_EMPTY_PATH);
  return retrying([&] { return ::statx(directory, name, flags, STATX_BASIC_STATS, &found); });
}

bool isMountRoot(const struct statx& found) { return (found.stx_attributes & STATX_ATTR_MOUNT_ROOT) != 0; }

/// The entries of a directory that are no stages. Nothing and errno when they can't be listed.
std::optional<std::vector<DiskDirectory::Entry>> documentEntries(DiskDirectory& directory) {
  auto entries = directory.entries();
  if (!entries) return std::nullopt;
  std::set<std::string, std::less<>> names;
  for (const auto& entry : *entries) names.insert(entry.name);
  std::erase_if(*entries, [&](const auto& entry) { return isStageOfOneOf(names, entry.name); });
  std::sort(entries->begin(), entries->end(), [](const auto& a, const auto& b) { return a.name < b.name; });
  return entries;
}

}  // namespace

bool isMountPoint(int directory, const char* name) {
  struct statx found;
  return look(directory, name, found) == 0 && isMountRoot(found);
}

TreeSurvey::Entry* TreeSurvey::Directory::find(std::string_view name) {
  const auto found =
      std::lower_bound(entries.begin(), entries.end(), name,
                       [](const Entry& entry, std::string_view wanted) { return entry.name < wanted; });
  return found != entries.end() && found->name == name ? &*found : nullptr;
}

TreeSurvey::TreeSurvey(std::shared_ptr<DiskDirectory> root, const std::string& path) : path_(path) {
  struct stat status;
  if (::fstat(root->descriptor(), &status) != 0) throwPosix(errno, path_);
  device_ = status.st_dev;
  add(std::move(root));
  for (std::size_t number = 0; number < directories_.size(); ++number) list(number);
}

std::size_t TreeSurvey::add(std::shared_ptr<DiskDirectory> directory) {
  directories_.push_back({std::move(directory), {}});
  return directories_.size() - 1;
}

void TreeSurvey::list(std::size_t number) {
  const auto onDisk = directories_[number].onDisk;
  struct stat own;
  if (onDisk->descriptor() < 0 || ::fstat(onDisk->descriptor(), &own) != 0) fail(errno, *onDisk);
  timespec now{};
  ::clock_gettime(CLOCK_REALTIME, &now);
  directories_[number].changed = own.st_ctim;
  directories_[number].isSettled = own.st_ctim.tv_sec + Tick < now.tv_sec;
  const auto listed = documentEntries(*onDisk);
  if (!listed) fail(errno, *onDisk);
  std::vector<Entry> entries;
  entries.reserve(listed->size());
  for (const auto& [name, type, listedNumber] : *listed) {
    struct statx found;
    if (look(onDisk->descriptor(), name.c_str(), found) != 0) fail(errno, *onDisk, name);
    const auto status = statusOf(found);
    const mode_t kind = status.st_mode & S_IFMT;
    // A layered file system gives its files the devices of the layers.
    const bool isElsewhere =
        kind == S_IFDIR && ::gnu_dev_makedev(found.stx_dev_major, found.stx_dev_minor) != device_;
    if (isMountRoot(found) || isElsewhere) {
      throwPosix(EBUSY, path_ + "/" + onDisk->path() + name,
                 "Something is mounted here, which can't be part of a document that is written.");
    }
    entries.push_back({name, kind, FileStamp(status), None, listedNumber});
    if (kind == S_IFDIR) {
      entries.back().directory =
          add(DiskDirectory::child(onDisk, SharedString(name), Descriptor(), status.st_ino));
    }
  }
  directories_[number].entries = std::move(entries);
}

void TreeSurvey::requireUnchanged() {
  for (auto& directory : directories_) requireUnchanged(directory);
}

void TreeSurvey::requireUnchanged(Directory& directory) {
  auto& onDisk = *directory.onDisk;
  struct stat own;
  const bool isRoot = !onDisk.parent();
  if ((isRoot ? ::fstat(onDisk.descriptor(), &own) : onDisk.parent()->status(onDisk.name().c_str(), own)) !=
      0) {
    fail(errno, onDisk);
  }
  if (!isRoot && own.st_ino != onDisk.number()) fail(ESTALE, onDisk);
  if (!directory.isSettled || !sameTime(own.st_ctim, directory.changed)) requireSameEntries(directory);
  for (const auto& entry : directory.entries) {
    if (entry.isShared || entry.kind != S_IFREG) continue;
    struct stat now;
    if (onDisk.status(entry.name.c_str(), now) != 0) fail(errno, onDisk, entry.name);
    if (FileStamp(now) != entry.stamp) fail(ESTALE, onDisk, entry.name);
  }
}

void TreeSurvey::requireSameEntries(Directory& directory) {
  const auto now = documentEntries(*directory.onDisk);
  if (!now) fail(errno, *directory.onDisk);
  auto next = now->begin();
  for (const auto& entry : directory.entries) {
    if (next == now->end() || next->name != entry.name || next->number != entry.listedNumber)
      fail(ESTALE, *directory.onDisk, entry.name);
    ++next;
  }
  if (next != now->end()) fail(ESTALE, *directory.onDisk, next->name);
}

void TreeSurvey::fail(int error, const DiskDirectory& directory, std::string_view name) const {
  const auto place = path_ + "/" + directory.path() + std::string(name);
  // What had a name at the look and has none now was taken away.
  if (error != ESTALE && error != ENOENT) throwPosix(error, place);
  throwPosix(ESTALE, place, "It was changed after it had been opened.");
}

}  // namespace MarletFoundation
