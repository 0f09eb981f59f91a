#include "MarletDiff/ContentDiff.h"

#include <gtest/gtest.h>

#include "MarletDiff/ContentMerge.h"
#include "MarletDiff/Texts.h"
#include "support/FailingAllocation.h"

namespace MarletFoundation::test {
namespace {

using MarletDiff::diffContent;
using MarletDiff::DiffDescriptor;
using MarletDiff::DiffOptions;
using MarletDiff::mergeContent;
using Hunks = std::vector<DiffDescriptor>;

constexpr auto smaller = DiffOptions::SmallerHunks;

std::u16string_view at(std::u16string_view text, const TextRange& range) {
  return text.substr(static_cast<std::size_t>(range.location), static_cast<std::size_t>(range.length));
}

/// The offsets at which a character starts, and the text's end.
std::vector<bool> characterStarts(std::u16string_view text) {
  auto starts = graphemeStarts(text);
  starts.push_back(true);
  return starts;
}

/// Fails unless the hunks lead from one text to the other and are as small hunks must be.
void expectLaws(std::u16string_view original, std::u16string_view modified, const Hunks& hunks,
                bool areSmall) {
  RC_ASSERT(mergeContent(original, hunks) == modified);
  RC_ASSERT(hunks.empty() == (original == modified));
  const auto starts = characterStarts(original), modifiedStarts = characterStarts(modified);
  const auto isWhole = [](const std::vector<bool>& in, const TextRange& range) {
    return in[static_cast<std::size_t>(range.location)] && in[static_cast<std::size_t>(range.end())];
  };
  std::int64_t done = 0, modifiedDone = 0;
  for (const auto& [range, modifiedRange, content, modifiedContent] : hunks) {
    RC_ASSERT(range.location - done == modifiedRange.location - modifiedDone);
    RC_ASSERT(range.location > done || (done == 0 && modifiedDone == 0));
    done = range.end(), modifiedDone = modifiedRange.end();
    RC_ASSERT(at(original, range) == content);
    RC_ASSERT(at(modified, modifiedRange) == modifiedContent);
    RC_ASSERT(content != modifiedContent);
    RC_ASSERT(isWhole(starts, range));
    RC_ASSERT(isWhole(modifiedStarts, modifiedRange));
    if (!areSmall) continue;
    // No character that both contents start or end with.
    const auto shorter = std::min(range.length, modifiedRange.length);
    for (std::int64_t n = 1; n <= shorter; ++n) {
      RC_ASSERT(content.compare(0, n, modifiedContent, 0, n) != 0 || !starts[range.location + n] ||
                !modifiedStarts[modifiedRange.location + n]);
      RC_ASSERT(!content.ends_with(std::u16string_view(modifiedContent).substr(modifiedRange.length - n)) ||
                !starts[range.end() - n] || !modifiedStarts[modifiedRange.end() - n]);
    }
  }
}

/// Fails unless the texts, with what is ill-formed replaced, give the same hunks in both encodings.
void expectSameInUTF8(std::u16string_view original, std::u16string_view modified, DiffOptions options) {
  const auto before = utf8FromUTF16Lossy(original), after = utf8FromUTF16Lossy(modified);
  const auto hunks = diffContent(before, after, options);
  RC_ASSERT(hunks == diffContent(*utf16FromUTF8(before), *utf16FromUTF8(after), options));
  RC_ASSERT(mergeContent(before, hunks) == after);
}

void expectLaws(std::u16string_view original, std::u16string_view modified) {
  expectLaws(original, modified, diffContent(original, modified), false);
  expectLaws(original, modified, diffContent(original, modified, smaller), true);
  expectSameInUTF8(original, modified, {});
  expectSameInUTF8(original, modified, smaller);
}

TEST(ContentDiff, LeadsFromOneTextToTheOther) {
  EXPECT_TRUE(rc::check([] { expectLaws(*similarText(), *similarText()); }));
}

TEST(ContentDiff, LeadsThroughSmallChangesOfAText) {
  EXPECT_TRUE(rc::check([] {
    const auto before = *similarText(), inside = *similarText(), after = *similarText();
    expectLaws(before + inside + after + inside + before,
               before + *similarText() + after + *similarText() + before);
  }));
}

/// Long lines are not compared by words at once.
TEST(ContentDiff, LeadsThroughSmallChangesOfALongLine) {
  constexpr std::u16string_view words = u"foo f(x) /*#-e*/ \u00e9t\u00e9 a_1 ";
  std::u16string line;
  for (std::size_t i = 0; i < 4000; ++i) line += words.substr(i * i % 23);
  EXPECT_TRUE(rc::check([&] {
    auto edited = line;
    const auto places =
        *rc::gen::container<std::vector<std::size_t>>(rc::gen::inRange<std::size_t>(0, 40000));
    for (const auto place : places)
      edited.replace(place, *rc::gen::inRange<std::size_t>(0, 60), *similarText());
    expectLaws(line, edited);
  }));
  const auto edited = std::u16string(line).replace(20000, 0, u"new ").replace(30000, 3, u"");
  EXPECT_LE(diffContent(line, edited, smaller).size(), 3u);
}

/// Long texts are not compared by lines at once, which changes nothing of what is found.
TEST(ContentDiff, FindsEachChangeOfALongText) {
  std::u16string original, modified;
  Hunks lines, small;
  for (std::int64_t i = 0; i < 60'000; ++i) {
    const auto digits = std::to_string(i * i);
    const auto line = u"let \u00e9 = " + std::u16string(digits.begin(), digits.end()) + u"\r\n";
    auto other = line;
    if (i % 7919 == 5) {
      other.replace(4, 1, u"x");
      lines.push_back(
          {{std::ssize(original), std::ssize(line)}, {std::ssize(modified), std::ssize(line)}, line, other});
      small.push_back({{std::ssize(original) + 4, 1}, {std::ssize(modified) + 4, 1}, u"\u00e9", u"x"});
    } else if (i % 7919 == 500) {
      other += u"new\r\n";
      lines.push_back({{std::ssize(original + line), 0}, {std::ssize(modified + line), 5}, u"", u"new\r\n"});
      small.push_back(lines.back());
    }
    original += line;
    modified += other;
  }
  ASSERT_GT(original.size(), 1u << 20);
  EXPECT_EQ(diffContent(original, modified), lines);
  EXPECT_EQ(diffContent(original, modified, smaller), small);
  EXPECT_EQ(diffContent(*utf8FromUTF16(original), *utf8FromUTF16(modified), smaller), small);
}

TEST(ContentDiff, HunksAreLinesOrSmaller) {
  struct {
    std::u16string original, modified;
    Hunks lines, small;
  } cases[] = {
      {u"a\nb c\nd\n",
       u"a\nb x\nd\n",
       {{{2, 4}, {2, 4}, u"b c\n", u"b x\n"}},
       {{{4, 1}, {4, 1}, u"c", u"x"}}},
      {u"one\r\ntwo",
       u"one\r\nnew\r\ntwo",
       {{{5, 0}, {5, 5}, u"", u"new\r\n"}},
       {{{5, 0}, {5, 5}, u"", u"new\r\n"}}},
      {u"a\r\n", u"a\n", {{{0, 3}, {0, 2}, u"a\r\n", u"a\n"}}, {{{1, 2}, {1, 1}, u"\r\n", u"\n"}}},
      {u"a\u2028b\u2029c",
       u"a\u2028x\u2029c",
       {{{0, 4}, {0, 4}, u"a\u2028b\u2029", u"a\u2028x\u2029"}},
       {{{2, 1}, {2, 1}, u"b", u"x"}}},
      {u"f(ab, cd)",
       u"f(abc, d)",
       {{{0, 9}, {0, 9}, u"f(ab, cd)", u"f(abc, d)"}},
       {{{4, 0}, {4, 1}, u"", u"c"}, {{6, 1}, {7, 0}, u"c", u""}}},
      // Characters change as a whole: surrogate pairs, letters with marks, flags, joined emoji.
      {u"\U0001F600",
       u"\U0001F601",
       {{{0, 2}, {0, 2}, u"\U0001F600", u"\U0001F601"}},
       {{{0, 2}, {0, 2}, u"\U0001F600", u"\U0001F601"}}},
      {u".e\u0301", u".e", {{{0, 3}, {0, 2}, u".e\u0301", u".e"}}, {{{1, 2}, {1, 1}, u"e\u0301", u"e"}}},
      {u".\u0301x", u".x", {{{0, 3}, {0, 2}, u".\u0301x", u".x"}}, {{{0, 2}, {0, 1}, u".\u0301", u"."}}},
      {u"same", u"same", {}, {}},
      {u"", u"x", {{{0, 0}, {0, 1}, u"", u"x"}}, {{{0, 0}, {0, 1}, u"", u"x"}}},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(diffContent(c.original, c.modified), c.lines);
    EXPECT_EQ(diffContent(c.original, c.modified, DiffOptions()), c.lines);
    EXPECT_EQ(diffContent(c.original, c.modified, smaller), c.small);
  }
}

/// Where equal text leaves a choice, a change keeps out of what stands beside it.
TEST(ContentDiff, SlidesToTheStartsOfLinesAndWords) {
  struct {
    std::u16string original, modified;
    Hunks small;
  } cases[] = {
      {u"a b", u"a new b", {{{2, 0}, {2, 4}, u"", u"new "}}},
      {u"foo fooo", u"fooo fooo", {{{3, 0}, {3, 1}, u"", u"o"}}},
      {u"x\n//#-end\n", u"x\n//\n//#-end\n", {{{2, 0}, {2, 3}, u"", u"//\n"}}},
      {u"x\n//\n//#-end\n", u"x\n//#-end\n", {{{2, 3}, {2, 0}, u"//\n", u""}}},
      {u"/*#-e*/x/*#-end*/", u"/*#-e*/x//*#-end*/", {{{8, 0}, {8, 1}, u"", u"/"}}},
      {u"/*#-e*/x/*#-end*/", u"/*#-e*//x/*#-end*/", {{{7, 0}, {7, 1}, u"", u"/"}}},
      {u"/*#-e*//*#-end*/", u"/*#-e*///*#-end*/", {{{7, 0}, {7, 1}, u"", u"/"}}},
      {u"/*#-e*/x///*#-end*/", u"/*#-e*/x//*#-end*/", {{{9, 1}, {9, 0}, u"/", u""}}},
  };
  for (const auto& [original, modified, small] : cases) {
    EXPECT_EQ(diffContent(original, modified, smaller), small) << utf8FromUTF16Lossy(modified);
  }
}

/// An edit between two markers stays between them, whatever was written there but the markers themselves.
TEST(ContentDiff, StaysBetweenMarkers) {
  const auto stays = [](const std::u16string& before, const rc::Gen<std::u16string>& field,
                        const std::u16string& after) {
    const auto old = *field, edited = *field;
    const auto start = std::ssize(before), end = start + std::ssize(old);
    for (const auto& hunk : diffContent(before + old + after, before + edited + after, smaller)) {
      RC_ASSERT(hunk.originalRange.location >= start);
      RC_ASSERT(hunk.originalRange.end() <= end);
    }
  };
  const std::u16string line = u"//#-editable-code\n", endLine = u"//#-end-editable-code\n";
  const auto lines = textOf({u"\n", u"//\n", u"// \n", u"//#-\n", u"}\n", u"  }\n", u"x = 1\n", u"/\n"});
  const auto inlined = textOf({u"/", u"//", u" ", u"x", u"foo", u"1", u"#-", u"-", u"\u00e9"});
  EXPECT_TRUE(rc::check([&] {
    stays(u"a\n" + line + u"b\n" + endLine + u"\n" + line, lines, endLine + u"\n" + line + u"b\n" + endLine);
  }));
  EXPECT_TRUE(rc::check([&] {
    stays(u"let x = f(/*#-editable-code*/", inlined, u"/*#-end-editable-code*/, /*#-editable-code*/1)");
  }));
}

/// Texts that a search for the fewest hunks would take hours over.
TEST(ContentDiff, FarApartTextsCostNoMoreThanTheirLength) {
  std::u16string numbers, others, ab, ba, flags(600'000, u'\0');
  for (std::int64_t i = 0; i < 300'000; ++i) {
    const auto number = std::to_string(i);
    const std::u16string digits(number.begin(), number.end());
    numbers += digits + u"\n";
    others += u"x" + digits + (i % 7 == 0 ? u"\n" : u" ");
    ab += i * i % 11 < 4 ? u"a\n" : u"b\n";
    ba += i * i % 13 < 6 ? u"a\n" : u"b\n";
    flags.replace(static_cast<std::size_t>(i) * 2, 2, i * i % 11 < 4 ? u"\U0001F1E9" : u"\U0001F1EA");
  }
  for (const auto& [original, modified] :
       {std::pair(&numbers, &others), {&ab, &ba}, {&others, &ab}, {&flags, &others}}) {
    const auto hunks = diffContent(*original, *modified, smaller);
    EXPECT_EQ(mergeContent(*original, hunks), *modified);
    EXPECT_EQ(diffContent(*original, *modified, smaller), hunks);
  }
}

/// Where characters start is found once for each stretch, though a change that may slide asks at two far places in
/// turn. Each time it is found takes memory anew.
TEST(ContentDiff, CutsATextIntoItsCharactersOnce) {
  const auto repeated = [](std::u16string_view text, std::size_t times) {
    std::u16string result;
    for (; times > 0; --times) result += text;
    return result;
  };
  for (const auto* piece : {u"\u00e9 ", u"\u5b66\u6821\u3067\u3001", u"e\u0301", u"\U0001F1E9\U0001F1EA"}) {
    const auto allocations = [&](std::size_t times) {
      const auto line = repeated(piece, times) + u"\n", lines = repeated(line, 5);
      const auto text = *utf8FromUTF16(line), texts = *utf8FromUTF16(lines);
      takeAllocationCount();
      diffContent(lines, line, smaller);
      diffContent(texts, text, smaller);
      return takeAllocationCount();
    };
    allocations(1);
    const auto few = allocations(100);
    EXPECT_LT(allocations(800), 2 * few) << utf8FromUTF16Lossy(piece);
  }
}

TEST(DiffOptions, IsASet) {
  const DiffOptions none;
  EXPECT_TRUE(none.empty() && smaller.contains(none) && !none.contains(smaller));
  EXPECT_EQ(none | smaller, smaller);
  EXPECT_EQ(none & smaller, none);
  EXPECT_EQ(smaller ^ smaller, none);
  EXPECT_EQ(smaller - smaller, none);
}

}  // namespace
}  // namespace MarletFoundation::test
