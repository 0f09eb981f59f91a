#pragma once

#include "MarletFoundation/Marlet/MarletPageSnapshot.h"

namespace MarletFoundation {

/// A live page of a classic document. A subclass may answer any of its properties in its own way; a snapshot
/// then holds what it answers. No locks: one thread at a time.
class MARLET_EXPORT MarletPage : public MutableMarletPageType {
 public:
  /// `resultInfo` is the page's record from then on; the host may keep it, too. Null is a fatal error.
  MarletPage(std::optional<std::string> name, std::u16string text,
             std::shared_ptr<MarletResultInfo> resultInfo, std::optional<URL> sourcesDirectoryURL,
             std::optional<URL> resourcesDirectoryURL, std::vector<MarletHint> hints);
  explicit MarletPage(const MarletPageSnapshot& snapshot);

  std::string filename() const override { return MarletPageSnapshot::filenameForName(name()); }
  std::optional<std::string> pageDescription() const override { return std::nullopt; }
  std::optional<std::string> imageReference() const override { return std::nullopt; }
  std::u16string& text() const override { return *text_; }
  MarletResultInfo& resultInfo() const override { return *resultInfo_; }
  std::optional<URL> sourcesDirectoryURL() const override { return sourcesDirectoryURL_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<URL> liveViewSourceFileURL() const override { return std::nullopt; }
  LiveViewMode liveViewMode() const override { return LiveViewMode::HiddenByDefault; }
  bool liveViewEdgeToEdge() const override { return false; }
  std::optional<std::string> posterReference() const override { return std::nullopt; }
  MarletLoggingMode marletLoggingMode() const override { return MarletLoggingMode::Normal; }
  const std::vector<MarletHint>& hints() const override { return hints_; }

  void setName(std::optional<std::string> name) { name_ = std::move(name); }
  void setSourcesDirectoryURL(std::optional<URL> url) { sourcesDirectoryURL_ = std::move(url); }
  void setResourcesDirectoryURL(std::optional<URL> url) { resourcesDirectoryURL_ = std::move(url); }
  void setHints(std::vector<MarletHint> hints) { hints_ = std::move(hints); }

  MarletPageSnapshot snapshot() const { return MarletPageSnapshot(*this); }

 protected:
  /// What `name` answers.
  std::optional<std::string> optionalName() const override { return name_; }
  MarletPageSnapshot* newSnapshot() const override { return new MarletPageSnapshot(*this); }

 private:
  std::optional<std::string> name_;
  const std::unique_ptr<std::u16string> text_;
  const std::shared_ptr<MarletResultInfo> resultInfo_;
  std::optional<URL> sourcesDirectoryURL_;
  std::optional<URL> resourcesDirectoryURL_;
  std::vector<MarletHint> hints_;
};

}  // namespace MarletFoundation
