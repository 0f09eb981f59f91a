#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// What the payload of a copy destination names. The payload has no blanks at its ends.
struct CopyDestinationParts {
  /// As it stands in the source, with the backslashes in front of double quotes.
  std::u16string_view pageRef;
  std::u16string_view identifier;
};
/// The parts of `("PAGE REFERENCE", IDENTIFIER)`; nothing for any other form.
MARLET_EXPORT std::optional<CopyDestinationParts> extractCopyDestinationParts(std::u16string_view payload);
/// The identifier of a copy source's payload, `(IDENTIFIER)`; nothing for any other form.
MARLET_EXPORT std::optional<std::u16string_view> extractCopySourceParts(std::u16string_view payload);

}  // namespace MarletFoundation
