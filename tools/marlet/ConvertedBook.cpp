#include "ConvertedBook.h"

#include "Guarded.h"
#include "MarletFoundation/Platform/Host.h"
#include "NewItems.h"

using namespace MarletFoundation;
using Children = FileWrapper::Children;

namespace {

constexpr const char* chapterFilename = "Start";

/// A page without a name takes the document's.
MarletBookPageSnapshot bookPage(const MarletPageSnapshot& page, const std::string& documentName) {
  return {page.name().value_or(documentName),
          std::nullopt,
          std::nullopt,
          page.name().value_or("Page") + ".marletpage",
          page.text(),
          {},
          page.sourcesDirectoryURL(),
          page.resourcesDirectoryURL(),
          std::nullopt,
          LiveViewMode::HiddenByDefault,
          true,
          std::nullopt,
          MarletLoggingMode::Normal,
          {}};
}

FileWrapper chapterOf(const MarletSnapshot& marlet) {
  std::vector<BookPagePlaceholderSnapshot> placeholders;
  Children pages;
  for (const auto& classic : marlet.pages) {
    const auto page = bookPage(classic, marlet.name);
    // A list may name one page twice.
    if (!pages.try_emplace(page.filename(), page.fileWrapper()).second) continue;
    placeholders.emplace_back(page.name(), page.filename(), std::nullopt, std::nullopt);
  }
  const MarletChapterSnapshot chapter(marlet.name, chapterFilename, std::nullopt, std::nullopt, std::nullopt,
                                      std::nullopt, std::move(placeholders));
  return FileWrapper::directory(
      {{"Manifest.plist", xmlFile(chapter.manifest())}, {"Pages", FileWrapper::directory(std::move(pages))}});
}

}  // namespace

FileWrapper bookOfMarlet(const MarletSnapshot& marlet, const std::string& path, const URL& url) {
  const auto refuse = [&](const std::string& reason) {
    throw CommandFailure{ExitStatus::negative, path + ": " + reason};
  };
  if (marlet.target->identifier != "slateos")
    refuse("It is made for \"" + marlet.target->identifier + "\", and books are for \"slateos\" only.");
  Children contents;
  if (marlet.sharedSourcesDirectoryURL)
    contents.emplace(SourcesDirectoryName, FileWrapper(*marlet.sharedSourcesDirectoryURL));
  if (marlet.sharedResourcesDirectoryURL)
    contents.emplace(ResourcesDirectoryName, FileWrapper(*marlet.sharedResourcesDirectoryURL));
  std::optional<std::string> image;
  if (marlet.marletIconURL) {
    auto resources =
        contents.try_emplace(std::string(ResourcesDirectoryName), FileWrapper::directory()).first->second;
    image = MarletIconName;
    if (resources.child(*image)) refuse("Its resources have a " + *image + " beside the document's own.");
    if (resources.isDirectory()) resources.addFileWrapper(FileWrapper(*marlet.marletIconURL));
  }
  const MarletBookSnapshot book(marlet.name, url.lastPathComponent(), std::nullopt, randomUUIDString(),
                                Version({1, 0}), std::nullopt, marlet.target, std::nullopt, std::nullopt,
                                std::nullopt, image,
                                {MarletChapterSnapshot(marlet.name, chapterFilename, std::nullopt,
                                                       std::nullopt, std::nullopt, std::nullopt, {})},
                                {});
  contents.emplace("Manifest.plist", xmlFile(book.manifest()));
  contents.emplace("Chapters", FileWrapper::directory({{chapterFilename, chapterOf(marlet)}}));
  auto tree = FileWrapper::directory({{"Contents", FileWrapper::directory(std::move(contents))}});
  const MarletBookSnapshot mustOpen(tree, url);
  return tree;
}
