#include "MarletFoundation/DiffPack/CheckedUpdate.h"

#include <gtest/gtest.h>

#include <cerrno>

#include "DiffPack/Packs.h"
#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/DiffPack/UpdateDiffPack.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "support/Documents.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using namespace std::string_literals;

const std::string chapter = "Chapters/One.marletchapter";
const std::string page = chapter + "/Pages/A.marletpage";
const std::string text = page + "/Contents.swift";

/// A book whose learner wrote "7" for the page's "1", drew something and changed the store.
class CheckedUpdates : public testing::Test {
 protected:
  CheckedUpdates() {
    std::filesystem::create_directory(directory_.path() / "source");
    goodBook()
        .with("Edits/UserResources/drawing", "mine")
        .with("Contents/Chapters/Two.marletchapter/Pages/C.marletpage/Manifest.plist", D{{"Name", "no mode"}})
        .writeTo(directory_.path() / "b.marletbook");
    const std::vector<FileDiff> edits{{FileDiff::Modified{text, {{{6, 1}, {6, 1}, u"1", u"7"}}}}};
    const DiffPackSnapshot pack(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, url_,
                                "org.example.loops", "1.2", "1.2", edits);
    pack.fileWrapper().write(directory_.url("b.marletbook/Edits/UserEdits.diffpack"));
  }

  DiffPackSnapshot update(std::vector<FileDiff> updates, const std::string& version = "1.2.1") const {
    return {DiffPackType::UpdatePack,
            DiffPackDocumentType::MarletBook,
            directory_.url("source"),
            "org.example.loops",
            "1.2",
            version,
            std::move(updates)};
  }
  /// "KIND FILE" of each conflict.
  std::string conflicts(const DiffPackSnapshot& pack) const {
    std::string found;
    for (const auto& conflict : checkedUpdate(url_, pack).conflicts)
      found += std::to_string(static_cast<int>(conflict.kind)) + " " + conflict.file + "; ";
    return found;
  }
  std::string learnersText() const {
    std::optional<DiffPackSnapshot> pack;
    MarletBookSnapshot(FileWrapper(url_), url_, pack);
    return std::string(mergedUserEdit(*pack, text)->view());
  }

  const TemporaryDirectory directory_;
  const URL url_ = directory_.url("b.marletbook");
};

TEST_F(CheckedUpdates, RefuseWhatHarmsTheBookOrItsLearner) {
  const auto cutscene = [](const std::string& asset) {
    return PropertyListValue(D{{"Name", "N"}, {"CutsceneReference", asset}});
  };
  const auto listing = [](const std::string& name) {
    return PropertyListValue(D{{"Name", "One"}, {"Pages", A{"A.marletpage", "B.cutscenepage", name}}});
  };
  Tree{{"source/" + chapter + "/Manifest.plist", "garbage"s},
       {"source/" + text, "x"s},
       {"source/Manifest.plist", "garbage"s},
       {"source/listing/gone", listing("gone.marletpage")},
       {"source/listing/new", listing("N.cutscenepage")}}
      .writeTo(directory_.path());
  const auto removed = [](const std::string& path) { return FileDiff{FileDiff::Removed{path}}; };
  const auto replaced = [](const std::string& path) { return FileDiff{FileDiff::Replaced{path}}; };
  const std::string opens = "1 ", loses = "2 ", fits = "3 ", all = "Contents; ",
                    once = "Contents/" + chapter + "; ";
  const std::pair<std::vector<FileDiff>, std::string> cases[] = {
      {{removed("Edits")}, loses + "Edits; "},
      {{removed("Edits//UserResources/drawing/")}, loses + "Edits//UserResources/drawing/; "},
      {{removed("Edits/UserEdits.diffpack")}, loses + "Edits/UserEdits.diffpack; "},
      {{removed("Edits/nothing"), removed("../Edits")}, ""},
      {{removed("Contents")}, opens + all},
      {{removed("Contents/Chapters"), removed("Edits/KeyValueStore.plist")},
       loses + "Edits/KeyValueStore.plist; " + opens + all + fits + "Contents/" + text + "; "},
      {{removed("Contents/" + text)}, opens + "Contents/" + page + "; " + fits + "Contents/" + text + "; "},
      {{removed("Contents/" + chapter + "/Pages/B.cutscenepage/Resources/b.html")},
       opens + "Contents/" + chapter + "/Pages/B.cutscenepage; "},
      {{replaced("Manifest.plist")}, opens + all},
      {{replaced(chapter + "/Manifest.plist")}, opens + once},
      {{replaced(text)}, fits + "Contents/" + text + "; "},
      {{replaced(page)},
       opens + once.substr(0, once.size() - 2) + "/Pages/A.marletpage; " + fits + "Contents/" + text + "; "},
      // Carried over, and then replaced all the same.
      {{{FileDiff::Modified{text, {{{0, 0}, {}, u"", u"//\n"}}}}, replaced(text)},
       fits + "Contents/" + text + "; "},
      // By another spelling the learner's changes aren't carried over.
      {{{FileDiff::Modified{page + "//Contents.swift", {{{0, 0}, {}, u"", u"//\n"}}}}},
       fits + "Contents/" + text + "; "},
      {{{FileDiff::Modified{text, {{{0, 0}, {}, u"", u"//\n"}}}}}, ""},
  };
  const auto before = learnersText();
  for (const auto& [updates, expected] : cases) {
    EXPECT_EQ(conflicts(update(updates)), expected) << updates[0].filePath();
    if (expected.empty()) continue;
    const auto error = thrown<ErrorObject>([&, &pack = updates] { applyCheckedUpdate(url_, update(pack)); });
    EXPECT_EQ(error.code(), static_cast<int>(DiffErrorCode::CriticalMergeError));
    EXPECT_NE(error.description().find(expected.substr(2, expected.find(';') - 2)), std::string::npos);
    EXPECT_EQ(learnersText(), before);
  }

  // A page that is new has to open, with what comes with it and isn't on disk.
  const auto pages = "source/" + chapter + "/Pages/N.cutscenepage/";
  const auto withNewPage = [&](const std::string& manifest, const std::string& asset) {
    Tree{{"source/" + chapter + "/Manifest.plist", listing(manifest)},
         {pages + "Manifest.plist", cutscene(asset)},
         {pages + "Resources/n.html", "new"s}}
        .writeTo(directory_.path());
    return conflicts(
        update({replaced(chapter + "/Manifest.plist"), replaced(chapter + "/Pages/N.cutscenepage")}));
  };
  EXPECT_EQ(withNewPage("N.cutscenepage", "n.html"), "");
  EXPECT_EQ(withNewPage("N.cutscenepage", "none.html"),
            opens + "Contents/" + chapter + "/Pages/N.cutscenepage; ");
  EXPECT_EQ(withNewPage("none.cutscenepage", "n.html"), opens + once);
}

/// A pack or text that can't be read at the moment isn't taken for none.
TEST_F(CheckedUpdates, EndWhereTheLearnersWorkCannotBeRead) {
  std::filesystem::resize_file(directory_.path() / "b.marletbook/Contents" / text,
                               (std::uintmax_t{1} << 30) + 1);
  EXPECT_EQ(thrown<ErrorObject>([&] { conflicts(update({{FileDiff::Replaced{text}}})); }).code(), EFBIG);
}

/// Insertions fit a text however often they are made.
TEST_F(CheckedUpdates, AreAppliedOnce) {
  const auto pack = update({{FileDiff::Modified{text, {{{0, 0}, {}, u"", u"//\n"}}}}});
  applyCheckedUpdate(url_, pack);
  EXPECT_EQ(learnersText(), "//\nprint(7)\n");
  EXPECT_EQ(conflicts(pack), "0 Contents/Manifest.plist; ");
  EXPECT_EQ(conflicts(update({}, "1.2")), "");
  EXPECT_EQ(failure([&] { checkedUpdate(directory_.url("b.other"), pack); }),
            failure([&] { applyUpdateDiffPack(directory_.url("b.other"), pack); }));
}

}  // namespace
}  // namespace MarletFoundation::test
