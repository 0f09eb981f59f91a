#include <gtest/gtest.h>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Marlet/BookPageLoading.h"
#include "MarletFoundation/Marlet/CutsceneBookPage.h"
#include "MarletFoundation/Marlet/MarletBookPage.h"
#include "support/Documents.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using D = PropertyListDictionary;
using A = PropertyListValue::Array;

const std::string manifest = "Manifest.plist";
const std::string source = "Contents.swift";
const std::string notAPlist = "<plist><oops></plist>";
const std::string notUTF8 = "\xC3(";

/// A code page with all that one can have.
Tree fullPage() {
  return {{manifest,
           PropertyListValue(D{{"Name", "Stairs"},
                               {"Description", "Up"},
                               {"ImageReference", "http://stairs"},
                               {"LiveViewMode", "AlwaysVisible"},
                               {"LiveViewEdgeToEdge", false},
                               {"PosterReference", "poster.png"},
                               {"MarletLoggingMode", "Off"},
                               {"Hints", A{D{{"Content", "Count."}, {"FileReference", 7}},
                                           D{{"FileReference", "climb.md"}, {"SpoilerButtonTitle", ""}}}}})},
          {source, "hop()\n"},
          {"LiveView.swift", "view\n"},
          {"ResultInfo.plist",
           PropertyListValue(
               D{{"Version", "1.0"},
                 {"AssessmentInformation", D{{"Status", D{{"Status", "Fail"}}}, {"EverPassed", true}}}})},
          {"Sources/S.swift", "let s = 1\n"},
          {"Resources/climb.md", "Use *stair*."}};
}

Tree cutscene() {
  return {{manifest, PropertyListValue(D{{"Name", "Film"}, {"CutsceneReference", "film.html"}})},
          {"Resources/film.html", "<html></html>"}};
}

Tree asFile(const Tree& tree, const std::string& path) { return tree.without(path).with(path, "file"); }
Tree asDirectory(const Tree& tree, const std::string& path) {
  return tree.without(path).with(path + "/", std::string());
}
Tree withHint(D hint) { return fullPage().withKey(manifest, "Hints", A{std::move(hint)}); }

const URL pageURL = URL::file("/books/L.marletbook/Contents/Chapters/C/Pages/Stairs.marletpage", true);

MarletBookPageSnapshot load(const Tree& tree) { return {tree.wrapper(), pageURL, std::nullopt}; }

}  // namespace

TEST(MarletBookPageSnapshot, HoldsWhatTheDirectorySays) {
  const auto page = load(fullPage());
  EXPECT_EQ(page.name(), "Stairs");
  EXPECT_EQ(page.pageDescription(), "Up");
  EXPECT_EQ(page.imageReference(), "http://stairs");
  EXPECT_EQ(page.filename(), "Stairs.marletpage");
  EXPECT_EQ(page.text(), u"hop()\n");
  EXPECT_TRUE(page.passed());
  EXPECT_EQ(page.sourcesDirectoryURL(), pageURL.appendingPathComponent("Sources", true));
  EXPECT_EQ(page.resourcesDirectoryURL(), pageURL.appendingPathComponent("Resources", true));
  EXPECT_EQ(page.liveViewSourceFileURL(), pageURL.appendingPathComponent("LiveView.swift"));
  EXPECT_EQ(page.liveViewMode(), LiveViewMode::VisibleByDefault);
  EXPECT_FALSE(page.liveViewEdgeToEdge());
  EXPECT_EQ(page.posterReference(), "poster.png");
  EXPECT_EQ(page.marletLoggingMode(), MarletLoggingMode::Off);
  EXPECT_EQ(page.hints(), (std::vector<MarletHint>{
                              {MarletHint::Contents{"Count."}, MarletHint::AlwaysVisible{}},
                              {MarletHint::FileReference{"Use *stair*.", "climb.md"},
                               MarletHint::HiddenWithSpoilerInstruction{""}},
                          }));
}

TEST(MarletBookPageSnapshot, DefaultsThatNeverFail) {
  const Tree bare{{manifest, PropertyListValue(D{{"Name", "N"}, {"LiveViewMode", "HiddenByDefault"}})},
                  {source, ""}};
  const auto page = load(bare.withKey(manifest, "LiveViewEdgeToEdge", "no"));
  EXPECT_EQ(page,
            MarletBookPageSnapshot("N", {}, {}, "Stairs.marletpage", u"", {}, {}, {}, {},
                                   LiveViewMode::HiddenByDefault, true, {}, MarletLoggingMode::Normal, {}));
  EXPECT_EQ(load(bare.withKey(manifest, "LiveViewMode", "AutomaticallyShowAndHide")).liveViewMode(),
            LiveViewMode::HiddenByDefault);
  EXPECT_EQ(load(bare.with("ResultInfo.plist", notAPlist)).resultInfo(), MarletResultInfoSnapshot());
  EXPECT_FALSE(page.passed());
}

TEST(MarletBookPageSnapshot, EveryFailure) {
  const auto good = fullPage();
  const auto withKey = [&](const char* key, PropertyListValue value) {
    return good.withKey(manifest, key, std::move(value));
  };
  const std::vector<std::pair<Tree, std::string>> cases{
      {good.without(manifest), "MissingManifest"},
      {asDirectory(good, manifest), "MissingManifest"},
      {good.with(manifest, PropertyListValue(A{})), "ManifestNotADictionary"},
      {good.withoutKey(manifest, "Name"), "MissingName"},
      {withKey("Name", 7), "MissingName"},
      {withKey("Description", 7), "DescriptionNotAString"},
      {good.without(source), "MissingContentsFile"},
      {asDirectory(good, source), "MissingContentsFile"},
      {good.with(source, notUTF8), "InvalidContentsFile"},
      {asDirectory(good, "ResultInfo.plist"), "ResultInfoNotAFile"},
      {asFile(good, "Sources"), "SourcesNotADirectory"},
      {asFile(good, "Resources"), "ResourcesNotADirectory"},
      {asDirectory(good, "LiveView.swift"), "LiveViewSourceFileNotAFile"},
      {withKey("ImageReference", 7), "ImageReferenceNotAString"},
      {good.without("Resources"), "ImageReferenceWithoutResources"},
      {good.withoutKey(manifest, "LiveViewMode"), "MissingLiveViewMode"},
      {withKey("LiveViewMode", 7), "MissingLiveViewMode"},
      {withKey("LiveViewMode", "visiblebydefault"), "InvalidLiveViewMode(\"visiblebydefault\")"},
      {withKey("PosterReference", 7), "PosterReferenceNotAString"},
      {withKey("MarletLoggingMode", 7), "MarletLoggingModeNotAString"},
      {withKey("MarletLoggingMode", "off"), "InvalidMarletLoggingMode(\"off\")"},
      {withKey("Hints", "none"), "HintsNotAnArray"},
      {withKey("Hints", A{"none"}), "HintNotADictionary"},
      {withHint({}), "HintContentMissing"},
      {withHint({{"Content", 7}, {"FileReference", "climb.md"}}), "HintContentNotAString"},
      {withHint({{"FileReference", 7}}), "HintContentReferenceNotAString"},
      {withHint({{"FileReference", "climb.md"}}).withoutKey(manifest, "ImageReference").without("Resources"),
       "HintContentReferenceWithoutResources"},
      {withHint({{"FileReference", "../Contents.swift"}}), "HintContentReferenceMissingFile"},
      {withHint({{"FileReference", "bad.md"}}).with("Resources/bad.md", notUTF8), "InvalidHintContentFile"},
      {withHint({{"Content", "x"}, {"SpoilerButtonTitle", 7}}), "HintSpoilerButtonTitleNotAString"},
      // Where two failures compete.
      {asDirectory(good, "ResultInfo.plist").with(source, notUTF8), "ResultInfoNotAFile"},
      {asDirectory(good, "ResultInfo.plist").without(source), "MissingContentsFile"},
      {asFile(good, "Sources").with("ResultInfo.plist", notAPlist), "SourcesNotADirectory"},
      {asFile(good, "Sources").with(source, notUTF8), "InvalidContentsFile"},
      {withHint({{"SpoilerButtonTitle", 7}}), "HintContentMissing"},
      {asFile(withHint({{"FileReference", "climb.md"}}), "Resources"), "ResourcesNotADirectory"},
  };
  for (const auto& [tree, expected] : cases) EXPECT_EQ(failure([&t = tree] { load(t); }), expected) << tree;
  EXPECT_TRUE(failure([&] { load(good.with(manifest, notAPlist)); }).starts_with("InvalidManifest("));
  EXPECT_EQ(failure([&] {
              MarletBookPageSnapshot(FileWrapper::regularFile(Data(std::string("x"))), pageURL, std::nullopt);
            }),
            "NotADirectory");
}

TEST(MarletBookPageSnapshot, WritesWhatItHolds) {
  const TemporaryDirectory directory;
  fullPage().writeTo(directory.path() / "P.marletpage");
  const auto url = directory.url("P.marletpage");
  const MarletBookPageSnapshot page(FileWrapper(url), url, std::nullopt);
  page.fileWrapper().write(url);
  EXPECT_EQ(MarletBookPageSnapshot(FileWrapper(url), url, std::nullopt), page);
  const auto written = FileWrapper(url).child(manifest)->regularFileContents();
  EXPECT_TRUE(written->view().starts_with("bplist00"));
  const auto keys = fromPropertyListData<PropertyListValue>(*written);
  EXPECT_EQ(*keys.dictionary()->find("LiveViewMode"), PropertyListValue("VisibleByDefault"));
  EXPECT_EQ(*keys.dictionary()->find("Hints"),
            PropertyListValue(
                A{D{{"Content", "Count."}}, D{{"FileReference", "climb.md"}, {"SpoilerButtonTitle", ""}}}));

  std::filesystem::remove_all(directory.path() / "P.marletpage" / "Sources");
  EXPECT_FALSE(page.fileWrapper().child("Sources"));
  EXPECT_TRUE(page.fileWrapper().child("Resources"));
}

TEST(CutsceneBookPageSnapshot, EveryFailureAndTheDisksAnswer) {
  const TemporaryDirectory directory;
  cutscene().writeTo(directory.path());
  const auto load = [&](const Tree& tree) { CutsceneBookPageSnapshot(tree.wrapper(), directory.url()); };
  const auto good = cutscene();
  const auto withKey = [&](const char* key, PropertyListValue value) {
    return good.withKey(manifest, key, std::move(value));
  };
  const std::string missing =
      R"(MissingCutsceneAssetForLocalReference(Error(domain: POSIX, code: 2, "No such file or directory")))";
  const std::vector<std::pair<Tree, std::string>> cases{
      {good, ""},
      {good.without(manifest), "MissingManifest"},
      {good.with(manifest, PropertyListValue(A{})), "ManifestNotADictionary"},
      {withKey("Name", 7), "MissingName"},
      {withKey("Description", 7), "DescriptionNotAString"},
      {asFile(good, "Resources").withoutKey(manifest, "CutsceneReference"), "ResourcesNotADirectory"},
      {good.withoutKey(manifest, "CutsceneReference"), "MissingCutsceneAssetReference"},
      {withKey("CutsceneReference", 7).without("Resources"), "InvalidCutsceneAssetReference(\"integer(7)\")"},
      {withKey("CutsceneReference", "two words").without("Resources"),
       "CutsceneAssetReferencesWithoutResources"},
      {withKey("CutsceneReference", "two words"), "InvalidCutsceneAssetReference(\"two words\")"},
      {withKey("CutsceneReference", "b.html").with("Resources/b.html", ""), missing},
      {withKey("CutsceneReference", "b.html").withKey(manifest, "ImageReference", 7), missing},
      {withKey("ImageReference", 7).withKey(manifest, "PosterReference", 7), "ImageReferenceNotAString"},
      {withKey("PosterReference", 7), "PosterReferenceNotAString"},
  };
  for (const auto& [tree, expected] : cases)
    EXPECT_EQ(failure([&t = tree, &load] { load(t); }), expected) << tree;
  EXPECT_TRUE(failure([&] { load(good.with(manifest, "7")); }).starts_with("InvalidManifest("));
  EXPECT_EQ(failure([&] { CutsceneBookPageSnapshot(FileWrapper::regularFile(Data()), directory.url()); }),
            "NotADirectory");
}

TEST(CutsceneBookPageSnapshot, WritesItsResourcesOrThrows) {
  const TemporaryDirectory directory;
  cutscene().withKey(manifest, "PosterReference", "p").writeTo(directory.path());
  const CutsceneBookPageSnapshot page(FileWrapper(directory.url()), directory.url());
  const auto live = page.convertToMutablePage();
  EXPECT_EQ(dynamic_cast<const CutsceneBookPage&>(*live).snapshot(), page);
  const auto written = page.fileWrapper();
  EXPECT_EQ(CutsceneBookPageSnapshot(written, directory.url()), page);
  EXPECT_EQ(written.child("Resources")->child("film.html")->regularFileContents()->view(), "<html></html>");
  std::filesystem::remove_all(directory.path() / "Resources");
  EXPECT_THROW(page.fileWrapper(), ErrorObject);
}

}  // namespace MarletFoundation::test
