#include "MarletFoundation/Marlet/MarletBookSnapshot.h"

#include "MarletFoundation/Marlet/ListedSnapshots.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletBook.h"
#include "MarletFoundation/PathUtilities/PathUniquifier.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Version/ManifestVersion.h"

namespace MarletFoundation {

using Case = MarletBookSnapshot::SerializationErrorCase;

namespace {

using E = MarletBookSnapshot::SerializationError;

/// One platform's target serves every book, whatever version its deployment target names.
constexpr std::string_view tabletTargetIdentifier = "slateos";

void requireReadableVersion(const std::string& version) {
  switch (judgeManifestVersion(version)) {
    case ManifestVersionVerdict::readable:
      return;
    case ManifestVersionVerdict::invalid:
      throw E(Case::invalidVersion, version);
    case ManifestVersionVerdict::tooNew:
      throw E(Case::versionTooNew, version);
  }
}

Version loadContentVersion(const PropertyListDictionary& manifest) {
  const auto text = requiredString<E>(manifest, "ContentVersion", Case::missingContentVersion,
                                      Case::contentVersionNotAString);
  auto version = Version::fromString(text);
  if (!version) throw E(Case::invalidContentVersion, text);
  return *std::move(version);
}

TargetPointer loadTarget(const PropertyListDictionary& manifest) {
  const auto deploymentTarget =
      requiredString<E>(manifest, "DeploymentTarget", Case::missingDeploymentTarget);
  if (!deploymentTarget.starts_with(tabletTargetIdentifier))
    throw E(Case::invalidDeploymentTarget, deploymentTarget);
  auto target = Target::targetWithIdentifier(tabletTargetIdentifier);
  if (!target) throw E(Case::unsupportedDeploymentTarget, deploymentTarget);
  return target;
}

void addChapter(ListedSnapshots<MarletChapterSnapshot>& listed, const FileWrapper& chapters,
                const URL& chaptersURL, const PropertyListValue& element,
                const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  require<E>(element.string(), Case::chapterFilenameNotAString);
  const auto& filename = *element.string();
  const auto chapter = chapters.child(filename);
  if (!chapter) throw E(Case::missingChapter, filename);
  try {
    listed.add(filename, [&] {
      return MarletChapterSnapshot(*chapter, chaptersURL.appendingPathComponent(filename), userEditsDiffPack);
    });
  } catch (const Error& error) {
    throw E(Case::invalidChapter, filename, error);
  }
}

MarletKeyValueStoreSnapshot loadKeyValueStore(const FileWrapper& edits) {
  const auto data = optionalFileContents<E>(edits, "KeyValueStore.plist", Case::keyValueStoreNotARegularFile);
  return data ? MarletKeyValueStoreSnapshot(*data) : MarletKeyValueStoreSnapshot();
}

/// The load, in the one order in which its failures are reported.
MarletBookSnapshot loadBook(const FileWrapper& fileWrapper, const URL& baseURL,
                            std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  userEditsDiffPack.reset();
  require<E>(fileWrapper.hasChildren(), Case::notADirectory);
  const auto contents =
      requiredDirectory<E>(fileWrapper, "Contents", Case::missingContents, Case::contentsNotADirectory);
  const auto contentsURL = baseURL.appendingPathComponent("Contents", true);
  const auto edits = fileWrapper.child("Edits");
  require<E>(!edits || edits->hasChildren(), Case::editsNotADirectory);
  if (const auto pack = edits ? edits->child("UserEdits.diffpack") : std::nullopt) {
    userEditsDiffPack.emplace(*pack, contentsURL);
  }
  const auto editsURL = baseURL.appendingPathComponent("Edits", true);
  const auto manifest =
      loadManifest<E>(contents, Case::missingManifest, Case::invalidManifest, Case::manifestNotADictionary);
  requireReadableVersion(requiredString<E>(manifest, "Version", Case::missingVersion));
  auto name = requiredString<E>(manifest, "Name", Case::missingName);
  auto filename = baseURL.lastPathComponent();
  auto bookDescription = optionalString<E>(manifest, "Description", Case::descriptionNotAString);
  auto contentIdentifier = requiredString<E>(manifest, "ContentIdentifier", Case::missingContentIdentifier,
                                             Case::contentIdentifierNotAString);
  auto contentVersion = loadContentVersion(manifest);
  auto uniquifier = pathUniquifier(baseURL);
  auto target = loadTarget(manifest);
  auto sourcesURL = optionalDirectory<E>(contents, contentsURL, "Sources", Case::sourcesNotADirectory);
  auto resourcesURL = optionalDirectory<E>(contents, contentsURL, "Resources", Case::resourcesNotADirectory);
  std::optional<URL> userResourcesURL;
  if (edits) {
    userResourcesURL =
        optionalDirectory<E>(*edits, editsURL, "UserResources", Case::userResourcesNotADirectory);
  }
  auto imageReference =
      optionalImageReference<E>(manifest, resourcesURL, Case::imageReferenceNotAString,
                                Case::imageReferenceWithNoResources, Case::imageReferenceIsAURL);
  const auto& filenames = requiredArray<E>(manifest, "Chapters", Case::missingChaptersInManifest,
                                           Case::chaptersInManifestNotAnArray);
  const auto chaptersWrapper =
      requiredDirectory<E>(contents, "Chapters", Case::missingChaptersDirectory, Case::chaptersNotADirectory);
  const auto chaptersURL = contentsURL.appendingPathComponent("Chapters", true);
  ListedSnapshots<MarletChapterSnapshot> chapters;
  for (const auto& element : filenames) {
    addChapter(chapters, chaptersWrapper, chaptersURL, element, userEditsDiffPack);
  }
  auto keyValueStore = edits ? loadKeyValueStore(*edits) : MarletKeyValueStoreSnapshot();

  return {std::move(name),
          std::move(filename),
          std::move(bookDescription),
          std::move(contentIdentifier),
          std::move(contentVersion),
          std::move(uniquifier),
          std::move(target),
          std::move(sourcesURL),
          std::move(resourcesURL),
          std::move(userResourcesURL),
          std::move(imageReference),
          chapters.take(),
          std::move(keyValueStore)};
}

}  // namespace

MarletBookSnapshot::MarletBookSnapshot(
    std::string name_, std::string filename_, std::optional<std::string> bookDescription_,
    std::string contentIdentifier_, Version contentVersion_, std::optional<std::string> uniquifier_,
    TargetPointer target_, std::optional<URL> sourcesDirectoryURL_, std::optional<URL> resourcesDirectoryURL_,
    std::optional<URL> userResourcesDirectoryURL_, std::optional<std::string> imageReference_,
    std::vector<MarletChapterSnapshot> chapters_, MarletKeyValueStoreSnapshot keyValueStore_)
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

MarletBookSnapshot::MarletBookSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                                       std::optional<DiffPackSnapshot>& userEditsDiffPack)
    : MarletBookSnapshot(loadBook(fileWrapper, baseURL, userEditsDiffPack)) {}

MarletBookSnapshot::MarletBookSnapshot(const FileWrapper& fileWrapper, const URL& baseURL)
    : MarletBookSnapshot([&] {
        std::optional<DiffPackSnapshot> discarded;
        return loadBook(fileWrapper, baseURL, discarded);
      }()) {}

MarletBookSnapshot::MarletBookSnapshot(const MarletBook& book)
    : name(book.name),
      filename(book.filename),
      bookDescription(book.bookDescription),
      contentIdentifier(book.contentIdentifier),
      contentVersion(book.contentVersion),
      uniquifier(book.uniquifier),
      target(book.target),
      sourcesDirectoryURL(book.sourcesDirectoryURL),
      resourcesDirectoryURL(book.resourcesDirectoryURL),
      userResourcesDirectoryURL(book.userResourcesDirectoryURL),
      imageReference(book.imageReference),
      keyValueStore(book.keyValueStore.snapshot()) {
  for (const auto& chapter : book.chapters) {
    if (!chapter) fatalError("A book's chapters can't be null.");
    chapters.push_back(chapter->snapshot());
  }
}

PropertyListValue MarletBookSnapshot::manifest() const {
  if (!target) fatalError("A book can't be written without a target.");
  PropertyListValue::Array filenames;
  for (const auto& chapter : chapters) filenames.emplace_back(chapter.filename);
  PropertyListDictionary manifest{
      {"Version", CurrentManifestVersionString}, {"Name", name},
      {"ContentIdentifier", contentIdentifier},  {"ContentVersion", contentVersion.versionString()},
      {"DeploymentTarget", target->targetOS},    {"Chapters", std::move(filenames)}};
  if (bookDescription) manifest["Description"] = *bookDescription;
  if (imageReference) manifest["ImageReference"] = *imageReference;
  return manifest;
}

}  // namespace MarletFoundation
