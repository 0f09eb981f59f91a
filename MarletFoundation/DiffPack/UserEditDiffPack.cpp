#include "MarletFoundation/DiffPack/UserEditDiffPack.h"

#include <algorithm>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/DiffPack/FieldwiseDiff.h"
#include "MarletFoundation/DiffPack/PackPaths.h"
#include "MarletFoundation/DiffPack/UserEditDiffPackValidator.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/PropertyListText.h"
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

/// Whether XML, and so a delta file, can carry the text.
bool isDeltaText(const std::u16string& text) {
  const auto utf8 = utf8FromUTF16(text);
  return utf8 && PropertyListText::findInvalidXMLCharacter(*utf8) == PropertyListText::npos;
}

/// An edited text as its entry. One whose changes hold a character that XML has none for, such as a form feed,
/// is carried whole: it must not get lost, nor keep the learner's other files from being saved.
std::optional<FileDiffDescriptor> textEntry(const UserEditDiffPackValidator& validator,
                                            const std::string& path, const std::u16string& original,
                                            const std::u16string& edited) {
  auto hunks = hunksBesideTags(userEditHunks(original, edited), original);
  if (hunks.empty()) return std::nullopt;
  auto entry = validator.validatedUpdate({FileDiffDescriptor::Modified{path, std::move(hunks)}}, original);
  if (!entry) return std::nullopt;
  const auto& kept = std::get<FileDiffDescriptor::Modified>(entry->change).diff;
  const bool isWritable = std::all_of(kept.begin(), kept.end(), [](const MarletDiff::DiffDescriptor& hunk) {
    return isDeltaText(hunk.originalContent) && isDeltaText(hunk.modifiedContent);
  });
  if (isWritable) return entry;
  auto whole = utf8FromUTF16(MarletDiff::mergeContent(original, kept));
  return FileDiffDescriptor{FileDiffDescriptor::Replaced{path, Data(std::move(whole).value())}};
}

/// The entry that an edited file gets, or nothing.
std::optional<FileDiffDescriptor> entryFor(const UserEditDiffPackValidator& validator,
                                           const std::string& path, const std::optional<Data>& data) {
  if (!data) return std::nullopt;
  const auto& contentUrl = validator.userEditPack.contentUrl;
  const auto edited = utf16FromUTF8(data->view());
  const auto original = edited ? authoredText(contentUrl, path) : std::nullopt;
  if (original) return textEntry(validator, path, *original, *edited);
  if (isReachable(contentUrl.appendingPathComponent(path)))
    return FileDiffDescriptor{FileDiffDescriptor::Replaced{path, data}};
  return FileDiffDescriptor{FileDiffDescriptor::Added{path, data}};
}

/// The edits by the one form of their paths.
UserEdits plainEdits(const UserEdits& userEdits) {
  UserEdits edits;
  for (const auto& [path, data] : userEdits) {
    if (!edits.emplace(plainPath(path), data).second) {
      throw diffError(DiffErrorCode::CriticalDiffPackValidationError,
                      "\"" + path + "\" is edited twice: it names the same file as another path does.");
    }
  }
  return edits;
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
  const auto edits = plainEdits(userEdits);
  // Emptied slots keep the indexes of the others until the end.
  std::vector<std::optional<FileDiffDescriptor>> slots(pack.updates.begin(), pack.updates.end());
  const auto slotOf = [&](const FileDiffDescriptor* entry) -> auto& {
    return slots[static_cast<std::size_t>(entry - pack.updates.begin())];
  };
  for (const auto& update : pack.updates) {
    // What named an edited file in another way.
    const auto path = plainPath(update.filePath());
    if (path != update.filePath() && edits.contains(path)) slotOf(&update).reset();
  }
  std::set<std::string, std::less<>> edited;
  for (const auto& [path, data] : edits) {
    auto entry = entryFor(validator, path, data);
    if (entry) edited.insert(path);
    if (const auto* replaced = pack.updates.first(path)) {
      slotOf(replaced) = std::move(entry);
    } else if (entry) {
      slots.push_back(std::move(entry));
    }
  }
  std::vector<FileDiffDescriptor> updates;
  for (auto& slot : slots) {
    if (slot) updates.push_back(*std::move(slot));
  }
  FileDiffDescriptors entries(std::move(updates));
  requireRoomInPack(entries, edited);
  return {DiffPackType::UserEditPack, pack.documentType,  pack.contentUrl,   pack.name,
          pack.baseVersion,           pack.updateVersion, std::move(entries)};
}

}  // namespace MarletFoundation
