#pragma once

#include "MarletFoundation/DiffPack/DiffPackValidator.h"

namespace MarletFoundation {

/// Those of the hunks whose original range lies wholly in one of the `editableRanges` of `content`, an
/// insertion at either end included.
std::vector<MarletDiff::DiffDescriptor> editableHunks(const MarletDiff::DiffDescriptors& hunks,
                                                      std::u16string_view content);

/// Keeps a learner's changes within what may be edited.
struct MARLET_EXPORT UserEditDiffPackValidator final : DiffPackValidator {
  /// A user-edit pack of a book, whose base version is its update version.
  DiffPackSnapshot userEditPack;

  /// Throws an `ErrorObject` of `DiffErrorDomain` with the code `CriticalDiffPackValidationError` for any
  /// other pack.
  explicit UserEditDiffPackValidator(DiffPackSnapshot userEditPack);

  /// Does nothing: the pack was tested when the validator was made.
  void validate() const override {}

  /// A modified entry with its `editableHunks`; nothing when no hunk is left. Other entries stay as they are. A
  /// modified entry without `content` is a fatal error.
  std::optional<MarletDiff::FileDiffDescriptor> validatedUpdate(
      const MarletDiff::FileDiffDescriptor& descriptor,
      std::optional<std::u16string_view> content = std::nullopt) const override;
};

}  // namespace MarletFoundation
