#pragma once

#include "MarletFoundation/Marlet/MarletPage.h"
#include "MarletFoundation/Marlet/MarletSnapshot.h"

namespace MarletFoundation {

/// A live classic document, which owns its pages and its store. Nothing that is assigned is checked; but a snapshot with
/// a null page, and writing one with a null target, are fatal errors. No locks: one thread at a time.
struct MARLET_EXPORT Marlet {
  using Pages = std::vector<std::unique_ptr<MarletPage>>;

  std::string name;
  std::string uniquifier;
  TargetPointer target;
  bool requiresFullEnvironment;
  std::optional<URL> sharedResourcesDirectoryURL;
  std::optional<URL> sharedSourcesDirectoryURL;
  std::optional<URL> marletIconURL;
  Pages pages;
  MarletKeyValueStore keyValueStore;

  Marlet(std::string name, std::string uniquifier, TargetPointer target, bool requiresFullEnvironment,
         std::optional<URL> sharedResourcesDirectoryURL, std::optional<URL> sharedSourcesDirectoryURL,
         std::optional<URL> marletIconURL, Pages pages, MarletKeyValueStore keyValueStore);
  /// The second argument is there for likeness with books and changes nothing.
  explicit Marlet(const MarletSnapshot& snapshot, const MarletSnapshot* originalContentSnapshot = nullptr);
  Marlet(const Marlet&) = delete;
  Marlet& operator=(const Marlet&) = delete;

  MarletSnapshot snapshot() const { return MarletSnapshot(*this); }

  /// Throws as reading the snapshot does.
  static std::unique_ptr<Marlet> loadFromFileWrapper(const FileWrapper& fileWrapper, const URL& baseURL);
};

}  // namespace MarletFoundation
