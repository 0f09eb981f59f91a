#include "MarletFoundation/Marlet/MarletBookSnapshot.h"

#include <gtest/gtest.h>

#include <cmath>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "support/Documents.h"
#include "support/FailingAllocation.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using D = PropertyListDictionary;
using A = PropertyListValue::Array;

const URL baseURL = URL::file("/books/Loops.marletbook", true);
const std::string book = "Contents/Manifest.plist";
const std::string one = "Contents/Chapters/One.marletchapter";
const std::string pageA = one + "/Pages/A.marletpage";
const std::string notAPlist = "<plist><oops></plist>";

MarletBookSnapshot open(const Tree& tree) { return MarletBookSnapshot(tree.wrapper(), baseURL); }

/// What is wrong with a document: the error's printed form, then its words where users see them.
std::string failureOf(const Tree& tree) {
  const auto error = errorOf([&] { open(tree); });
  if (!error) return "";
  const auto* visible = dynamic_cast<const UserVisibleError*>(error.get());
  if (!visible) return error->description();
  const auto words = visible->errorContents();
  return error->description() + " | " + words.localizedDescription + " | " +
         words.localizedRecoverySuggestion;
}

struct BadDocument {
  Tree tree;
  std::string failure;
};

void expectFailures(const std::vector<BadDocument>& cases) {
  for (const auto& c : cases) EXPECT_EQ(failureOf(c.tree), c.failure) << c.tree;
}

Tree emptyPath(const Tree& tree, const std::string& path) {
  return tree.without(path).with(path + "/", std::string());
}
Tree asFile(const Tree& tree, const std::string& path) {
  return tree.without(path).with(path, std::string("file"));
}

class BookSnapshot : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    registerUserVisibleError<MarletBookSnapshot::SerializationError>();
    registerUserVisibleError<MarletChapterSnapshot::SerializationError>();
  }
};

}  // namespace

TEST_F(BookSnapshot, HoldsWhatTheDocumentSays) {
  const auto snapshot = open(goodBook());
  EXPECT_EQ(snapshot.name, "Loops");
  EXPECT_EQ(snapshot.filename, "Loops.marletbook");
  EXPECT_EQ(snapshot.bookDescription, "All of them");
  EXPECT_EQ(snapshot.contentVersion, Version({1, 2}));
  EXPECT_EQ(snapshot.uniquifier.size(), 28u);
  EXPECT_EQ(snapshot.target->identifier, "slateos");
  EXPECT_EQ(snapshot.sourcesDirectoryURL,
            baseURL.appendingPathComponent("Contents", true).appendingPathComponent("Sources", true));
  EXPECT_EQ(snapshot.userResourcesDirectoryURL->path(), "/books/Loops.marletbook/Edits/UserResources");
  EXPECT_EQ(snapshot.imageReference, "cover.png");
  EXPECT_EQ(PropertyListValue(snapshot.keyValueStore.contents()),
            PropertyListValue(D{{"speed", 3}, {"seen", A{"A", true}}}));
  ASSERT_EQ(snapshot.chapters.size(), 2u);
  const auto& chapter = snapshot.chapters[0];
  EXPECT_EQ(chapter.chapterDescription, "The first");
  EXPECT_EQ(chapter.resourcesDirectoryURL->path(), "/books/Loops.marletbook/" + one + "/Resources");
  ASSERT_EQ(chapter.pages.size(), 2u);
  EXPECT_EQ(chapter.pages[0].pageDescription, "Page A");
  EXPECT_TRUE(chapter.pages[0].resultInfoSnapshot->assessmentInformation()->everPassed);
  EXPECT_EQ(chapter.pages[1].filename, "B.cutscenepage");
  EXPECT_FALSE(chapter.pages[1].resultInfoSnapshot);
  EXPECT_EQ(snapshot.chapters[1].pages[0].resultInfoSnapshot, MarletResultInfoSnapshot());
}

TEST_F(BookSnapshot, OpensTheSameFromDisk) {
  const TemporaryDirectory directory;
  goodBook().writeTo(directory.path());
  EXPECT_EQ(MarletBookSnapshot(FileWrapper(directory.url()), directory.url()).manifest(),
            open(goodBook()).manifest());
}

TEST_F(BookSnapshot, ManifestsAreMadeAnew) {
  const auto tree =
      goodBook().withKey(book, "Version", "1.7").withKey(book, "Extra", 1).withoutKey(book, "Description");
  const auto manifest = open(tree).manifest();
  EXPECT_EQ(manifest,
            PropertyListValue(D{{"Version", "1.0"},
                                {"Name", "Loops"},
                                {"ContentIdentifier", "org.example.loops"},
                                {"ContentVersion", "1.2"},
                                {"DeploymentTarget", Target::targetWithIdentifier("slateos")->targetOS},
                                {"ImageReference", "cover.png"},
                                {"Chapters", A{"One.marletchapter", "Two.marletchapter"}}}));
  const auto chapter =
      open(goodBook().withKey(one + "/Manifest.plist", "Version", "9")).chapters[0].manifest();
  EXPECT_EQ(chapter, PropertyListValue(D{{"Name", "One"},
                                         {"Description", "The first"},
                                         {"ImageReference", "one.png"},
                                         {"Pages", A{"A.marletpage", "B.cutscenepage"}}}));
}

TEST_F(BookSnapshot, EveryFailureInItsWords) {
  const auto good = goodBook();
  const auto whole = [](const std::string& name, const std::string& words) {
    return name + " | Invalid Marlet Book | " + words;
  };
  expectFailures({
      {Tree{}.with("Contents", std::string()),
       whole("contentsNotADirectory",
             "The file reference specified by the \"Contents\" key in the manifest is not a directory.")},
      {Tree{}, whole("missingContents", "The marlet book is missing a \"Contents\" directory.")},
      {asFile(good, "Edits"),
       whole("editsNotADirectory",
             "There is a file named \"Edits\" in the marlet book, but it is expected to be a directory.")},
      {good.without(book), whole("missingManifest", "Missing the \"Manifest.plist\" file.")},
      {emptyPath(good, book), whole("missingManifest", "Missing the \"Manifest.plist\" file.")},
      {good.with(book, PropertyListValue(A{})),
       whole("manifestNotADictionary", "Manifest.plist does not contain a dictionary as the root value.")},
      {good.withKey(book, "Version", 1), whole("missingVersion", "Missing \"Version\" key in the manifest.")},
      {good.withKey(book, "Version", "1"),
       whole("invalidVersion(\"1\")",
             "The version specified in the \"Version\" key of the manifest (\"1\") is not valid.")},
      {good.withKey(book, "Version", "2.0"),
       "versionTooNew(\"2.0\") | Unable to Open | This marlet book version (\"2.0\") is newer than "
       "supported."},
      {good.withKey(book, "Name", 7), whole("missingName", "Missing \"Name\" key in the manifest.")},
      {good.withKey(book, "Description", 7),
       whole("descriptionNotAString", "The \"Description\" key in the manifest is not a string.")},
      {good.withoutKey(book, "ContentIdentifier"),
       whole("missingContentIdentifier", "Missing the \"ContentIdentifier\" key in the manifest.")},
      {good.withKey(book, "ContentIdentifier", 7),
       whole("contentIdentifierNotAString",
             "The value of the \"ContentIdentifier\" key in the manifest is not a string.")},
      {good.withoutKey(book, "ContentVersion"),
       whole("missingContentVersion", "Missing the \"ContentVersion\" key in the manifest.")},
      {good.withKey(book, "ContentVersion", 1.5),
       whole("contentVersionNotAString",
             "The value of the \"ContentVersion\" key in the manifest is not a string.")},
      {good.withKey(book, "ContentVersion", "1.x"),
       whole("invalidContentVersion(\"1.x\")",
             "The value of the \"ContentVersion\" key in the manifest (\"1.x\") is not a valid version "
             "identifier.")},
      {good.withKey(book, "DeploymentTarget", 9),
       whole("missingDeploymentTarget", "Missing the \"DeploymentTarget\" key in the manifest.")},
      {good.withKey(book, "DeploymentTarget", "deskos10.12"),
       whole("invalidDeploymentTarget(\"deskos10.12\")",
             "The \"DeploymentTarget\" key in the manifest (\"deskos10.12\") is invalid.")},
      {asFile(good, "Contents/Sources"),
       whole("sourcesNotADirectory",
             "Found file named \"Sources\" in the marlet book but expected a directory.")},
      {asFile(good, "Contents/Resources"),
       whole("resourcesNotADirectory",
             "Found file named \"Resources\" in the marlet book but expected a directory.")},
      {asFile(good, "Edits/UserResources"),
       whole("userResourcesNotADirectory",
             "Found file named \"UserResources\" in the marlet book but expected a directory.")},
      {good.withKey(book, "ImageReference", true),
       whole("imageReferenceNotAString", "The \"ImageReference\" key in the manifest is not a string.")},
      {good.without("Contents/Resources").withKey(book, "ImageReference", "https://x.example/y"),
       whole("imageReferenceWithNoResources",
             "There is an \"ImageReference\" key in the manifest but no \"Resources\" directory.")},
      {good.withKey(book, "ImageReference", "https://x.example/y"),
       whole("imageReferenceIsAURL",
             "The \"ImageReference\" key in the manifest is a is not a local, relative path.")},
      {good.withoutKey(book, "Chapters"),
       whole("missingChaptersInManifest", "The manifest does not specify any chapters.")},
      {good.withKey(book, "Chapters", "One"),
       whole("chaptersInManifestNotAnArray",
             "The \"Chapters\" key in the manifest is not an array of strings.")},
      {good.withKey(book, "Chapters", A{"One.marletchapter", 3}),
       whole("chapterFilenameNotAString",
             "One of the values in the \"Chapters\" key of the manifest is not a string.")},
      {good.withKey(book, "Chapters", A{}).without("Contents/Chapters"),
       whole("missingChaptersDirectory", "Missing the \"Chapters\" directory.")},
      {asFile(good, "Contents/Chapters"),
       whole("chaptersNotADirectory",
             "Found file named \"Chapters\" in the marlet book but expected a directory.")},
      {good.withKey(book, "Chapters", A{"Gone", 3}),
       whole("missingChapter(\"Gone\")",
             "Expected to find subdirectory in \"Chapters\" with the name \"Gone\" but found none.")},
      {emptyPath(good, "Edits/KeyValueStore.plist"),
       whole("keyValueStoreNotARegularFile", "KeyValueStore.plist is not a valid file.")},
      {good.withKey("Edits/KeyValueStore.plist", "Version", "2.0"), "VersionTooNew"},
      {good.with("Edits/UserEdits.diffpack", std::string("x")),
       R"(Error(domain: Diff, code: 3, "Invalid diffpack format, no directory contents."))"},
  });
  EXPECT_EQ(failureOf(Tree{}.with("x", std::string())), failureOf(Tree{}));
  const auto error = thrown<MarletBookSnapshot::SerializationError>(
      [] { MarletBookSnapshot(FileWrapper::regularFile(Data()), baseURL); });
  EXPECT_EQ(error.errorContents().localizedRecoverySuggestion,
            "The marlet book is not a directory with files inside.");
  EXPECT_EQ(error.code(), 8);
}

TEST_F(BookSnapshot, ReaderErrorsAreQuoted) {
  const auto error =
      thrown<MarletBookSnapshot::SerializationError>([] { open(goodBook().with(book, notAPlist)); });
  ASSERT_EQ(error.caseName(), "invalidManifest");
  EXPECT_EQ(
      error.errorContents().localizedRecoverySuggestion,
      "Manifest.plist was not able to open: " + ErrorObject(*error.error).localizedDescription() + ", nil");
}

TEST_F(BookSnapshot, ChapterAndPageFailuresReachTheUser) {
  const auto good = goodBook();
  const auto manifest = one + "/Manifest.plist";
  const auto chapter = [&](const std::string& name, const std::string& words) {
    return "invalidChapter(filename: \"One.marletchapter\", error: " + name +
           ") | Invalid Chapter | One.marletchapter: " + words;
  };
  const auto page = [&](const std::string& name, int code) {
    return "invalidChapter(filename: \"One.marletchapter\", error: invalidPage(filename: \"A.marletpage\", "
           "error: " +
           name +
           ")) | The operation could not be completed. "
           "(MarletFoundation.BookPagePlaceholderSnapshot.SerializationError error " +
           std::to_string(code) + ".) | One.marletchapter: A.marletpage: Unable to open page.";
  };
  expectFailures({
      {asFile(good, one), chapter("notADirectory", "The chapter reference is not a directory.")},
      {good.without(manifest), chapter("missingManifest", "The chapter is missing the Manifest.plist file.")},
      {good.with(manifest, PropertyListValue("x")),
       chapter("manifestNotADictionary",
               "The chapter Manifest.plist does not contain a dictionary as the root value.")},
      {good.withKey(manifest, "Name", 7),
       chapter("missingName", "Missing \"Name\" key in the chapter manifest.")},
      {good.withKey(manifest, "Description", 7),
       chapter("descriptionNotAString", "The \"Description\" key in the chapter manifest is not a string.")},
      {asFile(good, one + "/Sources"),
       chapter("sourcesNotADirectory",
               "Found file named \"Sources\" in the chapter but expected a directory.")},
      {asFile(good, one + "/Resources"),
       chapter("resourcesNotADirectory",
               "Found file named \"Resources\" in the chapter but expected a directory.")},
      {good.withKey(manifest, "ImageReference", 7),
       chapter("imageReferenceNotAString",
               "The \"ImageReference\" key in the chapter manifest is not a string.")},
      {good.without(one + "/Resources"),
       chapter("imageReferenceWithNoResources",
               "There is an \"ImageReference\" key in the chaptermanifest but no \"Resources\" directory.")},
      {good.withKey(manifest, "ImageReference", "file:///x"),
       chapter("imageReferenceIsAURL",
               "The \"ImageReference\" key in the chapter manifest is a is not a local, relative path.")},
      {good.withoutKey(manifest, "Pages"),
       chapter("missingPagesInManifest", "The chapter manifest does not specify any pages.")},
      {asFile(good, one + "/Pages").withKey(manifest, "Pages", "A"),
       chapter("pagesInManifestNotAnArray",
               "The \"Pages\" key in the chapter manifest is not an array of strings.")},
      {good.without(one + "/Pages").withKey(manifest, "Pages", A{}),
       chapter("missingPagesDirectory", "Missing the \"Pages\" directory.")},
      {asFile(good, one + "/Pages"),
       chapter("pagesNotADirectory", "Found file named \"Pages\" in the chapter but expected a directory.")},
      {good.withKey(manifest, "Pages", A{"A.marletpage", 1}),
       chapter("pageFilenameNotAString",
               "One of the values in the \"Pages\" key of the chapter manifest is not a string.")},
      {good.withKey(manifest, "Pages", A{"../Pages"}),
       chapter("missingPage(\"../Pages\")",
               "Expected to find subdirectory in \"Pages\" with the name \"../Pages\" but found none.")},
      {asFile(good, pageA), page("NotADirectory", 1)},
      {good.without(pageA + "/Manifest.plist"), page("MissingManifest", 2)},
      {good.with(pageA + "/Manifest.plist", PropertyListValue(A{})), page("ManifestNotADictionary", 3)},
      {good.withKey(pageA + "/Manifest.plist", "Name", A{}), page("MissingName", 4)},
      {good.withKey(pageA + "/Manifest.plist", "Description", A{}), page("DescriptionNotAString", 5)},
      {emptyPath(good, pageA + "/ResultInfo.plist"), page("ResultInfoNotAFile", 6)},
  });
  const auto badChapterPlist = failureOf(good.with(manifest, notAPlist));
  EXPECT_NE(
      badChapterPlist.find(
          "Invalid Chapter | One.marletchapter: The chapter Manifest.plist file could not be opened: nil"),
      std::string::npos)
      << badChapterPlist;
  EXPECT_NE(failureOf(good.with(pageA + "/Manifest.plist", notAPlist)).find("error: InvalidManifest("),
            std::string::npos);
}

TEST_F(BookSnapshot, TheEarlierCheckWins) {
  const auto good = goodBook();
  const auto name = [](const std::string& text) { return text.substr(0, text.find_first_of("(| ")); };
  const std::pair<Tree, std::string> cases[] = {
      {asFile(good, "Edits").without(book), "editsNotADirectory"},
      {good.with("Edits/UserEdits.diffpack", std::string()).without(book), "Error"},
      {good.withKey(book, "Version", "2.x"), "invalidVersion"},
      {good.withKey(book, "Version", "2.0").withoutKey(book, "Name"), "versionTooNew"},
      {good.withKey(book, "ContentVersion", "x").withKey(book, "DeploymentTarget", 1),
       "invalidContentVersion"},
      {asFile(good, "Contents/Sources").withKey(book, "DeploymentTarget", "x"), "invalidDeploymentTarget"},
      {asFile(asFile(good, "Edits/UserResources"), "Contents/Resources"), "resourcesNotADirectory"},
      {good.withKey(book, "Chapters", 1).without("Contents/Chapters"), "chaptersInManifestNotAnArray"},
      {good.withKey(book, "Chapters", A{"One.marletchapter", 3}).withKey(one + "/Manifest.plist", "Name", 1),
       "invalidChapter"},
      {good.withKey(one + "/Manifest.plist", "Pages", A{"B.cutscenepage", 1, "A.marletpage"})
           .withKey(pageA + "/Manifest.plist", "Name", 1),
       "invalidChapter"},
      {emptyPath(good, "Edits/KeyValueStore.plist").withKey(book, "Chapters", A{1}),
       "chapterFilenameNotAString"},
  };
  for (const auto& [tree, expected] : cases) EXPECT_EQ(name(failureOf(tree)), expected) << tree;
}

TEST_F(BookSnapshot, WhatIsToleratedOpens) {
  const auto good = goodBook();
  const Tree trees[] = {
      good.withKey(book, "Version", "1.5"),
      good.withKey(book, "DeploymentTarget", "slateos99"),
      good.withKey(book, "ImageReference", "no such file"),
      good.withKey(book, "ImageReference", ""),
      good.withKey(book, "Chapters", A{})
          .without("Contents/Chapters")
          .with("Contents/Chapters/", std::string()),
      good.withKey(book, "Chapters", A{"One.marletchapter", "One.marletchapter"}),
      good.without("Edits"),
      good.with("Contents/Chapters/Unlisted/x", std::string()),
      good.with(pageA + "/ResultInfo.plist", std::string("damaged")),
      good.without(pageA + "/ResultInfo.plist"),
  };
  for (const auto& tree : trees) EXPECT_EQ(failureOf(tree), "") << tree;
  EXPECT_FALSE(open(good.without("Edits")).userResourcesDirectoryURL);
  EXPECT_EQ(open(trees[8]).chapters[0].pages[0].resultInfoSnapshot, MarletResultInfoSnapshot());
}

// A few bytes of a manifest name a page again: it is read once, and all that is listed is bounded.
TEST_F(BookSnapshot, WhatIsListedAgainIsReadOnce) {
  const auto listing = [](std::size_t chapters, std::size_t pages) {
    return goodBook()
        .withKey(book, "Chapters", A(chapters, "One.marletchapter"))
        .withKey(one + "/Manifest.plist", "Pages", A(pages, "A.marletpage"));
  };
  const auto snapshot = open(listing(2, 3));
  ASSERT_EQ(snapshot.chapters.size(), 2u);
  EXPECT_EQ(snapshot.chapters[1].manifest(), snapshot.chapters[0].manifest());
  ASSERT_EQ(snapshot.chapters[1].pages.size(), 3u);
  EXPECT_EQ(snapshot.chapters[1].pages[2].filename, "A.marletpage");
  EXPECT_TRUE(snapshot.chapters[1].pages[2].resultInfoSnapshot->assessmentInformation()->everPassed);

  A unread;
  for (int i = 0; i < 1000; ++i) unread.push_back(D{{"k", "a text that is no page's"}});
  const auto allocations = [&](std::size_t pages) {
    const auto wrapper = listing(1, pages).withKey(pageA + "/Manifest.plist", "Unread", unread).wrapper();
    takeAllocationCount();
    MarletBookSnapshot(wrapper, baseURL);
    return takeAllocationCount();
  };
  EXPECT_LT(allocations(20), allocations(1) + 1000);

  const auto tooMuch = [](const std::string& outer, const std::string& inner) {
    return outer + "The chapters and pages that are listed take more than 128 MB of memory together." + inner;
  };
  const auto large = listing(1, 200).withKey(pageA + "/Manifest.plist", "Name", std::string(1000000, 'x'));
  expectFailures({
      {listing(2400, 2400),
       tooMuch("invalidChapter(filename: \"One.marletchapter\", error: Error(domain: POSIX, code: 27, \"",
               "\")) | ") +
           tooMuch("", " | One.marletchapter: List each chapter and each page once.")},
      {large, tooMuch("invalidChapter(filename: \"One.marletchapter\", error: invalidPage(filename: "
                      "\"A.marletpage\", error: Error(domain: POSIX, code: 27, \"",
                      "\"))) | ") +
                  tooMuch("", " | One.marletchapter: A.marletpage: List each chapter and each page once.")},
  });
}

TEST_F(BookSnapshot, ResultInfoIsReadThroughTheLearnersPack) {
  const TemporaryDirectory directory;
  const auto path = "Chapters/One.marletchapter/Pages/A.marletpage/ResultInfo.plist";
  const auto pack = [](A added, A removed) {
    return PropertyListValue(D{{"DiffPackType", "UserEdit"},
                               {"DocumentType", "MarletBook"},
                               {"Name", "org.example.loops"},
                               {"BaseVersion", "1.2"},
                               {"UpdateVersion", "1.2"},
                               {"Updates", D{{"Added", std::move(added)}, {"Removed", std::move(removed)}}}});
  };
  const auto tree = goodBook();
  const auto opened = [&](const Tree& t) {
    const TemporaryDirectory place;
    t.writeTo(place.path());
    std::optional<DiffPackSnapshot> edits;
    const MarletBookSnapshot snapshot(FileWrapper(place.url()), place.url(), edits);
    EXPECT_TRUE(edits);
    return *snapshot.chapters[0].pages[0].resultInfoSnapshot;
  };
  const std::string manifest = "Edits/UserEdits.diffpack/Manifest.plist";
  EXPECT_TRUE(opened(tree.with(manifest, pack({}, {}))).assessmentInformation());
  EXPECT_FALSE(opened(tree.with(manifest, pack({}, {D{{"File", path}}}))).assessmentInformation());
  const auto fail = PropertyListValue(
      D{{"Version", "1.0"},
        {"AssessmentInformation", D{{"Status", D{{"Status", "Fail"}}}, {"EverPassed", false}}}});
  const auto edited = opened(tree.with(manifest, pack({D{{"File", path}}}, {}))
                                 .with("Edits/UserEdits.diffpack/" + std::string(path), fail));
  ASSERT_TRUE(edited.assessmentInformation());
  EXPECT_FALSE(edited.assessmentInformation()->everPassed);
}

TEST_F(BookSnapshot, PackStaysSetWhenALaterCheckFails) {
  const auto tree =
      goodBook()
          .with("Edits/UserEdits.diffpack/Manifest.plist", PropertyListValue(D{{"DiffPackType", "UserEdit"},
                                                                               {"DocumentType", "MarletBook"},
                                                                               {"Name", "n"},
                                                                               {"BaseVersion", "1"},
                                                                               {"UpdateVersion", "1"},
                                                                               {"Updates", D{}}}))
          .without(book);
  std::optional<DiffPackSnapshot> edits;
  EXPECT_THROW(MarletBookSnapshot(tree.wrapper(), baseURL, edits), MarletBookSnapshot::SerializationError);
  EXPECT_TRUE(edits);
  EXPECT_THROW(MarletBookSnapshot(Tree{}.wrapper(), baseURL, edits), MarletBookSnapshot::SerializationError);
  EXPECT_FALSE(edits);
}

TEST(KeyValueStore, ReadsItsWrapperInOrder) {
  const std::pair<PropertyListValue, std::string> cases[] = {
      {A{}, "WrapperNotADictionary"},
      {D{{"Version", 1}}, "MissingVersion"},
      {D{{"Version", "x"}}, "InvalidVersion"},
      {D{{"Version", "2.0"}}, "VersionTooNew"},
      {D{{"Version", "1.3"}}, "MissingContents"},
      {D{{"Version", "1.3"}, {"Contents", "x"}}, "ContentsNotADictionary"},
      {D{{"Version", "1.3"}, {"Contents", D{}}}, ""},
  };
  for (const auto& [value, expected] : cases) {
    const auto data = propertyListData(value, PropertyListFormat::xml);
    EXPECT_EQ(failure([&] { MarletKeyValueStoreSnapshot snapshot(data); }), expected);
  }
  EXPECT_THROW(MarletKeyValueStoreSnapshot(Data(std::string("x"))),
               MarletKeyValueStoreSnapshot::SerializationError);
}

TEST(KeyValueStore, RoundTripsInBinaryForm) {
  MarletKeyValueStore store;
  EXPECT_FALSE(store.snapshot().needsSerialization());
  store.setContents(D{{"list", A{1, A{"x", Date{5}}}}, {"flag", true}});
  const auto data = store.snapshot().plistData();
  EXPECT_TRUE(data.view().starts_with("bplist00"));
  EXPECT_TRUE(store.snapshot().needsSerialization());
  EXPECT_TRUE(MarletKeyValueStoreSnapshot(data).contents() == store.contents());
}

// Running content may put anything into it.
TEST(KeyValueStore, WritesWhatHasAFormAndRefusesTheRest) {
  PropertyListValue deep("end");
  for (int i = 0; i < 100000; ++i) {
    PropertyListDictionary around;
    around["k"] = std::move(deep);
    deep = std::move(around);
  }
  MarletKeyValueStore store;
  store.setValue("deep", deep);
  EXPECT_TRUE(MarletKeyValueStoreSnapshot(store.snapshot().plistData()).contents() == store.contents());
  store.removeValue("deep");
  const PropertyListValue formless[] = {Date{std::nan("")}, Date{HUGE_VAL}, "\xFF", A{D{{"\xC0\x80", 1}}}};
  for (const auto& value : formless) {
    store.setValue("x", value);
    const auto error = errorOf([&] { store.snapshot().plistData(); });
    ASSERT_TRUE(error) << description(value);
    EXPECT_EQ(error->domain(), PropertyListErrorDomain);
  }
  EXPECT_TRUE(store.removeValue("x") && !store.removeValue("x"));
  EXPECT_NO_THROW(store.snapshot().plistData());
}

TEST(KeyValueStore, SetsAndRemovesAKeyWithoutCopying) {
  const auto allocations = [](int size) {
    MarletKeyValueStore store;
    for (int i = 0; i < size; ++i)
      store.setValue(std::to_string(i * 7919 % size), "a text that needs memory");
    takeAllocationCount();
    store.setValue("5", "another text that needs memory");
    store.setValue("5 1/2", "a text that needs memory");
    store.removeValue("6");
    return takeAllocationCount();
  };
  EXPECT_EQ(allocations(200), allocations(20000));
}

}  // namespace MarletFoundation::test
