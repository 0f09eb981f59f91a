#include "MarletFoundation/Marlet/MarletBook.h"

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {

using Case = MarletBookSnapshot::SerializationErrorCase;
using E = MarletBookSnapshot::SerializationError;

namespace {

PropertyListDictionary readManifest(const URL& url) {
  PropertyListValue root;
  try {
    root = fromContentsOfPropertyListAtURL<PropertyListValue>(url);
  } catch (const Error&) {
    throw E(Case::missingManifest);
  }
  require<E>(root.dictionary(), Case::missingManifest);
  return std::get<PropertyListDictionary>(std::move(root.payload));
}

std::optional<std::string> stringIfAny(const PropertyListDictionary& manifest, std::string_view key) {
  const auto* value = manifest.find(key);
  return value && value->string() ? std::optional(*value->string()) : std::nullopt;
}

bool isReachable(const URL& url) {
  try {
    return FileManager::resourceIsReachable(url);
  } catch (const Error&) {
    return false;
  }
}

}  // namespace

MarletBook::MarletBook(std::string name_, std::string filename_, std::optional<std::string> bookDescription_,
                       std::string contentIdentifier_, Version contentVersion_,
                       std::optional<std::string> uniquifier_, TargetPointer target_,
                       std::optional<URL> sourcesDirectoryURL_, std::optional<URL> resourcesDirectoryURL_,
                       std::optional<URL> userResourcesDirectoryURL_,
                       std::optional<std::string> imageReference_, Chapters chapters_,
                       MarletKeyValueStore keyValueStore_)
    : name(std::move(name_)),
      filename(std::move(filename_)),
      bookDescription(std::move(bookDescription_)),
      contentIdentifier(std::move(contentIdentifier_)),
      contentVersion(std::move(contentVersion_)),
      uniquifier(uniquifier_ ? *std::move(uniquifier_) : randomUUIDString()),
      target(std::move(target_)),
      sourcesDirectoryURL(std::move(sourcesDirectoryURL_)),
      resourcesDirectoryURL(std::move(resourcesDirectoryURL_)),
      userResourcesDirectoryURL(std::move(userResourcesDirectoryURL_)),
      imageReference(std::move(imageReference_)),
      chapters(std::move(chapters_)),
      keyValueStore(std::move(keyValueStore_)) {}

MarletBook::MarletBook(const MarletBookSnapshot& snapshot)
    : MarletBook(snapshot.name, snapshot.filename, snapshot.bookDescription, snapshot.contentIdentifier,
                 snapshot.contentVersion, snapshot.uniquifier, snapshot.target, snapshot.sourcesDirectoryURL,
                 snapshot.resourcesDirectoryURL, snapshot.userResourcesDirectoryURL, snapshot.imageReference,
                 {}, MarletKeyValueStore(snapshot.keyValueStore)) {
  for (const auto& chapter : snapshot.chapters) chapters.push_back(std::make_unique<MarletChapter>(chapter));
}

MarletBook::Properties MarletBook::propertiesOfBookAtURL(const URL& url) {
  const auto contents = url.appendingPathComponent("Contents", true);
  const auto manifest = readManifest(contents.appendingPathComponent("Manifest.plist"));
  const auto resources = contents.appendingPathComponent("Resources", true);
  auto name = requiredString<E>(manifest, "Name", Case::missingName);
  auto identifier = requiredString<E>(manifest, "ContentIdentifier", Case::missingContentIdentifier);
  const auto versionString = requiredString<E>(manifest, "ContentVersion", Case::missingContentVersion);
  auto version = Version::fromString(versionString);
  if (!version) throw E(Case::invalidContentVersion, versionString);
  return {std::move(name),
          stringIfAny(manifest, "Description"),
          std::move(identifier),
          *std::move(version),
          stringIfAny(manifest, "ImageReference"),
          isReachable(resources) ? std::optional(resources) : std::nullopt};
}

}  // namespace MarletFoundation
