#pragma once

#include <string>
#include <utility>
#include <vector>

#include "MarletFoundation/DiffPack/MergedBook.h"

namespace MarletFoundation {

/// The pages that don't open, as authored, once the update is in the book at the URL: their paths relative to the
/// document, with what is wrong. None that doesn't open in the book as it is, either. `after` is the merged book and
/// `tree` its tree. Pages that the update doesn't touch aren't looked at: they are what they were.
std::vector<std::pair<std::string, ErrorPointer>> pagesThatWouldNotOpen(const MergedBook& book,
                                                                        const DiffPackSnapshot& update,
                                                                        const MarletBookSnapshot& after,
                                                                        const FileWrapper& tree,
                                                                        const URL& bookURL);

}  // namespace MarletFoundation
