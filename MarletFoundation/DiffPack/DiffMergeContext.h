#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// Applies packs to a document.
class MARLET_EXPORT DiffMergeContext {
 public:
  virtual ~DiffMergeContext() = default;
  /// Applies the pack to the document on disk, as a whole or not at all. Throws when it can't be applied.
  virtual void mergeDiffPack(const DiffPackSnapshot& pack) const = 0;
  /// Throws when no pack can be applied to the document.
  virtual void validateDiffPack(const DiffPackSnapshot& pack) const = 0;
};

}  // namespace MarletFoundation
