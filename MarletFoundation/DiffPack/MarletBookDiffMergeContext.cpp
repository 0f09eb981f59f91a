#include "MarletFoundation/DiffPack/MarletBookDiffMergeContext.h"

#include <cerrno>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/DiffPack/TreePaths.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;

constexpr std::string_view userEditsPath = "Edits/UserEdits.diffpack";

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

/// Applies the entries of one pack to a book's tree, and carries the learner's entries over.
class BookMerge {
 public:
  BookMerge(FileWrapper root, FileWrapper contents, FileWrapper source,
            const std::optional<DiffPackSnapshot>& userEditsPack)
      : root_(std::move(root)),
        contents_(std::move(contents)),
        source_(std::move(source)),
        userEditsPack_(userEditsPack) {
    if (userEditsPack_) userEdits_.assign(userEditsPack_->updates.begin(), userEditsPack_->updates.end());
  }

  void operator()(const FileDiffDescriptor::Removed& file) {
    // A path that names nothing below the root finds nothing, either.
    if (const auto names = relativePathComponents(file.path)) removeDescendant(root_, *names);
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
    addDescendant(contents_, namesOf(file.path), FileWrapper::regularFile(Data(*std::move(encoded))));
    rebaseUserEdit(file, *text, updated);
  }

  std::vector<FileDiffDescriptor> takeUserEdits() { return std::move(userEdits_); }

 private:
  void carry(const std::string& path) {
    auto file = fileAt(source_, path);
    addDescendant(contents_, namesOf(path), std::move(file));
  }

  /// Both changes start from the text before the update; where they can't be combined the whole merge ends.
  void rebaseUserEdit(const FileDiffDescriptor::Modified& update, std::u16string_view text,
                      std::u16string_view updated) {
    const auto* entry = userEditsPack_ ? userEditsPack_->updates.first(update.path) : nullptr;
    if (!entry) return;
    auto& userEdit = userEdits_[static_cast<std::size_t>(entry - userEditsPack_->updates.begin())];
    auto* modified = std::get_if<FileDiffDescriptor::Modified>(&userEdit.change);
    if (!modified) return;
    const auto merged = MarletDiff::mergeContent(text, update.diff, modified->diff);
    modified->diff = MarletDiff::diffContent(updated, merged, MarletDiff::DiffOptions::SmallerHunks);
  }

  FileWrapper root_, contents_, source_;
  const std::optional<DiffPackSnapshot>& userEditsPack_;
  /// In the order of the learner's pack, so that its index of paths holds for them, too.
  std::vector<FileDiffDescriptor> userEdits_;
};

}  // namespace

MarletBookDiffMergeContext::MarletBookDiffMergeContext(URL contextUrl)
    : baseUrl(std::move(contextUrl)), contentsUrl(baseUrl.appendingPathComponent("Contents", true)) {}

void MarletBookDiffMergeContext::mergeDiffPack(const DiffPackSnapshot& pack) const {
  mergedDocument(pack).write(baseUrl);
}

void MarletBookDiffMergeContext::validateDiffPack(const DiffPackSnapshot&) const {
  std::optional<DiffPackSnapshot> userEditsPack;
  MarletBookSnapshot(FileWrapper(baseUrl), baseUrl, userEditsPack);
}

FileWrapper MarletBookDiffMergeContext::mergedDocument(const DiffPackSnapshot& pack) const {
  const FileWrapper root(baseUrl);
  const auto contents = root.child("Contents");
  if (!contents) throw failure("Marlet Book has no Contents directory");
  std::optional<DiffPackSnapshot> userEditsPack;
  MarletBookSnapshot(root, baseUrl, userEditsPack);
  BookMerge merge(root, *contents, FileWrapper(pack.contentUrl), userEditsPack);
  for (const auto& update : pack.updates) std::visit(merge, update.change);
  if (userEditsPack) {
    const DiffPackSnapshot rebased(userEditsPack->diffPackType, userEditsPack->documentType,
                                   userEditsPack->contentUrl, userEditsPack->name, pack.updateVersion,
                                   pack.updateVersion, merge.takeUserEdits());
    addDescendant(root, *relativePathComponents(userEditsPath), rebased.fileWrapper());
  }
  return root;
}

}  // namespace MarletFoundation
