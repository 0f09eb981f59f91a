#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "MarletDiff/DiffDescriptor.h"

namespace MarletFoundation {

/// The changes from a page's authored text to its edited one, found in each of its fields by itself, so that none
/// reaches out of them or into a tag, be it of a field within another one. Where the text around the fields isn't as
/// it was, they are found between the page's tags, so that what was done there takes no field's changes with it.
/// Nothing when the tags don't stand in `edited` as they were. Time is linear in the texts, as that of
/// `MarletDiff::diffContent`.
std::optional<std::vector<MarletDiff::DiffDescriptor>> fieldwiseDiff(std::u16string_view original,
                                                                     std::u16string_view edited);

/// Those of the hunks that leave a page's tags as they are: of two fields, one within the other, the outer one's
/// editable range holds the tags of the inner one. Tags of copy destinations are text like any other.
std::vector<MarletDiff::DiffDescriptor> hunksBesideTags(const MarletDiff::DiffDescriptors& hunks,
                                                        std::u16string_view text);

}  // namespace MarletFoundation
