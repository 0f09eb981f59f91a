#pragma once

#include <optional>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// Whether a directory lies at the URL, links followed; false when that can't be told.
MARLET_EXPORT bool isDirectoryUrl(const URL& url);

/// The URL's own string, taken relative to `base`; the URL itself without one. An absolute URL keeps its
/// meaning. Nothing when no URL results.
MARLET_EXPORT std::optional<URL> relative(const URL& url, const std::optional<URL>& base);

}  // namespace MarletFoundation
