#include "UpdatePreview.h"

#include <algorithm>
#include <set>

#include "Hunks.h"
#include "MarletDiff/ContentMerge.h"

#include "MarletFoundation/Platform/Text.h"
#include "TreePath.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

using MarletDiff::FileDiffDescriptor;
using Edit = UpdatePreview::Edit;

/// What a conflict's error tells; nothing for any other error of a merge.
std::optional<UpdatePreview::Conflict> conflictOf(const ErrorObject& error, std::u16string_view text) {
  if (error.domain() != MarletDiff::ErrorDomain ||
      error.code() != static_cast<int>(MarletDiff::MergeErrorCode::Conflict)) {
    return std::nullopt;
  }
  const auto words = [&](std::string_view key) { return std::get<std::string>(error.value(key).value()); };
  const auto location = std::get<std::int64_t>(error.value(MarletDiff::LocationKey).value());
  return UpdatePreview::Conflict{1 + std::count(text.begin(), text.begin() + location, u'\n'),
                                 words(MarletDiff::BaseTextKey), words(MarletDiff::OtherTextKey),
                                 words(MarletDiff::TextKey)};
}

Edit previewOf(const Book& book, const FileDiffDescriptor& userEdit, const DiffPackSnapshot& update) {
  Edit edit{userEdit.filePath()};
  const auto isChanged = [&](const FileDiffDescriptor& entry) {
    return std::holds_alternative<FileDiffDescriptor::Modified>(entry.change) &&
           entry.filePath() == edit.file;
  };
  const auto* changed = std::find_if(update.updates.begin(), update.updates.end(), isChanged);
  const bool isRebased = changed != update.updates.end() &&
                         std::holds_alternative<FileDiffDescriptor::Modified>(userEdit.change) &&
                         book.userEdits->updates.first(edit.file) == &userEdit;
  if (!isRebased) return edit;
  const auto authored = mergedUserEdit(makeUserEditDiffPack(book.snapshot, book.contentsUrl()), edit.file);
  const auto text = authored ? utf16FromUTF8(authored->view()) : std::nullopt;
  if (!text) return edit;
  edit.state = Edit::State::rebased;
  const auto hunks = hunksOf(*changed), learnersHunks = hunksOf(userEdit);
  try {
    MarletDiff::mergeContent(*text, {hunks.begin(), hunks.size()},
                             {learnersHunks.begin(), learnersHunks.size()});
  } catch (const ErrorObject& error) {
    edit.conflict = conflictOf(error, *text);
    if (!edit.conflict) throw;
    edit.state = Edit::State::conflict;
  }
  return edit;
}

}  // namespace

UpdatePreview::UpdatePreview(const Book& book, const DiffPackSnapshot& update) {
  for (const auto& entry : update.updates) {
    const bool isRemoved = std::holds_alternative<FileDiffDescriptor::Removed>(entry.change);
    files.push_back({entry.filePath(), kindName(entry),
                     isRemoved && nodeAt(book.document.wrapper, "Contents/" + entry.filePath())});
  }
  if (!book.userEdits) return;
  for (const auto& userEdit : book.userEdits->updates) edits.push_back(previewOf(book, userEdit, update));
}

bool UpdatePreview::hasConflict() const {
  return std::any_of(edits.begin(), edits.end(), [](const Edit& edit) { return edit.conflict.has_value(); });
}

void UpdatePreview::take(std::vector<UpdateConflict> found) {
  conflicts = std::move(found);
  std::set<std::string_view> unfitting;
  for (const auto& conflict : conflicts) {
    if (conflict.kind == UpdateConflict::Kind::DoesNotFitEdit) unfitting.insert(conflict.file);
  }
  for (auto& edit : edits) {
    if (unfitting.contains("Contents/" + edit.file)) edit.state = Edit::State::conflict;
  }
}

std::string wordsOf(const UpdateConflict& conflict) {
  std::string words(conflict.reason());
  if (conflict.error) words += ": " + wordsWithSuggestion(*conflict.error);
  return words;
}

std::string_view stateName(Edit::State state) {
  static constexpr std::string_view names[] = {"kept", "rebased", "conflict"};
  return names[static_cast<int>(state)];
}

ordered_json json(const UpdatePreview::File& file) {
  return {{"file", file.file}, {"kind", file.kind}, {"result", file.isLeftInPlace ? "leftInPlace" : "done"}};
}

ordered_json json(const Edit& edit) {
  auto conflict = ordered_json(nullptr);
  if (edit.conflict) {
    conflict = {{"line", edit.conflict->line},
                {"base", edit.conflict->base},
                {"learner", edit.conflict->learner},
                {"update", edit.conflict->update}};
  }
  return {{"file", edit.file}, {"state", stateName(edit.state)}, {"conflict", std::move(conflict)}};
}

ordered_json json(const UpdateConflict& conflict) {
  static constexpr std::string_view kinds[] = {"alreadyApplied", "doesNotOpen", "losesLearnersFile",
                                               "doesNotFitEdit"};
  return {{"kind", kinds[static_cast<int>(conflict.kind)]},
          {"file", conflict.file},
          {"reason", wordsOf(conflict)}};
}
