#pragma once

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// The pack as a directory that was read back: it opens, and holds what the pack does. Throws what
/// `DiffPackSnapshot::fileWrapper` throws, and an `ErrorObject` of `DiffErrorDomain` with the code
/// `CriticalDiffPackValidationError` that names the first file which would be another one (the data of an update's
/// files, which stay on disk, isn't compared).
MARLET_EXPORT FileWrapper checkedFileWrapper(const DiffPackSnapshot& pack);

}  // namespace MarletFoundation
