#include "MarletFoundation/DiffPack/UserEditDiffPackValidator.h"

#include <algorithm>

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/SourceAnnotations/EditableRanges.h"

namespace MarletFoundation {
namespace {

using MarletDiff::DiffDescriptor;
using MarletDiff::FileDiffDescriptor;

/// Answers for any number of hunks which of them lie within one of the ranges, whatever order these have.
class RangesByStart {
 public:
  explicit RangesByStart(std::vector<TextRange> ranges) : ranges_(std::move(ranges)) {
    std::sort(ranges_.begin(), ranges_.end(),
              [](const TextRange& a, const TextRange& b) { return a.location < b.location; });
    std::int64_t end = 0;
    for (const auto& range : ranges_) farthestEnds_.push_back(end = std::max(end, range.end()));
  }

  bool holdWhole(const TextRange& hunk) const {
    // Of the ranges that start early enough, the one that reaches farthest decides.
    const auto after =
        std::upper_bound(ranges_.begin(), ranges_.end(), hunk.location,
                         [](std::int64_t at, const TextRange& range) { return at < range.location; });
    // The length is compared, and not the end, which may lie beyond all numbers.
    return after != ranges_.begin() && hunk.length >= 0 &&
           hunk.length <=
               farthestEnds_[static_cast<std::size_t>(after - ranges_.begin()) - 1] - hunk.location;
  }

 private:
  std::vector<TextRange> ranges_;
  std::vector<std::int64_t> farthestEnds_;
};

}  // namespace

std::vector<DiffDescriptor> editableHunks(const MarletDiff::DiffDescriptors& hunks,
                                          std::u16string_view content) {
  const RangesByStart editable(editableRanges(content));
  std::vector<DiffDescriptor> kept;
  std::copy_if(hunks.begin(), hunks.end(), std::back_inserter(kept),
               [&](const DiffDescriptor& hunk) { return editable.holdWhole(hunk.originalRange); });
  return kept;
}

UserEditDiffPackValidator::UserEditDiffPackValidator(DiffPackSnapshot pack) : userEditPack(std::move(pack)) {
  if (userEditPack.diffPackType != DiffPackType::UserEditPack ||
      userEditPack.baseVersion != userEditPack.updateVersion ||
      userEditPack.documentType != DiffPackDocumentType::MarletBook) {
    throw diffError(DiffErrorCode::CriticalDiffPackValidationError, "Invalid user-edit DiffPack");
  }
}

std::optional<FileDiffDescriptor> UserEditDiffPackValidator::validatedUpdate(
    const FileDiffDescriptor& descriptor, std::optional<std::u16string_view> content) const {
  const auto* modified = std::get_if<FileDiffDescriptor::Modified>(&descriptor.change);
  if (!modified) return descriptor;
  if (!content) fatalError("A modified file is validated against its original text.");
  auto survivors = editableHunks(modified->diff, *content);
  if (survivors.empty()) return std::nullopt;
  return FileDiffDescriptor{FileDiffDescriptor::Modified{modified->path, std::move(survivors)}};
}

}  // namespace MarletFoundation
