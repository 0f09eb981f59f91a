#pragma once

#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Marlet/MarletChapter.h"

namespace MarletFoundation {

/// A live book, which owns its chapters and its store. Nothing that is assigned is checked, so a snapshot can describe
/// a book that doesn't open; but of a null chapter there is none, and with a null target none can be written: fatal errors.
/// No locks: one thread at a time.
struct MARLET_EXPORT MarletBook {
  using Chapters = std::vector<std::unique_ptr<MarletChapter>>;

  std::string name;
  std::string filename;
  std::optional<std::string> bookDescription;
  std::string contentIdentifier;
  Version contentVersion;
  std::string uniquifier;
  TargetPointer target;
  std::optional<URL> sourcesDirectoryURL;
  std::optional<URL> resourcesDirectoryURL;
  std::optional<URL> userResourcesDirectoryURL;
  std::optional<std::string> imageReference;
  Chapters chapters;
  MarletKeyValueStore keyValueStore;

  /// An absent `uniquifier` becomes a new random UUID string.
  MarletBook(std::string name, std::string filename, std::optional<std::string> bookDescription,
             std::string contentIdentifier, Version contentVersion, std::optional<std::string> uniquifier,
             TargetPointer target, std::optional<URL> sourcesDirectoryURL,
             std::optional<URL> resourcesDirectoryURL, std::optional<URL> userResourcesDirectoryURL,
             std::optional<std::string> imageReference, Chapters chapters, MarletKeyValueStore keyValueStore);
  explicit MarletBook(const MarletBookSnapshot& snapshot);
  MarletBook(const MarletBook&) = delete;
  MarletBook& operator=(const MarletBook&) = delete;

  MarletBookSnapshot snapshot() const { return MarletBookSnapshot(*this); }

  /// What a list of books shows of each.
  struct Properties {
    std::string name;
    std::optional<std::string> bookDescription;
    std::string contentIdentifier;
    Version contentVersion;
    std::optional<std::string> imageReference;
    /// Only if there is something.
    std::optional<URL> resourcesDirectoryURL;
  };
  /// Reads the book's manifest and nothing else; what is wrong beyond these properties goes unnoticed. Throws
  /// `MarletBookSnapshot::SerializationError`.
  static Properties propertiesOfBookAtURL(const URL& url);
};

}  // namespace MarletFoundation
