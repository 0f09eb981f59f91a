#include "MarletFoundation/Marlet/BookPageLoading.h"

#include <algorithm>
#include <cerrno>

#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"
#include "MarletFoundation/Platform/OneState.h"

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

/// The directories that a page is read from, each opened by its own URL.
struct PageReading {
  /// Nothing where it isn't needed, or can't be opened, which a host's own snapshot makes up for.
  std::optional<FileWrapper> book;
  std::optional<FileWrapper> pack, page;

  PageReading(const URL& bookURL, bool needsBook) {
    if (!needsBook) return;
    try {
      book.emplace(bookURL);
    } catch (const ErrorObject&) {
    }
  }

  bool isUnchanged() const {
    return (!book || book->isUnchanged()) && (!pack || pack->isUnchanged()) && (!page || page->isUnchanged());
  }

  std::optional<DiffPackSnapshot> readPack(const URL& bookURL) {
    // Shows in the book whether a pack comes or goes.
    if (const auto edits = book ? book->child("Edits") : std::nullopt) edits->child("UserEdits.diffpack");
    try {
      pack.emplace(
          bookURL.appendingPathComponent("Edits", true).appendingPathComponent("UserEdits.diffpack", true));
    } catch (const ErrorObject& error) {
      if (error.code() != ENOENT) throw;
      return std::nullopt;
    }
    return DiffPackSnapshot(*pack, bookURL.appendingPathComponent("Contents", true));
  }

  const FileWrapper& openPage(const URL& url) {
    page.emplace(url);
    // Those that the learner's edits go into are read by their paths: looked at here, they can't change unseen.
    page->child("Contents.swift");
    page->child("ResultInfo.plist");
    return *page;
  }
};

std::unique_ptr<BookPageSnapshotType> readPage(PageReading& reading, const URL& url,
                                               const std::optional<DiffPackSnapshot>& pack) {
  const auto& page = reading.openPage(url);
  const auto kind = url.pathExtension();
  if (kind == "marletpage") return std::make_unique<MarletBookPageSnapshot>(page, url, pack);
  if (kind == "cutscenepage") return std::make_unique<CutsceneBookPageSnapshot>(page, url);
  throw BookPageLoadingError(Case::UnknownPageType, kind);
}

}  // namespace

std::unique_ptr<BookPageSnapshotType> snapshotForPageWithFilename(
    std::string_view pageFilename, std::string_view chapterFilename, const URL& bookURL,
    const MarletBookSnapshot* marletBookSnapshot, const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  const auto pageURL = bookURL.appendingPathComponent("Contents", true)
                           .appendingPathComponent("Chapters", true)
                           .appendingPathComponent(chapterFilename, true)
                           .appendingPathComponent("Pages", true)
                           .appendingPathComponent(pageFilename, true);
  return readOneState(
      bookURL.path(), [&] { return PageReading(bookURL, !marletBookSnapshot || !userEditsDiffPack); },
      [&](PageReading& reading) {
        if (marletBookSnapshot) {
          requirePage(*marletBookSnapshot, chapterFilename, pageFilename);
        } else {
          const auto book = reading.book ? *reading.book : FileWrapper(bookURL);
          requirePage(MarletBookSnapshot(book, bookURL), chapterFilename, pageFilename);
        }
        if (userEditsDiffPack) return readPage(reading, pageURL, userEditsDiffPack);
        return readPage(reading, pageURL, reading.readPack(bookURL));
      });
}

}  // namespace MarletFoundation
