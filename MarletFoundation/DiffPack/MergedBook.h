#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"

namespace MarletFoundation {

/// A book's tree with a pack applied to it, in memory, and what the merge knows of it.
struct MergedBook {
  FileWrapper document;
  /// The book as it was.
  MarletBookSnapshot before;
  /// The learner's pack as it was and as it became, entry by entry.
  std::optional<DiffPackSnapshot> editsBefore, edits;
  /// Of each entry of a modified file the authored text that its changes are made for: the one before the update, or,
  /// once they were carried over, the new one. Nothing for other entries, and where there was no such file.
  std::vector<std::optional<Data>> editedTexts;
  /// The paths, relative to the document, at which removed entries found something of the learner's.
  std::vector<std::string> takenFromEdits;
};

/// Applies a pack to the book at the URL; nothing is written. Throws as `MarletBookDiffMergeContext::mergedDocument`.
MergedBook mergedBook(const URL& bookURL, const DiffPackSnapshot& pack);

}  // namespace MarletFoundation
