#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include "MarletFoundation/SourceEditor/LineIndexedBuffer.h"
#include "MarletFoundation/SourceEditor/SourceEditorUTF8RangeConverter.h"
#include "MarletFoundation/SourceEditor/StringCharacters.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

/// Every place between two characters, from the front.
std::vector<ConvertedIndex> naivePlaces(const std::u16string& text) {
  std::vector<ConvertedIndex> places{{}};
  const auto end = static_cast<std::int64_t>(text.size());
  for (ConvertedIndex at; at.utf16Index < end; places.push_back(at)) {
    const auto unit = text[static_cast<std::size_t>(at.utf16Index)];
    const bool isHigh = unit >= 0xD800 && unit <= 0xDBFF;
    at.utf8Index += isHigh ? 4 : unit < 0x80 ? 1 : unit < 0x800 ? 2 : 3;
    at.utf16Index += isHigh ? 2 : 1;
  }
  return places;
}

ConvertedIndex naive(const std::vector<ConvertedIndex>& places, std::int64_t ConvertedIndex::*scheme,
                     std::int64_t target) {
  for (const auto& place : places)
    if (place.*scheme >= target) return place;
  return places.back();
}

/// Runs of one plane, so that blocks of all kinds come up, with halves of pairs strewn in.
rc::Gen<std::u16string> anyText() {
  const auto piece = rc::gen::map(
      rc::gen::pair(rc::gen::elementOf(std::vector<std::u16string>{
                        u"a", u"\n", u"\r", u"\r\n", u"\u2028", u"\u2029", u"\u00e9", u"\u20ac",
                        u"\U0001F600", u"\U0010FFFF", std::u16string(1, 0xD83D), std::u16string(1, 0xDE00),
                        std::u16string(1, 0), u"\u007f\u0080\u07ff\u0800\uffff"}),
                    rc::gen::inRange(1, 40)),
      [](const auto& run) {
        std::u16string text;
        for (int i = 0; i < run.second; ++i) text += run.first;
        return text;
      });
  return rc::gen::map(rc::gen::container<std::vector<std::u16string>>(piece), [](const auto& pieces) {
    std::u16string text;
    for (const auto& each : pieces) text += each;
    return text;
  });
}

RC_GTEST_PROP(RangeConverter, AgreesWithTheNaiveWalkInAnyOrder, ()) {
  const auto text = *anyText();
  const auto places = naivePlaces(text);
  const auto last = places.back().utf8Index + 3;
  std::vector<std::int64_t> targets;
  for (std::int64_t i = -2; i <= last; ++i) targets.push_back(i);
  const auto order = *rc::gen::inRange(0, 3);
  if (order == 1) std::reverse(targets.begin(), targets.end());
  if (order == 2)
    targets = *rc::gen::container<std::vector<std::int64_t>>(rc::gen::inRange<std::int64_t>(-2, last + 1));
  const auto buffer = std::make_shared<const LineIndexedBuffer>(text);
  UTF8RangeConverter toUTF16(text);
  SourceEditorUTF8RangeConverter both(buffer);
  const auto& units = both.utf16RangeConverter();
  for (const auto target : targets) {
    const auto expected = naive(places, &ConvertedIndex::utf8Index, target);
    RC_ASSERT(toUTF16.utf16IndexFromUTF8Index(target) == expected.utf16Index);
    // The cache keeps what it has passed, so a target inside the last character finds the same place.
    RC_ASSERT(toUTF16.lastConversion() == expected);
    const auto unit = std::clamp<std::int64_t>(target, 0, static_cast<std::int64_t>(text.size()));
    RC_ASSERT(units.indexFromSourceEditorPosition(buffer->positionFromIndex(unit, target)) == unit);
    const auto back = both.indexFromSourceEditorPosition(buffer->positionFromIndex(unit, target));
    RC_ASSERT(back == naive(places, &ConvertedIndex::utf16Index, unit).utf8Index);
    const OffsetRange range{std::min(back, expected.utf8Index), std::max(back, expected.utf8Index)};
    RC_ASSERT(both.rangeFromSourceEditorRange(both.sourceEditorRangeFromRange(range)) == range);
  }
}

RC_GTEST_PROP(LineIndexedBuffer, AgreesWithTheNaiveCountWhateverTheHint, ()) {
  const auto text = *anyText();
  const LineIndexedBuffer buffer(text);
  SourceEditorPosition expected;
  for (std::size_t i = 0; i <= text.size(); ++i) {
    const auto hint = *rc::gen::inRange<std::int64_t>(-2, buffer.lineCount() + 2);
    RC_ASSERT(buffer.positionFromIndex(static_cast<std::int64_t>(i), hint) == expected);
    RC_ASSERT(buffer.indexFromPosition(expected) == static_cast<std::int64_t>(i));
    if (i == text.size()) break;
    const bool ends = text[i] == u'\n' || text[i] == u'\u2029' ||
                      (text[i] == u'\r' && !(i + 1 < text.size() && text[i + 1] == u'\n'));
    expected = ends ? SourceEditorPosition(expected.line + 1, 0)
                    : SourceEditorPosition(expected.line, expected.col + 1);
  }
}

TEST(RangeConverter, IsFatalWithoutItsBufferAndForBoundsInTheWrongOrder) {
  auto buffer = std::make_shared<LineIndexedBuffer>(u"ab\ncd");
  SourceEditorUTF16RangeConverter converter(buffer);
  EXPECT_EQ(converter.sourceEditorRangeFromRange({1, 4}), SourceEditorRange({0, 1}, {1, 1}));
  EXPECT_EQ(converter.lastLine(), 1);
  EXPECT_NE(fatalMessage([&] { converter.rangeFromSourceEditorRange({{1, 0}, {0, 0}}); }), "");
  buffer.reset();
  EXPECT_NE(fatalMessage([&] { converter.sourceEditorPositionFromIndex(0); }), "");
}

TEST(StringCharacters, CountExtendedGraphemeClusters) {
  const std::string text = "a\r\ne\u0301\U0001F469\u200D\U0001F4BB";
  EXPECT_EQ(length(text), 4);
  EXPECT_EQ(subscript(text, 2), "e\u0301");
  EXPECT_EQ(subscript(text, OffsetRange{1, 4}), text.substr(1));
  EXPECT_EQ(subscript(text, OffsetRange{4, 4}), "");
  EXPECT_NE(fatalMessage([&] { subscript(text, 4); }), "");
  EXPECT_NE(fatalMessage([&] { subscript(text, INT64_MAX); }), "");
  EXPECT_NE(fatalMessage([&] { subscript(text, -1); }), "");
}

}  // namespace
}  // namespace MarletFoundation::test
