#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// Compares two versions of a document.
class MARLET_EXPORT DiffContext {
 public:
  virtual ~DiffContext() = default;
  /// The pack that leads from the one to the other. Throws when they make none.
  virtual DiffPackSnapshot generateDiffPack() const = 0;
};

}  // namespace MarletFoundation
