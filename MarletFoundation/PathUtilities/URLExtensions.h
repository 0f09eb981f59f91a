#pragma once

#include <optional>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// Whether a directory lies at the URL, links followed; false when that can't be told.
MARLET_EXPORT bool isDirectoryUrl(const URL& url);

/// The file URL of the same path that is marked as a directory's, without a base and with the grant that the URL
/// carries. URLs of one directory that were made in different ways are equal by it. Any other URL stays as it is.
MARLET_EXPORT URL directoryURL(const URL& url);

/// The URL's own string, taken relative to `base`; the URL itself without one. An absolute URL keeps its
/// meaning. Nothing when no URL results.
MARLET_EXPORT std::optional<URL> relative(const URL& url, const std::optional<URL>& base);

}  // namespace MarletFoundation
