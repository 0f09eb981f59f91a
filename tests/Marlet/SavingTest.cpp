#include "examples/embed/Saving.h"

#include <gtest/gtest.h>

#include "support/Documents.h"

namespace MarletFoundation::test {

TEST(SavingABook, PageManifestsAndStoreAtOnce) {
  const TemporaryDirectory directory;
  goodBook()
      .with("Contents/Chapters/One.marletchapter/Pages/A.marletpage/Resources/a.png", "png")
      .with("Contents/Notes.txt", "kept")
      .writeTo(directory.path() / "B");
  const auto url = directory.url("B");
  const auto pageURL =
      url.appendingPathComponent("Contents/Chapters/One.marletchapter/Pages/A.marletpage", true);
  MarletBook book{MarletBookSnapshot(FileWrapper(url), url)};
  MarletBookPage page{MarletBookPageSnapshot(FileWrapper(pageURL), pageURL, std::nullopt)};
  book.chapters[1]->name = "Zwei";
  book.keyValueStore.setContents({});
  page.text() = u"print(2)\n";
  embed::save(book.snapshot(), "One.marletchapter", page.snapshot(), url);

  const FileWrapper tree(url);
  const MarletBookSnapshot saved(tree, url);
  EXPECT_EQ(saved.chapters[1].name, "Zwei");
  EXPECT_TRUE(saved.keyValueStore.contents().empty());
  EXPECT_FALSE(tree.child("Edits")->child("KeyValueStore.plist"));
  EXPECT_EQ(MarletBookPageSnapshot(FileWrapper(pageURL), pageURL, std::nullopt), page.snapshot());
  EXPECT_EQ(FileWrapper(pageURL).child("Resources")->child("a.png")->regularFileContents()->view(), "png");
  EXPECT_EQ(tree.child("Contents")->child("Notes.txt")->regularFileContents()->view(), "kept");
  EXPECT_TRUE(
      tree.child("Contents")->child("Manifest.plist")->regularFileContents()->view().starts_with("<?xml"));

  // What can't be written leaves the book as it was.
  page.setName("\xC3(");
  EXPECT_THROW(embed::save(book.snapshot(), "One.marletchapter", page.snapshot(), url), Error);
  EXPECT_EQ(MarletBookPageSnapshot(FileWrapper(pageURL), pageURL, std::nullopt).name(), "A");
}

}  // namespace MarletFoundation::test
