#include "MarletFoundation/DiffPack/MergedBook.h"

#include <cerrno>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/DiffPack/TreePaths.h"
#include "MarletFoundation/DiffPack/UserEditsPlace.h"
#include "MarletFoundation/Platform/OneState.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;

ErrorObject failure(std::string message) {
  return diffError(DiffErrorCode::CriticalMergeError, std::move(message));
}
ErrorObject missingFile(const std::string& path) { return failure("Missing file " + path); }

FileWrapper fileAt(const FileWrapper& root, const std::string& path) {
  auto node = path.empty() ? std::optional(root) : descendant(root, path);
  if (!node) throw missingFile(path);
  return *std::move(node);
}

/// The names of a path at which there is a file; none for the empty path, which stands for the tree itself.
PathNames namesOf(const std::string& path) {
  return path.empty() ? PathNames() : relativePathComponents(path).value();
}

/// Nothing where there is no file; throws where it can't be read, since the learner's changes start from it.
std::optional<Data> contentsAt(const FileWrapper& root, const std::string& path) {
  root.requireReadable(path);
  const auto file = descendant(root, path);
  return file ? file->regularFileContents() : std::nullopt;
}

/// Applies the entries of one pack to a book's tree, and carries the learner's entries over.
class BookMerge {
 public:
  BookMerge(MergedBook& book, FileWrapper contents, FileWrapper source)
      : book_(book), contents_(std::move(contents)), source_(std::move(source)) {
    if (!book_.editsBefore) return;
    const auto& entries = book_.editsBefore->updates;
    userEdits_.assign(entries.begin(), entries.end());
    for (const auto& entry : entries) {
      const bool isModified = std::holds_alternative<FileDiffDescriptor::Modified>(entry.change);
      book_.editedTexts.push_back(isModified ? contentsAt(contents_, entry.filePath()) : std::nullopt);
    }
  }

  void operator()(const FileDiffDescriptor::Removed& file) {
    // A path that names nothing below the root finds nothing, either.
    const auto names = relativePathComponents(file.path);
    if (!names) return;
    if (names->front() == "Edits" && descendant(book_.document, file.path))
      book_.takenFromEdits.push_back(file.path);
    removeDescendant(book_.document, *names);
  }
  void operator()(const FileDiffDescriptor::Added& file) { carry(file.path); }
  void operator()(const FileDiffDescriptor::Replaced& file) { carry(file.path); }

  void operator()(const FileDiffDescriptor::Modified& file) {
    const auto contents = fileAt(contents_, file.path).regularFileContents();
    const auto text = contents ? utf16FromUTF8(contents->view()) : std::nullopt;
    if (!text) throw missingFile(file.path);
    const auto updated = MarletDiff::mergeContent(*text, file.diff);
    auto encoded = utf8FromUTF16(updated);
    if (!encoded) throw ErrorObject::posix(EILSEQ, file.path);
    const Data data(*std::move(encoded));
    addDescendant(contents_, namesOf(file.path), FileWrapper::regularFile(data));
    rebaseUserEdit(file, *text, updated, data);
  }

  std::vector<FileDiffDescriptor> takeUserEdits() { return std::move(userEdits_); }

 private:
  void carry(const std::string& path) {
    auto file = fileAt(source_, path);
    addDescendant(contents_, namesOf(path), std::move(file));
  }

  /// Both changes start from the text before the update; where they can't be combined the whole merge ends.
  void rebaseUserEdit(const FileDiffDescriptor::Modified& update, std::u16string_view text,
                      std::u16string_view updated, const Data& updatedData) {
    const auto* entry = book_.editsBefore ? book_.editsBefore->updates.first(update.path) : nullptr;
    if (!entry) return;
    const auto index = static_cast<std::size_t>(entry - book_.editsBefore->updates.begin());
    auto* modified = std::get_if<FileDiffDescriptor::Modified>(&userEdits_[index].change);
    if (!modified) return;
    const auto merged = MarletDiff::mergeContent(text, update.diff, modified->diff);
    modified->diff = MarletDiff::diffContent(updated, merged, MarletDiff::DiffOptions::SmallerHunks);
    book_.editedTexts[index] = updatedData;
  }

  MergedBook& book_;
  FileWrapper contents_, source_;
  /// In the order of the learner's pack, so that its index of paths holds for them, too.
  std::vector<FileDiffDescriptor> userEdits_;
};

}  // namespace

namespace {

MergedBook mergedTree(const FileWrapper& root, const URL& bookURL, const DiffPackSnapshot& pack) {
  const auto contents = root.child("Contents");
  if (!contents) throw failure("Marlet Book has no Contents directory");
  // To the load a pack that can't be read at the moment is none; an update would then pass it by.
  root.requireReadable("Edits/UserEdits.diffpack");
  std::optional<DiffPackSnapshot> editsBefore;
  MarletBookSnapshot before(root, bookURL, editsBefore);
  MergedBook book{root, std::move(before), std::move(editsBefore), {}, {}, {}};
  BookMerge merge(book, *contents, FileWrapper(pack.contentUrl));
  for (const auto& update : pack.updates) std::visit(merge, update.change);
  if (const auto& edits = book.editsBefore) {
    book.edits.emplace(edits->diffPackType, edits->documentType, edits->contentUrl, edits->name,
                       pack.updateVersion, pack.updateVersion, merge.takeUserEdits());
    setUserEdits(root, book.edits->fileWrapper());
  }
  return book;
}

}  // namespace

MergedBook mergedBook(const URL& bookURL, const DiffPackSnapshot& pack) {
  return readOneState(
      bookURL.path(), [&] { return FileWrapper(bookURL); },
      [&](const FileWrapper& root) { return mergedTree(root, bookURL, pack); });
}

}  // namespace MarletFoundation
