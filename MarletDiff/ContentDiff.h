#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletDiff/DiffOptions.h"
#include "MarletFoundation/Platform/Export.h"

namespace MarletDiff {

/// The hunks that lead from `original` to `modified`, in ascending order and disjoint; none when the texts
/// are equal. The same texts give the same hunks everywhere. Time and memory are linear in the texts' lengths
/// plus a constant: where the texts differ too much, the last hunk takes in all that is left.
MARLET_EXPORT std::vector<DiffDescriptor> diffContent(std::u16string_view original,
                                                      std::u16string_view modified,
                                                      std::optional<DiffOptions> options = std::nullopt);

}  // namespace MarletDiff
