#include "MarletFoundation/Utils/MLFUnzipCopier.h"

#include <cerrno>
#include <memory>

#include "ArcCopier/ArcCopier.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation {
namespace {

void readLimit(std::string_view key, std::uint64_t& limit) {
  const auto& userDefault = HostEnvironment::current().userDefault;
  const auto value = userDefault ? userDefault(key) : std::nullopt;
  if (value && *value > 0) limit = static_cast<std::uint64_t>(*value);
}

ArcCopierLimits limitsOfHost() {
  auto limits = ArcCopierDefaultLimits();
  readLimit("ArchiveEntryLimit", limits.entries);
  readLimit("ArchiveByteLimit", limits.totalBytes);
  readLimit("ArchiveExpansionLimit", limits.expansionRatio);
  return limits;
}

}  // namespace

/// The answers to the closed library.
struct MLFUnzipCopier::Handlers {
  static MLFUnzipCopier& self(ArcCopierRef copier) {
    return *static_cast<MLFUnzipCopier*>(ArcCopierUserData(copier));
  }

  static int started(ArcCopierRef copier, const char* path) {
    self(copier).incrementFileCompletion();
    self(copier).filenames.emplace_back(path);
    return 0;
  }
  static int finished(ArcCopierRef, const char*) { return 0; }
  static int update(ArcCopierRef, const char*, std::uint64_t) { return 0; }
  static int fatal(ArcCopierRef copier, const char* path, int, const char* reason) {
    tell(copier, path, reason);
    return 0;
  }
  static int fileConflict(ArcCopierRef copier, const char* path, int, const char* reason) {
    tell(copier, path, reason);
    return 0;
  }
  static int fileError(ArcCopierRef copier, const char* path, int, const char* reason) {
    tell(copier, path, reason);
    return 2;
  }

 private:
  static void tell(ArcCopierRef copier, const char* path, const char* reason) {
    if (self(copier).problemCallback) self(copier).problemCallback(path, reason);
  }
};

/// Makes a handle known to `cancel` for as long as it runs.
class MLFUnzipCopier::Running {
 public:
  Running(MLFUnzipCopier& copier, ArcCopierRef handle) : copier_(copier) {
    const std::lock_guard lock(copier_.mutex_);
    copier_.running_ = handle;
    if (copier_.isCancelled_) ArcCopierCancel(handle);
  }
  ~Running() {
    const std::lock_guard lock(copier_.mutex_);
    copier_.running_ = nullptr;
    copier_.isCancelled_ = false;
  }
  Running(const Running&) = delete;
  Running& operator=(const Running&) = delete;

 private:
  MLFUnzipCopier& copier_;
};

bool MLFUnzipCopier::unzip(const std::string& source, const std::string& toPath,
                           std::optional<ErrorObject>* error) {
  const auto fail = [&](ErrorObject object) {
    if (error) *error = std::move(object);
    return false;
  };
  const std::unique_ptr<ArcCopier, decltype(&ArcCopierFree)> handle(ArcCopierNew(), &ArcCopierFree);
  if (!handle) return fail({std::string(PosixErrorDomain), ENOMEM});
  const auto copier = handle.get();
  ArcCopierSetUserData(copier, this);
  ArcCopierSetCopyFileStartedHandler(copier, Handlers::started);
  ArcCopierSetCopyFileFinishedHandler(copier, Handlers::finished);
  ArcCopierSetCopyFileUpdateHandler(copier, Handlers::update);
  ArcCopierSetFatalErrorHandler(copier, Handlers::fatal);
  ArcCopierSetFatalFileErrorHandler(copier, Handlers::fatal);
  ArcCopierSetFileConflictErrorHandler(copier, Handlers::fileConflict);
  ArcCopierSetFileErrorHandler(copier, Handlers::fileError);
  ArcCopierSetLimits(copier, limitsOfHost());
  const Running running(*this, copier);

  filesTotal = filesComplete = 0;
  lastReportedPercentage = 0;
  // Counting costs a pass over the archive's directory.
  std::uint64_t count = 0;
  if (progressCallback && ArcCopierCountFilesInArchive(copier, source.c_str(), &count, 0) == 0)
    filesTotal = count;

  const ArcCopierOption options[] = {{ArcCopierExtractPKZip, true}, {nullptr, 0}};
  const int code = ArcCopierCopyWithOptions(copier, source.c_str(), toPath.c_str(), options);
  if (code == 0) return true;
  const std::int64_t errorNumber = errno;
  return fail({std::string(ArcCopierErrorDomain),
               code,
               {{"Source Path", source}, {"Dest Path", toPath}, {"errno", errorNumber}}});
}

void MLFUnzipCopier::cancel() {
  const std::lock_guard lock(mutex_);
  isCancelled_ = true;
  if (running_) ArcCopierCancel(running_);
}

void MLFUnzipCopier::incrementFileCompletion() {
  if (!progressCallback || filesTotal == 0) return;
  if (++filesComplete > filesTotal) return;
  const auto fraction = static_cast<double>(filesComplete) / static_cast<double>(filesTotal);
  const auto percentage = static_cast<std::int32_t>(fraction * 100);
  if (percentage == lastReportedPercentage) return;
  if (percentage != 100 && percentage < lastReportedPercentage + 5) return;
  lastReportedPercentage = percentage;
  progressCallback(fraction, fraction * 100);
}

}  // namespace MarletFoundation
