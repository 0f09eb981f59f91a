#include "MarletFoundation/Marlet/MarletBookPage.h"

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

MarletBookPage::MarletBookPage(std::string name, std::optional<std::string> pageDescription,
                               std::optional<std::string> imageReference, std::string filename,
                               std::u16string text, std::shared_ptr<MarletResultInfo> resultInfo,
                               std::optional<URL> sourcesDirectoryURL,
                               std::optional<URL> resourcesDirectoryURL,
                               std::optional<URL> liveViewSourceFileURL, LiveViewMode liveViewMode,
                               bool liveViewEdgeToEdge, std::optional<std::string> posterReference,
                               MarletLoggingMode marletLoggingMode, std::vector<MarletHint> hints)
    : name_(std::move(name)),
      pageDescription_(std::move(pageDescription)),
      imageReference_(std::move(imageReference)),
      filename_(std::move(filename)),
      text_(std::make_unique<std::u16string>(std::move(text))),
      resultInfo_(std::move(resultInfo)),
      sourcesDirectoryURL_(std::move(sourcesDirectoryURL)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      liveViewSourceFileURL_(std::move(liveViewSourceFileURL)),
      liveViewMode_(liveViewMode),
      liveViewEdgeToEdge_(liveViewEdgeToEdge),
      posterReference_(std::move(posterReference)),
      marletLoggingMode_(marletLoggingMode),
      hints_(std::move(hints)) {
  if (!resultInfo_) fatalError("A page must have a record of results!");
}

MarletBookPage::MarletBookPage(const MarletBookPageSnapshot& snapshot)
    : MarletBookPage(snapshot.name(), snapshot.pageDescription(), snapshot.imageReference(),
                     snapshot.filename(), snapshot.text(),
                     std::make_shared<MarletResultInfo>(snapshot.resultInfo()),
                     snapshot.sourcesDirectoryURL(), snapshot.resourcesDirectoryURL(),
                     snapshot.liveViewSourceFileURL(), snapshot.liveViewMode(), snapshot.liveViewEdgeToEdge(),
                     snapshot.posterReference(), snapshot.marletLoggingMode(), snapshot.hints()) {}

}  // namespace MarletFoundation
