#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Marlet/BookPagePlaceholderSnapshot.h"

namespace MarletFoundation {

struct MarletChapter;

/// One chapter of a book, with its pages as placeholders.
struct MARLET_EXPORT MarletChapterSnapshot {
  enum class SerializationErrorCase {
    invalidManifest,
    missingPage,
    invalidPage,
    notADirectory,
    missingManifest,
    manifestNotADictionary,
    missingName,
    descriptionNotAString,
    sourcesNotADirectory,
    resourcesNotADirectory,
    imageReferenceNotAString,
    imageReferenceWithNoResources,
    imageReferenceIsAURL,
    missingPagesInManifest,
    pagesInManifestNotAnArray,
    missingPagesDirectory,
    pagesNotADirectory,
    pageFilenameNotAString,
  };
  using SerializationError = UserVisibleCaseError<SerializationErrorCase>;

  std::string name;
  /// The chapter's directory name.
  std::string filename;
  std::optional<std::string> chapterDescription;
  /// A path inside the chapter's resources.
  std::optional<std::string> imageReference;
  std::optional<URL> sourcesDirectoryURL;
  std::optional<URL> resourcesDirectoryURL;
  /// In reading order.
  std::vector<BookPagePlaceholderSnapshot> pages;

  MarletChapterSnapshot(std::string name, std::string filename, std::optional<std::string> chapterDescription,
                        std::optional<std::string> imageReference, std::optional<URL> sourcesDirectoryURL,
                        std::optional<URL> resourcesDirectoryURL,
                        std::vector<BookPagePlaceholderSnapshot> pages);
  /// Loads the chapter's directory; throws `SerializationError`.
  MarletChapterSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                        const std::optional<DiffPackSnapshot>& userEditsDiffPack);

  /// The chapter as it stands; nothing is checked.
  explicit MarletChapterSnapshot(const MarletChapter& chapter);

  /// The chapter's manifest. Keys that a load didn't know are not in it.
  PropertyListValue manifest() const;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletChapterSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
