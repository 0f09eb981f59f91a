#include "MarletFoundation/DiffPack/CheckedUpdate.h"

#include <algorithm>
#include <cerrno>

#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/DiffPack/CheckedDiffPack.h"
#include "MarletFoundation/DiffPack/MergedBook.h"
#include "MarletFoundation/DiffPack/MergedPages.h"
#include "MarletFoundation/DiffPack/UpdateDiffPack.h"
#include "MarletFoundation/DiffPack/UserEditsPlace.h"
#include "MarletFoundation/Platform/OneState.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;
using Kind = UpdateConflict::Kind;

/// Looks for what stands against one merged book.
class UpdateCheck {
 public:
  UpdateCheck(const URL& bookURL, const DiffPackSnapshot& update, const MergedBook& book)
      : bookURL_(bookURL), update_(update), book_(book) {}

  std::vector<UpdateConflict> run() {
    checkIsNew();
    for (const auto& path : book_.takenFromEdits) add(Kind::LosesLearnersFile, path);
    checkBook();
    if (book_.edits) checkEdits();
    return std::move(conflicts_);
  }

 private:
  void add(Kind kind, std::string file, ErrorPointer error = nullptr) {
    conflicts_.push_back({kind, std::move(file), std::move(error)});
  }

  /// Insertions fit a text however often they are made, so the versions have to tell.
  void checkIsNew() {
    if (update_.baseVersion == update_.updateVersion) return;
    const bool isInBook = update_.name == book_.before.contentIdentifier &&
                          update_.updateVersion == book_.before.contentVersion.versionString();
    const bool isInEdits = book_.editsBefore && book_.editsBefore->baseVersion == update_.updateVersion;
    if (isInBook || isInEdits) add(Kind::AlreadyApplied, "Contents/Manifest.plist");
  }

  /// Through the authored files: the learner's are looked at one by one.
  void checkBook() {
    try {
      const auto tree = withoutUserEdits(book_.document);
      const MarletBookSnapshot after(tree, bookURL_);
      for (auto& [page, error] : pagesThatWouldNotOpen(book_, update_, after, tree, bookURL_))
        add(Kind::DoesNotOpen, std::move(page), std::move(error));
    } catch (const Error& error) {
      add(Kind::DoesNotOpen, placeInBook(error), error.copy());
    }
  }

  /// The directory whose load failed.
  static std::string placeInBook(const Error& error) {
    std::string place = "Contents";
    std::string_view level = "/Chapters/";
    for (const auto* failed = dynamic_cast<const ErrorPayload*>(&error); failed && failed->filename;
         failed = dynamic_cast<const ErrorPayload*>(failed->error.get())) {
      place.append(level).append(*failed->filename);
      level = "/Pages/";
    }
    return place;
  }

  void checkEdits() {
    const auto& edits = *book_.edits;
    try {
      checkedFileWrapper(edits);
    } catch (const Error& error) {
      add(Kind::LosesLearnersFile, "Edits/UserEdits.diffpack", error.copy());
    }
    const auto contents = book_.document.child("Contents");
    for (std::size_t i = 0; contents && i < edits.updates.size(); ++i) {
      const auto& entry = edits.updates[i];
      const auto* modified = std::get_if<FileDiffDescriptor::Modified>(&entry.change);
      // Only the first entry of a path counts. One that had no text, or changes none, has nothing to lose.
      if (modified && !modified->diff.empty() && book_.editedTexts[i] &&
          edits.updates.first(modified->path) == &entry) {
        checkEdit(*modified, *contents, i);
      }
    }
  }

  void checkEdit(const FileDiffDescriptor::Modified& edit, const FileWrapper& contents, std::size_t index) {
    const auto file = descendant(contents, edit.path);
    const auto text = file ? file->regularFileContents() : std::nullopt;
    if (!text || *text != *book_.editedTexts[index])
      return add(Kind::DoesNotFitEdit, "Contents/" + edit.path);
    try {
      MarletDiff::mergeContent(text->view(), edit.diff);
    } catch (const Error& error) {
      // Nor did it before, unless it was carried over.
      if (edits().updates[index] != book_.editsBefore->updates[index])
        add(Kind::DoesNotFitEdit, "Contents/" + edit.path, error.copy());
    }
  }

  const DiffPackSnapshot& edits() const { return *book_.edits; }

  const URL& bookURL_;
  const DiffPackSnapshot& update_;
  const MergedBook& book_;
  std::vector<UpdateConflict> conflicts_;
};

}  // namespace

std::string_view UpdateConflict::reason() const {
  switch (kind) {
    case Kind::AlreadyApplied:
      return "the update is in the book already, and its changes would be made a second time";
    case Kind::DoesNotOpen:
      return "it would not open";
    case Kind::LosesLearnersFile:
      return "what the learner has there would be lost";
    case Kind::DoesNotFitEdit:
      return "its text under the learner's changes would be another one, which they don't fit";
  }
  return {};
}

std::string description(const std::vector<UpdateConflict>& conflicts) {
  constexpr std::size_t mostNamed = 3;
  std::string text = "The update doesn't go with this book";
  const char* separator = ": ";
  for (std::size_t i = 0; i < std::min(conflicts.size(), mostNamed); ++i) {
    text.append(separator).append(conflicts[i].file).append(": ").append(conflicts[i].reason());
    separator = "; ";
  }
  if (conflicts.size() > mostNamed) text += "; and " + std::to_string(conflicts.size() - mostNamed) + " more";
  return text + ". Nothing was changed.";
}

CheckedUpdate checkedUpdate(const URL& documentUrl, const DiffPackSnapshot& diffPack) {
  requireBookDocument(documentUrl);
  // What the merged book is compared with may be of another one by then.
  struct Compared {
    MergedBook book;
    bool isUnchanged() const { return book.document.isUnchanged(); }
  };
  return readOneState(
      documentUrl.path(), [&] { return Compared{mergedBook(documentUrl, diffPack)}; },
      [&](const Compared& compared) {
        return CheckedUpdate{compared.book.document, UpdateCheck(documentUrl, diffPack, compared.book).run()};
      });
}

void applyCheckedUpdate(const URL& documentUrl, const DiffPackSnapshot& diffPack) {
  const auto update = checkedUpdate(documentUrl, diffPack);
  if (!update.conflicts.empty()) {
    throw diffError(DiffErrorCode::CriticalMergeError, description(update.conflicts),
                    update.conflicts.front().error);
  }
  update.document.write(documentUrl);
}

}  // namespace MarletFoundation
