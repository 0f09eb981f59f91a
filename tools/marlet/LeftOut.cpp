#include "LeftOut.h"

#include <algorithm>
#include <set>

#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;

namespace {

class Carried {
 public:
  Carried(const Document& document, const MarletSnapshot& marlet) : document_(document), marlet_(marlet) {
    add(marlet.marletIconURL);
    add(marlet.sharedSourcesDirectoryURL);
    add(marlet.sharedResourcesDirectoryURL);
    for (const auto& page : marlet.pages) {
      add(page.sourcesDirectoryURL());
      add(page.resourcesDirectoryURL());
      if (page.name()) pages_.insert("Pages/" + page.filename());
    }
    const auto manifest = document.wrapper.child(ManifestFilename);
    if (const auto data = manifest ? manifest->regularFileContents() : std::nullopt) manifest_ = data->view();
  }

  std::vector<std::string> others() && {
    for (const auto& [name, item] : childrenOf(document_.wrapper)) {
      if (name == "Pages" && item.isDirectory()) {
        lookAtPages(item);
      } else if (name != ManifestFilename && !isCarried(name) && !isSection(name, item)) {
        others_.push_back(name);
      }
    }
    return std::move(others_);
  }

 private:
  void lookAtPages(const FileWrapper& pages) {
    for (const auto& [name, page] : childrenOf(pages)) {
      const auto path = "Pages/" + name;
      if (!pages_.contains(path)) {
        others_.push_back(path);
        continue;
      }
      for (const auto& [filename, item] : childrenOf(page)) {
        const auto below = path + "/" + filename;
        if (!isCarried(below) && !isSource(filename, item)) others_.push_back(below);
      }
    }
  }

  static FileWrapper::Children childrenOf(const FileWrapper& directory) {
    return directory.fileWrappers().value_or(FileWrapper::Children());
  }

  void add(const std::optional<URL>& url) {
    if (url) carried_.insert(url->path());
  }

  bool isCarried(const std::string& path) const {
    return carried_.contains(document_.url.appendingPathComponent(path, false).path());
  }

  /// Of two spellings of its name a page has read one.
  bool isSource(const std::string& filename, const FileWrapper& item) const {
    if (filename != "Contents.swift" && filename != "contents.swift") return false;
    const auto text = textOf(item);
    return text && std::any_of(marlet_.pages.begin(), marlet_.pages.end(),
                               [&](const MarletPageSnapshot& page) { return page.text() == *text; });
  }

  /// Sections of an old document come together in its one page, or that has a source at the root.
  bool isSection(const std::string& filename, const FileWrapper& item) const {
    if (isSource(filename, item)) return true;
    const bool isListed = manifest_.find('"' + filename + '"') != std::string::npos ||
                          manifest_.find('\'' + filename + '\'') != std::string::npos;
    const auto text = isListed ? textOf(item) : std::nullopt;
    return text && !marlet_.pages.empty() && marlet_.pages.front().text().find(*text) != std::u16string::npos;
  }

  static std::optional<std::u16string> textOf(const FileWrapper& item) {
    const auto data = item.regularFileContents();
    return data ? utf16FromUTF8(data->view()) : std::nullopt;
  }

  const Document& document_;
  const MarletSnapshot& marlet_;
  std::set<std::string> carried_, pages_;
  std::string manifest_;
  std::vector<std::string> others_;
};

}  // namespace

std::vector<std::string> leftOut(const Document& document, const MarletSnapshot& marlet) {
  return Carried(document, marlet).others();
}
