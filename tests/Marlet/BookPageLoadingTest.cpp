#include "MarletFoundation/Marlet/BookPageLoading.h"

#include <gtest/gtest.h>

#include "MarletFoundation/Marlet/CutsceneBookPageSnapshot.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"
#include "support/Documents.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

const std::string chapter = "One.marletchapter";
const std::string pathOfA = "Chapters/One.marletchapter/Pages/A.marletpage/";

/// A book on disk, as a learner has it.
class BookPageLoading : public testing::Test {
 protected:
  void write(const Tree& tree) {
    std::filesystem::remove_all(directory_.path() / "L.marletbook");
    tree.writeTo(directory_.path() / "L.marletbook");
  }

  DiffPackSnapshot pack(std::vector<MarletDiff::FileDiffDescriptor> updates) const {
    return {DiffPackType::UserEditPack,
            DiffPackDocumentType::MarletBook,
            url().appendingPathComponent("Contents", true),
            "org.example.loops",
            "1.2",
            "1.2",
            FileDiffDescriptors(std::move(updates))};
  }

  URL url() const { return directory_.url("L.marletbook"); }

  std::string failure(const std::string& page, const std::string& inChapter = chapter,
                      const std::optional<DiffPackSnapshot>& pack = {}) const {
    return test::failure([&] { snapshotForPageWithFilename(page, inChapter, url(), nullptr, pack); });
  }

  std::u16string textOfA(const std::optional<DiffPackSnapshot>& pack = {}) const {
    const auto page = snapshotForPageWithFilename("A.marletpage", chapter, url(), nullptr, pack);
    return dynamic_cast<const MarletBookPageSnapshot&>(*page).text();
  }

  const TemporaryDirectory directory_;
};

}  // namespace

TEST_F(BookPageLoading, KindsByExtension) {
  const auto pages = "Contents/Chapters/" + chapter;
  write(goodBook()
            .withKey(pages + "/Manifest.plist", "Pages",
                     PropertyListValue::Array{"A.marletpage", "B.cutscenepage", "x.page"})
            .with(pages + "/Pages/x.page/Manifest.plist", PropertyListDictionary{{"Name", "X"}}));
  EXPECT_EQ(textOfA(), u"print(1)\n");
  const auto cutscene = snapshotForPageWithFilename("B.cutscenepage", chapter, url());
  EXPECT_EQ(dynamic_cast<const CutsceneBookPageSnapshot&>(*cutscene).cutsceneAssetReference(), "b.html");
  EXPECT_EQ(failure("x.page"), "UnknownPageType(\"page\")");
  EXPECT_EQ(failure("y.page"), "NoSuchPage(\"y.page\")");
  EXPECT_EQ(failure("y.page", "Three"), "NoSuchChapter(\"Three\")");
  write(goodBook().without("Contents/Manifest.plist"));
  EXPECT_EQ(failure("A.marletpage"), "missingManifest");
}

TEST_F(BookPageLoading, TheLearnersPackIsReadThrough) {
  using FileDiff = MarletDiff::FileDiffDescriptor;
  write(goodBook());
  const FileDiff edit{FileDiff::Replaced{pathOfA + "Contents.swift", Data(std::string("print(2)\n"))}};
  EXPECT_EQ(textOfA(pack({edit})), u"print(2)\n");
  EXPECT_EQ(failure("A.marletpage", chapter, pack({{FileDiff::Removed{pathOfA + "Contents.swift"}}})),
            "MissingContentsFile");

  // Removed, the author's record doesn't show through.
  const auto page = snapshotForPageWithFilename("A.marletpage", chapter, url(), nullptr,
                                                pack({{FileDiff::Removed{pathOfA + "ResultInfo.plist"}}}));
  EXPECT_FALSE(dynamic_cast<const MarletPageType&>(*page).passed());

  // The book's own is found without being passed in, and one that is passed in goes before it. With either,
  // a directory in the place of a record isn't looked at.
  write(goodBook()
            .without("Contents/" + pathOfA + "ResultInfo.plist")
            .with("Contents/" + pathOfA + "ResultInfo.plist/", std::string()));
  pack({edit}).fileWrapper().write(
      url().appendingPathComponent("Edits").appendingPathComponent("UserEdits.diffpack"));
  EXPECT_EQ(textOfA(), u"print(2)\n");
  const FileDiff other{FileDiff::Replaced{pathOfA + "Contents.swift", Data(std::string("3"))}};
  EXPECT_EQ(textOfA(pack({other})), u"3");
}

TEST_F(BookPageLoading, ABookThatIsPassedInIsNotReadAgain) {
  write(goodBook());
  std::optional<DiffPackSnapshot> pack;
  const MarletBookSnapshot book(FileWrapper(url()), url(), pack);
  std::filesystem::remove(directory_.path() / "L.marletbook/Contents/Manifest.plist");
  EXPECT_EQ(snapshotForPageWithFilename("A.marletpage", chapter, url(), &book)->name(), "A");
  write(goodBook().with("Edits/UserEdits.diffpack", std::string("x")));
  EXPECT_THROW(snapshotForPageWithFilename("A.marletpage", chapter, url(), &book), ErrorObject);
  write(goodBook().without("Edits"));
  EXPECT_EQ(snapshotForPageWithFilename("A.marletpage", chapter, url(), &book)->name(), "A");
  std::filesystem::remove_all(directory_.path() / "L.marletbook/Contents/Chapters");
  EXPECT_THROW(snapshotForPageWithFilename("A.marletpage", chapter, url(), &book), ErrorObject);
}

}  // namespace MarletFoundation::test
