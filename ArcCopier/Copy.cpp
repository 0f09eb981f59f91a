#include "ArcCopier/Copy.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "ArcCopier/Copier.h"

namespace ArcCopierImplementation {
namespace {

/// Archives of less than this are never called bombs for expanding well.
constexpr std::uint64_t RatioThreshold = 16 << 20;
constexpr mode_t Permissions = S_IRWXU | S_IRWXG | S_IRWXO;

/// Permissions without special bits; a directory stays usable to its owner.
mode_t permissions(const PlannedItem& item) {
  const mode_t mode = item.entry->mode & Permissions;
  if (item.path.isDirectory) return mode == 0 ? Permissions : mode | S_IRWXU;
  return mode == 0 ? mode_t{0666} : mode;
}

/// Whether it is no use to go on with the next file.
bool isDestinationsEnd(int error) {
  return error == ENOSPC || error == EDQUOT || error == EROFS || error == EIO || error == ENOMEM ||
         error == EMFILE || error == ENFILE;
}

}  // namespace

Copy::Copy(ArcCopier& copier, int archive) : copier_(copier), directory_(archive, copier.limits.entries) {
  directory_.checkLocalHeaders();
  items_ = plan(directory_, copier.limits.entries);
  std::vector<const ZipEntry*> readable;
  for (const auto& item : items_) {
    if (!item.path.problem && !item.path.isDirectory) readable.push_back(item.entry);
  }
  reader_.emplace(archive, std::move(readable));
}

int Copy::run(const char* destination) {
  if (const int error = destination_.open(destination)) {
    copier_.call(copier_.fatalError, destination, error, std::strerror(error));
    throw CopyEnd{ArcCopierBadDestination, error};
  }
  for (const auto& item : items_) {
    if (copier_.isCancelled) throw CopyEnd{ArcCopierCancelled, ECANCELED};
    copy(item);
  }
  return firstError_;
}

void Copy::copy(const PlannedItem& item) {
  const auto& path = item.path;
  if (path.problem) return failed(item, path.problem);
  stopUnlessContinued(copier_.call(copier_.started, path.shown.c_str()));
  if (!path.isDirectory) return copyFile(item);
  const int error =
      path.normalized.empty() ? 0 : destination_.makeDirectory(path.normalized, permissions(item));
  if (error != 0) return failedToWrite(item, error);
  stopUnlessContinued(copier_.call(copier_.finished, path.shown.c_str()));
}

void Copy::copyFile(const PlannedItem& item) {
  auto chunk = reader_->next(item.entry);
  if (chunk.problem) return failed(item, chunk.problem);
  // For a large file it pays to know beforehand that its place is taken.
  if (!chunk.isLast && destination_.exists(item.path.normalized)) return failedToWrite(item, EEXIST);
  const auto naming = chunk.isLast ? Destination::Naming::atOnce : Destination::Naming::whenFinished;
  Destination::File file;
  if (const int error = destination_.makeFile(item.path.normalized, permissions(item), naming, file))
    return failedToWrite(item, error);
  std::uint64_t copied = 0;
  while (true) {
    countBytes(item, chunk.bytes.size());
    if (const int error = file.write(chunk.bytes)) return failedToWrite(item, error);
    copied += chunk.bytes.size();
    stopUnlessContinued(copier_.call(copier_.update, item.path.shown.c_str(), copied));
    if (chunk.isLast) break;
    chunk = reader_->next(item.entry);
    if (chunk.problem) return failed(item, chunk.problem);
  }
  if (const int error = file.finish()) return failedToWrite(item, error);
  stopUnlessContinued(copier_.call(copier_.finished, item.path.shown.c_str()));
}

void Copy::countBytes(const PlannedItem& item, std::size_t size) {
  bytes_ += size;
  const auto& limits = copier_.limits;
  const char* reason = nullptr;
  if (bytes_ > limits.totalBytes) reason = "the archive's files are too large";
  if (bytes_ > RatioThreshold &&
      bytes_ / std::max<std::uint64_t>(limits.expansionRatio, 1) > directory_.archiveSize()) {
    reason = "the archive expands too much";
  }
  if (!reason) return;
  copier_.call(copier_.fatalFileError, item.path.shown.c_str(), EFBIG, reason);
  throw CopyEnd{ArcCopierLimitExceeded, EFBIG};
}

void Copy::failed(const PlannedItem& item, const Problem& problem) {
  if (firstError_ == 0) firstError_ = problem.error;
  stopUnlessContinued(
      copier_.call(copier_.fileError, item.path.shown.c_str(), problem.error, problem.reason));
}

void Copy::failedToWrite(const PlannedItem& item, int error) {
  const char* path = item.path.shown.c_str();
  if (error == EEXIST) {
    if (firstError_ == 0) firstError_ = error;
    return stopUnlessContinued(
        copier_.call(copier_.fileConflict, path, error, "something else is there already"));
  }
  // Which of the two the system tells depends on what is asked of it.
  if (error == ENOTDIR || error == ELOOP)
    return failed(item, {error, "a file or a link is there already where it needs a directory"});
  if (!isDestinationsEnd(error)) return failed(item, {error, std::strerror(error)});
  copier_.call(copier_.fatalFileError, path, error, std::strerror(error));
  throw CopyEnd{ArcCopierBadDestination, error};
}

void Copy::stopUnlessContinued(int answer) {
  const bool goesOn = answer == ArcCopierContinue || answer == ArcCopierSkip;
  if (!goesOn || copier_.isCancelled) throw CopyEnd{ArcCopierCancelled, ECANCELED};
}

}  // namespace ArcCopierImplementation
