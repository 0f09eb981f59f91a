#include "MarletFoundation/DiffPack/MarletBookDiffMergeContext.h"

#include "MarletFoundation/DiffPack/MergedBook.h"

namespace MarletFoundation {

MarletBookDiffMergeContext::MarletBookDiffMergeContext(URL contextUrl)
    : baseUrl(std::move(contextUrl)), contentsUrl(baseUrl.appendingPathComponent("Contents", true)) {}

void MarletBookDiffMergeContext::mergeDiffPack(const DiffPackSnapshot& pack) const {
  mergedDocument(pack).write(baseUrl);
}

void MarletBookDiffMergeContext::validateDiffPack(const DiffPackSnapshot&) const {
  std::optional<DiffPackSnapshot> userEditsPack;
  MarletBookSnapshot(FileWrapper(baseUrl), baseUrl, userEditsPack);
}

FileWrapper MarletBookDiffMergeContext::mergedDocument(const DiffPackSnapshot& pack) const {
  return mergedBook(baseUrl, pack).document;
}

}  // namespace MarletFoundation
