#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The text as a legal C99 extended identifier: each character that may not stand in one, or not at its start,
/// becomes an underscore. An empty text stays empty. Each half of a broken surrogate pair counts as a character.
MARLET_EXPORT std::u16string mlf_stringByManglingToLegalC99ExtendedIdentifier(std::u16string_view text);
inline std::u16string stringByManglingToLegalC99ExtendedIdentifier(std::u16string_view text) {
  return mlf_stringByManglingToLegalC99ExtendedIdentifier(text);
}

}  // namespace MarletFoundation
