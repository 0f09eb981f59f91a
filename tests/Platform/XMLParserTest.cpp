#include "MarletFoundation/Platform/XMLParser.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace MarletFoundation::test {
namespace {

/// Writes down what it is told, and may abort or throw at an element of a given name.
struct Recorder : XMLParser::Delegate {
  std::string events;
  std::string abortAt, throwAt;

  void didStartElement(XMLParser& parser, const std::string& name,
                       const XMLParser::Attributes& attributes) override {
    events += "<" + name;
    for (const auto& [key, value] : attributes) events += " " + key + "=" + value;
    events += ">";
    if (name == abortAt) parser.abortParsing();
    if (name == throwAt) throw std::runtime_error(name);
  }
  void didEndElement(XMLParser&, const std::string& name) override { events += "</" + name + ">"; }
  void foundCharacters(XMLParser&, std::string_view text) override { events += text; }
  void parserDidEndDocument(XMLParser&) override { events += "."; }
};

struct Outcome {
  std::string events;
  /// 0 after a success.
  std::int64_t line = 0;
};

Outcome parse(std::string document) {
  Recorder recorder;
  XMLParser parser((Data(std::move(document))));
  parser.delegate = &recorder;
  const bool success = parser.parse();
  EXPECT_EQ(success, !parser.parserError());
  if (success) return {recorder.events};
  EXPECT_EQ(parser.parserError()->domain(), XMLParserErrorDomain);
  EXPECT_FALSE(parser.parserError()->localizedDescription().empty());
  return {recorder.events, std::get<std::int64_t>(parser.parserError()->value(LineKey).value())};
}

std::string repeated(std::string_view text, int count) {
  std::string result;
  for (int i = 0; i < count; ++i) result += text;
  return result;
}

std::string wide(std::string_view text, bool bigEndian) {
  std::string result;
  for (const char c : text) result += bigEndian ? std::string{'\0', c} : std::string{c, '\0'};
  return result;
}

std::string elementWithAttributes(int count) {
  std::string text = "<b";
  for (int i = 0; i < count; ++i) text += " a" + std::to_string(i) + " = '" + (i % 2 ? ">" : "") + "'";
  return text + "/>";
}

TEST(XMLParser, tellsWhatItReads) {
  const struct {
    std::string document, events;
  } cases[] = {
      {"<a x='1&amp;2&#65;&lt;' p:y=\"'\">t&amp;u<![CDATA[<z>]]><p:b/></a>",
       "<a p:y=' x=1&2A<>t&u<z><p:b></p:b></a>."},
      {"<!DOCTYPE a SYSTEM 'file:///nowhere.dtd'><!-- c --><a/>", "<a></a>."},
      {"\xEF\xBB\xBF<?xml version='1.0' encoding='utf-8'?><a>\u00E9</a>", "<a>\u00E9</a>."},
      {"<?xml version='1.0' encoding='iso-8859-1'?><a>\xE9</a>", "<a>\u00E9</a>."},
      {"<?xml version='1.0' encoding=\"Windows-1252\"?><a>\x80</a>", "<a>\u20AC</a>."},
      {wide("<?xml version='1.0' encoding='UTF-16'?><a/>", false), "<a></a>."},
      {"\xFE\xFF" + wide("<a/>", true), "<a></a>."},
  };
  for (const auto& [document, events] : cases) {
    const auto outcome = parse(document);
    EXPECT_EQ(outcome.events, events);
    EXPECT_EQ(outcome.line, 0) << document;
  }
}

TEST(XMLParser, endsAtWhatItRefuses) {
  const struct {
    std::string document, events;
    std::int64_t line;
  } cases[] = {
      {"", "", 1},
      {"<a>\n<b/>\n<c></a>", "<a>\n<b></b>\n<c>", 3},
      {"<a/><b/>", "<a></a>", 1},
      {"<a x='1' x='2'/>", "", 1},
      {"<a><!-- -- -->b</a>", "<a>", 1},
      {"<!DOCTYPE a [<!ENTITY e 'x'>]><a>&e;</a>", "", 1},
      {"<!DOCTYPE a [<!ENTITY % e SYSTEM 'file:///etc/passwd'> %e;]><a/>", "", 1},
      {"<!DOCTYPE a SYSTEM 'file:///nowhere.dtd'>\n<a>&e;</a>", "<a>", 2},
      {"<a>b&nbsp;</a>", "<a>b", 1},
      {"<a>\n<b/>\xFF<c/></a>", "<a>\n<b></b>", 2},
      {"<a/>\n\xC3", "<a></a>", 2},
      {std::string("<a>\n\0</a>", 9), "<a>\n", 2},
      {std::string("\0\0\0<\0\0\0a", 8), "", 1},
      {"<?xml version='1.0' encoding='Shift_JIS'?><a/>", "", 1},
      {"<?xml version='1.0' encoding='UTF-16'?><a/>", "", 1},
      {"<?xml version='1.0' encoding='US-ASCII'?><a><b/>\u00E9</a>", "<a><b></b>", 1},
      {"<?xml version='1.0' encoding='windows-1252'?><a><b/>\x81</a>", "<a><b></b>", 1},
  };
  for (const auto& [document, events, line] : cases) {
    const auto outcome = parse(document);
    EXPECT_EQ(outcome.events, events) << document;
    EXPECT_EQ(outcome.line, line) << document;
  }
}

TEST(XMLParser, countsDepthAndAttributes) {
  EXPECT_EQ(parse(repeated("<a>", 256) + repeated("</a>", 256)).line, 0);
  EXPECT_EQ(parse(repeated("<a>", 257) + repeated("</a>", 257)).events, repeated("<a>", 256));
  EXPECT_EQ(parse(elementWithAttributes(256)).line, 0);
  const auto crowded = "<a>\n<b/>" + elementWithAttributes(257) + "</a>";
  EXPECT_EQ(parse(crowded).events, "<a>\n<b></b>");
  EXPECT_EQ(parse(crowded).line, 2);
  // What looks like a comment only to who doesn't know document types hides nothing.
  EXPECT_EQ(parse("<!DOCTYPE a SYSTEM '<!--'>" + elementWithAttributes(257)).events, "");
}

TEST(XMLParser, hostileSizesTakeLinearTime) {
  std::string names = "<r>";
  for (int i = 0; i < 600000; ++i) names += "<n" + std::to_string(i) + "/>";
  EXPECT_NE(parse(names + "</r>").line, 0);
  EXPECT_NE(parse(elementWithAttributes(300000)).line, 0);
  EXPECT_EQ(parse("<r>" + repeated(elementWithAttributes(250), 200) + "</r>").line, 0);
  EXPECT_EQ(parse("<r>" + repeated("text &amp; more\n", 800000) + "</r>").line, 0);
}

TEST(XMLParser, anAbortEndsTheParse) {
  Recorder recorder;
  recorder.abortAt = "b";
  XMLParser parser(Data(std::string("<a>\n<b/>x<c/></a>")));
  parser.delegate = &recorder;
  EXPECT_FALSE(parser.parse());
  EXPECT_EQ(recorder.events, "<a>\n<b>");
  ASSERT_TRUE(parser.parserError());
  EXPECT_EQ(parser.parserError()->localizedDescription(), "The parse was aborted.");
  recorder.abortAt.clear();
  EXPECT_TRUE(parser.parse());
  EXPECT_FALSE(parser.parserError());
}

TEST(XMLParser, whatADelegateThrowsComesOut) {
  Recorder recorder;
  recorder.throwAt = "b";
  XMLParser parser(Data(std::string("<a><b/><c/></a>")));
  parser.delegate = &recorder;
  EXPECT_THROW(parser.parse(), std::runtime_error);
  EXPECT_EQ(recorder.events, "<a><b>");
}

TEST(XMLParser, needsNoDelegate) {
  EXPECT_TRUE(XMLParser(Data(std::string("<a/>"))).parse());
  EXPECT_FALSE(XMLParser(Data(std::string("<a>"))).parse());
}

}  // namespace
}  // namespace MarletFoundation::test
