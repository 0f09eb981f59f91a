#pragma once

#include <span>
#include <string>
#include <string_view>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletFoundation/Platform/Export.h"

namespace MarletDiff {

/// The domain of this library's own errors.
inline constexpr std::string_view ErrorDomain = "MarletDiff";

/// Why a merge failed.
enum class MergeErrorCode {
  /// A hunk reaches beyond the base.
  OutOfBounds = 1,
  /// A hunk starts ahead of the end of the one before it.
  OutOfOrder = 2,
  /// A hunk starts or ends between the two halves of a surrogate pair.
  DividedCharacter = 3,
  /// The base holds other text than the hunk was made for.
  DifferentText = 4,
  /// Both sides change the same place, and not to the same text.
  Conflict = 5,
};

/// User-info keys of a merge's errors: the place in the base, as two integers in UTF-16 units, and for a
/// conflict the three texts of that place, as strings.
inline constexpr std::string_view LocationKey = "Location";
inline constexpr std::string_view LengthKey = "Length";
inline constexpr std::string_view BaseTextKey = "BaseText";
inline constexpr std::string_view TextKey = "Text";
inline constexpr std::string_view OtherTextKey = "OtherText";

/// The base with `diff` and, if there is one, `otherDiff` applied; both are hunks against `base`. Only
/// `originalRange` says where a hunk goes; `modifiedRange` isn't looked at.
///
/// Each list is checked first: its hunks must lie within the base, ascend without overlap, divide no
/// character and carry the text that the base has there. With two lists, hunks of the two sides that overlap,
/// touch or change the same word are taken together: a place that only one side changes, or both to the same
/// text, takes that text, and any other is a conflict. Where a script has no blanks, each character is a word.
///
/// Throws a `MarletFoundation::ErrorObject` of `ErrorDomain` with a `MergeErrorCode`.
MARLET_EXPORT std::u16string mergeContent(std::u16string_view base, std::span<const DiffDescriptor> diff,
                                          std::span<const DiffDescriptor> otherDiff = {});

/// The same for a base in UTF-8; ranges count UTF-16 units all the same. Throws one of the POSIX domain (EILSEQ) for
/// ill-formed UTF-8 and for an unpaired surrogate in a hunk's text.
MARLET_EXPORT std::string mergeContent(std::string_view base, std::span<const DiffDescriptor> diff,
                                       std::span<const DiffDescriptor> otherDiff = {});

}  // namespace MarletDiff
