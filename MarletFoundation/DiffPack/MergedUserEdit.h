#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// The contents of a file as the learner sees it: the authored file, read from below the pack's `contentUrl`,
/// with what the pack's first entry for `filePath` says applied to it. Without an entry, the authored file,
/// or nothing when it can't be read; nothing for a removed file.
///
/// `filePath` is relative to `contentUrl`. One that leads out of it, as "../x" does or a symbolic link below
/// it, can't be read.
///
/// Throws, for a file that has an entry, an `ErrorObject` of the POSIX domain when its authored text is
/// needed and can't be read or isn't UTF-8 (EILSEQ), and that of `MarletDiff::mergeContent` when the text
/// isn't the one that was edited.
MARLET_EXPORT std::optional<Data> mergedUserEdit(const DiffPackSnapshot& pack, std::string_view filePath);

}  // namespace MarletFoundation
