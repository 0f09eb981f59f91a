#pragma once

#include "MarletFoundation/DiffPack/DiffContext.h"

namespace MarletFoundation {

/// Compares two versions of a book. Both are loaded afresh at each call.
class MARLET_EXPORT MarletBookDiffContext final : public DiffContext {
 public:
  const URL originalUrl;
  const URL updatedUrl;

  MarletBookDiffContext(URL originalUrl, URL updatedUrl);

  /// An update pack with paths relative to "Contents". Throws an `ErrorObject` of `DiffErrorDomain` with the
  /// code `CriticalDiffPackCreationError` for a book that doesn't load (with the cause), for books of
  /// different content identifiers, and for any but the next patch version, in this order; and what
  /// comparing the files throws.
  DiffPackSnapshot generateDiffPack() const override;
};

}  // namespace MarletFoundation
