#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// What the payload of a copy tag, which has no blanks at its ends, names. Both answer nothing for any other
/// form, after looking no further than the first double quote that can't be part of a tag.
struct CopyDestinationParts {
  /// As it stands in the source, with the backslashes in front of double quotes.
  std::u16string_view pageRef;
  std::u16string_view identifier;
};
/// `("PAGE REFERENCE", IDENTIFIER)`
MARLET_EXPORT std::optional<CopyDestinationParts> extractCopyDestinationParts(std::u16string_view payload);
/// The identifier in `(IDENTIFIER)`.
MARLET_EXPORT std::optional<std::u16string_view> extractCopySourceParts(std::u16string_view payload);

}  // namespace MarletFoundation
