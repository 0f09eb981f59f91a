#pragma once

#include <string>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// For hosts that report checksum failures of their own; `Checksum` throws the file's error objects. With
/// `InvalidURL` goes the URL, printed, as the string, and with `InputStreamFailure` an error.
enum class ChecksumErrorCase { InvalidURL, InputStreamFailure };
MARLET_EXPORT const ErrorTable& errorTable(ChecksumErrorCase);
using ChecksumError = CaseError<ChecksumErrorCase>;

/// Digests of files, to tell contents apart and not for security.
class MARLET_EXPORT Checksum {
 public:
  /// The MD5 of a file's contents as 32 lower-case hexadecimal digits. The file is mapped
  /// (`FileManager::mapFile`); throws an `ErrorObject` of the POSIX domain when it can't be.
  static std::string MD5ChecksumForFile(const URL& url);
};

}  // namespace MarletFoundation
