#include <gtest/gtest.h>

#include "MarletFoundation/MarletFoundation.h"
#include "docs/FormatPage.h"

namespace MarletFoundation::test {
namespace {

/// What the system says: a user's words, an error object's, or else the name of the case that lies innermost.
std::string wordsOf(const Error& error) {
  const auto* payload = dynamic_cast<const ErrorPayload*>(&error);
  if (payload && payload->error && dynamic_cast<const ErrorPayload*>(payload->error.get()))
    return wordsOf(*payload->error);
  if (const auto* visible = dynamic_cast<const UserVisibleError*>(&error))
    return visible->errorContents().localizedRecoverySuggestion;
  return payload ? std::string(error.caseName()) : ErrorObject(error).localizedDescription();
}

/// Opens the book and fetches its pages.
void openBook(const TemporaryDirectory& directory) {
  const auto url = directory.url("Tides.marletbook");
  std::optional<DiffPackSnapshot> edits;
  const MarletBookSnapshot book(FileWrapper(url), url, edits);
  for (const auto& chapter : book.chapters)
    for (const auto& page : chapter.pages)
      snapshotForPageWithFilename(page.filename, chapter.filename, url, &book, edits);
}

struct Format {
  const char* page;
  void (*open)(const TemporaryDirectory&);
};

const Format formats[] = {{"book.md", openBook}};

/// The words in which opening the tree fails; empty when it opens.
std::string answer(const Format& format, const Tree& tree) {
  const TemporaryDirectory directory;
  tree.writeTo(directory.path());
  try {
    format.open(directory);
    return "";
  } catch (const Error& error) {
    return wordsOf(error);
  }
}

}  // namespace

TEST(Formats, ExamplesOpenAndTablesAreTrue) {
  for (const auto& format : formats) {
    const FormatPage page(format.page);
    ASSERT_FALSE(page.files.empty() || page.claims.empty()) << format.page;
    EXPECT_EQ(answer(format, page.example()), "") << format.page;
    for (const auto& claim : page.claims)
      EXPECT_EQ(answer(format, claim.changed), claim.answer) << format.page << ": " << claim.subject;
  }
}

}  // namespace MarletFoundation::test
