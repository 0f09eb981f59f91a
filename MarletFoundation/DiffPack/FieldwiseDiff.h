#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "MarletDiff/DiffDescriptor.h"

namespace MarletFoundation {

/// The changes from a page's authored text to its edited one, found in each of its `editableRanges` by itself,
/// so that none reaches out of them; nothing when the text between the ranges doesn't stand in `edited` as it
/// was. Time is linear in the texts, as that of `MarletDiff::diffContent`.
std::optional<std::vector<MarletDiff::DiffDescriptor>> fieldwiseDiff(std::u16string_view original,
                                                                     std::u16string_view edited);

}  // namespace MarletFoundation
