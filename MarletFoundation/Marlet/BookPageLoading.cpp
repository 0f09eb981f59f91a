#include "MarletFoundation/Marlet/BookPageLoading.h"

#include <algorithm>
#include <cerrno>

#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"

namespace MarletFoundation {

using Case = BookPageLoadingErrorCase;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {{"NoSuchChapter"}, {"NoSuchPage"}, {"UnknownPageType"}};
  static constexpr ErrorTable table{"MarletFoundation.BookPageLoadingError", rows};
  return table;
}

namespace {

template <class Item>
const Item& firstNamed(const std::vector<Item>& items, std::string_view filename, Case otherwise) {
  const auto found =
      std::find_if(items.begin(), items.end(), [&](const Item& item) { return item.filename == filename; });
  if (found == items.end()) throw BookPageLoadingError(otherwise, filename);
  return *found;
}

void requirePage(const MarletBookSnapshot& book, std::string_view chapterFilename,
                 std::string_view pageFilename) {
  const auto& chapter = firstNamed(book.chapters, chapterFilename, Case::NoSuchChapter);
  firstNamed(chapter.pages, pageFilename, Case::NoSuchPage);
}

std::optional<DiffPackSnapshot> readPack(const URL& bookURL) {
  const auto url =
      bookURL.appendingPathComponent("Edits", true).appendingPathComponent("UserEdits.diffpack", true);
  std::optional<FileWrapper> wrapper;
  try {
    wrapper.emplace(url);
  } catch (const ErrorObject& error) {
    if (error.code() != ENOENT) throw;
    return std::nullopt;
  }
  return DiffPackSnapshot(*wrapper, bookURL.appendingPathComponent("Contents", true));
}

}  // namespace

std::unique_ptr<BookPageSnapshotType> snapshotForPageWithFilename(
    std::string_view pageFilename, std::string_view chapterFilename, const URL& bookURL,
    const MarletBookSnapshot* marletBookSnapshot, const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  if (marletBookSnapshot) {
    requirePage(*marletBookSnapshot, chapterFilename, pageFilename);
  } else {
    requirePage(MarletBookSnapshot(FileWrapper(bookURL), bookURL), chapterFilename, pageFilename);
  }
  std::optional<DiffPackSnapshot> ownPack;
  if (!userEditsDiffPack) ownPack = readPack(bookURL);
  const auto& pack = userEditsDiffPack ? userEditsDiffPack : ownPack;
  const auto pageURL = bookURL.appendingPathComponent("Contents", true)
                           .appendingPathComponent("Chapters", true)
                           .appendingPathComponent(chapterFilename, true)
                           .appendingPathComponent("Pages", true)
                           .appendingPathComponent(pageFilename, true);
  const FileWrapper page(pageURL);
  const auto kind = pageURL.pathExtension();
  if (kind == "marletpage") return std::make_unique<MarletBookPageSnapshot>(page, pageURL, pack);
  if (kind == "cutscenepage") return std::make_unique<CutsceneBookPageSnapshot>(page, pageURL);
  throw BookPageLoadingError(Case::UnknownPageType, kind);
}

}  // namespace MarletFoundation
