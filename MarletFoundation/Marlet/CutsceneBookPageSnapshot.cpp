#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"

#include <tuple>

#include "MarletFoundation/Marlet/CutsceneBookPage.h"
#include "MarletFoundation/Marlet/LoadChecks.h"

namespace MarletFoundation {

using Case = CutsceneBookPageSnapshot::SerializationErrorCase;
using E = CutsceneBookPageSnapshot::SerializationError;
using Keys = CutsceneBookPageSnapshot::FileWrapperKeys;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"InvalidManifest"},
      {"InvalidCutsceneAssetReference"},
      {"MissingCutsceneAssetForLocalReference"},
      {"InvalidMarletLoggingMode"},
      {"NotADirectory"},
      {"MissingManifest"},
      {"ManifestNotADictionary"},
      {"MissingName"},
      {"DescriptionNotAString"},
      {"MissingCutsceneAssetReference"},
      {"CutsceneAssetReferencesWithoutResources"},
      {"ResultInfoNotAFile"},
      {"SourcesNotADirectory"},
      {"ResourcesNotADirectory"},
      {"ImageReferenceNotAString"},
      {"ImageReferenceWithoutResources"},
      {"OriginalContentsNotAFile"},
      {"PosterReferenceNotAString"},
      {"MarletLoggingModeNotAString"},
  };
  static constexpr ErrorTable table{"MarletFoundation.CutsceneBookPageSnapshot.SerializationError", rows};
  return table;
}

namespace {

/// Only a positive answer of the file system passes.
void requireReachable(const URL& asset) {
  bool isReachable = false;
  try {
    isReachable = FileManager::resourceIsReachable(asset);
  } catch (const Error& error) {
    throw E(Case::MissingCutsceneAssetForLocalReference, error);
  }
  require<E>(isReachable, Case::MissingCutsceneAssetForLocalReference);
}

std::string loadAssetReference(const PropertyListDictionary& manifest, const std::optional<URL>& resources) {
  const auto* value = manifest.find(Keys::CutsceneReference);
  require<E>(value, Case::MissingCutsceneAssetReference);
  if (!value->string()) throw E(Case::InvalidCutsceneAssetReference, description(*value));
  require<E>(resources.has_value(), Case::CutsceneAssetReferencesWithoutResources);
  const auto asset = URL::parse(*value->string(), &*resources);
  if (!asset) throw E(Case::InvalidCutsceneAssetReference, *value->string());
  requireReachable(*asset);
  return *value->string();
}

}  // namespace

CutsceneBookPageSnapshot::CutsceneBookPageSnapshot(const FileWrapper& fileWrapper, const URL& baseURL) {
  require<E>(fileWrapper.hasChildren(), Case::NotADirectory);
  const auto manifest = loadManifest<E>(fileWrapper, Case::MissingManifest, Case::InvalidManifest,
                                        Case::ManifestNotADictionary);
  name_ = requiredString<E>(manifest, Keys::Name, Case::MissingName);
  filename_ = baseURL.lastPathComponent();
  pageDescription_ = optionalString<E>(manifest, Keys::Description, Case::DescriptionNotAString);
  resourcesDirectoryURL_ =
      optionalDirectory<E>(fileWrapper, baseURL, Keys::Resources, Case::ResourcesNotADirectory);
  cutsceneAssetReference_ = loadAssetReference(manifest, resourcesDirectoryURL_);
  imageReference_ = optionalString<E>(manifest, Keys::ImageReference, Case::ImageReferenceNotAString);
  posterReference_ = optionalString<E>(manifest, Keys::PosterReference, Case::PosterReferenceNotAString);
}

CutsceneBookPageSnapshot::CutsceneBookPageSnapshot(std::string name, std::string filename,
                                                   std::string cutsceneAssetReference,
                                                   std::optional<std::string> pageDescription,
                                                   std::optional<std::string> imageReference,
                                                   std::optional<URL> resourcesDirectoryURL,
                                                   std::optional<std::string> posterReference)
    : name_(std::move(name)),
      filename_(std::move(filename)),
      cutsceneAssetReference_(std::move(cutsceneAssetReference)),
      pageDescription_(std::move(pageDescription)),
      imageReference_(std::move(imageReference)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      posterReference_(std::move(posterReference)) {}

CutsceneBookPageSnapshot::CutsceneBookPageSnapshot(const CutsceneBookPage& page)
    : CutsceneBookPageSnapshot(page.name(), page.filename(), page.cutsceneAssetReference(),
                               page.pageDescription(), page.imageReference(), page.resourcesDirectoryURL(),
                               page.posterReference()) {}

FileWrapper CutsceneBookPageSnapshot::fileWrapper() const {
  PropertyListDictionary manifest{{Keys::Name, name_}, {Keys::CutsceneReference, cutsceneAssetReference_}};
  if (pageDescription_) manifest[Keys::Description] = *pageDescription_;
  if (imageReference_) manifest[Keys::ImageReference] = *imageReference_;
  if (posterReference_) manifest[Keys::PosterReference] = *posterReference_;
  FileWrapper::Children children;
  children.emplace(Keys::Manifest, FileWrapper::regularFile(PropertyListSerialization::write(
                                       manifest, PropertyListFormat::binary)));
  if (resourcesDirectoryURL_) {
    FileManager::resourceIsReachable(*resourcesDirectoryURL_);
    children.emplace(Keys::Resources, FileWrapper::reference(*resourcesDirectoryURL_));
  }
  return FileWrapper::directory(std::move(children));
}

std::unique_ptr<BookPageType> CutsceneBookPageSnapshot::convertToMutablePage() const {
  return std::make_unique<CutsceneBookPage>(*this);
}

bool CutsceneBookPageSnapshot::operator==(const CutsceneBookPageSnapshot& other) const {
  const auto fields = [](const CutsceneBookPageSnapshot& page) {
    return std::tie(page.name_, page.filename_, page.cutsceneAssetReference_, page.pageDescription_,
                    page.imageReference_, page.resourcesDirectoryURL_, page.posterReference_);
  };
  return fields(*this) == fields(other);
}

}  // namespace MarletFoundation
