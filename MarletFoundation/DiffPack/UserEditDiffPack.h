#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

struct MarletBookSnapshot;

/// A learner's edited files by their paths below the pack's `contentUrl`; no data for a file that goes back
/// to its authored state.
using UserEdits = std::map<std::string, std::optional<Data>, std::less<>>;

/// An empty user-edit pack for the book's current version.
MARLET_EXPORT DiffPackSnapshot makeUserEditDiffPack(const MarletBookSnapshot& book, URL contentUrl);

/// The pack with the given files' edits in place of those it held; edits never pile up. Of a text only the
/// changes stay that `UserEditDiffPackValidator` lets pass and that leave the page's tags as they are, also those of a
/// field within another one, without a word about the others; a file with none left has no entry. What isn't UTF-8, or has no authored text beside it, is carried whole. Throws what the
/// validator throws for the pack.
MARLET_EXPORT DiffPackSnapshot updatedUserEditDiffPack(const DiffPackSnapshot& pack,
                                                       const UserEdits& userEdits);

/// The changes from a file's authored text to its edited one, before any is dropped. Where some would be
/// dropped, though the page's tags stand as authored, the fields are compared one by one. A line feed at
/// the end that the authored text lacks doesn't count: editors add one.
MARLET_EXPORT std::vector<MarletDiff::DiffDescriptor> userEditHunks(std::u16string_view original,
                                                                    std::u16string_view edited);

}  // namespace MarletFoundation
