#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletDiff/DiffOptions.h"
#include "MarletFoundation/Platform/Export.h"

namespace MarletDiff {

/// The hunks that lead from `original` to `modified`, ascending, with equal text between any two of them; none
/// when the texts are equal. No range divides a character (extended grapheme cluster). Hunks are whole lines;
/// with `SmallerHunks` they are refined by words and by characters, and no hunk's two contents start or end
/// with the same character. The same texts give the same hunks everywhere.
///
/// Time and memory are linear in the texts' lengths plus a constant: where the texts differ too much, one hunk
/// takes in what is left. Texts of more than 2^30 units differ as a whole.
MARLET_EXPORT std::vector<DiffDescriptor> diffContent(std::u16string_view original,
                                                      std::u16string_view modified,
                                                      std::optional<DiffOptions> options = std::nullopt);

/// The same hunks of texts in UTF-8, as files hold them, found with half the memory. Ranges count UTF-16 units all
/// the same. Throws a `MarletFoundation::ErrorObject` of the POSIX domain (EILSEQ) for ill-formed UTF-8.
MARLET_EXPORT std::vector<DiffDescriptor> diffContent(std::string_view original, std::string_view modified,
                                                      std::optional<DiffOptions> options = std::nullopt);

/// The same for one of several parts of a text that are compared by themselves. All of them together take the work of
/// one comparison, which `diffBudget` gives for the length of both texts, UTF-16 units; what is left of it is less
/// afterwards.
MARLET_EXPORT std::vector<DiffDescriptor> diffContent(std::u16string_view original,
                                                      std::u16string_view modified,
                                                      std::optional<DiffOptions> options,
                                                      std::int64_t& budget);
MARLET_EXPORT std::int64_t diffBudget(std::size_t length);

}  // namespace MarletDiff
