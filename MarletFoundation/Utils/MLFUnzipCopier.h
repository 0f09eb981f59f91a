#pragma once

#include <cstdint>
#include <functional>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/ErrorObject.h"

struct ArcCopier;

namespace MarletFoundation {

/// The domain of what stopped or spoilt an extraction. The code is an `ArcCopierResult` (ArcCopier/ArcCopier.h);
/// the user info has the entries "Source Path", "Dest Path" and "errno".
inline constexpr std::string_view ArcCopierErrorDomain = "com.quorvex.ArcCopier";

/// Extracts zip archives, and tells how far it has come. Used by one thread at a time, but for `cancel`.
///
/// A host raises the bounds of an archive with the user-default keys "ArchiveEntryLimit" (100,000),
/// "ArchiveByteLimit" (bytes of all files, 4 GiB) and "ArchiveExpansionLimit" (bytes of all files for each
/// byte of the archive, 200; looked at from 16 MiB on). Other values than
/// positive ones leave these.
class MARLET_EXPORT MLFUnzipCopier {
 public:
  /// Called in steps of at least 5 percent of the items, with 100 always among them, unless their number can't
  /// be found.
  std::function<void(double fraction, double percentage)> progressCallback;
  /// The paths of the items begun, directories too, in order. In the archive, without a slash at the end.
  std::vector<std::string> filenames;
  /// Items in the archive, 0 if unknown.
  std::uint64_t filesTotal = 0;
  /// Items begun so far.
  std::uint64_t filesComplete = 0;
  std::int32_t lastReportedPercentage = 0;
  /// Told, one by one, what was not extracted and why: an item's path in the archive, or the archive's own
  /// for what stops the whole; and a sentence without a full stop.
  std::function<void(const std::string& path, const std::string& reason)> problemCallback;

  MLFUnzipCopier() = default;
  MLFUnzipCopier(const MLFUnzipCopier&) = delete;
  MLFUnzipCopier& operator=(const MLFUnzipCopier&) = delete;

  /// Extracts the archive into a directory, which is made when missing. False, with an error object in
  /// `error` unless that is null, when anything of the archive isn't there afterwards. What can be extracted
  /// is; but nothing of an archive that can't be trusted, and nothing more after a cancel.
  bool unzip(const std::string& source, const std::string& toPath, std::optional<ErrorObject>* error);

  /// Stops the extraction after the current block, or before it begins. Any thread.
  void cancel();

 private:
  struct Handlers;
  class Running;
  void incrementFileCompletion();

  std::mutex mutex_;  // guards what follows
  ArcCopier* running_ = nullptr;
  bool isCancelled_ = false;
};

}  // namespace MarletFoundation
