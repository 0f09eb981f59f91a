#pragma once

#include <memory>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Lets go of what an object holds, from the object's destructor: when that ends a long chain, or a deep tree, of such
/// objects, one goes behind the other and not within it, so that depth takes no stack. Whether a link is the last holder
/// is never asked, only found by letting go: so copies may be dropped on several threads at once. Destructors of what
/// hangs on a link may therefore run when that link's owner is gone already.
MARLET_EXPORT void releaseWithoutStack(std::shared_ptr<const void> link) noexcept;

}  // namespace MarletFoundation
