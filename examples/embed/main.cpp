// A host in small: opens a book, says how far its learner has come and which files they edited; or, for the
// author, opens a page, writes a line under it and saves the book.
#include <MarletFoundation/MarletFoundation.h>

#include <iostream>

#include "Saving.h"

using namespace MarletFoundation;

namespace {

void printProgress(const MarletBookSnapshot& book) {
  for (const auto& chapter : book.chapters) {
    std::size_t passed = 0;
    for (const auto& page : chapter.pages) {
      if (!page.resultInfoSnapshot) continue;
      const auto& assessment = page.resultInfoSnapshot->assessmentInformation();
      if (assessment && assessment->everPassed) ++passed;
    }
    std::cout << chapter.name << ": " << passed << " of " << chapter.pages.size() << " pages passed\n";
  }
}

void printEditedPages(const DiffPackSnapshot& edits) {
  for (const auto& update : edits.updates) {
    const auto text = mergedUserEdit(edits, update.filePath());
    std::cout << "edited: " << update.filePath() << ", now " << (text ? text->size() : 0) << " bytes\n";
  }
}

void appendLine(const URL& bookURL, const std::string& chapterFilename, const std::string& pageFilename) {
  const MarletBook book{MarletBookSnapshot(FileWrapper(bookURL), bookURL)};
  const auto pageURL =
      bookURL.appendingPathComponent("Contents/Chapters/" + chapterFilename + "/Pages/" + pageFilename, true);
  const MarletBookPage page{MarletBookPageSnapshot(FileWrapper(pageURL), pageURL, std::nullopt)};
  page.text() += u"// The end.\n";
  embed::save(book.snapshot(), chapterFilename, page.snapshot(), bookURL);
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2 && argc != 4) {
    std::cerr << "usage: embed BOOK [CHAPTER PAGE]\n";
    return 2;
  }
  // A host registers the errors that it wants explained in words, and says where diagnostics go.
  registerUserVisibleError<MarletBookSnapshot::SerializationError>();
  registerUserVisibleError<MarletChapterSnapshot::SerializationError>();
  auto environment = HostEnvironment::defaults();
  environment.diagnostics = [](std::string_view) {};
  HostEnvironment::setCurrent(std::move(environment));

  try {
    const auto url = URL::file(argv[1], true);
    if (argc == 4) appendLine(url, argv[2], argv[3]);
    std::optional<DiffPackSnapshot> edits;
    const MarletBookSnapshot book(FileWrapper(url), url, edits);
    std::cout << book.name << " " << book.contentVersion.versionString() << "\n";
    printProgress(book);
    if (edits) printEditedPages(*edits);
  } catch (const Error& error) {
    const ErrorObject object(error);
    std::cerr << object.localizedDescription() << " " << object.localizedRecoverySuggestion().value_or("")
              << "\n";
    return 1;
  }
}
