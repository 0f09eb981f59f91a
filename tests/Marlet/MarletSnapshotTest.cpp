#include <gtest/gtest.h>

#include "MarletFoundation/Marlet/Marlet.h"
#include "support/Failure.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using Case = MarletSnapshot::SerializationErrorCase;

/// Two pages with all that a document can hold.
Tree goodMarlet() {
  return {{"contents.wbmarlet",
           R"(<marlet version="6.0" target-platform="slateos" requires-full-environment="yes">)"
           R"(<pages><page name="B &amp; &#10;&quot;C&quot;"/><page name="A"/></pages></marlet>)"},
          {"Pages/A.wbmarletpage/Contents.swift", "print(\"ä😀\")\n"},
          {"Pages/A.wbmarletpage/Resources/a.png", "a"},
          {"Pages/A.wbmarletpage/Sources/A.swift", "let a = 1"},
          {"Pages/B & \n\"C\".wbmarletpage/Contents.swift", ""},
          {"Resources/shared.png", "s"},
          {"Sources/Shared.swift", "let s = 1"},
          {"MarletIcon.png", "icon"}};
}

Tree oldMarlet() {
  return {{"contents.wbmarlet",
           R"(<marlet version="3.0" sdk="deskos10.11"><sections><code source-file-name="1"/>)"
           R"(<code source-file-name="2"/></sections></marlet>)"},
          {"1", "one"},
          {"2", "two"},
          {"Resources/a.png", "a"}};
}

/// A document on disk, as it was given or as a snapshot writes it.
struct OnDisk {
  TemporaryDirectory directory;
  URL url = directory.url("D.marlet");

  explicit OnDisk(const Tree& tree) { tree.writeTo(directory.path() / "D.marlet"); }
  MarletSnapshot read() const { return MarletSnapshot(FileWrapper(url), url); }
  void write(const MarletSnapshot& snapshot) const { snapshot.fileWrapper().write(url); }
  std::string file(const std::string& path) const {
    auto node = std::optional(FileWrapper(url));
    for (const auto& name : URL::file("/" + path).pathComponents())
      if (name != "/") node = node->child(name);
    return std::string(node->regularFileContents()->view());
  }
  std::string names() const {
    const auto children = FileWrapper(url).fileWrappers();
    std::string all;
    for (const auto& child : *children) all += child.first + " ";
    return all;
  }
};

TEST(MarletSnapshot, HoldsWhatTheDirectoryHolds) {
  const OnDisk disk(goodMarlet());
  const auto marlet = disk.read();
  EXPECT_EQ(marlet.name, "D");
  EXPECT_EQ(marlet.uniquifier.size(), 28u);
  EXPECT_EQ(marlet.target, Target::targetWithIdentifier("slateos"));
  EXPECT_TRUE(marlet.requiresFullEnvironment);
  EXPECT_EQ(marlet.sharedResourcesDirectoryURL, disk.url.appendingPathComponent("Resources", true));
  EXPECT_EQ(marlet.sharedSourcesDirectoryURL, disk.url.appendingPathComponent("Sources", true));
  EXPECT_EQ(marlet.marletIconURL, disk.url.appendingPathComponent("MarletIcon.png"));
  ASSERT_EQ(marlet.pages.size(), 2u);
  EXPECT_EQ(marlet.pages[1].text(), u"print(\"ä😀\")\n");
  EXPECT_FALSE(marlet.isSinglePage());

  // Without "Pages" the directories are the page's.
  const OnDisk single(oldMarlet().with("MarletIcon.png", "icon"));
  EXPECT_EQ(single.read().sharedResourcesDirectoryURL, std::nullopt);
  EXPECT_EQ(single.read().pages[0].resourcesDirectoryURL(),
            single.url.appendingPathComponent("Resources", true));
  EXPECT_TRUE(single.read().marletIconURL);
  EXPECT_TRUE(single.read().isSinglePage());
}

TEST(MarletSnapshot, WritesTheFormThatItsShapeDecides) {
  const OnDisk several(goodMarlet().with("Other", "not carried over"));
  several.write(several.read());
  EXPECT_EQ(several.names(), "MarletIcon.png Pages Resources Sources contents.wbmarlet ");
  EXPECT_EQ(several.file("contents.wbmarlet"), R"(<?xml version="1.0" encoding="UTF-8"?>
<marlet version="6.0" target-platform="slateos" requires-full-environment="true">
    <pages>
        <page name="B &amp; &#10;&quot;C&quot;"/>
        <page name="A"/>
    </pages>
</marlet>
)");
  EXPECT_EQ(several.file("Pages/A.wbmarletpage/Contents.swift"), "print(\"ä😀\")\n");
  EXPECT_EQ(several.file("Pages/A.wbmarletpage/Resources/a.png"), "a");

  const OnDisk single(oldMarlet());
  single.write(single.read());
  EXPECT_EQ(single.names(), "Contents.swift Resources contents.wbmarlet ");
  EXPECT_EQ(single.file("contents.wbmarlet"), R"(<?xml version="1.0" encoding="UTF-8"?>
<marlet version="5.0" target-platform="desk" requires-full-environment="false"/>
)");
  EXPECT_EQ(single.file("Contents.swift"), "one\ntwo");
  EXPECT_EQ(single.file("Resources/a.png"), "a");
}

TEST(MarletSnapshot, WhatIsWrittenReadsBackEqual) {
  const auto version5 = [](const std::string& children) {
    return "<marlet version='5.3' target-platform='desk'>" + children + "</marlet>";
  };
  const Tree root{{"contents.wbmarlet", version5("")}, {"contents.swift", "x"}, {"Sources/", ""}};
  for (const auto& tree :
       {goodMarlet(), oldMarlet(), root, goodMarlet().without("Resources").without("Sources"),
        goodMarlet().with("contents.wbmarlet", version5("<pages><page name='A'/><page name='A'/></pages>")),
        goodMarlet().with("contents.wbmarlet", "<marlet version='6.7' target-platform='slateos'/>")}) {
    const OnDisk disk(tree);
    const auto snapshot = disk.read();
    disk.write(snapshot);
    EXPECT_TRUE(disk.read() == snapshot) << tree;
    disk.write(Marlet(snapshot).snapshot());
    EXPECT_TRUE(disk.read() == snapshot) << tree;
  }
}

TEST(MarletSnapshot, LeavesOutWhatCannotBeRead) {
  const OnDisk disk(goodMarlet());
  const auto marlet = disk.read();
  for (const auto* gone : {"Resources", "Sources", "MarletIcon.png", "Pages/A.wbmarletpage/Resources"})
    std::filesystem::remove_all(disk.directory.path() / "D.marlet" / gone);
  disk.write(marlet);
  EXPECT_EQ(disk.names(), "Pages contents.wbmarlet ");
  EXPECT_EQ(FileWrapper(disk.url.appendingPathComponent("Pages/A.wbmarletpage")).fileWrappers()->size(), 2u);
}

TEST(MarletSnapshot, Errors) {
  const auto url = URL::file("/D.marlet", true);
  const auto contents = [&](const FileWrapper& wrapper) {
    return thrown<MarletSnapshot::SerializationError>([&] { MarletSnapshot(wrapper, url); }).errorContents();
  };
  EXPECT_EQ(contents(FileWrapper::regularFile(Data())),
            (UserVisibleErrorContents{"Marlet Error", "File is not a marlet (it is not a directory)."}));
  const auto unknown =
      goodMarlet().with("contents.wbmarlet", "<marlet version='6.0' target-platform='toaster'/>");
  EXPECT_EQ(contents(unknown.wrapper()),
            (UserVisibleErrorContents{"Marlet Error",
                                      "Unable to find target for platform with identifier toaster."}));
  EXPECT_THROW(MarletSnapshot(Tree().wrapper(), url), ErrorObject);
}

TEST(MarletSnapshot, RefusesToWriteWhatWouldNotReadBack) {
  const OnDisk disk(oldMarlet());
  auto marlet = disk.read();
  marlet.sharedResourcesDirectoryURL = disk.url;
  EXPECT_NE(fatalMessage([&] { marlet.fileWrapper(); }), "");
  const auto withPage = [&](std::optional<std::string> name, std::u16string text) {
    marlet.pages = {MarletPageSnapshot(std::move(name), std::move(text), {}, {}, {}, {})};
    return marlet;
  };
  EXPECT_EQ(fatalMessage([&] { withPage("a", u"").fileWrapper(); }), "");
  EXPECT_THROW(withPage("a\x01", u"").fileWrapper(), ErrorObject);
  EXPECT_THROW(withPage("a", u"\xD800").fileWrapper(), ErrorObject);
  EXPECT_THROW(disk.write(withPage("a/b", u"")), ErrorObject);
}

TEST(Marlet, IsEditedApartFromItsSnapshots) {
  const OnDisk disk(goodMarlet());
  const auto marlet = Marlet::loadFromFileWrapper(FileWrapper(disk.url), disk.url);
  const auto before = marlet->snapshot();
  auto& page = *marlet->pages[1];
  page.text() += u"// more\n";
  page.setName("Z");
  page.resultInfo().trackInlineResultDataAt(0, 0);
  marlet->keyValueStore.setContents({{"speed", 3}});
  EXPECT_TRUE(before == disk.read());
  const auto after = marlet->snapshot();
  EXPECT_EQ(after.pages[1].filename(), "Z.wbmarletpage");
  EXPECT_EQ(after.pages[1].resultInfo().inlineResults().size(), 1u);
  EXPECT_FALSE(after == before);
  disk.write(after);
  // Neither results nor the store have a place on disk.
  EXPECT_EQ(disk.read().pages[1].text(), u"print(\"ä😀\")\n// more\n");
  EXPECT_TRUE(disk.read().pages[1].resultInfo().inlineResults().empty());
  EXPECT_TRUE(disk.read().keyValueStore.contents().empty());
}

TEST(MarletPage, AnswersAsAnyPageAndLetsSubclassesAnswer) {
  struct Shouting : MarletPage {
    using MarletPage::MarletPage;
    std::string filename() const override { return "loud"; }
    std::optional<std::string> optionalName() const override { return "LOUD"; }
  };
  const MarletPageSnapshot unnamed(std::nullopt, u"x", {}, {}, {}, {});
  EXPECT_EQ(unnamed.filename(), "wbmarletpage");
  EXPECT_EQ(MarletPageSnapshot::filenameForName(""), ".wbmarletpage");
  const Shouting shouting(unnamed);
  const MarletPageType& page = shouting;
  EXPECT_EQ(page.name(), "LOUD");
  EXPECT_EQ(page.filename(), "loud");
  EXPECT_EQ(page.snapshot()->name(), "LOUD");
  EXPECT_EQ(page.pageDescription(), std::nullopt);
  EXPECT_EQ(page.liveViewMode(), LiveViewMode::HiddenByDefault);
  EXPECT_FALSE(page.liveViewEdgeToEdge());
  EXPECT_FALSE(page.passed());
}

}  // namespace
}  // namespace MarletFoundation::test
