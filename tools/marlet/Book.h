#pragma once

#include <optional>
#include <string>

#include "Document.h"
#include "Guarded.h"
#include "MarletFoundation/MarletFoundation.h"

/// A book as a command opens it, with what the learner changed in it.
struct Book {
  const Document& document;
  std::optional<MarletFoundation::DiffPackSnapshot> userEdits;
  MarletFoundation::MarletBookSnapshot snapshot;

  /// Throws the error of a book that doesn't load.
  explicit Book(const Document& document);

  MarletFoundation::URL contentsUrl() const;
  /// The learner's pack; an empty one where the book has none.
  MarletFoundation::DiffPackSnapshot userEditPack() const;
};

/// A book for who mends its learner's pack: it opens whatever the pack is like, and the pack as far as it can be read.
struct MendableBook {
  const Document& document;
  /// As authored.
  MarletFoundation::MarletBookSnapshot snapshot;
  std::optional<MarletFoundation::PartialDiffPack> userEdits;

  /// Throws the error of a book that doesn't load as authored, and `CommandFailure` for a pack of which nothing can
  /// be read.
  explicit MendableBook(const Document& document);

  MarletFoundation::URL contentsUrl() const;
  /// What can be read of the learner's pack; an empty one where the book has none.
  MarletFoundation::DiffPackSnapshot userEditPack() const;
  const std::vector<MarletFoundation::PartialDiffPack::Unreadable>& unreadable() const;
};

/// Throws `CommandFailure` for a path that can't be read or is no book.
Document openBookDocument(const std::string& path);

/// What `use` makes of one state of the book at the path; see `readOneState`. It may run more than once.
template <class BookType = Book, class Use>
auto withBook(const std::string& path, Use use) {
  return MarletFoundation::readOneState(
      path, [&] { return openBookDocument(path); },
      [&](const Document& document) {
        const BookType book(document);
        return use(book);
      });
}
