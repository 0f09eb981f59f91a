#include "MarletFoundation/Marlet/MarletParser.h"

#include <gtest/gtest.h>

#include "MarletFoundation/Platform/Text.h"
#include "support/Failure.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

const std::string manifest = "contents.wbmarlet";

std::string described(const MarletParser::Document& document) {
  auto text = document.targetPlatform + (document.requiresFullEnvironment ? " full:" : ":");
  for (const auto& page : document.pages)
    text += " " + page.name().value_or("-") + "=" + utf8FromUTF16Lossy(page.text());
  return text;
}

MarletParser::Document parsed(const Tree& tree) {
  return MarletParser(tree.wrapper(), URL::file("/D.marlet", true)).parse();
}

/// What a document's parse gives, or the words of its failure.
std::string outcome(const Tree& tree) {
  std::string text;
  const auto error = errorOf([&] { text = described(parsed(tree)); });
  return error ? ErrorObject(*error).localizedDescription() : text;
}

struct Row {
  Tree tree;
  std::string expected;
};

void expectOutcomes(const std::vector<Row>& rows) {
  for (const auto& [tree, expected] : rows) EXPECT_EQ(outcome(tree), expected) << tree;
}

/// `prefix` stands in front of each row's expectation.
void expectFailures(const std::string& prefix, const std::vector<std::pair<Tree, std::string>>& rows) {
  for (const auto& [tree, expected] : rows) EXPECT_EQ(outcome(tree), prefix + expected) << tree;
}

const Tree sections{{"one", "1"}, {"two", "2"}};
const std::string twoSections =
    R"(<sections><code source-file-name="two"/><code source-file-name="one"/></sections>)";

Tree oldStyle(const std::string& children,
              const std::string& attributes = R"(version="3.1" sdk="slate9.2")") {
  return sections.with(manifest, "<marlet " + attributes + ">" + children + "</marlet>");
}

Tree newStyle(const std::string& children, const std::string& version = "6.0",
              const std::string& attributes = R"(target-platform="slateos")") {
  return Tree{{manifest, "<marlet version='" + version + "' " + attributes + ">" + children + "</marlet>"},
              {"Pages/A.wbmarletpage/Contents.swift", "a"},
              {"Pages/B.wbmarletpage/contents.swift", "b"},
              {"Pages/D.wbmarletpage/Contents.swift", "d"},
              {"Pages/C.wbmarletpage/Contents.swift", "c"},
              {"Contents.swift", "root"}};
}

const std::string listOfBA = "<pages><page name='B'/><page name='A'/></pages>";

TEST(MarletParser, ReadsEveryGeneration) {
  expectOutcomes({
      {oldStyle(twoSections, R"(version="1.0" sdk="slate9.2")"), "slateos: -=2\n1"},
      {oldStyle("<timeline/>" + twoSections, R"(version="2.0" sdk="deskos10.11")"), "desk: -=2\n1"},
      {oldStyle(twoSections, R"(version="3.9.x" sdk="slate" runInFullSimulator="YES")"),
       "slateos full: -=2\n1"},
      {oldStyle(twoSections, R"(version="4.0" sdk="slate9" runInFullSimulator="False")"), "slateos: -=2\n1"},
      {oldStyle(twoSections, R"(version="-1.0" sdk="slate9")"), "slateos: -=2\n1"},
      {oldStyle(twoSections + "<sections/>"), "slateos: -=2\n1"},
      {oldStyle("").with("contents.swift", "root"), "slateos: -=root"},
      {newStyle(listOfBA, "5.0"), "slateos: B=b A=a"},
      {newStyle(listOfBA + "<timeline/>", "6.99"), "slateos: B=b A=a C=c D=d"},
      {newStyle("", "5.0"), "slateos: -=root"},
      {newStyle("", "6.0", "target-platform='any' requires-full-environment='tRue'"),
       "any full: A=a B=b C=c D=d"},
      {newStyle("", "6.0").without("Pages"), "slateos: -=root"},
      {newStyle("", "6.0").without("Pages").with("contents.swift", "other"), "slateos: -=root"},
      {newStyle("<pages/>"), "slateos: A=a B=b C=c D=d"},
      {newStyle("<pages><page name='A'/><page name='gone'/><page name='A'/></pages>", "5.0"),
       "slateos: A=a A=a"},
      {newStyle(listOfBA).with("Pages/E.wbmarletpage", "no directory").with("Pages/note", ""),
       "slateos: B=b A=a C=c D=d"},
      // By name, not by file name: "!" comes before "." but not before the end.
      {newStyle("")
           .without("Pages")
           .with("Pages/A!.wbmarletpage/Contents.swift", "2")
           .with("Pages/A.wbmarletpage/Contents.swift", "1")
           .with("Pages/.wbmarletpage/Contents.swift", "no name"),
       "slateos: A=1 A!=2"},
  });
}

TEST(MarletParser, SaysWhatIsWrongWithTheDocument) {
  const std::string unable = "Unable to load marlet page: ";
  expectOutcomes({
      {Tree{}, "Unable to get file wrapper for contents.wbmarlet."},
      {Tree{{manifest + "/", ""}}, "Unable to get data for contents.wbmarlet."},
      {newStyle("<pages/>").without("Pages").with("Pages/", ""),
       "Unable to load marlet file: it has no pages."},
      {newStyle("").without("Pages").with("Pages/", ""), "Unable to load marlet file: it has no pages."},
      {newStyle("").with("Pages", "a file"), "Unable to load marlet file: it has no pages."},
      {newStyle("<pages><page name='gone'/></pages>", "5.0"), "Unable to load marlet file: it has no pages."},
      {newStyle("", "5.0").without("Contents.swift"),
       "Unable to load marlet file: Contents.swift file is missing."},
      {newStyle("").with("Pages/E.wbmarletpage", ""), unable + "E.wbmarletpage is not a directory."},
      {newStyle("<pages><page name='E'/></pages>").with("Pages/E.wbmarletpage", ""),
       unable + "E.wbmarletpage is not a directory."},
      {newStyle("").with("Pages/E.wbmarletpage/", ""), unable + "Contents.swift file is missing."},
      {newStyle("").without("Pages/A.wbmarletpage").with("Pages/A.wbmarletpage/Contents.swift/", ""),
       unable + "unable to load Contents.swift."},
      {newStyle("").with("Pages/A.wbmarletpage/Contents.swift", "\xff"),
       unable + "unable to load Contents.swift."},
      {newStyle("<pages/>").without("Pages"),
       "Unable to parse marlet: expected to find a Pages directory, but it is missing."},
      {newStyle("<pages/>").with("Pages", ""),
       "Unable to parse marlet: expected to find a Pages directory, but it is not a directory."},
      {oldStyle("<sections><code source-file-name='../one'/></sections>"), "Unable to load '../one'."},
      {oldStyle("<sections><code source-file-name='Pages'/></sections>").with("Pages/", ""),
       "Unable to load contents of 'Pages'."},
      {oldStyle("<sections><code source-file-name='one'/></sections>").with("one", "\xc0\x80"),
       "Unable to parse contents of 'one' as UTF-8-encoded text."},
  });
}

TEST(MarletParser, SaysWhatIsWrongWithTheManifest) {
  const auto inSections = [](const std::string& child) {
    return oldStyle("<sections>" + child + "</sections>");
  };
  const auto version = [](const std::string& value) {
    return Tree{{manifest, "<marlet version='" + value + "' target-platform='slateos'/>"}};
  };
  const std::string number = " version number cannot be parsed as a decimal number.";
  const std::string components =
      ": the version of the marlet must contain at least a major and minor component.";
  const std::string flag = " attribute is invalid (expected yes/true or no/false, but got ";
  expectFailures(
      "Unable to parse contents.wbmarlet",
      {
          {Tree{{manifest, "<book/>"}}, ": the root element is not named 'marlet' (it is named 'book')."},
          {Tree{{manifest, "<marlet/>"}}, ": the 'marlet' element does not specify a version number."},
          {version(""), components},
          {version("5"), components},
          {version("x.0"), ": the major" + number},
          {version("9223372036854775808.0"), ": the major" + number},
          {version("5.x"), ": the minor" + number},
          {version("7."), ": the minor" + number},
          {version("7.0"), ": the version (7) of the file is too new."},
          {oldStyle("", "version='4.0'"), ": the 'marlet' element does not have an 'sdk' attribute."},
          {oldStyle("", "version='4.0' sdk='zz'"),
           ": the 'sdk' attribute requests the zz SDK, but we don't know what platform that is."},
          {oldStyle("", "version='4.0' sdk='slate' runInFullSimulator='1'"),
           ": value of 'runInFullSimulator'" + flag + "1)."},
          {newStyle("", "6.0", ""), ": 'marlet' element does not have a 'target-platform' attribute."},
          {newStyle("", "6.0", "target-platform='slateos' requires-full-environment='Maybe'"),
           ": value of 'requires-full-environment'" + flag + "Maybe)."},
          {oldStyle("<pages/>"), ": encountered unknown element 'pages' as child of 'marlet' element."},
          {inSections("<page/>"), ": encountered unknown element 'page' as child of 'sections' element."},
          {inSections("<code/>"), ": 'code' element does not specify 'source-file-name'."},
          {inSections("<code source-file-name='one'><a/></code>"),
           ": encountered element 'a' as a child of a 'code' element which should have no children."},
          {oldStyle("<timeline><a/></timeline>"),
           ": encountered element 'a' as a child of a 'timeline' element which should have no children."},
          {newStyle("<a/>"), ": encountered unknown element 'a' as child of 'marlet' element."},
          {newStyle("<sections/>"),
           ": encountered unexpected element 'sections' as a child of a 'marlet' element in a new-style marlet."},
          {newStyle("<timeline><a/></timeline>"),
           ": encountered element 'a' as a child of a 'timeline' element which should have no children."},
          {newStyle("<pages><a/></pages>"), ": encountered unknown element 'a' as child of 'pages' element."},
          {newStyle("<pages><page/></pages>"), ": 'page' element is missing a valid 'name' attribute."},
          {newStyle("<pages><page name='A'><a/></page></pages>"),
           ": encountered element 'a' as a child of a 'page' element which should have no children."},
          {newStyle("<pages/><pages/>"),
           ": encountered 'pages' element multiple times as a child of a 'marlet' element."},
      });
}

TEST(MarletParser, ErrorObjects) {
  const auto error = [](const Tree& tree) { return thrown<ErrorObject>([&] { parsed(tree); }); };
  EXPECT_EQ(error(Tree{}),
            ErrorObject("MarletSerialization", 0,
                        {{"LocalizedDescription", "Unable to get file wrapper for contents.wbmarlet."}}));
  const auto documentation = error(oldStyle("<sections><documentation/></sections>"));
  EXPECT_EQ(documentation.localizedDescription(),
            "Marlets containing HTML documentation sections are not supported.");
  EXPECT_EQ(
      documentation.localizedRecoverySuggestion(),
      "Convert the HTML documentation sections to documentation comments stored in a source code section "
      "instead.");
  // The XML parser's own error, with its line; but the first failure wins.
  EXPECT_EQ(error(Tree{{manifest, "<marlet version='6.0' target-platform='a'>\n<"}}).domain(), "XMLParser");
  EXPECT_EQ(error(Tree{{manifest, "<marlet version='6.0' target-platform='a'><a/>\n<"}}).domain(),
            "MarletSerialization");
}

TEST(MarletParser, PageURLs) {
  const auto tree = newStyle("")
                        .with("Pages/A.wbmarletpage/Resources/", "")
                        .with("Pages/B.wbmarletpage/Sources/", "")
                        .with("Resources/", "")
                        .with("Sources/", "");
  const auto pages = parsed(tree).pages;
  EXPECT_EQ(pages[0].resourcesDirectoryURL(), URL::file("/D.marlet/Pages/A.wbmarletpage/Resources", true));
  EXPECT_EQ(pages[0].sourcesDirectoryURL(), std::nullopt);
  EXPECT_EQ(pages[1].sourcesDirectoryURL(), URL::file("/D.marlet/Pages/B.wbmarletpage/Sources", true));
  const auto rootPage = parsed(tree.without("Pages")).pages[0];
  EXPECT_EQ(rootPage.resourcesDirectoryURL(), URL::file("/D.marlet/Resources", true));
  EXPECT_EQ(rootPage.sourcesDirectoryURL(), URL::file("/D.marlet/Sources", true));
  const auto joined = parsed(oldStyle(twoSections).with("Resources/", "").with("Sources/", "")).pages[0];
  EXPECT_EQ(joined.resourcesDirectoryURL(), URL::file("/D.marlet/Resources", true));
  EXPECT_EQ(joined.sourcesDirectoryURL(), std::nullopt);
}

TEST(MarletParser, DoesNotFollowLinks) {
  const TemporaryDirectory directory;
  newStyle("").writeTo(directory.path() / "D.marlet");
  const auto page = directory.path() / "D.marlet/Pages/A.wbmarletpage";
  std::filesystem::create_directory_symlink("/", page / "Resources");
  const auto url = directory.url("D.marlet");
  EXPECT_EQ(MarletParser(FileWrapper(url), url).parse().pages[0].resourcesDirectoryURL(), std::nullopt);
  std::filesystem::remove(page / "Contents.swift");
  std::filesystem::create_symlink("/etc/passwd", page / "Contents.swift");
  EXPECT_THROW(MarletParser(FileWrapper(url), url).parse(), ErrorObject);
}

TEST(MarletParser, CountsWhatItReads) {
  std::string list;
  for (int i = 0; i < 9; ++i) list += "<page name='A'/>";
  const auto tree = newStyle("<pages>" + list + "</pages>")
                        .with("Pages/A.wbmarletpage/Contents.swift", std::string(32 << 20, 'x'));
  EXPECT_EQ(outcome(tree), "Unable to load marlet page: unable to load Contents.swift.");
  // By UTF-16 units, of which these have a third of their bytes.
  std::string wide;
  while (wide.size() < 30u << 20) wide += "、";
  list.clear();
  for (int i = 0; i < 9; ++i) list += "<code source-file-name='a'/>";
  const auto old = oldStyle("<sections>" + list + "</sections>").with("a", wide);
  EXPECT_FALSE(errorOf([&] { parsed(old); }));
}

TEST(MarletParser, TellsTheOldStyle) {
  for (const auto& [tree, isOldStyle] : {std::pair(oldStyle(""), true), std::pair(newStyle(""), false)}) {
    MarletParser parser(tree.wrapper(), URL::file("/D.marlet", true));
    EXPECT_EQ(parser.isOldStyleMarlet(), std::nullopt);
    errorOf([&] { parser.parse(); });
    EXPECT_EQ(parser.isOldStyleMarlet(), isOldStyle);
  }
}

TEST(MarletParser, FatalConditions) {
  // The one that a file can reach.
  EXPECT_EQ(fatalMessage([] { outcome(oldStyle("<sections/>")); }),
            "A 'sections' element must have at least one 'code' element!");
  // The rest takes a caller that sends the events itself.
  XMLParser xml{Data()};
  const auto fatal = [&](const auto& events) {
    return fatalMessage([&] {
      MarletParser parser(sections.wrapper(), URL::file("/D.marlet", true));
      parser.parserDidStartDocument(xml);
      events(parser);
    });
  };
  const XMLParser::Attributes newRoot{{"version", "6.0"}, {"target-platform", "a"}};
  EXPECT_EQ(fatal([&](auto& parser) {
              parser.didStartElement(xml, "marlet", newRoot);
              parser.didEndElement(xml, "pages");
            }),
            "Unexpected state for new-style marlet: MarletElement");
  EXPECT_NE(fatal([&](auto& parser) { parser.parserDidStartDocument(xml); }), "");
  EXPECT_NE(fatal([&](auto& parser) {
              parser.didStartElement(xml, "marlet", newRoot);
              parser.parserDidEndDocument(xml);
            }),
            "");
}

}  // namespace
}  // namespace MarletFoundation::test
