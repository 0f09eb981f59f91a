#include "ArcCopier/ArcCopier.h"

#include <cerrno>
#include <cstring>
#include <new>
#include <string_view>
#include <system_error>

#include "ArcCopier/Copier.h"
#include "ArcCopier/Copy.h"

using namespace ArcCopierImplementation;

namespace {

/// Opens a source, which nobody's pipe can hold up.
Descriptor openSource(const char* path) {
  return Descriptor(MarletFoundation::retrying([&] { return ::open(path, MarletFoundation::ReadingFlags); }));
}

bool areUnderstood(const ArcCopierOption* options) {
  bool isPKZip = false;
  for (; options && options->key; ++options) {
    if (std::string_view(options->key) != ArcCopierExtractPKZip) return false;
    isPKZip = options->value != 0;
  }
  return isPKZip;
}

ArcCopierResult resultOf(const Refusal& refusal) {
  return refusal.isLimit ? ArcCopierLimitExceeded : ArcCopierBadArchive;
}

CopyEnd copy(ArcCopier& copier, const char* source, const char* destination) {
  const auto refused = [&](ArcCopierResult result, int error, const char* reason) {
    copier.call(copier.fatalError, source, error, reason);
    return CopyEnd{result, error};
  };
  const auto archive = openSource(source);
  if (!archive) return refused(ArcCopierBadArchive, errno, std::strerror(errno));
  try {
    const int firstError = Copy(copier, archive.get()).run(destination);
    return {firstError == 0 ? ArcCopierSuccess : ArcCopierSomeFilesFailed, firstError};
  } catch (const Refusal& refusal) {
    return refused(resultOf(refusal), refusal.error, refusal.reason);
  } catch (const CopyEnd& end) {
    return end;
  } catch (const std::bad_alloc&) {
    return refused(ArcCopierBadDestination, ENOMEM, std::strerror(ENOMEM));
  } catch (const std::system_error& error) {  // no thread can be made
    return refused(ArcCopierBadDestination, error.code().value(), std::strerror(error.code().value()));
  }
}

}  // namespace

ArcCopierLimits ArcCopierDefaultLimits(void) { return {100'000, std::uint64_t{4} << 30, 200}; }

ArcCopierRef ArcCopierNew(void) { return new (std::nothrow) ArcCopier; }
void ArcCopierFree(ArcCopierRef copier) { delete copier; }

void ArcCopierSetUserData(ArcCopierRef copier, void* userData) { copier->userData = userData; }
void* ArcCopierUserData(ArcCopierRef copier) { return copier->userData; }

void ArcCopierSetCopyFileStartedHandler(ArcCopierRef copier, ArcCopierFileHandler handler) {
  copier->started = handler;
}
void ArcCopierSetCopyFileFinishedHandler(ArcCopierRef copier, ArcCopierFileHandler handler) {
  copier->finished = handler;
}
void ArcCopierSetCopyFileUpdateHandler(ArcCopierRef copier, ArcCopierUpdateHandler handler) {
  copier->update = handler;
}
void ArcCopierSetFatalErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler) {
  copier->fatalError = handler;
}
void ArcCopierSetFatalFileErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler) {
  copier->fatalFileError = handler;
}
void ArcCopierSetFileConflictErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler) {
  copier->fileConflict = handler;
}
void ArcCopierSetFileErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler) {
  copier->fileError = handler;
}

void ArcCopierSetLimits(ArcCopierRef copier, ArcCopierLimits limits) { copier->limits = limits; }

int ArcCopierCountFilesInArchive(ArcCopierRef copier, const char* sourcePath, uint64_t* count, int flags) {
  int error = EINVAL;
  auto result = ArcCopierBadOptions;
  if (flags == 0) {
    const auto archive = openSource(sourcePath);
    error = errno;
    result = ArcCopierBadArchive;
    if (archive) {
      try {
        *count = ZipDirectory(archive.get(), copier->limits.entries).entries().size();
        return ArcCopierSuccess;
      } catch (const Refusal& refusal) {
        error = refusal.error;
        result = resultOf(refusal);
      } catch (const std::bad_alloc&) {
        error = ENOMEM;
      }
    }
  }
  errno = error;
  return result;
}

int ArcCopierCopyWithOptions(ArcCopierRef copier, const char* sourcePath, const char* destinationPath,
                             const ArcCopierOption* options) {
  const auto end = areUnderstood(options) ? copy(*copier, sourcePath, destinationPath)
                                          : CopyEnd{ArcCopierBadOptions, EINVAL};
  copier->isCancelled = false;
  if (end.result != ArcCopierSuccess) errno = end.error;
  return end.result;
}

void ArcCopierCancel(ArcCopierRef copier) { copier->isCancelled = true; }
