#include "MarletFoundation/Marlet/Marlet.h"

namespace MarletFoundation {

Marlet::Marlet(std::string name_, std::string uniquifier_, TargetPointer target_,
               bool requiresFullEnvironment_, std::optional<URL> sharedResourcesDirectoryURL_,
               std::optional<URL> sharedSourcesDirectoryURL_, std::optional<URL> marletIconURL_, Pages pages_,
               MarletKeyValueStore keyValueStore_)
    : name(std::move(name_)),
      uniquifier(std::move(uniquifier_)),
      target(std::move(target_)),
      requiresFullEnvironment(requiresFullEnvironment_),
      sharedResourcesDirectoryURL(std::move(sharedResourcesDirectoryURL_)),
      sharedSourcesDirectoryURL(std::move(sharedSourcesDirectoryURL_)),
      marletIconURL(std::move(marletIconURL_)),
      pages(std::move(pages_)),
      keyValueStore(std::move(keyValueStore_)) {}

Marlet::Marlet(const MarletSnapshot& snapshot, const MarletSnapshot*)
    : Marlet(snapshot.name, snapshot.uniquifier, snapshot.target, snapshot.requiresFullEnvironment,
             snapshot.sharedResourcesDirectoryURL, snapshot.sharedSourcesDirectoryURL, snapshot.marletIconURL,
             {}, MarletKeyValueStore(snapshot.keyValueStore)) {
  for (const auto& page : snapshot.pages) pages.push_back(std::make_unique<MarletPage>(page));
}

std::unique_ptr<Marlet> Marlet::loadFromFileWrapper(const FileWrapper& fileWrapper, const URL& baseURL) {
  return std::make_unique<Marlet>(MarletSnapshot(fileWrapper, baseURL));
}

}  // namespace MarletFoundation
