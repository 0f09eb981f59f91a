#include "Book.h"

using namespace MarletFoundation;

Book::Book(const Document& document_)
    : document(document_), snapshot(document.wrapper, document.url, userEdits) {}

URL Book::contentsUrl() const { return document.url.appendingPathComponent("Contents", true); }

DiffPackSnapshot Book::userEditPack() const {
  return userEdits ? *userEdits : makeUserEditDiffPack(snapshot, contentsUrl());
}

Document openBookDocument(const std::string& path) {
  auto document = orFailWith(ExitStatus::unreadablePath, path, [&] { return Document(path); });
  if (document.kind != DocumentKind::book) {
    throw CommandFailure{ExitStatus::negative, path + ": this is no book."};
  }
  return document;
}
