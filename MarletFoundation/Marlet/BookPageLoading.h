#pragma once

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Marlet/PageType.h"

namespace MarletFoundation {

/// Each case carries a string: the chapter's or page's filename, or the extension of the page's directory.
enum class BookPageLoadingErrorCase { NoSuchChapter, NoSuchPage, UnknownPageType };
using BookPageLoadingError = CaseError<BookPageLoadingErrorCase>;
MARLET_EXPORT const ErrorTable& errorTable(BookPageLoadingErrorCase);

/// Loads a whole page of the book at `bookURL`, with the learner's edits: a `MarletBookPageSnapshot` or a
/// `CutsceneBookPageSnapshot`, as the extension of the page's directory says.
///
/// Without a book snapshot the whole book is loaded to find the page in it, and without a pack the book's own
/// is looked for and read; a host that holds them passes them in. What is read is of one state of the book, also while
/// it, its page or its pack is saved: it is read again for as long as it isn't, a bounded number of times. Throws `BookPageLoadingError`, the page's
/// own error, what loading book, pack or directory throws, or a POSIX ESTALE.
MARLET_EXPORT std::unique_ptr<BookPageSnapshotType> snapshotForPageWithFilename(
    std::string_view pageFilename, std::string_view chapterFilename, const URL& bookURL,
    const MarletBookSnapshot* marletBookSnapshot = nullptr,
    const std::optional<DiffPackSnapshot>& userEditsDiffPack = std::nullopt);

}  // namespace MarletFoundation
