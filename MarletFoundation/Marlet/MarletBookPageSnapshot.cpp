#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"

#include <tuple>

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletBookPage.h"
#include "MarletFoundation/Marlet/PageHints.h"
#include "MarletFoundation/Marlet/PageResultInfo.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

using Case = MarletBookPageSnapshot::SerializationErrorCase;
using E = MarletBookPageSnapshot::SerializationError;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"InvalidManifest"},
      {"InvalidLiveViewMode"},
      {"InvalidMarletLoggingMode"},
      {"NotADirectory"},
      {"MissingManifest"},
      {"ManifestNotADictionary"},
      {"MissingName"},
      {"DescriptionNotAString"},
      {"MissingContentsFile"},
      {"InvalidContentsFile"},
      {"ResultInfoNotAFile"},
      {"SourcesNotADirectory"},
      {"ResourcesNotADirectory"},
      {"LiveViewSourceFileNotAFile"},
      {"ImageReferenceNotAString"},
      {"ImageReferenceWithoutResources"},
      {"MissingLiveViewMode"},
      {"PosterReferenceNotAString"},
      {"MarletLoggingModeNotAString"},
      {"HintsNotAnArray"},
      {"HintNotADictionary"},
      {"HintContentMissing"},
      {"HintContentNotAString"},
      {"HintContentReferenceNotAString"},
      {"HintContentReferenceWithoutResources"},
      {"HintContentReferenceMissingFile"},
      {"InvalidHintContentFile"},
      {"HintSpoilerButtonTitleNotAString"},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletBookPageSnapshot.SerializationError", rows};
  return table;
}

namespace {

struct PageFiles {
  Data source;
  std::optional<Data> resultInfo;
};

PageFiles readFiles(const FileWrapper& page, const URL& pageURL,
                    const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  auto source = userEditsDiffPack ? learnersFile(*userEditsDiffPack, pageURL, "Contents.swift")
                                  : fileContents(page, "Contents.swift");
  require<E>(source.has_value(), Case::MissingContentsFile);
  return {*std::move(source),
          userEditsDiffPack ? learnersFile(*userEditsDiffPack, pageURL, "ResultInfo.plist")
                            : optionalFileContents<E>(page, "ResultInfo.plist", Case::ResultInfoNotAFile)};
}

std::optional<URL> loadLiveViewSourceFileURL(const FileWrapper& page, const URL& pageURL) {
  const auto file = page.child("LiveView.swift");
  if (!file) return std::nullopt;
  require<E>(file->isRegularFile(), Case::LiveViewSourceFileNotAFile);
  return pageURL.appendingPathComponent("LiveView.swift");
}

LiveViewMode loadLiveViewMode(const PropertyListDictionary& manifest) {
  const auto mode = requiredString<E>(manifest, "LiveViewMode", Case::MissingLiveViewMode);
  // Of each pair the second is how older manifests spell it.
  if (mode == "HiddenByDefault" || mode == "AutomaticallyShowAndHide") return LiveViewMode::HiddenByDefault;
  if (mode == "VisibleByDefault" || mode == "AlwaysVisible") return LiveViewMode::VisibleByDefault;
  throw E(Case::InvalidLiveViewMode, mode);
}

bool loadLiveViewEdgeToEdge(const PropertyListDictionary& manifest) {
  const auto* value = manifest.find("LiveViewEdgeToEdge");
  return !value || !value->boolean() || *value->boolean();
}

MarletLoggingMode loadMarletLoggingMode(const PropertyListDictionary& manifest) {
  const auto mode = optionalString<E>(manifest, "MarletLoggingMode", Case::MarletLoggingModeNotAString);
  if (!mode || *mode == "Normal") return MarletLoggingMode::Normal;
  if (*mode == "Off") return MarletLoggingMode::Off;
  throw E(Case::InvalidMarletLoggingMode, *mode);
}

}  // namespace

MarletBookPageSnapshot::MarletBookPageSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                                               const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  require<E>(fileWrapper.hasChildren(), Case::NotADirectory);
  const auto manifest = loadManifest<E>(fileWrapper, Case::MissingManifest, Case::InvalidManifest,
                                        Case::ManifestNotADictionary);
  name_ = requiredString<E>(manifest, "Name", Case::MissingName);
  pageDescription_ = optionalString<E>(manifest, "Description", Case::DescriptionNotAString);
  filename_ = baseURL.lastPathComponent();
  const auto files = readFiles(fileWrapper, baseURL, userEditsDiffPack);
  auto text = utf16FromUTF8(files.source.view());
  require<E>(text.has_value(), Case::InvalidContentsFile);
  text_ = *std::move(text);
  resultInfo_ = pageResultInfo(files.resultInfo);
  sourcesDirectoryURL_ = optionalDirectory<E>(fileWrapper, baseURL, "Sources", Case::SourcesNotADirectory);
  resourcesDirectoryURL_ =
      optionalDirectory<E>(fileWrapper, baseURL, "Resources", Case::ResourcesNotADirectory);
  liveViewSourceFileURL_ = loadLiveViewSourceFileURL(fileWrapper, baseURL);
  imageReference_ = optionalString<E>(manifest, "ImageReference", Case::ImageReferenceNotAString);
  require<E>(!imageReference_ || resourcesDirectoryURL_, Case::ImageReferenceWithoutResources);
  liveViewMode_ = loadLiveViewMode(manifest);
  liveViewEdgeToEdge_ = loadLiveViewEdgeToEdge(manifest);
  posterReference_ = optionalString<E>(manifest, "PosterReference", Case::PosterReferenceNotAString);
  marletLoggingMode_ = loadMarletLoggingMode(manifest);
  hints_ = loadHints(manifest, fileWrapper);
}

MarletBookPageSnapshot::MarletBookPageSnapshot(
    std::string name, std::optional<std::string> pageDescription, std::optional<std::string> imageReference,
    std::string filename, std::u16string text, MarletResultInfoSnapshot resultInfo,
    std::optional<URL> sourcesDirectoryURL, std::optional<URL> resourcesDirectoryURL,
    std::optional<URL> liveViewSourceFileURL, LiveViewMode liveViewMode, bool liveViewEdgeToEdge,
    std::optional<std::string> posterReference, MarletLoggingMode marletLoggingMode,
    std::vector<MarletHint> hints)
    : name_(std::move(name)),
      pageDescription_(std::move(pageDescription)),
      imageReference_(std::move(imageReference)),
      filename_(std::move(filename)),
      text_(std::move(text)),
      resultInfo_(std::move(resultInfo)),
      sourcesDirectoryURL_(std::move(sourcesDirectoryURL)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      liveViewSourceFileURL_(std::move(liveViewSourceFileURL)),
      liveViewMode_(liveViewMode),
      liveViewEdgeToEdge_(liveViewEdgeToEdge),
      posterReference_(std::move(posterReference)),
      marletLoggingMode_(marletLoggingMode),
      hints_(std::move(hints)) {}

MarletBookPageSnapshot::MarletBookPageSnapshot(const MarletBookPage& page)
    : MarletBookPageSnapshot(page.name(), page.pageDescription(), page.imageReference(), page.filename(),
                             page.text(), page.resultInfo().snapshot(), page.sourcesDirectoryURL(),
                             page.resourcesDirectoryURL(), page.liveViewSourceFileURL(), page.liveViewMode(),
                             page.liveViewEdgeToEdge(), page.posterReference(), page.marletLoggingMode(),
                             page.hints()) {}

std::unique_ptr<BookPageType> MarletBookPageSnapshot::convertToMutablePage() const {
  return std::make_unique<MarletBookPage>(*this);
}

bool MarletBookPageSnapshot::operator==(const MarletBookPageSnapshot& other) const {
  const auto fields = [](const MarletBookPageSnapshot& page) {
    return std::tie(page.name_, page.pageDescription_, page.imageReference_, page.filename_, page.text_,
                    page.resultInfo_, page.sourcesDirectoryURL_, page.resourcesDirectoryURL_,
                    page.liveViewSourceFileURL_, page.liveViewMode_, page.liveViewEdgeToEdge_,
                    page.posterReference_, page.marletLoggingMode_, page.hints_);
  };
  return fields(*this) == fields(other);
}

}  // namespace MarletFoundation
