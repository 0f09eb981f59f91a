#pragma once

#include <optional>
#include <string>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/Marlet/MarletResultInfoSnapshot.h"
#include "MarletFoundation/Platform/FileWrapper.h"

namespace MarletFoundation {

struct BookPagePlaceholder;

/// What a table of contents needs to know of a page: enough to draw it with its pass mark, without its
/// source.
struct MARLET_EXPORT BookPagePlaceholderSnapshot {
  enum class SerializationErrorCase {
    InvalidManifest,
    NotADirectory,
    MissingManifest,
    ManifestNotADictionary,
    MissingName,
    DescriptionNotAString,
    ResultInfoNotAFile,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  std::string name;
  /// The page's directory name.
  std::string filename;
  std::optional<std::string> pageDescription;
  /// Only a ".marletpage" has one; it is empty when the page's file is missing or damaged.
  std::optional<MarletResultInfoSnapshot> resultInfoSnapshot;

  BookPagePlaceholderSnapshot(std::string name, std::string filename,
                              std::optional<std::string> pageDescription,
                              std::optional<MarletResultInfoSnapshot> resultInfoSnapshot);
  /// Loads the page's directory. With a pack, the result info is the learner's, read through it. Throws
  /// `SerializationError`, or what reading through the pack throws.
  BookPagePlaceholderSnapshot(const FileWrapper& fileWrapper, const URL& baseURL,
                              const std::optional<DiffPackSnapshot>& userEditsDiffPack);
  explicit BookPagePlaceholderSnapshot(const BookPagePlaceholder& page);
};

MARLET_EXPORT const ErrorTable& errorTable(BookPagePlaceholderSnapshot::SerializationErrorCase);

}  // namespace MarletFoundation
