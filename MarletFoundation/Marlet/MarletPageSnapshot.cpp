#include "MarletFoundation/Marlet/MarletPageSnapshot.h"

#include <tuple>

#include "MarletFoundation/Data/MarletSerializationError.h"
#include "MarletFoundation/Marlet/MarletPage.h"
#include "MarletFoundation/Marlet/PageDirectory.h"
#include "MarletFoundation/PathUtilities/DocumentNames.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

MarletPageSnapshot::MarletPageSnapshot(std::optional<std::string> name, std::u16string text,
                                       MarletResultInfoSnapshot resultInfo,
                                       std::optional<URL> sourcesDirectoryURL,
                                       std::optional<URL> resourcesDirectoryURL,
                                       std::vector<MarletHint> hints)
    : name_(std::move(name)),
      text_(std::move(text)),
      resultInfo_(std::move(resultInfo)),
      sourcesDirectoryURL_(std::move(sourcesDirectoryURL)),
      resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
      hints_(std::move(hints)) {}

MarletPageSnapshot::MarletPageSnapshot(const MarletPage& page)
    : MarletPageSnapshot(page.name(), page.text(), page.resultInfo().snapshot(), page.sourcesDirectoryURL(),
                         page.resourcesDirectoryURL(), page.hints()) {}

std::string MarletPageSnapshot::filenameForName(const std::optional<std::string>& name) {
  return name ? *name + ".wbmarletpage" : "wbmarletpage";
}

FileWrapper MarletPageSnapshot::fileWrapper() const {
  auto source = utf8FromUTF16(text_);
  if (!source)
    throw StubMarletSerializationError("Unable to write marlet page: its text is not valid UTF-16.");
  FileWrapper::Children children;
  children.emplace("Contents.swift", FileWrapper::regularFile(Data(*std::move(source))));
  addIfThere(children, SourcesDirectoryName, sourcesDirectoryURL_);
  addIfThere(children, ResourcesDirectoryName, resourcesDirectoryURL_);
  return FileWrapper::directory(std::move(children));
}

bool MarletPageSnapshot::operator==(const MarletPageSnapshot& other) const {
  const auto fields = [](const MarletPageSnapshot& page) {
    return std::tie(page.name_, page.text_, page.resultInfo_, page.sourcesDirectoryURL_,
                    page.resourcesDirectoryURL_, page.hints_);
  };
  return fields(*this) == fields(other);
}

}  // namespace MarletFoundation
