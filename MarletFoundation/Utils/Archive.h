#pragma once

#include <string>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// With `InvalidURL` goes the URL, printed, as the string.
enum class UnarchiveErrorCase { InvalidURL, UnzipFailed };
MARLET_EXPORT const ErrorTable& errorTable(UnarchiveErrorCase);
using UnarchiveError = CaseError<UnarchiveErrorCase>;

/// Expands zip archives.
class MARLET_EXPORT Archive {
 public:
  /// Extracts the archive into a directory, which is made when missing, and returns the path of its first
  /// item, usually its top folder. Reports into the current `Progress`, whose cancelling stops the extraction
  /// between two blocks of a file.
  ///
  /// Throws `InvalidURL` for a URL, the archive's or the directory's, without a path in the file system; the
  /// error object of `MLFUnzipCopier` when anything of the archive was not extracted; `UnzipFailed` for an
  /// empty archive.
  static std::string unarchiveFile(const URL& fromURL, const URL& intoURL);
};

}  // namespace MarletFoundation
