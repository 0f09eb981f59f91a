#pragma once

#include <optional>
#include <string>

#include "MarletFoundation/Platform/FileWrapper.h"

/// The learner's pack in a book's tree, for who has to mend it.
namespace MarletFoundation {

/// The pack's directory as it lies in the book; nothing where there is none.
MARLET_EXPORT std::optional<FileWrapper> userEditsIn(const FileWrapper& book);

/// Puts a pack's directory in the place of the learner's pack, in memory.
MARLET_EXPORT void setUserEdits(const FileWrapper& book, FileWrapper pack);

/// The book's tree as a load sees it, but for the learner's pack, so that it opens whatever that is like. Shares its
/// nodes with `book`.
MARLET_EXPORT FileWrapper withoutUserEdits(const FileWrapper& book);

/// Renames the learner's pack of the book on disk, beside itself, so that the book opens without it; nothing is
/// removed or overwritten. Gives the new path, relative to the book. Throws an `ErrorObject` of `DiffErrorDomain` with
/// the code `CriticalDiffPackValidationError` for a pack that can be read, one of the POSIX domain where there is none
/// (ENOENT), and the file system's.
MARLET_EXPORT std::string setUserEditsAside(const URL& bookURL);

}  // namespace MarletFoundation
