#pragma once

#include <optional>
#include <vector>

#include "MarletDiff/DiffOptions.h"
#include "MarletDiff/FileDiffDescriptor.h"
#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletDiff {

/// How the files beneath `updatedUrl` differ from those beneath `originalUrl`, both directories. Paths are
/// relative to the roots. The order is that of a walk by name, bytes compared, each directory in its place
/// among its neighbours; where a file took a directory's place or the reverse, what was removed comes first.
///
/// A file on both sides is modified when both texts are valid UTF-8 of characters that XML has, as a delta
/// file needs, and replaced otherwise; its hunks are `diffContent`'s. Added and replaced files carry no data:
/// they are to be found beneath `updatedUrl`. Modes, times and empty directories aren't compared. Below the
/// roots no symbolic link is followed: a link is a file of its own, equal to a link with the same
/// destination.
///
/// Throws a `MarletFoundation::ErrorObject` of the POSIX domain for what can't be read, for a file that is
/// neither regular nor a link (EINVAL) and for a path longer than the system takes (ENAMETOOLONG).
MARLET_EXPORT std::vector<FileDiffDescriptor> recursiveFileDiff(
    const MarletFoundation::URL& originalUrl, const MarletFoundation::URL& updatedUrl,
    std::optional<DiffOptions> options = std::nullopt);

}  // namespace MarletDiff
