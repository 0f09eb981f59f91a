#include "MarletFoundation/Marlet/MarletSnapshot.h"

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/Marlet.h"
#include "MarletFoundation/Marlet/MarletParser.h"
#include "MarletFoundation/Marlet/PageDirectory.h"
#include "MarletFoundation/PathUtilities/DocumentNames.h"
#include "MarletFoundation/PathUtilities/PathUniquifier.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/XML/MLFXMLWriter.h"

namespace MarletFoundation {

using Case = MarletSnapshot::SerializationErrorCase;
using E = MarletSnapshot::SerializationError;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"unknownTargetIdentifier", "Unable to find target for platform with identifier {}."},
      {"notADirectory", "File is not a marlet (it is not a directory)."},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletSnapshot.SerializationError", rows,
                                    "Marlet Error"};
  return table;
}

namespace {

std::string nameFromURL(const URL& url) {
  auto name = url.lastPathComponent();
  const auto extension = url.pathExtension();
  if (!extension.empty()) name.resize(name.size() - extension.size() - 1);
  return name;
}

}  // namespace

MarletSnapshot::MarletSnapshot(std::string name_, std::string uniquifier_, TargetPointer target_,
                               bool requiresFullEnvironment_, std::optional<URL> sharedResourcesDirectoryURL_,
                               std::optional<URL> sharedSourcesDirectoryURL_,
                               std::optional<URL> marletIconURL_, std::vector<MarletPageSnapshot> pages_,
                               MarletKeyValueStoreSnapshot keyValueStore_)
    : name(std::move(name_)),
      uniquifier(std::move(uniquifier_)),
      target(std::move(target_)),
      requiresFullEnvironment(requiresFullEnvironment_),
      sharedResourcesDirectoryURL(std::move(sharedResourcesDirectoryURL_)),
      sharedSourcesDirectoryURL(std::move(sharedSourcesDirectoryURL_)),
      marletIconURL(std::move(marletIconURL_)),
      pages(std::move(pages_)),
      keyValueStore(std::move(keyValueStore_)) {}

MarletSnapshot::MarletSnapshot(const FileWrapper& fileWrapper, const URL& baseURL) {
  require<E>(fileWrapper.isDirectory(), Case::notADirectory);
  auto document = MarletParser(fileWrapper, baseURL).parse();
  name = nameFromURL(baseURL);
  uniquifier = pathUniquifier(baseURL);
  target = Target::targetWithIdentifier(document.targetPlatform);
  if (!target) throw E(Case::unknownTargetIdentifier, document.targetPlatform);
  requiresFullEnvironment = document.requiresFullEnvironment;
  // Without "Pages" these directories are the page's.
  if (fileWrapper.child("Pages")) {
    sharedResourcesDirectoryURL = urlOfChild(fileWrapper, baseURL, ResourcesDirectoryName, true);
    sharedSourcesDirectoryURL = urlOfChild(fileWrapper, baseURL, SourcesDirectoryName, true);
  }
  marletIconURL = urlOfChild(fileWrapper, baseURL, MarletIconName, false);
  pages = std::move(document.pages);
}

MarletSnapshot::MarletSnapshot(const Marlet& marlet)
    : MarletSnapshot(marlet.name, marlet.uniquifier, marlet.target, marlet.requiresFullEnvironment,
                     marlet.sharedResourcesDirectoryURL, marlet.sharedSourcesDirectoryURL,
                     marlet.marletIconURL, {}, marlet.keyValueStore.snapshot()) {
  for (const auto& page : marlet.pages) {
    if (!page) fatalError("A marlet's pages can't be null.");
    pages.push_back(page->snapshot());
  }
}

bool MarletSnapshot::isSinglePage() const {
  return !sharedResourcesDirectoryURL && !sharedSourcesDirectoryURL && pages.size() == 1 && !pages[0].name();
}

Data MarletSnapshot::manifest() const {
  if (!target) fatalError("A marlet can't be written without a target.");
  const MLFXMLAttributes attributes{
      {"version", isSinglePage() ? "5.0" : "6.0"},
      {"target-platform", target->identifier},
      {"requires-full-environment", requiresFullEnvironment ? "true" : "false"}};
  const MLFXMLElementWriter addPages = [&](MLFXMLElement& list) {
    for (const auto& page : pages) {
      if (!page.name()) fatalError("Every page of a marlet with several pages must have a name!");
      list.addChildElementWithName("page", {{"name", *page.name()}});
    }
  };
  return MLFXMLWriter::XMLDataUsingDocumentWriter([&](MLFXMLDocument& document) {
    document.createRootElementWithName("marlet", attributes, [&](MLFXMLElement& marlet) {
      if (!isSinglePage()) marlet.addChildElementWithName("pages", {}, addPages);
    });
  });
}

FileWrapper MarletSnapshot::fileWrapper(const MarletSnapshot*) const {
  FileWrapper::Children children;
  children.emplace(ManifestFilename, FileWrapper::regularFile(manifest()));
  addIfThere(children, MarletIconName, marletIconURL);
  addIfThere(children, ResourcesDirectoryName, sharedResourcesDirectoryURL);
  addIfThere(children, SourcesDirectoryName, sharedSourcesDirectoryURL);
  if (isSinglePage()) {
    // The page's directory is the document's.
    children.merge(*pages[0].fileWrapper().fileWrappers());
  } else {
    FileWrapper::Children pageDirectories;
    for (const auto& page : pages) pageDirectories.insert_or_assign(page.filename(), page.fileWrapper());
    children.emplace("Pages", FileWrapper::directory(std::move(pageDirectories)));
  }
  return FileWrapper::directory(std::move(children));
}

bool MarletSnapshot::operator==(const MarletSnapshot& other) const {
  const auto fields = [](const MarletSnapshot& marlet) {
    return std::tie(marlet.name, marlet.uniquifier, marlet.target, marlet.requiresFullEnvironment,
                    marlet.sharedResourcesDirectoryURL, marlet.sharedSourcesDirectoryURL,
                    marlet.marletIconURL, marlet.pages, marlet.keyValueStore.contents());
  };
  return fields(*this) == fields(other);
}

}  // namespace MarletFoundation
