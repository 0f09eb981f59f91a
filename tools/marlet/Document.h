#pragma once

#include <string>

#include "Ending.h"
#include "MarletFoundation/Platform/FileWrapper.h"

enum class DocumentKind { book, classic, unknown };

/// A document as the command line names it: a path and what lies there.
struct Document {
  std::string path;
  MarletFoundation::URL url;
  MarletFoundation::FileWrapper wrapper;
  DocumentKind kind;

  /// Throws the file error when the path can't be read at all.
  explicit Document(const std::string& path);
};

/// What `use` makes of the document that `open` opens. One that another process replaces meanwhile is opened
/// again, so that the answer is about the old one or the new one and no mixture; `use` may thus run more than once,
/// but never again after its change is made.
template <class Open, class Use>
auto withSettled(Open open, Use use) {
  constexpr int mostAttempts = 1000;
  for (int attempt = 1;; ++attempt) {
    const Document document = open();
    const auto isSettled = [&] {
      return isChangeMade() || !document.wrapper.wasReplaced() || attempt == mostAttempts;
    };
    try {
      auto result = use(document);
      if (isSettled()) return result;
    } catch (...) {
      if (isSettled()) throw;
    }
  }
}
