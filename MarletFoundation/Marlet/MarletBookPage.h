#pragma once

#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"

namespace MarletFoundation {

/// A live code page of a book. Nothing that is assigned is checked, so a snapshot can describe a page that
/// doesn't open. No locks: one thread at a time.
class MARLET_EXPORT MarletBookPage final : public BookPageType, public MutableMarletPageType {
 public:
  /// `resultInfo` is the page's record from then on; the host may keep it, too. Null is a fatal error.
  MarletBookPage(std::string name, std::optional<std::string> pageDescription,
                 std::optional<std::string> imageReference, std::string filename, std::u16string text,
                 std::shared_ptr<MarletResultInfo> resultInfo, std::optional<URL> sourcesDirectoryURL,
                 std::optional<URL> resourcesDirectoryURL, std::optional<URL> liveViewSourceFileURL,
                 LiveViewMode liveViewMode, bool liveViewEdgeToEdge,
                 std::optional<std::string> posterReference, MarletLoggingMode marletLoggingMode,
                 std::vector<MarletHint> hints);
  explicit MarletBookPage(const MarletBookPageSnapshot& snapshot);

  std::string name() const override { return name_; }
  std::optional<std::string> pageDescription() const override { return pageDescription_; }
  std::optional<std::string> imageReference() const override { return imageReference_; }
  std::string filename() const override { return filename_; }
  std::u16string& text() const override { return *text_; }
  MarletResultInfo& resultInfo() const override { return *resultInfo_; }
  std::optional<URL> sourcesDirectoryURL() const override { return sourcesDirectoryURL_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<URL> liveViewSourceFileURL() const override { return liveViewSourceFileURL_; }
  LiveViewMode liveViewMode() const override { return liveViewMode_; }
  bool liveViewEdgeToEdge() const override { return liveViewEdgeToEdge_; }
  std::optional<std::string> posterReference() const override { return posterReference_; }
  MarletLoggingMode marletLoggingMode() const override { return marletLoggingMode_; }
  const std::vector<MarletHint>& hints() const override { return hints_; }

  void setName(std::string name) { name_ = std::move(name); }
  void setPageDescription(std::optional<std::string> text) { pageDescription_ = std::move(text); }
  void setImageReference(std::optional<std::string> path) { imageReference_ = std::move(path); }
  void setFilename(std::string filename) { filename_ = std::move(filename); }
  void setSourcesDirectoryURL(std::optional<URL> url) { sourcesDirectoryURL_ = std::move(url); }
  void setResourcesDirectoryURL(std::optional<URL> url) { resourcesDirectoryURL_ = std::move(url); }
  void setLiveViewSourceFileURL(std::optional<URL> url) { liveViewSourceFileURL_ = std::move(url); }
  void setLiveViewMode(LiveViewMode mode) { liveViewMode_ = mode; }
  void setLiveViewEdgeToEdge(bool isEdgeToEdge) { liveViewEdgeToEdge_ = isEdgeToEdge; }
  void setPosterReference(std::optional<std::string> path) { posterReference_ = std::move(path); }
  void setMarletLoggingMode(MarletLoggingMode mode) { marletLoggingMode_ = mode; }
  void setHints(std::vector<MarletHint> hints) { hints_ = std::move(hints); }

  MarletBookPageSnapshot snapshot() const { return MarletBookPageSnapshot(*this); }

 private:
  MarletBookPageSnapshot* newSnapshot() const override { return new MarletBookPageSnapshot(*this); }

  std::string name_;
  std::optional<std::string> pageDescription_;
  std::optional<std::string> imageReference_;
  std::string filename_;
  const std::unique_ptr<std::u16string> text_;
  const std::shared_ptr<MarletResultInfo> resultInfo_;
  std::optional<URL> sourcesDirectoryURL_;
  std::optional<URL> resourcesDirectoryURL_;
  std::optional<URL> liveViewSourceFileURL_;
  LiveViewMode liveViewMode_;
  bool liveViewEdgeToEdge_;
  std::optional<std::string> posterReference_;
  MarletLoggingMode marletLoggingMode_;
  std::vector<MarletHint> hints_;
};

}  // namespace MarletFoundation
