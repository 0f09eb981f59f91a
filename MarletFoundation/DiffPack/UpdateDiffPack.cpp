#include "MarletFoundation/DiffPack/UpdateDiffPack.h"

#include "MarletFoundation/DiffPack/MarletBookDiffContext.h"
#include "MarletFoundation/DiffPack/MarletBookDiffMergeContext.h"

namespace MarletFoundation {
namespace {

void requireBook(const URL& url) {
  if (url.pathExtension() == "marletbook") return;
  // A merge error also for a pack that isn't made: hosts know the failure by this code.
  throw diffError(DiffErrorCode::CriticalMergeError, "Unrecognized document format " + url.absoluteString());
}

}  // namespace

DiffPackSnapshot makeUpdateDiffPack(const URL& originalUrl, const URL& updatedUrl) {
  requireBook(originalUrl);
  requireBook(updatedUrl);
  return MarletBookDiffContext(originalUrl, updatedUrl).generateDiffPack();
}

void applyUpdateDiffPack(const URL& documentUrl, const DiffPackSnapshot& diffPack) {
  requireBook(documentUrl);
  MarletBookDiffMergeContext(documentUrl).mergeDiffPack(diffPack);
}

}  // namespace MarletFoundation
