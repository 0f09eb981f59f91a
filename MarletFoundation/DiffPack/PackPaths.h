#pragma once

#include <set>
#include <string>
#include <string_view>

#include "MarletFoundation/DiffPack/FileDiffDescriptors.h"

/// The places of a pack's files in its directory.
namespace MarletFoundation {

/// The one form in which a pack names a file: doubled slashes and one at the end are left out. A path that names
/// nothing below a directory, as "../x", stays as it is; the pack's writer refuses it.
MARLET_EXPORT std::string plainPath(std::string_view path);

/// Where the changes of a modified file lie: "P.delta".
std::string deltaPath(std::string_view path);

/// Throws an `ErrorObject` of `DiffErrorDomain` with the code `CriticalDiffPackValidationError` where the file of an
/// entry that is one of `chosen`, plain paths, and another's can't lie in one directory: they would be at the same
/// place, or one below the other, and one of them may be the pack's own manifest. Entries of one path aren't at odds:
/// the first counts.
void requireRoomInPack(const FileDiffDescriptors& entries, const std::set<std::string, std::less<>>& chosen);

}  // namespace MarletFoundation
