#pragma once

#include <string>

#include "MarletFoundation/DiffPack/DiffError.h"
#include "MarletFoundation/DiffPack/DiffPackType.h"
#include "MarletFoundation/DiffPack/FileDiffDescriptors.h"
#include "MarletFoundation/Platform/FileWrapper.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// How one version of a document's content differs from another: a value, and a directory with the extension
/// `.diffpack`. The directory holds `Manifest.plist`, a `.delta` property list for each modified text file
/// and a whole copy of each added or replaced file.
struct MARLET_EXPORT DiffPackSnapshot {
  DiffPackType diffPackType;
  DiffPackDocumentType documentType;
  /// The directory against which the paths of `updates` resolve, and where a file that isn't held in memory
  /// lies. Of a book, its "Contents".
  URL contentUrl;
  /// The document's content identifier.
  std::string name;
  /// The content version the pack applies to, and the one it leads to.
  std::string baseVersion;
  std::string updateVersion;
  /// One entry for each changed file.
  FileDiffDescriptors updates;

  DiffPackSnapshot(DiffPackType diffPackType, DiffPackDocumentType documentType, URL contentUrl,
                   std::string name, std::string baseVersion, std::string updateVersion,
                   FileDiffDescriptors updates);

  /// Reads a pack. The added and replaced files of an update pack are left where they are; those of a
  /// user-edit pack are read with it. Throws an `ErrorObject` of `DiffErrorDomain` with the code
  /// `CriticalDiffPackDeserializationError`, or the property-list reader's for a delta that is none.
  DiffPackSnapshot(const FileWrapper& fileWrapper, URL contentUrl);

  /// The pack as a directory; its entries' order is kept within added, removed, replaced and modified files.
  /// A file without data is taken from below `contentUrl`, where no symbolic link is followed. Throws an
  /// `ErrorObject` of the POSIX domain for a file that isn't there (ENOENT), a path that names nothing below
  /// a directory, as "../x" (EINVAL), and text that isn't well-formed (EILSEQ), or the property-list
  /// writer's.
  FileWrapper fileWrapper() const;

  /// `MarletBook UserEdit, NAME 1.0`, and for two different versions `… 1.0 -> 1.0.1`.
  std::string description() const;
};

}  // namespace MarletFoundation
