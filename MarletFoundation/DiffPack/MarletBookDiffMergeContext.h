#pragma once

#include "MarletFoundation/DiffPack/DiffMergeContext.h"

namespace MarletFoundation {

/// Applies updates to a book under its learner's edits. The book is loaded afresh at each call.
class MARLET_EXPORT MarletBookDiffMergeContext final : public DiffMergeContext {
 public:
  const URL baseUrl;
  /// The book's "Contents".
  const URL contentsUrl;

  /// The book at `contextUrl`.
  explicit MarletBookDiffMergeContext(URL contextUrl);

  /// Writes the `mergedDocument` in the place of the book, all of it or nothing.
  void mergeDiffPack(const DiffPackSnapshot& pack) const override;

  /// Only asks whether the book loads, and throws what stands against it; the pack isn't looked at.
  void validateDiffPack(const DiffPackSnapshot& pack) const override;

  /// The book's tree with the pack applied, and the learner's pack moved to the pack's update version with
  /// its changes of modified files carried over to the new texts. Nothing is written.
  ///
  /// Added and replaced files come from below the pack's `contentUrl`, never from an entry's data. Paths are
  /// relative to "Contents", but for those of removed files: they go by the document's root, so that a file
  /// below "Contents" stays. Nothing is reported where none is there.
  ///
  /// Throws an `ErrorObject` of `DiffErrorDomain` with the code `CriticalMergeError` for a book without
  /// contents and for a file that is needed and isn't there or is no UTF-8 text; that of
  /// `MarletDiff::mergeContent` where a change doesn't fit the book's text, or is at odds with the learner's
  /// edit; and the file system's and the book's own errors.
  FileWrapper mergedDocument(const DiffPackSnapshot& pack) const;
};

}  // namespace MarletFoundation
