#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"
#include "MarletFoundation/Marlet/PageDirectory.h"
#include "MarletFoundation/Marlet/PageHints.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

PropertyListValue MarletBookPageSnapshot::manifest() const {
  PropertyListDictionary manifest{
      {"Name", name_},
      {"LiveViewMode",
       liveViewMode_ == LiveViewMode::HiddenByDefault ? "HiddenByDefault" : "VisibleByDefault"},
      {"LiveViewEdgeToEdge", liveViewEdgeToEdge_}};
  if (pageDescription_) manifest["Description"] = *pageDescription_;
  if (imageReference_) manifest["ImageReference"] = *imageReference_;
  if (posterReference_) manifest["PosterReference"] = *posterReference_;
  if (marletLoggingMode_ == MarletLoggingMode::Off) manifest["MarletLoggingMode"] = "Off";
  if (!hints_.empty()) manifest["Hints"] = hintsForManifest(hints_);
  return manifest;
}

FileWrapper MarletBookPageSnapshot::fileWrapper() const {
  FileWrapper::Children children;
  const auto add = [&](const char* name, FileWrapper child) { children.emplace(name, std::move(child)); };
  add("Manifest.plist",
      FileWrapper::regularFile(PropertyListSerialization::write(manifest(), PropertyListFormat::binary)));
  auto source = utf8FromUTF16(text_);
  if (!source) fatalError("A page's text must be valid UTF-16 to be written!");
  add("Contents.swift", FileWrapper::regularFile(Data(*std::move(source))));
  addIfThere(children, "Sources", sourcesDirectoryURL_);
  addIfThere(children, "Resources", resourcesDirectoryURL_);
  addIfThere(children, "LiveView.swift", liveViewSourceFileURL_);
  static constexpr auto format = MarletResultInfoSnapshot::Format::ResultInfo;
  if (resultInfo_.needsSerialization(format))
    add("ResultInfo.plist", FileWrapper::regularFile(resultInfo_.data(format)));
  return FileWrapper::directory(std::move(children));
}

}  // namespace MarletFoundation
