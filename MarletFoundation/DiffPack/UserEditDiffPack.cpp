#include "MarletFoundation/DiffPack/UserEditDiffPack.h"

#include "MarletDiff/ContentDiff.h"
#include "MarletFoundation/DiffPack/FieldwiseDiff.h"
#include "MarletFoundation/DiffPack/UserEditDiffPackValidator.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;

bool endsInLineFeed(std::u16string_view text) { return text.ends_with(u'\n') && !text.ends_with(u"\r\n"); }

/// Failures only say that the file isn't text.
std::optional<std::u16string> authoredText(const URL& contentUrl, std::string_view path) {
  try {
    return utf16FromUTF8(readDescendant(contentUrl, path).view());
  } catch (const ErrorObject&) {
    return std::nullopt;
  }
}

bool isReachable(const URL& url) {
  try {
    return FileManager::resourceIsReachable(url);
  } catch (const ErrorObject&) {
    return false;
  }
}

/// The entry that an edited file gets, or nothing.
std::optional<FileDiffDescriptor> entryFor(const UserEditDiffPackValidator& validator,
                                           const std::string& path, const std::optional<Data>& data) {
  if (!data) return std::nullopt;
  const auto& contentUrl = validator.userEditPack.contentUrl;
  const auto edited = utf16FromUTF8(data->view());
  const auto original = edited ? authoredText(contentUrl, path) : std::nullopt;
  if (original) {
    auto hunks = hunksBesideTags(userEditHunks(*original, *edited), *original);
    return validator.validatedUpdate({FileDiffDescriptor::Modified{path, std::move(hunks)}}, *original);
  }
  if (isReachable(contentUrl.appendingPathComponent(path)))
    return FileDiffDescriptor{FileDiffDescriptor::Replaced{path, data}};
  return FileDiffDescriptor{FileDiffDescriptor::Added{path, data}};
}

}  // namespace

DiffPackSnapshot makeUserEditDiffPack(const MarletBookSnapshot& book, URL contentUrl) {
  const auto version = book.contentVersion.versionString();
  return {DiffPackType::UserEditPack,
          DiffPackDocumentType::MarletBook,
          std::move(contentUrl),
          book.contentIdentifier,
          version,
          version,
          {}};
}

std::vector<MarletDiff::DiffDescriptor> userEditHunks(std::u16string_view original,
                                                      std::u16string_view edited) {
  if (!endsInLineFeed(original) && endsInLineFeed(edited)) edited.remove_suffix(1);
  auto hunks = MarletDiff::diffContent(original, edited, MarletDiff::DiffOptions::SmallerHunks);
  if (editableHunks(hunksBesideTags(hunks, original), original).size() == hunks.size()) return hunks;
  // The same edit can often be told by other changes: a learner who writes what a field's border looks like
  // must not lose it because it was compared with the border itself.
  auto byField = fieldwiseDiff(original, edited);
  return byField ? *std::move(byField) : hunks;
}

DiffPackSnapshot updatedUserEditDiffPack(const DiffPackSnapshot& pack, const UserEdits& userEdits) {
  const UserEditDiffPackValidator validator(pack);
  // Emptied slots keep the indexes of the others until the end.
  std::vector<std::optional<FileDiffDescriptor>> slots(pack.updates.begin(), pack.updates.end());
  for (const auto& [path, data] : userEdits) {
    auto entry = entryFor(validator, path, data);
    if (const auto* replaced = pack.updates.first(path)) {
      slots[static_cast<std::size_t>(replaced - pack.updates.begin())] = std::move(entry);
    } else if (entry) {
      slots.push_back(std::move(entry));
    }
  }
  std::vector<FileDiffDescriptor> updates;
  for (auto& slot : slots) {
    if (slot) updates.push_back(*std::move(slot));
  }
  return {DiffPackType::UserEditPack, pack.documentType,  pack.contentUrl,   pack.name,
          pack.baseVersion,           pack.updateVersion, std::move(updates)};
}

}  // namespace MarletFoundation
