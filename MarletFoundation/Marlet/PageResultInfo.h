#pragma once

#include <optional>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/Marlet/MarletResultInfoSnapshot.h"

namespace MarletFoundation {

/// A file of the page at `pageURL` as the learner sees it; throws what reading through the pack throws.
std::optional<Data> learnersFile(const DiffPackSnapshot& pack, const URL& pageURL, std::string_view filename);

/// What a page's "ResultInfo.plist" holds. A damaged one is no reason to refuse a page: it is logged, and the
/// record is empty, as it is without a file.
MarletResultInfoSnapshot pageResultInfo(const std::optional<Data>& file);

}  // namespace MarletFoundation
