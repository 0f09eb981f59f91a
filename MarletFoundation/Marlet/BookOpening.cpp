#include "MarletFoundation/Marlet/BookOpening.h"

#include "MarletFoundation/Platform/OneState.h"

namespace MarletFoundation {

OpenedBook openBook(const URL& url) {
  return readOneState(
      url.path(), [&] { return FileWrapper(url); },
      [&](const FileWrapper& document) {
        std::optional<DiffPackSnapshot> userEdits;
        MarletBookSnapshot snapshot(document, url, userEdits);
        return OpenedBook{document, std::move(snapshot), std::move(userEdits)};
      });
}

}  // namespace MarletFoundation
