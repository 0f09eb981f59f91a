#include "MarletFoundation/DiffPack/MergedPages.h"

#include <cerrno>
#include <set>

#include "MarletFoundation/DiffPack/PackPaths.h"
#include "MarletFoundation/Marlet/BookPageLoading.h"
#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"
#include "MarletFoundation/Platform/RelativePath.h"

namespace MarletFoundation {
namespace {

using Cutscene = CutsceneBookPageSnapshot;

/// Opens single pages of a tree that stands for the document at a URL.
class PageOpener {
 public:
  PageOpener(const FileWrapper& tree, const URL& documentURL) : tree_(tree), documentURL_(documentURL) {}

  /// The error of a page that doesn't open, or null.
  ErrorPointer error(const std::string& path) const {
    try {
      open(path);
    } catch (const Error& error) {
      return error.copy();
    }
    return nullptr;
  }

 private:
  void open(const std::string& path) const {
    const auto url = documentURL_.appendingPathComponent(path, true);
    const auto page = descendant(tree_, path);
    if (!page) throw ErrorObject::posix(ENOENT, url.path());
    const auto kind = url.pathExtension();
    if (kind == "cutscenepage") return openCutscene(*page, url);
    if (kind != "marletpage") throw BookPageLoadingError(BookPageLoadingErrorCase::UnknownPageType, kind);
    MarletBookPageSnapshot(*page, url, std::nullopt);
  }

  /// The load asks the disk for the asset, which says nothing of this tree.
  void openCutscene(const FileWrapper& page, const URL& url) const {
    using E = Cutscene::SerializationError;
    using Case = Cutscene::SerializationErrorCase;
    std::string reference;
    try {
      reference = Cutscene(page, url).cutsceneAssetReference();
    } catch (const E& error) {
      if (error.kind != Case::MissingCutsceneAssetForLocalReference) throw;
      const auto manifest =
          loadManifest<E>(page, Case::MissingManifest, Case::InvalidManifest, Case::ManifestNotADictionary);
      reference = requiredString<E>(manifest, Cutscene::FileWrapperKeys::CutsceneReference,
                                    Case::MissingCutsceneAssetReference);
      if (!isInTree(reference, url)) throw;
    }
    require<E>(isInTree(reference, url), Case::MissingCutsceneAssetForLocalReference);
  }

  /// Whether an asset of a page is there; the disk has the word about what lies outside of the document.
  bool isInTree(const std::string& reference, const URL& pageURL) const {
    const auto resources = pageURL.appendingPathComponent(Cutscene::FileWrapperKeys::Resources, true);
    const auto asset = URL::parse(reference, &resources);
    const auto document = documentURL_.standardized().path() + "/";
    const auto path = asset ? asset->standardized().path() : std::string();
    if (!path.starts_with(document)) return asset && FileManager::fileExists(*asset);
    return descendant(tree_, std::string_view(path).substr(document.size())).has_value();
  }

  const FileWrapper& tree_;
  const URL& documentURL_;
};

/// The paths of a book's pages, each once.
std::set<std::string> pagePaths(const MarletBookSnapshot& book) {
  std::set<std::string> paths;
  for (const auto& chapter : book.chapters) {
    for (const auto& page : chapter.pages)
      paths.insert("Contents/Chapters/" + chapter.filename + "/Pages/" + page.filename);
  }
  return paths;
}

/// Answers which directories of a document an update changes something in.
class TouchedPlaces {
 public:
  explicit TouchedPlaces(const DiffPackSnapshot& update) {
    for (const auto& entry : update.updates) {
      // Removed files go by the document's root.
      const bool isRemoved = std::holds_alternative<MarletDiff::FileDiffDescriptor::Removed>(entry.change);
      paths_.insert((isRemoved ? "" : "Contents/") + plainPath(entry.filePath()));
    }
  }

  bool touch(const std::string& directory) const {
    const auto below = paths_.lower_bound(directory + "/");
    if (paths_.contains(directory) || (below != paths_.end() && below->starts_with(directory + "/")))
      return true;
    for (auto slash = directory.find('/'); slash != directory.npos; slash = directory.find('/', slash + 1)) {
      if (paths_.contains(directory.substr(0, slash))) return true;
    }
    // An update that adds the whole of "Contents" does so by the empty path.
    return paths_.contains("Contents/");
  }

 private:
  std::set<std::string> paths_;
};

}  // namespace

std::vector<std::pair<std::string, ErrorPointer>> pagesThatWouldNotOpen(const MergedBook& book,
                                                                        const DiffPackSnapshot& update,
                                                                        const MarletBookSnapshot& after,
                                                                        const FileWrapper& tree,
                                                                        const URL& bookURL) {
  const auto known = pagePaths(book.before);
  const TouchedPlaces touched(update);
  const PageOpener opener(tree, bookURL);
  std::vector<std::pair<std::string, ErrorPointer>> failed;
  for (const auto& path : pagePaths(after)) {
    // A cutscene's asset may lie anywhere.
    if (known.contains(path) && !path.ends_with(".cutscenepage") && !touched.touch(path)) continue;
    if (auto error = opener.error(path)) failed.emplace_back(path, std::move(error));
  }
  if (failed.empty()) return failed;
  const FileWrapper old(bookURL);
  const PageOpener oldOpener(old, bookURL);
  std::erase_if(failed,
                [&](const auto& page) { return known.contains(page.first) && oldOpener.error(page.first); });
  return failed;
}

}  // namespace MarletFoundation
