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
/// field within another one, without a word about the others; a file with none left has no entry. What isn't UTF-8, or has no authored text beside it, is carried whole, and so is a text whose
/// changes hold a character that XML has none for, such as a form feed (as authored where it isn't editable).
///
/// Doubled slashes in a path and one at its end count for nothing: the pack names a file in one way. Throws what the
/// validator throws for the pack, and an `ErrorObject` of `DiffErrorDomain` with the code
/// `CriticalDiffPackValidationError` for a file that is edited by two paths, and for one that has no room in the
/// pack's directory beside another: below a path at which there is a file, or where the pack keeps its manifest or
/// another file's changes.
MARLET_EXPORT DiffPackSnapshot updatedUserEditDiffPack(const DiffPackSnapshot& pack,
                                                       const UserEdits& userEdits);

/// The changes from a file's authored text to its edited one, before any is dropped. Where some would be
/// dropped, though the page's tags stand as authored, the fields are compared one by one. A line feed at
/// the end that the authored text lacks doesn't count: editors add one.
MARLET_EXPORT std::vector<MarletDiff::DiffDescriptor> userEditHunks(std::u16string_view original,
                                                                    std::u16string_view edited);

}  // namespace MarletFoundation
