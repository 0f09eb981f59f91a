#include "PageWarnings.h"

#include "MarletFoundation/MarletFoundation.h"
#include "TreePath.h"

using namespace MarletFoundation;

namespace {

std::optional<std::string> posterReference(const BookPageSnapshotType& page) {
  if (const auto* marletPage = dynamic_cast<const MarletPageType*>(&page))
    return marletPage->posterReference();
  if (const auto* cutscene = dynamic_cast<const CutscenePageType*>(&page)) return cutscene->posterReference();
  return std::nullopt;
}

/// The reference of such a hint is not in the loaded page any more, so the manifest is looked at once again.
std::vector<Problem> warningsOfHints(const FileWrapper& book, const std::string& directory) {
  std::vector<Problem> warnings;
  const auto file = directory + "/Manifest.plist";
  const auto node = nodeAt(book, file);
  const auto data = node ? node->regularFileContents() : std::nullopt;
  if (!data) return warnings;
  const auto manifest = fromPropertyListData<PropertyListValue>(*data);
  const auto* hints = manifest.dictionary() ? manifest.dictionary()->find("Hints") : nullptr;
  if (!hints || !hints->array()) return warnings;
  for (const auto& hint : *hints->array()) {
    const auto* entries = hint.dictionary();
    if (entries && entries->contains("Content") && entries->contains("FileReference"))
      warnings.push_back(
          warning("page.hiddenFileReference",
                  "A hint has both \"Content\" and \"FileReference\"; the file is never shown.", file));
  }
  return warnings;
}

}  // namespace

std::vector<Problem> warningsOfReference(const FileWrapper& book, const std::string& directory,
                                         const std::string& kind, const std::string& key,
                                         const std::optional<std::string>& reference) {
  if (!reference) return {};
  const auto url = URL::parse(*reference);
  if (url && url->scheme()) return {};
  const auto file = nodeAt(book, directory + "/Resources/" + *reference);
  if (file && file->isRegularFile()) return {};
  return {warning(kind + ".missing" + key,
                  "\"" + key + "\" names no file in \"Resources\": \"" + *reference + "\"",
                  directory + "/Manifest.plist")};
}

std::vector<Problem> warningsOfPage(const FileWrapper& book, const std::string& directory,
                                    const BookPageSnapshotType& page) {
  auto warnings = warningsOfReference(book, directory, "page", "ImageReference", page.imageReference());
  const auto add = [&](std::vector<Problem> more) {
    warnings.insert(warnings.end(), more.begin(), more.end());
  };
  add(warningsOfReference(book, directory, "page", "PosterReference", posterReference(page)));
  if (dynamic_cast<const MarletPageType*>(&page)) add(warningsOfHints(book, directory));
  return warnings;
}
