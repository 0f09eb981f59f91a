#ifndef ARC_COPIER_H
#define ARC_COPIER_H

#include <stddef.h>
#include <stdint.h>

#if defined(__GNUC__)
#define ARC_COPIER_EXPORT __attribute__((visibility("default")))
#else
#define ARC_COPIER_EXPORT
#endif

/// @file
/// Extracts PKZip archives that anybody may have made.
///
/// An archive is refused before anything is written when its directory can't be trusted: entries that
/// overlap, local headers that say something else than the directory, contradictory zip64 fields, missing
/// parts. A single entry that is hostile or damaged is a file error, and the rest goes on: a path that is
/// absolute, has "..", a drive, a backslash or a NUL, or is too long; a link, a device, a second entry of a
/// name, an entry below a file; encryption, a compression other than deflate, a wrong checksum or size.
///
/// Nothing is written outside of the destination and no symbolic link below it is followed. What exists there
/// already stays. A file gets its name only once it is known to be whole and its checksum to be right. Names are
/// UTF-8, marked as such or not, else code page 437. Of the modes only the permissions count, under the process's
/// umask; times are those of the extraction.
#ifdef __cplusplus
extern "C" {
#endif

/// An opaque copier. Used by one thread at a time, but for `ArcCopierCancel`.
typedef struct ArcCopier* ArcCopierRef;

/// What `ArcCopierCopyWithOptions` gives back. Names and numbers are for good.
enum ArcCopierResult {
  ArcCopierSuccess = 0,
  /// Everything else of the archive is there; `errno` is that of the first error.
  ArcCopierSomeFilesFailed = 1,
  /// The archive can't be read or trusted; nothing was written.
  ArcCopierBadArchive = 2,
  /// The destination can't be made or written to, or there is not enough memory.
  ArcCopierBadDestination = 3,
  /// The archive holds more than the limits allow.
  ArcCopierLimitExceeded = 4,
  ArcCopierCancelled = 5,
  ArcCopierBadOptions = 6
};

/// Answers of the handlers. Both `Continue` and `Skip` go on with the next file; any other answer stops the
/// copy as `ArcCopierCancel` does.
enum { ArcCopierContinue = 0, ArcCopierStop = 1, ArcCopierSkip = 2 };

/// `path` is the item's path in the archive in UTF-8, without a slash at its end. A name that can't be
/// decoded is given with U+FFFD in place of what is wrong in it.
typedef int (*ArcCopierFileHandler)(ArcCopierRef copier, const char* path);
/// `copied` is the number of the file's bytes that have been copied so far.
typedef int (*ArcCopierUpdateHandler)(ArcCopierRef copier, const char* path, uint64_t copied);
/// `error` is an errno and `reason` a sentence without a full stop.
typedef int (*ArcCopierErrorHandler)(ArcCopierRef copier, const char* path, int error, const char* reason);

/// One entry of an options dictionary; lists of them end with a null key.
typedef struct {
  const char* key;
  int64_t value;
} ArcCopierOption;

/// The source is a PKZip archive. Must be given, as true.
#define ArcCopierExtractPKZip "extractPKZip"

/// What one archive may make of itself. Reaching a limit is no error, passing it is.
typedef struct {
  /// With the directories that none of them names, but that their paths need.
  uint64_t entries;
  /// Bytes of all extracted files together.
  uint64_t totalBytes;
  /// Bytes of all extracted files for each byte of the archive; looked at from 16 MiB on.
  uint64_t expansionRatio;
} ArcCopierLimits;

/// 100,000 entries, 4 GiB, 200 times.
ARC_COPIER_EXPORT ArcCopierLimits ArcCopierDefaultLimits(void);

/// A new copier, or null on lack of memory.
ARC_COPIER_EXPORT ArcCopierRef ArcCopierNew(void);
ARC_COPIER_EXPORT void ArcCopierFree(ArcCopierRef copier);

/// A pointer for the handlers.
ARC_COPIER_EXPORT void ArcCopierSetUserData(ArcCopierRef copier, void* userData);
ARC_COPIER_EXPORT void* ArcCopierUserData(ArcCopierRef copier);

/// Called when an item's extraction begins, a directory's too; whether it succeeds shows later.
ARC_COPIER_EXPORT void ArcCopierSetCopyFileStartedHandler(ArcCopierRef copier, ArcCopierFileHandler handler);
/// Called when an item stands whole under its name.
ARC_COPIER_EXPORT void ArcCopierSetCopyFileFinishedHandler(ArcCopierRef copier, ArcCopierFileHandler handler);
/// Called after each block that was copied.
ARC_COPIER_EXPORT void ArcCopierSetCopyFileUpdateHandler(ArcCopierRef copier, ArcCopierUpdateHandler handler);
/// Called when the copy ends early for a reason that lies in no single file; `path` is the archive's or the
/// destination's. The answer doesn't matter.
ARC_COPIER_EXPORT void ArcCopierSetFatalErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler);
/// Called when the copy ends early at a file, such as for a full disk. The answer doesn't matter.
ARC_COPIER_EXPORT void ArcCopierSetFatalFileErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler);
/// Called when something that isn't from this archive stands in an item's place. It stays.
ARC_COPIER_EXPORT void ArcCopierSetFileConflictErrorHandler(ArcCopierRef copier,
                                                            ArcCopierErrorHandler handler);
/// Called when an item can't be extracted.
ARC_COPIER_EXPORT void ArcCopierSetFileErrorHandler(ArcCopierRef copier, ArcCopierErrorHandler handler);

ARC_COPIER_EXPORT void ArcCopierSetLimits(ArcCopierRef copier, ArcCopierLimits limits);

/// The number of items in the archive, directories included. 0 on success; otherwise an `ArcCopierResult`,
/// with `errno` set and `count` untouched. Calls no handlers. `flags` must be 0.
ARC_COPIER_EXPORT int ArcCopierCountFilesInArchive(ArcCopierRef copier, const char* sourcePath,
                                                   uint64_t* count, int flags);

/// Extracts the archive into a directory, which is made with those above it when missing. Gives back an
/// `ArcCopierResult`, with `errno` set unless that is 0.
ARC_COPIER_EXPORT int ArcCopierCopyWithOptions(ArcCopierRef copier, const char* sourcePath,
                                               const char* destinationPath, const ArcCopierOption* options);

/// Stops the running copy after the current block, or the next one before it begins. Any thread.
ARC_COPIER_EXPORT void ArcCopierCancel(ArcCopierRef copier);

#ifdef __cplusplus
}
#endif

#endif
