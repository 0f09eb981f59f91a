#pragma once

#include "MarletFoundation/Marlet/BookPagePlaceholderSnapshot.h"

namespace MarletFoundation {

/// A page's place in a live table of contents. The page itself is fetched when it is wanted, and not linked
/// to this: assign `resultInfoSnapshot` to keep its pass mark up to date.
struct MARLET_EXPORT BookPagePlaceholder {
  std::string name;
  std::string filename;
  std::optional<std::string> pageDescription;
  std::optional<MarletResultInfoSnapshot> resultInfoSnapshot;

  BookPagePlaceholder(std::string name_, std::string filename_, std::optional<std::string> pageDescription_,
                      std::optional<MarletResultInfoSnapshot> resultInfoSnapshot_)
      : name(std::move(name_)),
        filename(std::move(filename_)),
        pageDescription(std::move(pageDescription_)),
        resultInfoSnapshot(std::move(resultInfoSnapshot_)) {}
  explicit BookPagePlaceholder(const BookPagePlaceholderSnapshot& snapshot)
      : BookPagePlaceholder(snapshot.name, snapshot.filename, snapshot.pageDescription,
                            snapshot.resultInfoSnapshot) {}
  BookPagePlaceholder(const BookPagePlaceholder&) = delete;
  BookPagePlaceholder& operator=(const BookPagePlaceholder&) = delete;

  BookPagePlaceholderSnapshot snapshot() const { return BookPagePlaceholderSnapshot(*this); }
};

}  // namespace MarletFoundation
