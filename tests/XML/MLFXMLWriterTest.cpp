#include "MarletFoundation/XML/MLFXMLWriter.h"

#include <gtest/gtest.h>
#include <libxml/globals.h>
#include <rapidcheck/gtest.h>

#include "MarletFoundation/Data/MarletSerializationError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Platform/XMLParser.h"
#include "support/Failure.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using Writer = MLFXMLWriter;

std::string document(const MLFXMLDocumentWriter& writer) {
  return std::string(Writer::XMLDataUsingDocumentWriter(writer).view());
}

struct Received : XMLParser::Delegate {
  XMLParser::Attributes attributes;
  std::string text;
  void didStartElement(XMLParser&, const std::string&, const XMLParser::Attributes& a) override {
    attributes = a;
  }
  void foundCharacters(XMLParser&, std::string_view characters) override { text += characters; }
};

TEST(MLFXMLWriter, WritesInOrderIndentedByFourBlanks) {
  const auto write = [](MLFXMLDocument& document) {
    document.addComment(" made by hand ");
    document.createRootElementWithName("list", {{"version", "6.0"}, {"a", "<\"&'>\n"}}, [](auto& list) {
      list.addChildElementWithName("empty");
      EXPECT_THROW(list.addChildElementWithName("left", {}, [](auto&) { throw 1; }), int);
      list.addChildElementWithName("s:r", {{"xml:lang", "de"}, {"s:r", ""}});
      list.addChildElementWithName("item", {{"name", "ä"}}, [](auto& item) {
        item.addChildElementWithName("text", {}, [](auto& text) { text.addText("1 < 2 & 3"); });
        item.addComment("inside");
      });
    });
  };
  const std::string expected = R"(<?xml version="1.0" encoding="UTF-8"?>
<!-- made by hand -->
<list version="6.0" a="&lt;&quot;&amp;'&gt;&#10;">
    <empty/>
    <left/>
    <s:r xml:lang="de" s:r=""/>
    <item name="ä">
        <text>1 &lt; 2 &amp; 3</text>
        <!--inside-->
    </item>
</list>
)";
  EXPECT_EQ(document(write), expected);

  const TemporaryDirectory directory;
  Writer::writeXMLToFile(directory.url("list.xml").path(), write);
  EXPECT_EQ(FileManager::readFile(directory.url("list.xml")).view(), expected);
  EXPECT_THROW(Writer::writeXMLToURL(directory.url("none/list.xml"), write), ErrorObject);
}

TEST(MLFXMLWriter, RefusesWhatXMLCannotCarryAndASecondRoot) {
  const auto withElement = [](const MLFXMLElementWriter& writer) {
    document([&](auto& d) { d.createRootElementWithName("a", {}, writer); });
  };
  for (const std::string& text :
       {std::string("\x01"), std::string("\0", 1), std::string("\xff"), std::string("\xed\xa0\x80"),
        std::string("\xef\xbf\xbe"), std::string((8 << 20) + 1, 'x')}) {
    EXPECT_THROW(withElement([&](auto& e) { e.addText(text); }), ErrorObject) << quoted(text.substr(0, 9));
    EXPECT_THROW(withElement([&](auto& e) { e.addComment(text); }), ErrorObject);
    EXPECT_THROW(withElement([&](auto& e) { e.addChildElementWithName("b", {{"c", text}}); }), ErrorObject);
  }
  for (const std::string& name :
       std::initializer_list<std::string>{"", "1a", "a b", ":a", "a:", "a:b:c", "<", "a\n"}) {
    EXPECT_THROW(withElement([&](auto& e) { e.addChildElementWithName(name); }), ErrorObject) << name;
    EXPECT_THROW(withElement([&](auto& e) { e.addChildElementWithName("b", {{name, ""}}); }), ErrorObject);
  }
  const auto error = thrown<ErrorObject>([&] { withElement([](auto& e) { e.addText("a\x01"); }); });
  EXPECT_EQ(error.localizedDescription(), "XML has no form for \"a\\u{01}\".");
  EXPECT_EQ(error.code(), 0);
  for (const char* comment : {"a--b", "a-"})
    EXPECT_THROW(withElement([&](auto& e) { e.addComment(comment); }), ErrorObject) << comment;
  EXPECT_EQ(fatalMessage([] {
              document([](auto& d) {
                d.createRootElementWithName("a");
                d.createRootElementWithName("b");
              });
            }),
            "!_didAddRootElement && \"-createRootElementWithName:attributes:usingElementWriter: may only be "
            "called once per document!\"");
}

void nest(MLFXMLElement& element, int levels) {
  if (levels > 0)
    element.addChildElementWithName("e", {}, [&](auto& child) { nest(child, levels - 1); });
  else
    element.addText("innermost");
}

TEST(MLFXMLWriter, WritesNothingOfADocumentOfWhichAPartIsRefused) {
  const MLFXMLElementWriter writers[] = {
      [](auto& e) { nest(e, 256); },
      [](auto& e) {
        e.addText(std::string(6 << 20, 'x'));
        e.addText(std::string(6 << 20, 'y'));
      },
      [](auto& e) { e.addText(std::string((8 << 20) + 1, 'x')); },
      [](auto& e) {
        e.addChildElementWithName("b", {{"a", "1"}, {"a", "2"}});
      },
      [](auto& e) {
        e.addChildElementWithName("b", {{"xmlns:p", ""}});
      },
      [](auto& e) { e.addChildElementWithName(std::string(60000, 'n')); },
      [](auto& e) {
        // Its error is kept, whoever catches it.
        for (const char* name : {"a", "b"}) {
          try {
            e.addChildElementWithName(name, {{"a", "1"}, {"a", std::string(9000, '2')}});
          } catch (const ErrorObject&) {
          }
        }
      },
  };
  const TemporaryDirectory directory;
  testing::internal::CaptureStderr();
  for (const auto& writer : writers) {
    const auto error = thrown<ErrorObject>([&] {
      Writer::writeXMLToURL(directory.url("x.xml"),
                            [&](auto& d) { d.createRootElementWithName("a", {}, writer); });
    });
    EXPECT_EQ(error.domain(), MarletSerializationErrorDomain);
    EXPECT_EQ(error.code(), static_cast<int>(MarletSerializationErrorCode::UnknownError));
    EXPECT_FALSE(FileManager::fileExists(directory.url("x.xml"))) << error.description();
  }
  const auto deepest =
      document([](auto& d) { d.createRootElementWithName("a", {}, [](auto& e) { nest(e, 255); }); });
  EXPECT_NE(deepest.find("innermost"), std::string::npos);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
}

TEST(MLFXMLWriter, IndentsByFourBlanksForTheWhileOfABlock) {
  const std::string former = xmlTreeIndentString;
  std::string within;
  EXPECT_THROW(Writer::performBlockWithCustomTreeIndentString([&] { throw within = xmlTreeIndentString; }),
               std::string);
  EXPECT_EQ(within, "    ");
  EXPECT_EQ(xmlTreeIndentString, former);
}

std::pair<std::string, std::string> readBack(const std::string& value, const std::string& text) {
  Received received;
  XMLParser parser(Writer::XMLDataUsingDocumentWriter([&](auto& d) {
    d.createRootElementWithName("a", {{"b", value}}, [&](auto& a) { a.addText(text); });
  }));
  parser.delegate = &received;
  EXPECT_TRUE(parser.parse());
  return {received.attributes["b"], received.text};
}

RC_GTEST_PROP(MLFXMLWriter, WhatIsWrittenReadsBack, ()) {
  const auto text = [] {
    return *rc::gen::container<std::string>(
        rc::gen::element('a', '<', '&', '"', '\'', '>', ']', ' ', '\t', '\n', '\r'));
  };
  const auto value = text(), content = text();
  RC_ASSERT(readBack(value, content) == std::make_pair(value, content));
}

TEST(MLFXMLWriter, LargePiecesAndManyElements) {
  const std::string large(8 << 20, 'x');
  EXPECT_TRUE(readBack(large, large) == std::make_pair(large, large));
  struct Count : XMLParser::Delegate {
    int elements = 0;
    void didStartElement(XMLParser&, const std::string&, const XMLParser::Attributes&) override {
      ++elements;
    }
  } count;
  XMLParser parser(Writer::XMLDataUsingDocumentWriter([](auto& d) {
    d.createRootElementWithName("a", {}, [](auto& a) {
      for (int i = 0; i < 50000; ++i) a.addChildElementWithName("page", {{"name", std::string(200, 'n')}});
    });
  }));
  parser.delegate = &count;
  EXPECT_TRUE(parser.parse());
  EXPECT_EQ(count.elements, 50001);
}

}  // namespace
}  // namespace MarletFoundation::test
