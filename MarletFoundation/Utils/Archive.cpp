#include "MarletFoundation/Utils/Archive.h"

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/Progress.h"
#include "MarletFoundation/Utils/MLFUnzipCopier.h"

namespace MarletFoundation {
namespace {

std::string validPath(const URL& url) {
  auto path = fileSystemPath(url);
  if (!path) throw UnarchiveError(UnarchiveErrorCase::InvalidURL, url.absoluteString());
  return *std::move(path);
}

}  // namespace

const ErrorTable& errorTable(UnarchiveErrorCase) {
  static constexpr ErrorRow rows[] = {{"InvalidURL"}, {"UnzipFailed"}};
  static constexpr ErrorTable table{"MarletFoundation.UnarchiveError", rows};
  return table;
}

std::string Archive::unarchiveFile(const URL& fromURL, const URL& intoURL) {
  const auto progress = Progress::make(100);
  const auto source = validPath(fromURL);
  const auto destination = validPath(intoURL);
  // Shared, since another thread may be cancelling while this one ends.
  const auto copier = std::make_shared<MLFUnzipCopier>();
  copier->progressCallback = [&](double fraction, double) {
    progress->setCompletedUnitCount(static_cast<std::int64_t>(fraction * 100));
  };
  progress->setCancellationHandler([copier] { copier->cancel(); });
  std::optional<ErrorObject> error;
  const bool isWhole = copier->unzip(source, destination, &error);
  progress->setCancellationHandler({});
  if (!isWhole) throw *error;
  if (copier->filenames.empty()) throw UnarchiveError(UnarchiveErrorCase::UnzipFailed);
  progress->setCompletedUnitCount(progress->totalUnitCount());
  return copier->filenames.front();
}

}  // namespace MarletFoundation
