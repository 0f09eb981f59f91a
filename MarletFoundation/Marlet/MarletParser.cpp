#include "MarletFoundation/Marlet/MarletParser.h"

#include <algorithm>
#include <set>

#include "MarletFoundation/Data/MarletSerializationError.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/PathUtilities/DocumentNames.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view pageExtension = ".wbmarletpage";

/// The source of a page's directory, under either spelling.
std::optional<FileWrapper> sourceOf(const FileWrapper& directory) {
  auto source = directory.child("Contents.swift");
  return source ? source : directory.child("contents.swift");
}

struct NamedDirectory {
  std::string name;
  FileWrapper directory;
};

/// The children of "Pages" that bear a page's extension, sorted by page name, which isn't the order of the
/// file names.
std::vector<NamedDirectory> pagesInDirectory(const FileWrapper& pages) {
  std::vector<NamedDirectory> found;
  const auto children = pages.fileWrappers();
  if (!children) return found;
  for (const auto& [filename, child] : *children) {
    // The extension alone is a name without one.
    if (filename.size() > pageExtension.size() && filename.ends_with(pageExtension))
      found.push_back({filename.substr(0, filename.size() - pageExtension.size()), child});
  }
  std::sort(found.begin(), found.end(), [](const auto& a, const auto& b) { return a.name < b.name; });
  return found;
}

}  // namespace

MarletParser::Document MarletParser::parse() {
  const auto manifest = fileWrapper_.child(ManifestFilename);
  if (!manifest) throw StubMarletSerializationError("Unable to get file wrapper for contents.wbmarlet.");
  const auto data = manifest->regularFileContents();
  if (!data) throw StubMarletSerializationError("Unable to get data for contents.wbmarlet.");
  XMLParser parser(*data);
  parser.delegate = this;
  if (!parser.parse()) {
    if (parseError_) throw *parseError_;
    if (parser.parserError()) throw *parser.parserError();
    throw StubMarletSerializationError("XML parsing failed for an unknown reason.");
  }
  if (!targetPlatform_)
    throw StubMarletSerializationError("Unable to parse contents.wbmarlet: no target platform specified.");
  if (!requiresFullEnvironment_)
    fatalError("requiresFullEnvironment should always be set, even if not specified in the document!");

  if (singlePageMarletContents_) {
    addPageOfSections();
  } else if (pages_) {
    addPagesOmittedByList();
  } else if (const auto directory = fileWrapper_.child("Pages"); directory && majorVersion_ > 5) {
    addPagesOfDirectory(*directory);
  } else {
    addRootAsPage();
  }
  if (pages_->empty()) throw StubMarletSerializationError("Unable to load marlet file: it has no pages.");
  return {*std::move(targetPlatform_), *requiresFullEnvironment_, *std::move(pages_)};
}

void MarletParser::addPageOfSections() {
  pages_ = {MarletPageSnapshot(std::nullopt, *std::move(singlePageMarletContents_), {}, std::nullopt,
                               urlOfChild(fileWrapper_, baseURL_, ResourcesDirectoryName, true), {})};
}

void MarletParser::addPagesOmittedByList() {
  if (majorVersion_ < 6) return;
  const auto directory = fileWrapper_.child("Pages");
  if (!directory || !directory->isDirectory()) return;
  std::set<std::string> listed;
  for (const auto& page : *pages_) listed.insert(*page.name());
  for (const auto& [name, page] : pagesInDirectory(*directory)) {
    if (!listed.contains(name) && page.isDirectory()) addNamedPage(page, name);
  }
}

void MarletParser::addPagesOfDirectory(const FileWrapper& directory) {
  pages_.emplace();
  for (const auto& [name, page] : pagesInDirectory(directory)) addNamedPage(page, name);
}

void MarletParser::addRootAsPage() {
  if (!sourceOf(fileWrapper_))
    throw StubMarletSerializationError("Unable to load marlet file: Contents.swift file is missing.");
  pages_.emplace();
  addPage(fileWrapper_, baseURL_, std::nullopt);
}

void MarletParser::addNamedPage(const FileWrapper& directory, const std::string& name) {
  addPage(directory,
          baseURL_.appendingPathComponent("Pages", true)
              .appendingPathComponent(MarletPageSnapshot::filenameForName(name), true),
          name);
}

void MarletParser::addPage(const FileWrapper& directory, const URL& url, std::optional<std::string> name) {
  auto page = pageSnapshotFromFileWrapper(directory, url, std::move(name));
  if (!takes(page.text().size()))
    throw StubMarletSerializationError("Unable to load marlet page: unable to load Contents.swift.");
  pages_->push_back(std::move(page));
}

bool MarletParser::takes(std::size_t sourceUnits) {
  if (sourceUnits > sourceUnitsLeft_) return false;
  sourceUnitsLeft_ -= sourceUnits;
  return true;
}

MarletPageSnapshot MarletParser::pageSnapshotFromFileWrapper(const FileWrapper& fileWrapper,
                                                             const URL& baseURL,
                                                             std::optional<std::string> name) {
  if (!fileWrapper.isDirectory())
    throw StubMarletSerializationError("Unable to load marlet page: " + baseURL.lastPathComponent() +
                                       " is not a directory.");
  const auto source = sourceOf(fileWrapper);
  if (!source)
    throw StubMarletSerializationError("Unable to load marlet page: Contents.swift file is missing.");
  const auto data = source->regularFileContents();
  auto text = data ? utf16FromUTF8(data->view()) : std::nullopt;
  if (!text) throw StubMarletSerializationError("Unable to load marlet page: unable to load Contents.swift.");
  auto resources = urlOfChild(fileWrapper, baseURL, ResourcesDirectoryName, true);
  auto sources = urlOfChild(fileWrapper, baseURL, SourcesDirectoryName, true);
  return {std::move(name), *std::move(text), {}, std::move(sources), std::move(resources), {}};
}

}  // namespace MarletFoundation
