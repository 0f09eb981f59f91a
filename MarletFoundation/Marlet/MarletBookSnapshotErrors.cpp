#include "MarletFoundation/Marlet/MarletBookSnapshot.h"

namespace MarletFoundation {

const ErrorTable& errorTable(MarletBookSnapshot::SerializationErrorCase) {
  static constexpr ErrorRow rows[] = {
      {"invalidManifest", R"(Manifest.plist was not able to open: {error}, {suggestion})"},
      {"invalidVersion",
       R"(The version specified in the "Version" key of the manifest ("{}") is not valid.)"},
      {"versionTooNew", R"(This marlet book version ("{}") is newer than supported.)", "Unable to Open"},
      {"invalidContentVersion",
       R"(The value of the "ContentVersion" key in the manifest ("{}") is not a valid version identifier.)"},
      {"invalidDeploymentTarget", R"(The "DeploymentTarget" key in the manifest ("{}") is invalid.)"},
      {"unsupportedDeploymentTarget",
       R"(The value of the  "DeploymentTarget" key in the manifest ("{}") is not a supported target.)"},
      {"missingChapter", R"(Expected to find subdirectory in "Chapters" with the name "{}" but found none.)"},
      {"invalidChapter", R"({filename}: {suggestion|Unable to open chapter.})", "{error}"},
      {"notADirectory", R"(The marlet book is not a directory with files inside.)"},
      {"missingContents", R"(The marlet book is missing a "Contents" directory.)"},
      {"contentsNotADirectory",
       R"(The file reference specified by the "Contents" key in the manifest is not a directory.)"},
      {"editsNotADirectory",
       R"(There is a file named "Edits" in the marlet book, but it is expected to be a directory.)"},
      {"missingManifest", R"(Missing the "Manifest.plist" file.)"},
      {"manifestNotADictionary", R"(Manifest.plist does not contain a dictionary as the root value.)"},
      {"missingVersion", R"(Missing "Version" key in the manifest.)"},
      {"missingName", R"(Missing "Name" key in the manifest.)"},
      {"descriptionNotAString", R"(The "Description" key in the manifest is not a string.)"},
      {"missingContentIdentifier", R"(Missing the "ContentIdentifier" key in the manifest.)"},
      {"contentIdentifierNotAString",
       R"(The value of the "ContentIdentifier" key in the manifest is not a string.)"},
      {"missingContentVersion", R"(Missing the "ContentVersion" key in the manifest.)"},
      {"contentVersionNotAString",
       R"(The value of the "ContentVersion" key in the manifest is not a string.)"},
      {"missingDeploymentTarget", R"(Missing the "DeploymentTarget" key in the manifest.)"},
      {"sourcesNotADirectory", R"(Found file named "Sources" in the marlet book but expected a directory.)"},
      {"resourcesNotADirectory",
       R"(Found file named "Resources" in the marlet book but expected a directory.)"},
      {"userResourcesNotADirectory",
       R"(Found file named "UserResources" in the marlet book but expected a directory.)"},
      {"imageReferenceNotAString", R"(The "ImageReference" key in the manifest is not a string.)"},
      {"imageReferenceWithNoResources",
       R"(There is an "ImageReference" key in the manifest but no "Resources" directory.)"},
      {"imageReferenceIsAURL",
       R"(The "ImageReference" key in the manifest is a is not a local, relative path.)"},
      {"missingChaptersInManifest", R"(The manifest does not specify any chapters.)"},
      {"chaptersInManifestNotAnArray", R"(The "Chapters" key in the manifest is not an array of strings.)"},
      {"chapterFilenameNotAString",
       R"(One of the values in the "Chapters" key of the manifest is not a string.)"},
      {"missingChaptersDirectory", R"(Missing the "Chapters" directory.)"},
      {"chaptersNotADirectory",
       R"(Found file named "Chapters" in the marlet book but expected a directory.)"},
      {"keyValueStoreNotARegularFile", R"(KeyValueStore.plist is not a valid file.)"},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletBookSnapshot.SerializationError", rows,
                                    "Invalid Marlet Book"};
  return table;
}

}  // namespace MarletFoundation
