#pragma once

#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"

namespace MarletFoundation {

/// A live page of a book that shows a prepared asset. Nothing that is assigned is checked. No locks: one
/// thread at a time.
class MARLET_EXPORT CutsceneBookPage final : public BookPageType, public CutscenePageType {
 public:
  CutsceneBookPage(std::string name, std::optional<std::string> pageDescription,
                   std::optional<std::string> imageReference, std::string filename,
                   std::string cutsceneAssetReference, std::optional<URL> resourcesDirectoryURL,
                   std::optional<std::string> posterReference)
      : name_(std::move(name)),
        pageDescription_(std::move(pageDescription)),
        imageReference_(std::move(imageReference)),
        filename_(std::move(filename)),
        cutsceneAssetReference_(std::move(cutsceneAssetReference)),
        resourcesDirectoryURL_(std::move(resourcesDirectoryURL)),
        posterReference_(std::move(posterReference)) {}
  explicit CutsceneBookPage(const CutsceneBookPageSnapshot& snapshot)
      : CutsceneBookPage(snapshot.name(), snapshot.pageDescription(), snapshot.imageReference(),
                         snapshot.filename(), snapshot.cutsceneAssetReference(),
                         snapshot.resourcesDirectoryURL(), snapshot.posterReference()) {}
  CutsceneBookPage(const CutsceneBookPage&) = delete;
  CutsceneBookPage& operator=(const CutsceneBookPage&) = delete;

  std::string name() const override { return name_; }
  std::optional<std::string> pageDescription() const override { return pageDescription_; }
  std::optional<std::string> imageReference() const override { return imageReference_; }
  std::string filename() const override { return filename_; }
  std::string cutsceneAssetReference() const override { return cutsceneAssetReference_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<std::string> posterReference() const override { return posterReference_; }

  void setName(std::string name) { name_ = std::move(name); }
  void setPageDescription(std::optional<std::string> text) { pageDescription_ = std::move(text); }
  void setImageReference(std::optional<std::string> path) { imageReference_ = std::move(path); }
  void setFilename(std::string filename) { filename_ = std::move(filename); }
  void setCutsceneAssetReference(std::string path) { cutsceneAssetReference_ = std::move(path); }
  void setResourcesDirectoryURL(std::optional<URL> url) { resourcesDirectoryURL_ = std::move(url); }
  void setPosterReference(std::optional<std::string> path) { posterReference_ = std::move(path); }

  CutsceneBookPageSnapshot snapshot() const { return CutsceneBookPageSnapshot(*this); }

 private:
  CutsceneBookPageSnapshot* newSnapshot() const override { return new CutsceneBookPageSnapshot(*this); }

  std::string name_;
  std::optional<std::string> pageDescription_;
  std::optional<std::string> imageReference_;
  std::string filename_;
  std::string cutsceneAssetReference_;
  std::optional<URL> resourcesDirectoryURL_;
  std::optional<std::string> posterReference_;
};

}  // namespace MarletFoundation
