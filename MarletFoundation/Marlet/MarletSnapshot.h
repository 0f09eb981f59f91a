#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Environment/Target.h"
#include "MarletFoundation/Marlet/MarletKeyValueStore.h"
#include "MarletFoundation/Marlet/MarletPageSnapshot.h"

namespace MarletFoundation {

struct Marlet;

/// A whole classic document as an immutable value: what opening a ".marlet" directory yields. It is read in any
/// version of the format and written in the current form; so its old files are not among those written. Texts
/// are in memory, directories stay on disk.
struct MARLET_EXPORT MarletSnapshot {
  enum class SerializationErrorCase {
    unknownTargetIdentifier,
    notADirectory,
  };
  using SerializationError = UserVisibleCaseError<SerializationErrorCase>;

  std::string name;
  /// Tells apart documents of one name; made from where the document lies.
  std::string uniquifier;
  TargetPointer target;
  bool requiresFullEnvironment;
  /// Resources and sources of all pages; a single page's own belong to the page.
  std::optional<URL> sharedResourcesDirectoryURL;
  std::optional<URL> sharedSourcesDirectoryURL;
  std::optional<URL> marletIconURL;
  /// In reading order.
  std::vector<MarletPageSnapshot> pages;
  /// Not stored: empty in a document that was read.
  MarletKeyValueStoreSnapshot keyValueStore;

  MarletSnapshot(std::string name, std::string uniquifier, TargetPointer target, bool requiresFullEnvironment,
                 std::optional<URL> sharedResourcesDirectoryURL, std::optional<URL> sharedSourcesDirectoryURL,
                 std::optional<URL> marletIconURL, std::vector<MarletPageSnapshot> pages,
                 MarletKeyValueStoreSnapshot keyValueStore);
  /// Loads the document whose tree `fileWrapper` holds and whose place is `baseURL`. Throws
  /// `SerializationError`, or what `MarletParser` throws.
  MarletSnapshot(const FileWrapper& fileWrapper, const URL& baseURL);
  /// The document as it stands; nothing is checked.
  explicit MarletSnapshot(const Marlet& marlet);

  /// Whether the document is written in the single-page form, version 5.0: one page without a name and nothing
  /// shared. Any other is written with a directory for each page, version 6.0.
  bool isSinglePage() const;

  /// The document's directory. The icon and the directories are left out where nothing lies at their URLs:
  /// of what does nothing is left out, and what can't be read of it ends the writing with its error. In the form with a directory for each page, a page without a name is a fatal error. Throws an
  /// `ErrorObject` of `MarletSerializationErrorDomain` for names that XML can't carry and for texts that aren't
  /// valid UTF-16.
  /// The argument is there for likeness with books and changes nothing.
  FileWrapper fileWrapper(const MarletSnapshot* originalContentSnapshot = nullptr) const;

  bool operator==(const MarletSnapshot& other) const;

 private:
  Data manifest() const;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
