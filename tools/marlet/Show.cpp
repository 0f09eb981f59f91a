#include "Show.h"

#include <functional>
#include <iostream>

#include "Document.h"
#include "Guarded.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "ShowMarlet.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

/// Whether the page was ever passed; nothing for a page that keeps no record.
std::optional<bool> passed(const BookPagePlaceholderSnapshot& page) {
  if (!page.resultInfoSnapshot) return std::nullopt;
  const auto& assessment = page.resultInfoSnapshot->assessmentInformation();
  return assessment && assessment->everPassed;
}

ordered_json json(const BookPagePlaceholderSnapshot& page) {
  const auto pass = passed(page);
  return {{"name", page.name},
          {"filename", page.filename},
          {"description", orNull(page.pageDescription)},
          {"passed", pass ? ordered_json(*pass) : ordered_json(nullptr)}};
}

ordered_json json(const MarletChapterSnapshot& chapter) {
  auto pages = ordered_json::array();
  for (const auto& page : chapter.pages) pages.push_back(json(page));
  return {{"name", chapter.name},
          {"filename", chapter.filename},
          {"description", orNull(chapter.chapterDescription)},
          {"imageReference", orNull(chapter.imageReference)},
          {"pages", std::move(pages)}};
}

/// All but the store.
ordered_json json(const MarletBookSnapshot& book) {
  auto chapters = ordered_json::array();
  for (const auto& chapter : book.chapters) chapters.push_back(json(chapter));
  return {{"name", book.name},
          {"filename", book.filename},
          {"description", orNull(book.bookDescription)},
          {"contentIdentifier", book.contentIdentifier},
          {"contentVersion", book.contentVersion.versionString()},
          {"uniquifier", book.uniquifier},
          {"target", {{"identifier", book.target->identifier}, {"targetOS", book.target->targetOS}}},
          {"imageReference", orNull(book.imageReference)},
          {"chapters", std::move(chapters)}};
}

void printTree(const MarletBookSnapshot& book, const Terminal& terminal) {
  using Style = Terminal::Style;
  const auto dim = [&](const std::string& text) { return terminal.styled(Style::dim, printable(text)); };
  std::cout << terminal.styled(Style::bold, printable(book.name)) << " "
            << dim(book.contentVersion.versionString() + " for " + book.target->targetOS) << "\n";
  if (book.bookDescription) std::cout << printable(*book.bookDescription) << "\n";
  for (std::size_t c = 0; c < book.chapters.size(); ++c) {
    const auto& chapter = book.chapters[c];
    const bool isLastChapter = c + 1 == book.chapters.size();
    std::cout << (isLastChapter ? "└─ " : "├─ ") << terminal.styled(Style::bold, printable(chapter.name))
              << " " << dim(chapter.filename) << "\n";
    for (std::size_t p = 0; p < chapter.pages.size(); ++p) {
      const auto& page = chapter.pages[p];
      const auto pass = passed(page);
      std::cout << (isLastChapter ? "   " : "│  ") << (p + 1 == chapter.pages.size() ? "└─ " : "├─ ")
                << (!pass   ? "  "
                    : *pass ? terminal.styled(Style::green, "✓ ")
                            : "· ")
                << printable(page.name) << " " << dim(page.filename) << "\n";
    }
  }
}

void showBook(const MarletBookSnapshot& book, bool asJSON, const Terminal& terminal) {
  if (asJSON) {
    std::cout << dumpedWith(json(book), "keyValueStore", book.keyValueStore.contents()) << "\n";
  } else {
    printTree(book, terminal);
  }
}

}  // namespace

ExitStatus show(const std::string& path, bool asJSON, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto open = [&] {
      return orFailWith(ExitStatus::unreadablePath, path, [&] { return Document(path); });
    };
    const auto print = readOneState(path, open, [&](const Document& document) -> std::function<void()> {
      if (document.kind == DocumentKind::unknown)
        throw CommandFailure{ExitStatus::negative, path + ": this is neither a book nor a classic document."};
      if (document.kind == DocumentKind::classic) {
        const auto marlet = std::make_shared<const MarletSnapshot>(document.wrapper, document.url);
        return [=, &terminal] { showMarlet(*marlet, asJSON, terminal); };
      }
      const auto book = std::make_shared<const MarletBookSnapshot>(document.wrapper, document.url);
      return [=, &terminal] { showBook(*book, asJSON, terminal); };
    });
    print();
    return ExitStatus::good;
  });
}
