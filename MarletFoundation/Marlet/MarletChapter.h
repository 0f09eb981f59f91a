#pragma once

#include <memory>

#include "MarletFoundation/Marlet/BookPagePlaceholder.h"
#include "MarletFoundation/Marlet/MarletChapterSnapshot.h"

namespace MarletFoundation {

/// A live chapter, which owns its placeholders. Nothing that is assigned is checked; but a snapshot with a null page is
/// a fatal error.
struct MARLET_EXPORT MarletChapter {
  using Pages = std::vector<std::unique_ptr<BookPagePlaceholder>>;

  std::string name;
  std::string filename;
  std::optional<std::string> chapterDescription;
  std::optional<std::string> imageReference;
  std::optional<URL> sourcesDirectoryURL;
  std::optional<URL> resourcesDirectoryURL;
  Pages pages;

  MarletChapter(std::string name, std::string filename, std::optional<std::string> chapterDescription,
                std::optional<std::string> imageReference, std::optional<URL> sourcesDirectoryURL,
                std::optional<URL> resourcesDirectoryURL, Pages pages);
  explicit MarletChapter(const MarletChapterSnapshot& snapshot);
  MarletChapter(const MarletChapter&) = delete;
  MarletChapter& operator=(const MarletChapter&) = delete;

  MarletChapterSnapshot snapshot() const { return MarletChapterSnapshot(*this); }
};

}  // namespace MarletFoundation
