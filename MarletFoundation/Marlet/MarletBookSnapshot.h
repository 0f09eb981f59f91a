#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Environment/Target.h"
#include "MarletFoundation/Marlet/MarletChapterSnapshot.h"
#include "MarletFoundation/Marlet/MarletKeyValueStore.h"
#include "MarletFoundation/Version/Version.h"

namespace MarletFoundation {

struct MarletBook;

/// A whole book as an immutable value: what opening a ".marletbook" directory yields. Pages stay on disk;
/// their placeholders make the table of contents.
struct MARLET_EXPORT MarletBookSnapshot {
  enum class SerializationErrorCase {
    invalidManifest,
    invalidVersion,
    versionTooNew,
    invalidContentVersion,
    invalidDeploymentTarget,
    unsupportedDeploymentTarget,
    missingChapter,
    invalidChapter,
    notADirectory,
    missingContents,
    contentsNotADirectory,
    editsNotADirectory,
    missingManifest,
    manifestNotADictionary,
    missingVersion,
    missingName,
    descriptionNotAString,
    missingContentIdentifier,
    contentIdentifierNotAString,
    missingContentVersion,
    contentVersionNotAString,
    missingDeploymentTarget,
    sourcesNotADirectory,
    resourcesNotADirectory,
    userResourcesNotADirectory,
    imageReferenceNotAString,
    imageReferenceWithNoResources,
    imageReferenceIsAURL,
    missingChaptersInManifest,
    chaptersInManifestNotAnArray,
    chapterFilenameNotAString,
    missingChaptersDirectory,
    chaptersNotADirectory,
    keyValueStoreNotARegularFile,
  };
  using SerializationError = UserVisibleCaseError<SerializationErrorCase>;

  std::string name;
  /// The book's directory name, extension included.
  std::string filename;
  std::optional<std::string> bookDescription;
  /// Identity of the authored content across its versions.
  std::string contentIdentifier;
  Version contentVersion;
  /// A short stable name made from where the book lies.
  std::string uniquifier;
  TargetPointer target;
  std::optional<URL> sourcesDirectoryURL;
  std::optional<URL> resourcesDirectoryURL;
  /// Resources that the learner added.
  std::optional<URL> userResourcesDirectoryURL;
  /// A path inside the book's resources.
  std::optional<std::string> imageReference;
  /// In reading order.
  std::vector<MarletChapterSnapshot> chapters;
  MarletKeyValueStoreSnapshot keyValueStore;

  /// An absent `uniquifier` becomes a new random UUID string.
  MarletBookSnapshot(std::string name, std::string filename, std::optional<std::string> bookDescription,
                     std::string contentIdentifier, Version contentVersion,
                     std::optional<std::string> uniquifier, TargetPointer target,
                     std::optional<URL> sourcesDirectoryURL, std::optional<URL> resourcesDirectoryURL,
                     std::optional<URL> userResourcesDirectoryURL, std::optional<std::string> imageReference,
                     std::vector<MarletChapterSnapshot> chapters, MarletKeyValueStoreSnapshot keyValueStore);

  /// Loads the book whose tree `fileWrapper` holds and whose place is `baseURL`, in one fixed order of
  /// checks; the first failure ends it. Throws `SerializationError`, a
  /// `MarletKeyValueStoreSnapshot::SerializationError`, or the error object of a learner's pack that can't be
  /// read. Writes nothing.
  MarletBookSnapshot(const FileWrapper& fileWrapper, const URL& baseURL);
  /// The same, and gives the learner's pack, or nothing where there is none. It stays set when a later check
  /// fails.
  MarletBookSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                     std::optional<DiffPackSnapshot>& userEditsDiffPack);

  /// The book as it stands; nothing is checked.
  explicit MarletBookSnapshot(const MarletBook& book);

  /// The book's manifest, of the current format version and with the target's own `DeploymentTarget`. Keys
  /// that a load didn't know are not in it.
  PropertyListValue manifest() const;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletBookSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
