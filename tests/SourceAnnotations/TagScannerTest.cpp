#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <chrono>

#include "Dump.h"
#include "MarletFoundation/Platform/RegularExpression.h"
#include "MarletFoundation/SourceAnnotations/CopyPayload.h"
#include "MarletFoundation/SourceAnnotations/DocumentNode.h"
#include "MarletFoundation/SourceAnnotations/TagCandidates.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

struct Row {
  std::string text;
  std::string dump;
};

/// One line each, as the scanner alone sees them.
const std::vector<Row> lines = {
    {"", ""},
    {"  \t ", ""},
    {"//#-editable-code", "multiLineFieldStart@0+17[Tap to enter code]"},
    {"//#-editable-code  x y\u3000", "multiLineFieldStart@0+23[x y]"},
    {"//#-editable-code \t", "multiLineFieldStart@0+19[\t]"},
    {"//#-editable-code(abc)", "multiLineFieldStart@0+22[(abc)]"},
    {"//#-editable-code\tx", ""},
    {"//#-editable-code \u2028\u0085\u00A0\u000B", "multiLineFieldStart@0+22[Tap to enter code]"},
    {"//#-editable-code /*#-end-editable-code*/", "multiLineFieldStart@0+41[/*#-end-editable-code*/]"},
    {"//#-editable-code \U0001F600e\u0301", "multiLineFieldStart@0+22[\U0001F600e\u0301]"},
    {"//#-end-editable-code", "multiLineFieldEnd@0+21"},
    {"//#-end-editable-code x", ""},
    {"//#-hidden-code   ", "hiddenCodeStart@0+18"},
    {"//#-hidden-code(", ""},
    {"//#-hidden-codes", ""},
    {"//#-Hidden-Code", ""},
    {"// #-hidden-code", ""},
    {"x //#-hidden-code", ""},
    {"//#-hidden-code x /*#-bogus*/", "!unknownInlineTag@18+11[/*#-bogus*/]"},
    {"//#-end-hidden-code", "hiddenCodeEnd@0+19"},
    {"//#-code-completion(everything, show)", "codeCompletionDirective@0+37[Add.Everything]"},
    {"//#-code-completion(identifier, hide, a, \"b\")  ",
     "codeCompletionDirective@0+47[Remove.Identifier.a,Remove.Identifier.\"b\"]"},
    {"//#-code-completion", ""},
    {"//#-code-completion(everything)", ""},
    {"//#-code-completion(everything,hide)/*#-x*/", "!unknownInlineTag@36+7[/*#-x*/]"},
    {"//#-code-completion(bogus, maybe)",
     "!lexiportParseError@0+33[parse error in lexiport directive: Invalid namespace: bogus]"},
    {"//#-code-completion(module, maybe)",
     "!lexiportParseError@0+34[parse error in lexiport directive: Invalid hide or show: maybe]"},
    {"//#-copy-source(x)", "multiLineCopySourceStart@0+18[x]"},
    {"//#-copy-source (_\u00E9$1)", "multiLineCopySourceStart@0+22[_\u00E9$1]"},
    {"//#-copy-source", "!copySourceMalformed@0+15[//#-copy-source]"},
    {"//#-copy-source(1x) ", "!copySourceMalformed@0+20[//#-copy-source(1x) ]"},
    {"//#-end-copy-source", "multiLineCopySourceEnd@0+19"},
    {R"(//#-copy-destination("P\"1", x))", R"(multiLineCopyDestinationStart@0+31[P\"1,x])"},
    {R"(//#-copy-destination("P",x))", R"(!copyDestinationMalformed@0+27[//#-copy-destination("P",x)])"},
    {R"(//#-copy-destination("", x))", R"(!copyDestinationMalformed@0+27[//#-copy-destination("", x)])"},
    {"//#-end-copy-destination", "multiLineCopyDestinationEnd@0+24"},
    {"//#-bogus", ""},
    {R"(a = /*#-editable-code*/"x"/*#-end-editable-code*/)",
     "inlineFieldStart@4+19[Tap to edit,1] inlineFieldEnd@26+23[1]"},
    {R"(a = /*#-editable-code n */ "x" /*#-end-editable-code */)",
     "inlineFieldStart@4+22[n,0] inlineFieldEnd@31+24[0]"},
    {"/*#-editable-code*/", "!missingEndTag@0+19[inlineFieldStart]"},
    {"/*#-end-editable-code x*/", "!unknownInlineTag@0+25[/*#-end-editable-code x*/]"},
    {"/*#-end-editable-code*/", "!missingStartTag@0+23[inlineFieldEnd]"},
    {"/*#-hidden-code*/", "!unknownInlineTag@0+17[/*#-hidden-code*/]"},
    {"/*#-editable-code", ""},
    {"/*#-*/*#-*/", "!unknownInlineTag@0+6[/*#-*/] !unknownInlineTag@5+6[/*#-*/]"},
    {"\u00E9/*#-bogus /*#-\U0001F600*/",
     "!unknownInlineTag@1+18[/*#-bogus /*#-\U0001F600*/] !unknownInlineTag@11+8[/*#-\U0001F600*/]"},
    {"/*#-copy-source(a)*//*#-copy-source(b)*/1/*#-end-copy-source*//*#-end-copy-source*/",
     "inlineCopySourceStart@0+20[a] inlineCopySourceStart@20+20[b] inlineCopySourceEnd@41+21 "
     "inlineCopySourceEnd@62+21"},
    {"/*#-copy-source*/", "!copySourceMalformed@0+17[/*#-copy-source*/]"},
    {R"(/*#-copy-destination("P", x)*//*#-end-copy-destination*/)",
     "inlineCopyDestinationStart@0+30[P,x] inlineCopyDestinationEnd@30+26"},
    {R"(/*#-copy-destination("P" x)*/)", R"(!copyDestinationMalformed@0+29[/*#-copy-destination("P" x)*/])"},
    // A copy destination may not hold a field, nor a field a field.
    {R"(/*#-copy-destination("P", x)*//*#-editable-code*//*#-end-editable-code*//*#-end-copy-destination*/)",
     "inlineCopyDestinationStart@0+30[P,x] inlineCopyDestinationEnd@72+26 "
     "!improperlyNestedTag@30+19[inlineFieldStart]"},
};

TEST(TagScanner, linesByThemselves) {
  for (const auto& row : lines)
    EXPECT_EQ(dump(SourceTag::parseStringForTags(wide(row.text))), row.dump) << row.text;
}

SourceTag::ParseResult moved(SourceTag::ParseResult result, std::size_t before, std::size_t indentation) {
  for (auto& located : result.tags) located.range.location += static_cast<std::int64_t>(before + indentation);
  for (auto& error : result.errors) {
    const auto* text = std::get_if<TagText>(&error.payload);
    const bool isRelative = text && text->view().starts_with("//");
    error.range.location += static_cast<std::int64_t>(isRelative ? indentation : before + indentation);
  }
  return result;
}

TEST(TagScanner, linesInLongerTexts) {
  for (const auto& row : lines) {
    const auto alone = SourceTag::parseStringForTags(wide(row.text));
    for (const std::u16string before :
         {u"\n", u"//#-x\r", u"\U0001F600//\r\n", u"/*#-\u2029", u"*/ \r\r\n"}) {
      for (const std::u16string indentation : {u"", u" \t", u"\u00A0\u3000"}) {
        for (const std::u16string after : {u"", u"\r*/", u"\u2029*/", u"\r\n//#-"}) {
          const auto text = before + indentation + wide(row.text) + after;
          EXPECT_EQ(dump(SourceTag::parseStringForTags(text)),
                    dump(moved(alone, before.size(), indentation.size())))
              << utf8FromUTF16Lossy(text);
        }
      }
    }
  }
}

/// Whole texts, one letter a tag, in capitals for line tags: f field, s copy source, d copy destination, H
/// hidden code; "/" in front closes; C is a directive.
std::string pageOf(const std::string& sketch) {
  std::string page;
  for (std::size_t i = 0; i < sketch.size(); ++i) {
    const bool isEnd = sketch[i] == '/';
    const char letter = sketch[i += isEnd ? 1 : 0];
    const bool isLine = letter < 'a';
    const std::string end = isEnd ? "end-" : "";
    std::string tag;
    switch (letter | 0x20) {
      case 'f':
        tag = end + "editable-code";
        break;
      case 's':
        tag = end + "copy-source" + (isEnd ? "" : "(x)");
        break;
      case 'd':
        tag = end + "copy-destination" + (isEnd ? "" : "(\"P\", x)");
        break;
      case 'h':
        tag = end + "hidden-code";
        break;
      default:
        tag = "code-completion(module, show)";
    }
    page += isLine ? "\n//#-" + tag + "\n" : "/*#-" + tag + "*/";
  }
  return page;
}

struct Verdict {
  std::string sketch;
  std::size_t tags;
  std::vector<std::string> errors;
};

TEST(TagTree, documentsAreJudged) {
  const std::vector<Verdict> verdicts = {
      {"F/FF/F", 4, {}},
      {"SF/F/S", 4, {}},
      {"SFD/D/F/S", 6, {}},
      {"SSF/F/S/S", 4, {"improperlyNestedTag[multiLineFieldStart]"}},
      {"S/SS/S", 4, {}},
      {"Ss/s/S", 4, {}},
      {"HC/HC", 4, {}},
      {"FC/F", 2, {"improperlyNestedTag[codeCompletionDirective]"}},
      {"FH/H/F", 2, {"improperlyNestedTag[hiddenCodeStart]"}},
      {"HF/F/H", 2, {"improperlyNestedTag[multiLineFieldStart]"}},
      {"HF/H/F", 0, {"missingEndTag[hiddenCodeStart]"}},
      {"Ff/f/F", 2, {"improperlyNestedTag[inlineFieldStart]"}},
      {"fd/d/f", 4, {}},
      {"Fd/d/F", 2, {"improperlyNestedTag[inlineCopyDestinationStart]"}},
      {"d/d", 0, {"improperlyNestedTag[inlineCopyDestinationStart]"}},
      {"D/D", 0, {"improperlyNestedTag[multiLineCopyDestinationStart]"}},
      {"sf/f/s", 4, {}},
      {"ssf/f/s/s", 4, {"improperlyNestedTag[inlineFieldStart]"}},
      {"Sf/f/S", 2, {"improperlyNestedTag[inlineFieldStart]"}},
      {"fs/s/f", 2, {"improperlyNestedTag[inlineCopySourceStart]"}},
      {"F/F/F", 2, {"missingStartTag[multiLineFieldEnd]"}},
      {"/HF/F", 2, {"missingStartTag[hiddenCodeEnd]"}},
      {"F", 0, {"missingEndTag[multiLineFieldStart]"}},
      {"fF/F", 2, {"missingEndTag[inlineFieldStart]"}},
      {"F/H/F", 2, {"missingStartTag[hiddenCodeEnd]"}},
      {"/S/s/D/d/f",
       0,
       {"missingStartTag[inlineCopySourceEnd]", "missingStartTag[inlineCopyDestinationEnd]",
        "missingStartTag[inlineFieldEnd]", "missingStartTag[multiLineCopySourceEnd]",
        "missingStartTag[multiLineCopyDestinationEnd]"}},
  };
  for (const auto& [sketch, tags, errors] : verdicts) {
    const auto result = SourceTag::parseStringForValidTags(wide(pageOf(sketch)));
    EXPECT_EQ(result.tags.size(), tags) << sketch;
    std::vector<std::string> found;
    for (const auto& error : result.errors)
      found.push_back(std::string(error.caseName()) + "[" +
                      std::string(std::get<SourceTag>(error.payload).caseName()) + "]");
    EXPECT_EQ(found, errors) << sketch;
    EXPECT_EQ(SourceTag::hasValidTags(wide(pageOf(sketch))), errors.empty()) << sketch;
  }
}

TEST(TagTree, lineTagsAmongInlineTagsAreFatal) {
  const SourceTag::Located tag{{0, 1}, {SourceTag::Plain<SourceTag::Case::hiddenCodeStart>{}}};
  const SourceTag::Located end{{1, 1}, {SourceTag::Plain<SourceTag::Case::hiddenCodeEnd>{}}};
  EXPECT_EQ(fatalMessage([&] {
              validateInlineTagsFor(u"the line", {tag, end});
            }),
            "Should not have received multiline tag while validating inline tags for line: the line");
}

TEST(SourceTag, predicatesAndCodes) {
  const auto scanned = SourceTag::parseStringForTags(wide(pageOf("HC/HSFD/D/F/Ssf/f/sd/d")));
  std::string sorts;
  for (const auto& [range, tag] : scanned.tags) {
    sorts += tag.isLineTag() ? 'L' : 'i';
    EXPECT_NE(tag.isLineTag(), tag.isInlineTag());
    sorts += tag.isMultiLineEditableField() ? "F" : tag.isEditableField() ? "f" : "";
    sorts += tag.isCopySource() ? "s" : tag.isCopyDestination() ? "d" : "";
  }
  EXPECT_EQ(sorts, "LLLLsLFLdLdLFLsisififisidid");
  const SourceTag::ParseError error(SourceTag::ParseError::Case::copyDestinationMalformed, {3, 4},
                                    TagText("a\"b"));
  EXPECT_EQ(error.code(), 6);
  EXPECT_EQ(error.domain(), "MarletFoundation.SourceTag.ParseError");
  EXPECT_EQ(error.description(), "copyDestinationMalformed({3, 4}, \"a\\\"b\")");
}

std::u16string joined(const std::vector<std::string>& pieces) {
  std::string text;
  for (const auto& piece : pieces) text += piece;
  return wide(text);
}

rc::Gen<std::vector<std::string>> taggedPieces() {
  const auto piece = rc::gen::element<std::string>(
      "//#-", "/*#-", "*/", "\n", "\r\n", "\u2029", " ", "\"", "x", "\U0001F600", "editable-code",
      "end-editable-code", "hidden-code", "end-hidden-code", "copy-source(a)", "end-copy-source",
      "copy-destination(\"p\", q)", "end-copy-destination", "code-completion(module, hide)",
      "/*#-editable-code*/", "/*#-end-editable-code*/", "\n//#-editable-code\n", "\n//#-end-editable-code\n");
  return rc::gen::container<std::vector<std::string>>(piece);
}

RC_GTEST_PROP(TagScanner, lawsHold, ()) {
  const auto text = joined(*taggedPieces());
  const auto scanned = SourceTag::parseStringForTags(text);
  const auto valid = SourceTag::parseStringForValidTags(text);
  std::int64_t last = -1;
  for (const auto& [range, tag] : scanned.tags) {
    RC_ASSERT(range.location > last && range.end() <= static_cast<std::int64_t>(text.size()));
    last = range.location;
    const auto opening = text.substr(static_cast<std::size_t>(range.location), 4);
    const bool isExpected = opening == (tag.isLineTag() ? u"//#-" : u"/*#-");
    RC_ASSERT(isExpected);
  }
  auto rest = scanned.tags.begin();
  for (const auto& tag : valid.tags) {
    rest = std::find(rest, scanned.tags.end(), tag);
    RC_ASSERT(rest != scanned.tags.end());
  }
  RC_ASSERT(SourceTag::hasValidTags(text) == valid.errors.empty());
  RC_ASSERT(SourceTag::filterForOnlyValidTagsFor(valid.tags).errors.empty());

  const auto kept = [&](auto isKept) {
    auto tags = scanned.tags;
    std::erase_if(
        tags, [&](const auto& located) { return located.tag.isCopyDestination() || !isKept(located.tag); });
    return tags;
  };
  RC_ASSERT(SourceTag::parseStringForLineTagsInSourceEditor(text) ==
            kept([](const SourceTag& tag) { return tag.isLineTag(); }));
  RC_ASSERT(SourceTag::parseStringForInlineTagsInSourceEditor(text) ==
            kept([](const SourceTag& tag) { return tag.isInlineTag(); }));
  RC_ASSERT(SourceTag::parseLineForTagsInSourceEditor(text) == kept([](const SourceTag&) { return true; }));
}

RC_GTEST_PROP(TagScanner, candidatesAreFound, ()) {
  const auto filler = static_cast<std::size_t>(*rc::gen::inRange(0, 200));
  const auto pieces = rc::gen::element<std::string>("/", "*", "#", "-", "x");
  const auto text =
      std::u16string(filler, u'#') + joined(*rc::gen::container<std::vector<std::string>>(pieces));
  for (std::size_t from = 0; from <= text.size(); ++from)
    RC_ASSERT(nextTagCandidate(text, from) == std::min(text.find(u"//#-", from), text.find(u"/*#-", from)));
}

const std::u16string identifierHead =
    uR"([a-zA-Z_)"
    uR"(\u00A8\u00AA\u00AD\u00AF\u00B2-\u00B5\u00B7-\u00BA\u00BC-\u00BE\u00C0-\u00D6\u00D8-\u00F6)"
    uR"(\u00F8-\u00FF\u0100-\u02FF\u0370-\u167F\u1681-\u180D\u180F-\u1DBF\u1E00-\u1FFF)"
    uR"(\u200B-\u200D\u202A-\u202E\u203F-\u2040\u2054\u2060-\u206F\u2070-\u20CF\u2100-\u218F)"
    uR"(\u2460-\u24FF\u2776-\u2793\u2C00-\u2DFF\u2E80-\u2FFF\u3004-\u3007\u3021-\u302F)"
    uR"(\u3031-\u303F\u3040-\uD7FF\uF900-\uFD3D\uFD40-\uFDCF\uFDF0-\uFE1F\uFE30-\uFE44)"
    uR"(\uFE47-\uFFFD)";

std::u16string identifierPattern() {
  auto head = identifierHead;
  for (const char16_t plane : std::u16string(u"123456789ABCDE"))
    head = head + u"\\U000" + plane + u"0000-\\U000" + plane + u"FFFD";
  const auto tail = head + uR"(0-9\u0300-\u036F\u1DC0-\u1DFF\u20D0-\u20FF\uFE20-\uFE2F$])";
  head += u"]";
  return u"(?:(?:" + head + tail + u"*)(?:" + head + tail + u"*)*?)";
}

const RegularExpression copySourcePartsRegex(u"^\\((" + identifierPattern() + u")\\) *$");
const RegularExpression copyDestinationPartsRegex(uR"x(^\("((?:[^"]|\\")+?)", ()x" + identifierPattern() +
                                                  u")\\) *$");

TEST(CopyPayload, identifiersAreThoseOfThePattern) {
  for (const std::u16string before : {u"(", u"(a"}) {
    for (char32_t scalar = 0; scalar < 0x110000; scalar += scalar < 0x10400 ? 1 : 0x3FFF) {
      auto payload = before;
      if (scalar >= 0x10000) payload += static_cast<char16_t>(0xD7C0 + (scalar >> 10));
      payload += static_cast<char16_t>(scalar < 0x10000 ? scalar : 0xDC00 | (scalar & 0x3FF));
      payload += u')';
      ASSERT_EQ(extractCopySourceParts(payload).has_value(),
                copySourcePartsRegex.firstMatch(payload).has_value())
          << std::hex << static_cast<unsigned>(scalar);
    }
  }
}

RC_GTEST_PROP(CopyPayload, isThatOfThePatterns, ()) {
  const auto pieces = rc::gen::element<std::string>("(", ")", "\"", "\\", ", ", ",", "a", "1", "\"(", "(\"",
                                                    "\", ", "b)", "\\\"");
  const auto text = joined(*rc::gen::resize(12, rc::gen::container<std::vector<std::string>>(pieces)));
  for (const auto& payload : {text, u"(\"" + text, u"(\"" + text + u"\", x)", u"(" + text + u")"}) {
    if (payload.size() > 30 || payload.ends_with(u' ')) continue;
    const auto source = copySourcePartsRegex.firstMatch(payload);
    const auto identifier = extractCopySourceParts(payload);
    RC_ASSERT(source.has_value() == identifier.has_value());
    if (source) RC_ASSERT(static_cast<std::int64_t>(identifier->size()) == (*source)[1].length);
    const auto destination = copyDestinationPartsRegex.firstMatch(payload);
    const auto parts = extractCopyDestinationParts(payload);
    RC_ASSERT(destination.has_value() == parts.has_value());
    if (!parts) continue;
    RC_ASSERT(static_cast<std::int64_t>(parts->pageRef.size()) == (*destination)[1].length);
    const auto identifierLocation = parts->identifier.data() - payload.data();
    RC_ASSERT(identifierLocation == (*destination)[2].location);
  }
}

/// Texts on which something that looks again at what it has seen would take hours.
TEST(TagScanner, hostileTextsTakeLinearTime) {
  const auto repeated = [](const std::string& piece, std::size_t count) {
    std::string text;
    for (std::size_t i = 0; i < count; ++i) text += piece;
    return text;
  };
  const std::size_t count = 200000;
  const auto start = std::chrono::steady_clock::now();
  for (const auto& text : {
           repeated("/*#-editable-code ", count) + repeated(" ", count) + "*/",
           repeated("/*#-copy-destination(\"a\\\", ", count) + repeated("b", count) + "*/",
           repeated("/*#-copy-source(a", count) + repeated("b", count) + ")*/",
           repeated("/*#-bogus", count) + "\u00E9*/",
           repeated("/*#-", count),
           repeated("//#-code-completion(a, ", count) + "x",
           "//#-copy-destination(\"" + repeated("\\\", a", count),
           "//#-copy-source(" + repeated("a", count) + "!",
           repeated("//#-editable-code\n", count),
           repeated("//#-copy-source(x)\n", count) + repeated("//#-end-copy-source\n", count),
           repeated("/*#-copy-source(x)*/", count) + repeated("/*#-end-copy-source*/", count),
           repeated("#-", count) + repeated("\n", count),
       }) {
    SourceTag::parseStringForValidTags(wide(text));
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(60));
}

}  // namespace
}  // namespace MarletFoundation::test
