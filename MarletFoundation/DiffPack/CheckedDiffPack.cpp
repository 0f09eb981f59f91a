#include "MarletFoundation/DiffPack/CheckedDiffPack.h"

#include <algorithm>
#include <set>

#include "MarletFoundation/DiffPack/PackPaths.h"
#include "MarletFoundation/Platform/RelativePath.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;
using Entries = std::vector<FileDiffDescriptor>;

/// The entries as a directory keeps them: by sections, and an update's files without data.
Entries inSections(const DiffPackSnapshot& pack) {
  Entries entries(pack.updates.begin(), pack.updates.end());
  std::stable_sort(entries.begin(), entries.end(),
                   [](const auto& a, const auto& b) { return a.change.index() < b.change.index(); });
  if (pack.diffPackType == DiffPackType::UserEditPack) return entries;
  for (auto& entry : entries) {
    if (auto* added = std::get_if<FileDiffDescriptor::Added>(&entry.change)) added->data.reset();
    if (auto* replaced = std::get_if<FileDiffDescriptor::Replaced>(&entry.change)) replaced->data.reset();
  }
  return entries;
}

ErrorObject failure(std::string message) {
  return diffError(DiffErrorCode::CriticalDiffPackValidationError, std::move(message));
}

ErrorObject wouldChange(const std::string& path) {
  return failure("\"" + path +
                 "\" would not read back from the pack as it was put there. Revert it, or set it anew.");
}

}  // namespace

FileWrapper checkedFileWrapper(const DiffPackSnapshot& pack) {
  std::set<std::string, std::less<>> paths;
  for (const auto& entry : pack.updates) {
    const auto& path = entry.filePath();
    if (!std::holds_alternative<FileDiffDescriptor::Removed>(entry.change) && !relativePathComponents(path))
      throw failure("\"" + path + "\" names no file below a book's contents.");
    paths.insert(path);
  }
  requireRoomInPack(pack.updates, paths);
  auto wrapper = pack.fileWrapper();
  const auto expected = inSections(pack), found = inSections(DiffPackSnapshot(wrapper, pack.contentUrl));
  const auto [entry, other] = std::mismatch(expected.begin(), expected.end(), found.begin(), found.end());
  if (entry != expected.end()) throw wouldChange(entry->filePath());
  return wrapper;
}

}  // namespace MarletFoundation
