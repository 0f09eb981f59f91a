#include "MarletFoundation/DiffPack/MarletBookDiffContext.h"

#include <limits>
#include <optional>

#include "MarletDiff/RecursiveFileDiff.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/OneState.h"

namespace MarletFoundation {
namespace {

ErrorObject failure(std::string message, ErrorPointer cause = nullptr) {
  return diffError(DiffErrorCode::CriticalDiffPackCreationError, std::move(message), std::move(cause));
}

ErrorObject unableToLoad(const URL& url, const Error& error) {
  return failure("Unable to load document " + url.absoluteString() + ", error: " + error.description(),
                 error.copy());
}

FileWrapper open(const URL& url) {
  try {
    return FileWrapper(url);
  } catch (const Error& error) {
    throw unableToLoad(url, error);
  }
}

MarletBookSnapshot load(const FileWrapper& document, const URL& url) {
  try {
    return {document, url};
  } catch (const Error& error) {
    throw unableToLoad(url, error);
  }
}

/// The books that are compared. Loading looks at each page's manifest, so that a page which is exchanged meanwhile is
/// noticed.
struct TwoBooks {
  FileWrapper original;
  std::optional<FileWrapper> updated;  // once the original was loaded

  bool isUnchanged() const { return original.isUnchanged() && (!updated || updated->isUnchanged()); }
};

bool isNextPatch(const Version& original, const Version& updated) {
  const auto patch = original.patchVersion().value_or(0);
  return original.majorVersion() == updated.majorVersion() &&
         original.minorVersion() == updated.minorVersion() &&
         patch != std::numeric_limits<std::int64_t>::max() && updated.patchVersion().value_or(0) == patch + 1;
}

}  // namespace

MarletBookDiffContext::MarletBookDiffContext(URL original, URL updated)
    : originalUrl(std::move(original)), updatedUrl(std::move(updated)) {}

DiffPackSnapshot MarletBookDiffContext::generateDiffPack() const {
  return readOneState(
      updatedUrl.path(),
      [&] {
        return TwoBooks{open(originalUrl), std::nullopt};
      },
      [&](TwoBooks& books) {
        const auto original = load(books.original, originalUrl);
        books.updated = open(updatedUrl);
        return diffPack(original, load(*books.updated, updatedUrl));
      });
}

DiffPackSnapshot MarletBookDiffContext::diffPack(const MarletBookSnapshot& original,
                                                 const MarletBookSnapshot& updated) const {
  if (original.contentIdentifier != updated.contentIdentifier) {
    throw failure("Mismatched Marlet Book content identifier: " + original.contentIdentifier + " -> " +
                  updated.contentIdentifier);
  }
  auto baseVersion = original.contentVersion.versionString();
  auto updateVersion = updated.contentVersion.versionString();
  if (!isNextPatch(original.contentVersion, updated.contentVersion)) {
    throw failure("Invalid Marlet Book content version: " + baseVersion + " -> " + updateVersion +
                  ". The update must have the same major and minor version, with the next sequential patch "
                  "version, e.g. 1.0.0 -> 1.0.1");
  }
  const auto originalContents = originalUrl.appendingPathComponent("Contents", true);
  auto updatedContents = updatedUrl.appendingPathComponent("Contents", true);
  auto updates =
      MarletDiff::recursiveFileDiff(originalContents, updatedContents, MarletDiff::DiffOptions::SmallerHunks);
  return {DiffPackType::UpdatePack,  DiffPackDocumentType::MarletBook, std::move(updatedContents),
          updated.contentIdentifier, std::move(baseVersion),           std::move(updateVersion),
          std::move(updates)};
}

}  // namespace MarletFoundation
