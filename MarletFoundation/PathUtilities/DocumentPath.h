#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// The path by which a diff pack knows the file `filename` of the page at `pageURL`: relative to the content
/// directory, both paths standardised.
MARLET_EXPORT std::string documentRelativePath(const URL& pageURL, std::string_view filename,
                                               const URL& contentURL);

/// The standardised path of `url` without the leading components that it has in common with that of `other`.
std::string joinedWithoutCommonStart(const URL& url, const URL& other);

}  // namespace MarletFoundation
