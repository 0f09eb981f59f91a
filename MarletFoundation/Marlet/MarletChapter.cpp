#include "MarletFoundation/Marlet/MarletChapter.h"

namespace MarletFoundation {

MarletChapter::MarletChapter(std::string name_, std::string filename_,
                             std::optional<std::string> chapterDescription_,
                             std::optional<std::string> imageReference_,
                             std::optional<URL> sourcesDirectoryURL_,
                             std::optional<URL> resourcesDirectoryURL_, Pages pages_)
    : name(std::move(name_)),
      filename(std::move(filename_)),
      chapterDescription(std::move(chapterDescription_)),
      imageReference(std::move(imageReference_)),
      sourcesDirectoryURL(std::move(sourcesDirectoryURL_)),
      resourcesDirectoryURL(std::move(resourcesDirectoryURL_)),
      pages(std::move(pages_)) {}

MarletChapter::MarletChapter(const MarletChapterSnapshot& snapshot)
    : MarletChapter(snapshot.name, snapshot.filename, snapshot.chapterDescription, snapshot.imageReference,
                    snapshot.sourcesDirectoryURL, snapshot.resourcesDirectoryURL, {}) {
  for (const auto& page : snapshot.pages) pages.push_back(std::make_unique<BookPagePlaceholder>(page));
}

}  // namespace MarletFoundation
