#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/Marlet/PageType.h"

namespace MarletFoundation {

class MarletBookPage;

/// A whole code page of a book: a directory with the extension ".marletpage". Its directories and its live
/// view stay on disk.
class MARLET_EXPORT MarletBookPageSnapshot final : public BookPageSnapshotType,
                                                   public MarletPageSnapshotType {
 public:
  enum class SerializationErrorCase {
    InvalidManifest,
    InvalidLiveViewMode,
    InvalidMarletLoggingMode,
    NotADirectory,
    MissingManifest,
    ManifestNotADictionary,
    MissingName,
    DescriptionNotAString,
    MissingContentsFile,
    InvalidContentsFile,
    ResultInfoNotAFile,
    SourcesNotADirectory,
    ResourcesNotADirectory,
    LiveViewSourceFileNotAFile,
    ImageReferenceNotAString,
    ImageReferenceWithoutResources,
    MissingLiveViewMode,
    PosterReferenceNotAString,
    MarletLoggingModeNotAString,
    HintsNotAnArray,
    HintNotADictionary,
    HintContentMissing,
    HintContentNotAString,
    HintContentReferenceNotAString,
    HintContentReferenceWithoutResources,
    HintContentReferenceMissingFile,
    InvalidHintContentFile,
    HintSpoilerButtonTitleNotAString,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  MarletBookPageSnapshot(std::string name, std::optional<std::string> pageDescription,
                         std::optional<std::string> imageReference, std::string filename, std::u16string text,
                         MarletResultInfoSnapshot resultInfo, std::optional<URL> sourcesDirectoryURL,
                         std::optional<URL> resourcesDirectoryURL, std::optional<URL> liveViewSourceFileURL,
                         LiveViewMode liveViewMode, bool liveViewEdgeToEdge,
                         std::optional<std::string> posterReference, MarletLoggingMode marletLoggingMode,
                         std::vector<MarletHint> hints);
  /// Loads the page's directory, in one fixed order of checks. With a pack, the source and the record are the
  /// learner's, read through it, and those of the tree are not looked at. Throws `SerializationError`, or what
  /// reading through the pack throws.
  MarletBookPageSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                         const std::optional<DiffPackSnapshot>& userEditsDiffPack);
  /// The page as it stands; nothing is checked.
  explicit MarletBookPageSnapshot(const MarletBookPage& page);

  std::string name() const override { return name_; }
  std::optional<std::string> pageDescription() const override { return pageDescription_; }
  /// A path inside the page's resources, or a URL.
  std::optional<std::string> imageReference() const override { return imageReference_; }
  std::string filename() const override { return filename_; }
  const std::u16string& text() const override { return text_; }
  const MarletResultInfoSnapshot& resultInfo() const override { return resultInfo_; }
  std::optional<URL> sourcesDirectoryURL() const override { return sourcesDirectoryURL_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<URL> liveViewSourceFileURL() const override { return liveViewSourceFileURL_; }
  LiveViewMode liveViewMode() const override { return liveViewMode_; }
  bool liveViewEdgeToEdge() const override { return liveViewEdgeToEdge_; }
  std::optional<std::string> posterReference() const override { return posterReference_; }
  MarletLoggingMode marletLoggingMode() const override { return marletLoggingMode_; }
  const std::vector<MarletHint>& hints() const override { return hints_; }

  MarletBookPageSnapshot snapshot() const { return *this; }
  /// The page's whole directory, with a binary manifest. "Sources", "Resources" and "LiveView.swift" are taken
  /// from where their URLs point, each left out where nothing lies there: of what does nothing is left out, and
  /// what can't be read of it ends the writing with its error. Throws the property-list writer's
  /// error for strings that aren't valid; a source that isn't valid UTF-16 is a fatal error.
  FileWrapper fileWrapper() const override;
  std::unique_ptr<BookPageType> convertToMutablePage() const override;

  bool operator==(const MarletBookPageSnapshot& other) const;

 private:
  MarletBookPageSnapshot* newSnapshot() const override { return new MarletBookPageSnapshot(*this); }
  PropertyListValue manifest() const;

  std::string name_;
  std::optional<std::string> pageDescription_;
  std::optional<std::string> imageReference_;
  std::string filename_;
  std::u16string text_;
  MarletResultInfoSnapshot resultInfo_;
  std::optional<URL> sourcesDirectoryURL_;
  std::optional<URL> resourcesDirectoryURL_;
  std::optional<URL> liveViewSourceFileURL_;
  LiveViewMode liveViewMode_;
  bool liveViewEdgeToEdge_;
  std::optional<std::string> posterReference_;
  MarletLoggingMode marletLoggingMode_;
  std::vector<MarletHint> hints_;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletBookPageSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
