#pragma once

#include <optional>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/FileWrapper.h"

namespace MarletFoundation {

/// A book as it lay on disk at one moment.
struct OpenedBook {
  /// The tree that it was read from, to be changed and written: `write` refuses it (ESTALE) once the book on disk is
  /// another.
  FileWrapper document;
  MarletBookSnapshot snapshot;
  /// The learner's edits, where the book has any.
  std::optional<DiffPackSnapshot> userEdits;
};

/// Opens the book at `url` with its learner's pack, both of one state, also while others write it or its pages. Throws
/// what loading throws, the file error when the place can't be opened, and a POSIX ESTALE when it changes faster
/// than it can be read. Any thread.
MARLET_EXPORT OpenedBook openBook(const URL& url);

}  // namespace MarletFoundation
