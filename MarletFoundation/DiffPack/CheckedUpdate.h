#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// What stands against an update of a book, though its changes can be made.
struct MARLET_EXPORT UpdateConflict {
  enum class Kind {
    /// The update is in the book: its changes would be made a second time.
    AlreadyApplied,
    /// The book, or a page that opened before or is new, wouldn't open.
    DoesNotOpen,
    /// Something of the learner's would be removed or become another file.
    LosesLearnersFile,
    /// The text under a learner's changes would become another one, for which they weren't made.
    DoesNotFitEdit,
  };
  Kind kind;
  /// A path relative to the document: "Contents/Chapters/…", "Edits/UserResources".
  std::string file;
  /// What was thrown; null where nothing was.
  ErrorPointer error = nullptr;

  /// What is wrong as a clause: "its text under the learner's changes would be another one".
  std::string_view reason() const;
};

/// An update of a book before it is written.
struct MARLET_EXPORT CheckedUpdate {
  /// As `MarletBookDiffMergeContext::mergedDocument` gives it.
  FileWrapper document;
  /// Empty where the document may be written.
  std::vector<UpdateConflict> conflicts;
};

/// Applies an update to the ".marletbook" document at the URL in memory, as `applyUpdateDiffPack` would, and opens the
/// outcome in full: the book, its pages, the learner's pack and each edited file's text. Nothing is written. Whether
/// the update is meant for this book is left to the host.
///
/// Throws what `applyUpdateDiffPack` throws, and a POSIX ESTALE when the book changes faster than it can be read: it is
/// read again a bounded number of times.
MARLET_EXPORT CheckedUpdate checkedUpdate(const URL& documentUrl, const DiffPackSnapshot& diffPack);

/// `applyUpdateDiffPack` for packs from anywhere: the book is written when nothing stands against it. Throws what
/// `checkedUpdate` throws, what writing does, and for conflicts an `ErrorObject` of `DiffErrorDomain` with the code
/// `CriticalMergeError` that names them.
MARLET_EXPORT void applyCheckedUpdate(const URL& documentUrl, const DiffPackSnapshot& diffPack);

/// The conflicts in a sentence that names the first few.
MARLET_EXPORT std::string description(const std::vector<UpdateConflict>& conflicts);

}  // namespace MarletFoundation
