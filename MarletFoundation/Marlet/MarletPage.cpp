#include "MarletFoundation/Marlet/MarletPage.h"

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

MarletPage::MarletPage(std::optional<std::string> name, std::u16string text,
                       std::shared_ptr<MarletResultInfo> resultInfo, std::optional<URL> sourcesDirectoryURL,
                       std::optional<URL> resourcesDirectoryURL, std::vector<MarletHint> hints)
    : name_(std::move(name)),
      text_(std::make_unique<std::u16string>(std::move(text))),
      resultInfo_(std::move(resultInfo)),
      sourcesDirectoryURL_(std::move(sourcesDirectoryURL)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      hints_(std::move(hints)) {
  if (!resultInfo_) fatalError("A page must have a record of results!");
}

MarletPage::MarletPage(const MarletPageSnapshot& snapshot)
    : MarletPage(snapshot.name(), snapshot.text(), std::make_shared<MarletResultInfo>(snapshot.resultInfo()),
                 snapshot.sourcesDirectoryURL(), snapshot.resourcesDirectoryURL(), snapshot.hints()) {}

}  // namespace MarletFoundation
