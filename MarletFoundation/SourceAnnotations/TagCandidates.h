#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The first "//#-" or "/*#-" in `text` at or behind `from`, at memory speed; `npos` when there is none.
MARLET_EXPORT std::size_t nextTagCandidate(std::u16string_view text, std::size_t from);

}  // namespace MarletFoundation
