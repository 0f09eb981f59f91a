#include "Book.h"

using namespace MarletFoundation;

namespace {

URL contentsOf(const Document& document) { return document.url.appendingPathComponent("Contents", true); }

std::optional<PartialDiffPack> readablePart(const Document& document) {
  const auto pack = userEditsIn(document.wrapper);
  if (!pack) return std::nullopt;
  try {
    return PartialDiffPack(*pack, contentsOf(document));
  } catch (const Error& error) {
    throw CommandFailure{ExitStatus::negative,
                         document.path + ": the learner's pack can't be read: " + wordsOf(error) +
                             suggested(wordsOf(error), "`marlet edit --set-aside` puts it aside.")};
  }
}

}  // namespace

Book::Book(const Document& document_)
    : document(document_), snapshot(document.wrapper, document.url, userEdits) {}

URL Book::contentsUrl() const { return contentsOf(document); }

DiffPackSnapshot Book::userEditPack() const {
  return userEdits ? *userEdits : makeUserEditDiffPack(snapshot, contentsUrl());
}

MendableBook::MendableBook(const Document& document_)
    : document(document_),
      snapshot(withoutUserEdits(document.wrapper), document.url),
      userEdits(readablePart(document)) {}

URL MendableBook::contentsUrl() const { return contentsOf(document); }

DiffPackSnapshot MendableBook::userEditPack() const {
  return userEdits ? userEdits->pack : makeUserEditDiffPack(snapshot, contentsUrl());
}

const std::vector<PartialDiffPack::Unreadable>& MendableBook::unreadable() const {
  static const std::vector<PartialDiffPack::Unreadable> none;
  return userEdits ? userEdits->unreadable : none;
}

Document openBookDocument(const std::string& path) {
  auto document = orFailWith(ExitStatus::unreadablePath, path, [&] { return Document(path); });
  if (document.kind != DocumentKind::book) {
    throw CommandFailure{ExitStatus::negative, path + ": this is no book."};
  }
  return document;
}
