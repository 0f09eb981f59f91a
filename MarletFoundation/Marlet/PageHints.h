#pragma once

#include <vector>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Marlet/MarletHint.h"
#include "MarletFoundation/Platform/FileWrapper.h"

namespace MarletFoundation {

/// The hints of a page's manifest, in order, with the files that they refer to read from the page. Throws
/// `MarletBookPageSnapshot::SerializationError`.
std::vector<MarletHint> loadHints(const PropertyListDictionary& manifest, const FileWrapper& page);

/// The manifest's form of hints. The text of a file that one refers to is not in it.
PropertyListValue::Array hintsForManifest(const std::vector<MarletHint>& hints);

}  // namespace MarletFoundation
