#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// Throws for a URL without the extension "marletbook" an `ErrorObject` of `DiffErrorDomain` with the code
/// `CriticalMergeError`.
MARLET_EXPORT void requireBookDocument(const URL& url);

/// The update pack that leads from one book to its next patch release. The URLs are ".marletbook" documents;
/// for any other an `ErrorObject` of `DiffErrorDomain` with the code `CriticalMergeError` is thrown, and what
/// `MarletBookDiffContext::generateDiffPack` throws.
MARLET_EXPORT DiffPackSnapshot makeUpdateDiffPack(const URL& originalUrl, const URL& updatedUrl);

/// Applies an update pack to the ".marletbook" document at the URL, as a whole or not at all. Whether it is
/// an update and is meant for this version of this book is left to the host, and so is what it does there: see
/// `applyCheckedUpdate` for a pack that isn't known to be good. Throws as `makeUpdateDiffPack`
/// for another document, and what `MarletBookDiffMergeContext::mergeDiffPack` throws.
MARLET_EXPORT void applyUpdateDiffPack(const URL& documentUrl, const DiffPackSnapshot& diffPack);

}  // namespace MarletFoundation
