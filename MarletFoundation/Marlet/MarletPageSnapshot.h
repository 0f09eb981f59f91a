#pragma once

#include "MarletFoundation/Marlet/PageType.h"

namespace MarletFoundation {

class MarletPage;

/// A page of a classic document as an immutable value. Its directories stay on disk.
class MARLET_EXPORT MarletPageSnapshot final : public MarletPageSnapshotType {
 public:
  /// The one page of a single-page document has no name.
  MarletPageSnapshot(std::optional<std::string> name, std::u16string text,
                     MarletResultInfoSnapshot resultInfo, std::optional<URL> sourcesDirectoryURL,
                     std::optional<URL> resourcesDirectoryURL, std::vector<MarletHint> hints);
  /// The page as it stands; nothing is checked.
  explicit MarletPageSnapshot(const MarletPage& page);

  /// What the directory of a page of that name is called: the name and ".wbmarletpage", or "wbmarletpage"
  /// without a name.
  static std::string filenameForName(const std::optional<std::string>& name);

  std::string filename() const override { return filenameForName(name_); }
  std::optional<std::string> pageDescription() const override { return std::nullopt; }
  std::optional<std::string> imageReference() const override { return std::nullopt; }
  const std::u16string& text() const override { return text_; }
  const MarletResultInfoSnapshot& resultInfo() const override { return resultInfo_; }
  std::optional<URL> sourcesDirectoryURL() const override { return sourcesDirectoryURL_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<URL> liveViewSourceFileURL() const override { return std::nullopt; }
  LiveViewMode liveViewMode() const override { return LiveViewMode::HiddenByDefault; }
  bool liveViewEdgeToEdge() const override { return false; }
  std::optional<std::string> posterReference() const override { return std::nullopt; }
  MarletLoggingMode marletLoggingMode() const override { return MarletLoggingMode::Normal; }
  const std::vector<MarletHint>& hints() const override { return hints_; }

  MarletPageSnapshot snapshot() const { return *this; }
  /// The page's directory: "Contents.swift", and "Sources" and "Resources" from where their URLs point, each left
  /// out where nothing lies there: of what does nothing is left out, and what can't be read of it ends the writing
  /// with its error. Result info and hints aren't stored. A text that isn't valid UTF-16 throws
  /// an `ErrorObject` of `MarletSerializationErrorDomain`.
  FileWrapper fileWrapper() const override;

  bool operator==(const MarletPageSnapshot& other) const;

 private:
  std::optional<std::string> optionalName() const override { return name_; }
  MarletPageSnapshot* newSnapshot() const override { return new MarletPageSnapshot(*this); }

  std::optional<std::string> name_;
  std::u16string text_;
  MarletResultInfoSnapshot resultInfo_;
  std::optional<URL> sourcesDirectoryURL_;
  std::optional<URL> resourcesDirectoryURL_;
  std::vector<MarletHint> hints_;
};

}  // namespace MarletFoundation
