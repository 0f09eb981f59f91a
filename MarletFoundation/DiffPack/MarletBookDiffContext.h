#pragma once

#include "MarletFoundation/DiffPack/DiffContext.h"

namespace MarletFoundation {

struct MarletBookSnapshot;

/// Compares two versions of a book. Both are loaded afresh at each call.
class MARLET_EXPORT MarletBookDiffContext final : public DiffContext {
 public:
  const URL originalUrl;
  const URL updatedUrl;

  MarletBookDiffContext(URL originalUrl, URL updatedUrl);

  /// An update pack with paths relative to "Contents". Throws an `ErrorObject` of `DiffErrorDomain` with the
  /// code `CriticalDiffPackCreationError` for a book that doesn't load (with the cause), for books of
  /// different content identifiers, and for any but the next patch version, in this order; and what
  /// comparing the files throws. Books that others write meanwhile are read again, a bounded number of times, then that is
  /// a POSIX ESTALE.
  DiffPackSnapshot generateDiffPack() const override;

 private:
  DiffPackSnapshot diffPack(const MarletBookSnapshot& original, const MarletBookSnapshot& updated) const;
};

}  // namespace MarletFoundation
