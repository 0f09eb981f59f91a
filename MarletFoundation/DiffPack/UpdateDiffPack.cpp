#include "MarletFoundation/DiffPack/UpdateDiffPack.h"

#include "MarletFoundation/DiffPack/MarletBookDiffContext.h"
#include "MarletFoundation/DiffPack/MarletBookDiffMergeContext.h"

namespace MarletFoundation {

void requireBookDocument(const URL& url) {
  if (url.pathExtension() == "marletbook") return;
  // A merge error also for a pack that isn't made: hosts know the failure by this code.
  throw diffError(DiffErrorCode::CriticalMergeError, "Unrecognized document format " + url.absoluteString());
}

DiffPackSnapshot makeUpdateDiffPack(const URL& originalUrl, const URL& updatedUrl) {
  requireBookDocument(originalUrl);
  requireBookDocument(updatedUrl);
  return MarletBookDiffContext(originalUrl, updatedUrl).generateDiffPack();
}

void applyUpdateDiffPack(const URL& documentUrl, const DiffPackSnapshot& diffPack) {
  requireBookDocument(documentUrl);
  MarletBookDiffMergeContext(documentUrl).mergeDiffPack(diffPack);
}

}  // namespace MarletFoundation
