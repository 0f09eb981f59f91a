#include "MarletFoundation/Marlet/MarletPage.h"

namespace MarletFoundation {

MarletPage::MarletPage(std::optional<std::string> name, std::u16string text,
                       const MarletResultInfoSnapshot& resultInfo, std::optional<URL> sourcesDirectoryURL,
                       std::optional<URL> resourcesDirectoryURL, std::vector<MarletHint> hints)
    : name_(std::move(name)),
      text_(std::make_unique<std::u16string>(std::move(text))),
      resultInfo_(std::make_unique<MarletResultInfo>(resultInfo)),
      sourcesDirectoryURL_(std::move(sourcesDirectoryURL)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      hints_(std::move(hints)) {}

MarletPage::MarletPage(const MarletPageSnapshot& snapshot)
    : MarletPage(snapshot.name(), snapshot.text(), snapshot.resultInfo(), snapshot.sourcesDirectoryURL(),
                 snapshot.resourcesDirectoryURL(), snapshot.hints()) {}

}  // namespace MarletFoundation
