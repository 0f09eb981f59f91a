#pragma once

#include <string_view>

#include "MarletFoundation/SourceEditor/OffsetRange.h"
#include "MarletFoundation/Utils/CheckedArithmetic.h"

/// @file
/// Strings by user-perceived characters (extended grapheme clusters). Each call walks the string from its
/// front.
namespace MarletFoundation {

/// Number of characters.
MARLET_EXPORT std::int64_t length(std::string_view string);
/// The characters of a range of character offsets, as a view into `string`. An offset outside is fatal.
MARLET_EXPORT std::string_view subscript(std::string_view string, const OffsetRange& range);
/// The one character at a character offset.
inline std::string_view subscript(std::string_view string, std::int64_t index) {
  return subscript(string, {index, checkedSum(index, 1)});
}

}  // namespace MarletFoundation
