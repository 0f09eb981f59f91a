#pragma once

#include "MarletFoundation/DiffPack/PartialDiffPack.h"

namespace MarletFoundation {

/// Reads a pack. Entries that can't be read go to `unreadable` or, without it, end the reading.
DiffPackSnapshot readDiffPack(const FileWrapper& pack, URL contentUrl,
                              std::vector<PartialDiffPack::Unreadable>* unreadable = nullptr);

}  // namespace MarletFoundation
