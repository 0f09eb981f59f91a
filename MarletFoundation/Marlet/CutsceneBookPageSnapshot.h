#pragma once

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Marlet/PageType.h"

namespace MarletFoundation {

class CutsceneBookPage;

/// A page of a book that shows a prepared asset: a directory with the extension ".cutscenepage". It has no
/// source and no record, and a learner's pack has nothing for it. Its resources stay on disk.
class MARLET_EXPORT CutsceneBookPageSnapshot final : public BookPageSnapshotType,
                                                     public CutscenePageSnapshotType {
 public:
  /// The names in the page's directory and manifest.
  struct FileWrapperKeys {
    FileWrapperKeys() = delete;
    static constexpr std::string_view Manifest = "Manifest.plist";
    static constexpr std::string_view Name = "Name";
    static constexpr std::string_view Description = "Description";
    static constexpr std::string_view Resources = "Resources";
    static constexpr std::string_view CutsceneReference = "CutsceneReference";
    static constexpr std::string_view ImageReference = "ImageReference";
    static constexpr std::string_view PosterReference = "PosterReference";
  };

  /// `InvalidMarletLoggingMode`, `ResultInfoNotAFile`, `SourcesNotADirectory`,
  /// `ImageReferenceWithoutResources`, `OriginalContentsNotAFile` and `MarletLoggingModeNotAString` are never
  /// raised.
  enum class SerializationErrorCase {
    InvalidManifest,
    InvalidCutsceneAssetReference,
    MissingCutsceneAssetForLocalReference,
    InvalidMarletLoggingMode,
    NotADirectory,
    MissingManifest,
    ManifestNotADictionary,
    MissingName,
    DescriptionNotAString,
    MissingCutsceneAssetReference,
    CutsceneAssetReferencesWithoutResources,
    ResultInfoNotAFile,
    SourcesNotADirectory,
    ResourcesNotADirectory,
    ImageReferenceNotAString,
    ImageReferenceWithoutResources,
    OriginalContentsNotAFile,
    PosterReferenceNotAString,
    MarletLoggingModeNotAString,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  CutsceneBookPageSnapshot(std::string name, std::string filename, std::string cutsceneAssetReference,
                           std::optional<std::string> pageDescription,
                           std::optional<std::string> imageReference,
                           std::optional<URL> resourcesDirectoryURL,
                           std::optional<std::string> posterReference);
  /// Loads the page's directory, in one fixed order of checks. That the asset can be reached is asked of the
  /// disk, below `baseURL`. Throws `SerializationError`.
  CutsceneBookPageSnapshot(const FileWrapper& fileWrapper, const URL& baseURL);
  /// The page as it stands; nothing is checked.
  explicit CutsceneBookPageSnapshot(const CutsceneBookPage& page);

  std::string name() const override { return name_; }
  std::string filename() const override { return filename_; }
  std::string cutsceneAssetReference() const override { return cutsceneAssetReference_; }
  std::optional<std::string> pageDescription() const override { return pageDescription_; }
  std::optional<std::string> imageReference() const override { return imageReference_; }
  std::optional<URL> resourcesDirectoryURL() const override { return resourcesDirectoryURL_; }
  std::optional<std::string> posterReference() const override { return posterReference_; }

  CutsceneBookPageSnapshot snapshot() const { return *this; }
  /// The page's whole directory, with a binary manifest. Throws the property-list writer's error, and the
  /// file error when "Resources" can't be opened.
  FileWrapper fileWrapper() const override;
  std::unique_ptr<BookPageType> convertToMutablePage() const override;

  bool operator==(const CutsceneBookPageSnapshot& other) const;

 private:
  CutsceneBookPageSnapshot* newSnapshot() const override { return new CutsceneBookPageSnapshot(*this); }

  std::string name_;
  std::string filename_;
  std::string cutsceneAssetReference_;
  std::optional<std::string> pageDescription_;
  std::optional<std::string> imageReference_;
  std::optional<URL> resourcesDirectoryURL_;
  std::optional<std::string> posterReference_;
};

MARLET_EXPORT const ErrorTable& errorTable(CutsceneBookPageSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
