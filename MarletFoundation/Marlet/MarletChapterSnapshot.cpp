#include "MarletFoundation/Marlet/MarletChapterSnapshot.h"

#include "MarletFoundation/Marlet/ListedSnapshots.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletChapter.h"
#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

using Case = MarletChapterSnapshot::SerializationErrorCase;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"invalidManifest", R"(The chapter Manifest.plist file could not be opened: {suggestion})"},
      {"missingPage", R"(Expected to find subdirectory in "Pages" with the name "{}" but found none.)"},
      {"invalidPage", R"({filename}: {suggestion|Unable to open page.})", "{error}"},
      {"notADirectory", R"(The chapter reference is not a directory.)"},
      {"missingManifest", R"(The chapter is missing the Manifest.plist file.)"},
      {"manifestNotADictionary",
       R"(The chapter Manifest.plist does not contain a dictionary as the root value.)"},
      {"missingName", R"(Missing "Name" key in the chapter manifest.)"},
      {"descriptionNotAString", R"(The "Description" key in the chapter manifest is not a string.)"},
      {"sourcesNotADirectory", R"(Found file named "Sources" in the chapter but expected a directory.)"},
      {"resourcesNotADirectory", R"(Found file named "Resources" in the chapter but expected a directory.)"},
      {"imageReferenceNotAString", R"(The "ImageReference" key in the chapter manifest is not a string.)"},
      {"imageReferenceWithNoResources",
       R"(There is an "ImageReference" key in the chaptermanifest but no "Resources" directory.)"},
      {"imageReferenceIsAURL",
       R"(The "ImageReference" key in the chapter manifest is a is not a local, relative path.)"},
      {"missingPagesInManifest", R"(The chapter manifest does not specify any pages.)"},
      {"pagesInManifestNotAnArray", R"(The "Pages" key in the chapter manifest is not an array of strings.)"},
      {"missingPagesDirectory", R"(Missing the "Pages" directory.)"},
      {"pagesNotADirectory", R"(Found file named "Pages" in the chapter but expected a directory.)"},
      {"pageFilenameNotAString",
       R"(One of the values in the "Pages" key of the chapter manifest is not a string.)"},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletChapterSnapshot.SerializationError", rows,
                                    "Invalid Chapter"};
  return table;
}

namespace {

void addPage(ListedSnapshots<BookPagePlaceholderSnapshot>& listed, const FileWrapper& pages,
             const URL& pagesURL, const PropertyListValue& element,
             const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  using E = MarletChapterSnapshot::SerializationError;
  require<E>(element.string(), Case::pageFilenameNotAString);
  const auto& filename = *element.string();
  const auto page = pages.child(filename);
  if (!page) throw E(Case::missingPage, filename);
  try {
    listed.add(filename, [&] {
      return BookPagePlaceholderSnapshot(*page, pagesURL.appendingPathComponent(filename), userEditsDiffPack);
    });
  } catch (const Error& error) {
    throw E(Case::invalidPage, filename, error);
  }
}

}  // namespace

MarletChapterSnapshot::MarletChapterSnapshot(std::string name_, std::string filename_,
                                             std::optional<std::string> chapterDescription_,
                                             std::optional<std::string> imageReference_,
                                             std::optional<URL> sourcesDirectoryURL_,
                                             std::optional<URL> resourcesDirectoryURL_,
                                             std::vector<BookPagePlaceholderSnapshot> pages_)
    : name(std::move(name_)),
      filename(std::move(filename_)),
      chapterDescription(std::move(chapterDescription_)),
      imageReference(std::move(imageReference_)),
      sourcesDirectoryURL(std::move(sourcesDirectoryURL_)),
      resourcesDirectoryURL(std::move(resourcesDirectoryURL_)),
      pages(std::move(pages_)) {}

MarletChapterSnapshot::MarletChapterSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                                             const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  using E = SerializationError;
  require<E>(fileWrapper.hasChildren(), Case::notADirectory);
  const auto manifest = loadManifest<E>(fileWrapper, Case::missingManifest, Case::invalidManifest,
                                        Case::manifestNotADictionary);
  name = requiredString<E>(manifest, "Name", Case::missingName);
  filename = baseURL.lastPathComponent();
  chapterDescription = optionalString<E>(manifest, "Description", Case::descriptionNotAString);
  sourcesDirectoryURL = optionalDirectory<E>(fileWrapper, baseURL, "Sources", Case::sourcesNotADirectory);
  resourcesDirectoryURL =
      optionalDirectory<E>(fileWrapper, baseURL, "Resources", Case::resourcesNotADirectory);
  imageReference = optionalImageReference<E>(manifest, resourcesDirectoryURL, Case::imageReferenceNotAString,
                                             Case::imageReferenceWithNoResources, Case::imageReferenceIsAURL);
  const auto& filenames =
      requiredArray<E>(manifest, "Pages", Case::missingPagesInManifest, Case::pagesInManifestNotAnArray);
  const auto pagesWrapper =
      requiredDirectory<E>(fileWrapper, "Pages", Case::missingPagesDirectory, Case::pagesNotADirectory);
  const auto pagesURL = baseURL.appendingPathComponent("Pages", true);
  ListedSnapshots<BookPagePlaceholderSnapshot> listed;
  for (const auto& element : filenames) addPage(listed, pagesWrapper, pagesURL, element, userEditsDiffPack);
  pages = listed.take();
}

MarletChapterSnapshot::MarletChapterSnapshot(const MarletChapter& chapter)
    : name(chapter.name),
      filename(chapter.filename),
      chapterDescription(chapter.chapterDescription),
      imageReference(chapter.imageReference),
      sourcesDirectoryURL(chapter.sourcesDirectoryURL),
      resourcesDirectoryURL(chapter.resourcesDirectoryURL) {
  for (const auto& page : chapter.pages) {
    if (!page) fatalError("A chapter's pages can't be null.");
    pages.push_back(page->snapshot());
  }
}

PropertyListValue MarletChapterSnapshot::manifest() const {
  PropertyListValue::Array filenames;
  for (const auto& page : pages) filenames.emplace_back(page.filename);
  PropertyListDictionary manifest{{"Name", name}, {"Pages", std::move(filenames)}};
  if (chapterDescription) manifest["Description"] = *chapterDescription;
  if (imageReference) manifest["ImageReference"] = *imageReference;
  return manifest;
}

}  // namespace MarletFoundation
