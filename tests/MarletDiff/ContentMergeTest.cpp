#include "MarletDiff/ContentMerge.h"

#include <gtest/gtest.h>

#include <cerrno>

#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/Texts.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using MarletDiff::DiffDescriptor;
using MarletDiff::mergeContent;
using Hunks = std::vector<DiffDescriptor>;
constexpr auto largest = std::numeric_limits<std::int64_t>::max();

std::string printed(std::string text) { return text; }
std::string printed(const std::u16string& text) { return utf8FromUTF16Lossy(text); }

template <class Text>
std::string mergedIn(const Text& base, const Hunks& diff, const Hunks& otherDiff) {
  try {
    return printed(mergeContent(base, diff, otherDiff));
  } catch (const ErrorObject& error) {
    return error.description();
  }
}

/// The merged text, or the error's printed form: the same in both encodings where UTF-8 can tell.
std::string merged(std::u16string_view base, const Hunks& diff, const Hunks& otherDiff = {}) {
  const auto result = mergedIn(base, diff, otherDiff);
  const auto isWellFormed = [](const DiffDescriptor& hunk) {
    return utf8FromUTF16(hunk.modifiedContent).has_value();
  };
  if (const auto utf8 = utf8FromUTF16(base); utf8 && std::all_of(diff.begin(), diff.end(), isWellFormed) &&
                                             std::all_of(otherDiff.begin(), otherDiff.end(), isWellFormed)) {
    EXPECT_EQ(mergedIn(*utf8, diff, otherDiff), result);
  }
  return result;
}

TEST(ContentMerge, RefusesHunksThatAreNotOfTheBase) {
  const std::string words[] = {"reaches beyond the text.", "starts ahead of the end of the one before it.",
                               "divides a character.", "is of other text than stands there."};
  const std::u16string base = u"abc\U0001F600def";
  struct {
    Hunks hunks;
    int code;
    std::string place;
  } cases[] = {
      {{{{-1, 1}, {}, u"", u""}}, 1, "{-1, 1}"},
      {{{{1, -1}, {}, u"", u""}}, 1, "{1, -1}"},
      {{{{7, 2}, {}, u"f", u""}}, 1, "{7, 2}"},
      {{{{9, 0}, {}, u"", u""}}, 1, "{9, 0}"},
      {{{{1, largest}, {}, u"", u""}}, 1, "{1, 9223372036854775807}"},
      {{{{largest, largest}, {}, u"", u""}}, 1, "{9223372036854775807, 9223372036854775807}"},
      {{hunk(5, u"d", u"x"), hunk(0, u"a", u"x")}, 2, "{0, 1}"},
      {{hunk(0, u"abc", u"x"), hunk(2, u"c", u"y")}, 2, "{2, 1}"},
      {{hunk(0, u"a", u"x"), hunk(0, u"", u"y")}, 2, "{0, 0}"},
      {{hunk(4, u"", u"x")}, 3, "{4, 0}"},
      {{{{2, 2}, {}, {u'c', char16_t{0xD83D}}, u"x"}}, 3, "{2, 2}"},
      {{hunk(1, u"x", u"y")}, 4, "{1, 1}"},
      {{{{1, 1}, {}, u"bc", u"y"}}, 4, "{1, 1}"},
  };
  for (const auto& [hunks, code, place] : cases) {
    const auto failure = "Error(domain: MarletDiff, code: " + std::to_string(code) + ", \"The change at " +
                         place + " " + words[code - 1] + "\")";
    EXPECT_EQ(merged(base, hunks), failure);
    EXPECT_EQ(merged(base, {hunk(0, u"abc", u"")}, hunks), failure);
  }
}

TEST(ContentMerge, RefusesWhatUTF8CannotHold) {
  const auto notUTF8 = ErrorObject(std::string(PosixErrorDomain), EILSEQ).description();
  EXPECT_EQ(mergedIn(std::string("a\xff"), {}, {}), notUTF8);
  EXPECT_EQ(mergedIn(std::string("a"), {hunk(0, u"a", {char16_t{0xD83D}})}, {}), notUTF8);
  EXPECT_THROW(MarletDiff::diffContent("a", "a\xff"), ErrorObject);
}

TEST(ContentMerge, AppliesOneDiffByItsOriginalRanges) {
  const std::pair<Hunks, std::string> cases[] = {
      {{}, "one two"},
      {{hunk(0, u"", u"zero "), hunk(0, u"one", u"1"), hunk(3, u"", u"!"), hunk(7, u"", u" three")},
       "zero 1! two three"},
      {{hunk(3, u"", u"a"), hunk(3, u"", u"b"), hunk(3, u" two", u"")}, "oneab"},
      {{{{4, 3}, {largest, -5}, u"two", u"2"}}, "one 2"},
  };
  for (const auto& [hunks, text] : cases) EXPECT_EQ(merged(u"one two", hunks), text);
}

TEST(ContentMerge, JoinsTwoSidesUnlessTheyMeet) {
  struct {
    std::u16string base;
    Hunks diff, otherDiff;
    std::string expected;  // the text, or the place of the conflict
  } cases[] = {
      // Apart, if only by a blank.
      {u"foo bar", {hunk(0, u"foo", u"1")}, {hunk(4, u"bar", u"2")}, "1 2"},
      {u"foo bar", {hunk(1, u"oo", u"ee")}, {hunk(4, u"bar", u"2")}, "fee 2"},
      {u"foo bar", {hunk(1, u"o", u"e")}, {hunk(3, u" ", u"-")}, "feo-bar"},
      {u"a\nb\nc\n", {hunk(0, u"a\n", u"")}, {hunk(4, u"", u"x\n")}, "b\nx\nc\n"},
      // Both the same.
      {u"foo bar", {hunk(0, u"foo", u"1")}, {hunk(0, u"foo", u"1")}, "1 bar"},
      {u"foo", {hunk(3, u"", u"!")}, {hunk(3, u"", u"!")}, "foo!"},
      {u"abc", {hunk(0, u"ab", u"xy")}, {hunk(0, u"a", u"x"), hunk(1, u"b", u"y")}, "xyc"},
      // One side changes nothing there.
      {u"foo bar", {hunk(0, u"foo", u"foo")}, {hunk(0, u"foo", u"1")}, "1 bar"},
      {u"foo bar", {hunk(0, u"foo", u"1")}, {hunk(1, u"oo b", u"oo b")}, "1 bar"},
      // Overlapping and touching.
      {u"foo bar", {hunk(0, u"foo b", u"1")}, {hunk(4, u"bar", u"2")}, "{0, 7}"},
      {u"(foo)", {hunk(0, u"(", u"[")}, {hunk(1, u"foo", u"2")}, "{0, 4}"},
      {u"foo", {hunk(3, u"", u"!")}, {hunk(3, u"", u"?")}, "{3, 0}"},
      {u"a b", {hunk(1, u"", u",")}, {hunk(1, u" ", u"-")}, "{1, 1}"},
      {u"0123456789", {hunk(0, u"012", u"a"), hunk(5, u"567", u"b")}, {hunk(2, u"2345", u"c")}, "{0, 8}"},
      // The same word.
      {u"window", {hunk(0, u"w", u"W")}, {hunk(5, u"w", u"ws")}, "{0, 6}"},
      {u"window", {hunk(0, u"", u"my")}, {hunk(6, u"", u"s")}, "{0, 6}"},
      {u"foo bar", {hunk(3, u" ", u"")}, {hunk(5, u"ar", u"us")}, "{3, 4}"},
      {u"foo bar", {hunk(0, u"f", u"g")}, {hunk(3, u" ", u"_")}, "{0, 4}"},
      {u"\u00e4\u00f6\u00fc", {hunk(0, u"\u00e4", u"a")}, {hunk(2, u"\u00fc", u"u")}, "{0, 3}"},
      // Beyond ASCII there are blanks and punctuation too, and scripts that do without.
      {u"\u00e9t\u00e9\u3000\u00e9t\u00e9",
       {hunk(0, u"\u00e9", u"e")},
       {hunk(6, u"\u00e9", u"e")},
       "et\u00e9\u3000\u00e9te"},
      {u"\u3042\u3001\u3044", {hunk(0, u"\u3042", u"a")}, {hunk(2, u"\u3044", u"i")}, "a\u3001i"},
      {u"\u79c1\u306f\u5b66\u6821",
       {hunk(0, u"\u79c1", u"\u541b")},
       {hunk(2, u"\u5b66", u"\u9ad8")},
       "\u541b\u306f\u9ad8\u6821"},
      {u"\u0e1b\u0e25\u0e32", {hunk(0, u"\u0e1b", u"")}, {hunk(2, u"\u0e32", u"")}, "\u0e25"},
      {u"\u30ab\u30bf\u30ab\u30ca",
       {hunk(0, u"\u30ab", u"\u30ad")},
       {hunk(3, u"\u30ca", u"\u30cb")},
       "{0, 4}"},
      {u"\ud55c\uad6d\uc5b4", {hunk(0, u"\ud55c", u"\uc911")}, {hunk(2, u"\uc5b4", u"\uc778")}, "{0, 3}"},
      // But a character stays one, and its marks with it.
      {u"\u0e19\u0e49\u0e33", {hunk(0, u"\u0e19", u"\u0e1a")}, {hunk(2, u"\u0e33", u"")}, "{0, 3}"},
      {u"\u845b\U000E0100\u57ce",
       {hunk(0, u"\u845b", u"\u8449")},
       {hunk(3, u"", u"!")},
       "\u8449\U000E0100!\u57ce"},
      {u"\U0001F469\u200d\U0001F680",
       {hunk(0, u"\U0001F469", u"\U0001F468")},
       {hunk(3, u"\U0001F680", u"\U0001F33E")},
       "{0, 5}"},
      // A conflict is one even if all else fits.
      {u"a b c", {hunk(0, u"a", u"x"), hunk(4, u"c", u"1")}, {hunk(4, u"c", u"2")}, "{4, 1}"},
  };
  for (const auto& [base, diff, otherDiff, expected] : cases) {
    const auto result = expected.front() != '{'
                            ? expected
                            : "Error(domain: MarletDiff, code: 5, \"Both sides change the text at " +
                                  expected + " in different ways.\")";
    EXPECT_EQ(merged(base, diff, otherDiff), result);
    EXPECT_EQ(merged(base, otherDiff, diff), result);
  }
}

TEST(ContentMerge, ConflictNamesThePlaceAndTheThreeTexts) {
  const auto error = thrown<ErrorObject>(
      [] { mergeContent(u"let x = 1", Hunks{hunk(8, u"1", u"2")}, Hunks{hunk(8, u"1", u"\U0001F600")}); });
  EXPECT_EQ(error.value(MarletDiff::LocationKey), UserInfoValue(std::int64_t{8}));
  EXPECT_EQ(error.value(MarletDiff::LengthKey), UserInfoValue(std::int64_t{1}));
  EXPECT_EQ(error.value(MarletDiff::BaseTextKey), UserInfoValue("1"));
  EXPECT_EQ(error.value(MarletDiff::TextKey), UserInfoValue("2"));
  EXPECT_EQ(error.value(MarletDiff::OtherTextKey), UserInfoValue("\U0001F600"));
}

TEST(ContentMerge, SidesAreAlikeAndAgreeWithThemselves) {
  EXPECT_TRUE(rc::check([] {
    const auto base = *similarText(), text = *similarText(), otherText = *similarText();
    const auto diff = MarletDiff::diffContent(base, text, MarletDiff::DiffOptions::SmallerHunks);
    const auto otherDiff = MarletDiff::diffContent(base, otherText, MarletDiff::DiffOptions::SmallerHunks);
    RC_ASSERT(mergeContent(base, diff, diff) == text);
    RC_ASSERT(mergeContent(base, {}, diff) == text);
    RC_ASSERT(merged(base, diff, otherDiff) == merged(base, otherDiff, diff));
  }));
}

TEST(ContentMerge, ChangesOfDifferentPlacesAllGoIn) {
  EXPECT_TRUE(rc::check([] {
    const auto head = *similarText(), newHead = *similarText(), tail = *similarText(),
               newTail = *similarText();
    const std::u16string between = u" - ";
    const auto diff = MarletDiff::diffContent(head, newHead, MarletDiff::DiffOptions::SmallerHunks);
    auto otherDiff = MarletDiff::diffContent(tail, newTail, MarletDiff::DiffOptions::SmallerHunks);
    for (auto& hunk : otherDiff) hunk.originalRange.location += std::ssize(head + between);
    RC_ASSERT(mergeContent(head + between + tail, diff, otherDiff) == newHead + between + newTail);
  }));
}

/// Many changes of both sides within one endless word are one conflict, found in one pass.
TEST(ContentMerge, CostsNoMoreThanTheBaseIsLong) {
  const std::u16string base(2'000'000, u'w');
  Hunks diff, otherDiff;
  for (int at = 0; at + 4 < std::ssize(base); at += 4) {
    diff.push_back(hunk(at, u"w", u"x"));
    otherDiff.push_back(hunk(at + 2, u"w", u"y"));
  }
  EXPECT_THROW(mergeContent(base, diff, otherDiff), ErrorObject);
  EXPECT_EQ(mergeContent(base, diff).size(), base.size());
}

}  // namespace
}  // namespace MarletFoundation::test
