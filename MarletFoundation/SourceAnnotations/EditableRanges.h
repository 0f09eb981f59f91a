#pragma once

#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/TextRange.h"

namespace MarletFoundation {

/// The stretches of a page's source that a learner may edit, in UTF-16 units: what lies in its fields, less
/// what is hidden; without fields, what lies between its hidden parts; without either, all of it.
///
/// The list stands in the order in which cutting out the hidden parts leaves it, so it need not be sorted and
/// ranges may overlap. Crossed tags can give an entry of negative length, which matches nothing, not even an
/// insertion.
MARLET_EXPORT std::vector<TextRange> editableRanges(std::u16string_view content);

}  // namespace MarletFoundation
