#include <gtest/gtest.h>

#include <sstream>

#include "MarletFoundation/MarletFoundation.h"

namespace MarletFoundation::test {
namespace {

// Hosts keep domains, and codes, which are places in these rows.
constexpr auto stable = R"(
MarletFoundation.JSONError: DecodingTypeMismatch InvalidType UnexpectedOptional
MarletFoundation.SearchPath.PropertyListSerializationError: RootNotAnArray SearchPathNotAString
MarletFoundation.AssessmentInformation.SerializationError: rootNotADictionary missingStatus
MarletFoundation.AssessmentStatus.SerializationError: invalidStatus rootNotADictionary missingStatus
    messageNotAString hintsNotAnArray hintNotAString solutionNotAString
MarletFoundation.BookPageLoadingError: NoSuchChapter NoSuchPage UnknownPageType
MarletFoundation.BookPagePlaceholderSnapshot.SerializationError: InvalidManifest NotADirectory
    MissingManifest ManifestNotADictionary MissingName DescriptionNotAString ResultInfoNotAFile
MarletFoundation.CutsceneBookPageSnapshot.SerializationError: InvalidManifest InvalidCutsceneAssetReference
    MissingCutsceneAssetForLocalReference InvalidMarletLoggingMode NotADirectory MissingManifest
    ManifestNotADictionary MissingName DescriptionNotAString MissingCutsceneAssetReference
    CutsceneAssetReferencesWithoutResources ResultInfoNotAFile SourcesNotADirectory ResourcesNotADirectory
    ImageReferenceNotAString ImageReferenceWithoutResources OriginalContentsNotAFile
    PosterReferenceNotAString MarletLoggingModeNotAString
MarletFoundation.MarletBookPageSnapshot.SerializationError: InvalidManifest InvalidLiveViewMode
    InvalidMarletLoggingMode NotADirectory MissingManifest ManifestNotADictionary MissingName
    DescriptionNotAString MissingContentsFile InvalidContentsFile ResultInfoNotAFile SourcesNotADirectory
    ResourcesNotADirectory LiveViewSourceFileNotAFile ImageReferenceNotAString
    ImageReferenceWithoutResources MissingLiveViewMode PosterReferenceNotAString MarletLoggingModeNotAString
    HintsNotAnArray HintNotADictionary HintContentMissing HintContentNotAString
    HintContentReferenceNotAString HintContentReferenceWithoutResources HintContentReferenceMissingFile
    InvalidHintContentFile HintSpoilerButtonTitleNotAString
MarletFoundation.MarletBookSnapshot.SerializationError: invalidManifest invalidVersion versionTooNew
    invalidContentVersion invalidDeploymentTarget unsupportedDeploymentTarget missingChapter invalidChapter
    notADirectory missingContents contentsNotADirectory editsNotADirectory missingManifest
    manifestNotADictionary missingVersion missingName descriptionNotAString missingContentIdentifier
    contentIdentifierNotAString missingContentVersion contentVersionNotAString missingDeploymentTarget
    sourcesNotADirectory resourcesNotADirectory userResourcesNotADirectory imageReferenceNotAString
    imageReferenceWithNoResources imageReferenceIsAURL missingChaptersInManifest
    chaptersInManifestNotAnArray chapterFilenameNotAString missingChaptersDirectory chaptersNotADirectory
    keyValueStoreNotARegularFile
MarletFoundation.MarletChapterSnapshot.SerializationError: invalidManifest missingPage invalidPage
    notADirectory missingManifest manifestNotADictionary missingName descriptionNotAString
    sourcesNotADirectory resourcesNotADirectory imageReferenceNotAString imageReferenceWithNoResources
    imageReferenceIsAURL missingPagesInManifest pagesInManifestNotAnArray missingPagesDirectory
    pagesNotADirectory pageFilenameNotAString
MarletFoundation.MarletInlineResultData.SerializationError: unknownDisplayMode unknownTypeForVisibleState
    rootNotADictionary missingLineNumber missingDisplayModeForVisibleState missingTypeForVisibleState
    missingWidthForVisibleState missingHeightForVisibleState
MarletFoundation.MarletKeyValueStoreSnapshot.SerializationError: InvalidPlist WrapperNotADictionary
    MissingVersion InvalidVersion VersionTooNew MissingContents ContentsNotADictionary
MarletFoundation.MarletResultInfoSnapshot.SerializationError: invalidVersion versionTooNew
    assessmentInformationInvalid rootNotADictionary missingVersion
MarletFoundation.MarletSnapshot.SerializationError: unknownTargetIdentifier notADirectory
MarletFoundation.Issue.FixIt.PropertyListSerializationError: RootNotADictionary MissingRange
    RangeMissingFile RangeMissingLine RangeMissingColumn RangeMissingLength MissingReplacementText
MarletFoundation.Issue.PropertyListSerializationError: InvalidSeverity InvalidChildIssue InvalidFixIt
    RootNotADictionary MissingSeverity MissingMessage LocationMissingFile LocationMissingLine
    LocationMissingColumn LocationMissingLength
MarletFoundation.SourceEditorPosition.PropertyListSerializationError: RootNotADictionary MissingLine
    MissingColumn
MarletFoundation.SourceEditorRange.PropertyListSerializationError: StartInvalid EndInvalid
    RootNotADictionary MissingStart MissingEnd
MarletFoundation.UnarchiveError: InvalidURL UnzipFailed
MarletFoundation.ChecksumError: InvalidURL InputStreamFailure
)";

TEST(ErrorDomains, AndCodesNeverChange) {
  const ErrorTable* tables[] = {
      &errorTable(JSONErrorCase()),
      &errorTable(SearchPath::PropertyListSerializationErrorCase()),
      &errorTable(AssessmentInformation::SerializationErrorCase()),
      &errorTable(AssessmentStatus::SerializationErrorCase()),
      &errorTable(BookPageLoadingErrorCase()),
      &errorTable(BookPagePlaceholderSnapshot::SerializationErrorCase()),
      &errorTable(CutsceneBookPageSnapshot::SerializationErrorCase()),
      &errorTable(MarletBookPageSnapshot::SerializationErrorCase()),
      &errorTable(MarletBookSnapshot::SerializationErrorCase()),
      &errorTable(MarletChapterSnapshot::SerializationErrorCase()),
      &errorTable(MarletInlineResultData::SerializationErrorCase()),
      &errorTable(MarletKeyValueStoreSnapshot::SerializationErrorCase()),
      &errorTable(MarletResultInfoSnapshot::SerializationErrorCase()),
      &errorTable(MarletSnapshot::SerializationErrorCase()),
      &errorTable(Issue::FixIt::PropertyListSerializationErrorCase()),
      &errorTable(Issue::PropertyListSerializationErrorCase()),
      &errorTable(SourceEditorPosition::PropertyListSerializationErrorCase()),
      &errorTable(SourceEditorRange::PropertyListSerializationErrorCase()),
      &errorTable(UnarchiveErrorCase()),
      &errorTable(ChecksumErrorCase()),
  };
  std::vector<std::string> expected, words;
  std::istringstream rows(stable);
  for (std::string word; rows >> word;) expected.push_back(word);
  for (const auto* table : tables) {
    words.push_back(std::string(table->domain) + ":");
    for (const auto& row : table->rows) words.emplace_back(row.name);
  }
  EXPECT_EQ(words, expected);
}

}  // namespace
}  // namespace MarletFoundation::test
