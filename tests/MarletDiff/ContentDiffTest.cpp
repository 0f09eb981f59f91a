#include "MarletDiff/ContentDiff.h"

#include <gtest/gtest.h>

#include "MarletDiff/ContentMerge.h"
#include "MarletDiff/Texts.h"

namespace MarletFoundation::test {
namespace {

using MarletDiff::diffContent;
using MarletDiff::DiffDescriptor;
using MarletDiff::DiffOptions;
using MarletDiff::mergeContent;

constexpr auto smaller = DiffOptions::SmallerHunks;

/// Whether the hunks lead from one text to the other, by either side's ranges.
void expectLeads(const std::u16string& original, const std::u16string& modified,
                 const std::vector<DiffDescriptor>& hunks) {
  RC_ASSERT(mergeContent(original, hunks) == modified);
  RC_ASSERT(hunks.empty() == (original == modified));
  std::vector<DiffDescriptor> backwards;
  for (const auto& [from, to, before, after] : hunks) backwards.push_back({to, from, after, before});
  RC_ASSERT(mergeContent(modified, backwards) == original);
}

TEST(ContentDiff, LeadsFromOneTextToTheOther) {
  EXPECT_TRUE(rc::check([] {
    const auto original = *similarText(), modified = *similarText();
    for (const auto options : {std::optional<DiffOptions>(), {smaller}}) {
      expectLeads(original, modified, diffContent(original, modified, options));
    }
  }));
}

TEST(ContentDiff, LeadsThroughSmallChangesOfAText) {
  EXPECT_TRUE(rc::check([] {
    const auto before = *similarText(), inside = *similarText(), after = *similarText();
    const auto original = before + inside + after + inside + before;
    const auto modified = before + *similarText() + after + *similarText() + before;
    expectLeads(original, modified, diffContent(original, modified, smaller));
  }));
}

TEST(ContentDiff, HunksAreLinesOrSmaller) {
  struct {
    std::u16string original, modified;
    std::vector<DiffDescriptor> lines, words;
  } cases[] = {
      {u"a\nb c\nd\n",
       u"a\nb x\nd\n",
       {{{2, 4}, {2, 4}, u"b c\n", u"b x\n"}},
       {{{4, 1}, {4, 1}, u"c", u"x"}}},
      {u"one\r\ntwo",
       u"one\r\nnew\r\ntwo",
       {{{5, 0}, {5, 5}, u"", u"new\r\n"}},
       {{{5, 0}, {5, 5}, u"", u"new\r\n"}}},
      {u"a\u2028b\u2029c",
       u"a\u2028x\u2029c",
       {{{0, 4}, {0, 4}, u"a\u2028b\u2029", u"a\u2028x\u2029"}},
       {{{0, 3}, {0, 3}, u"a\u2028b", u"a\u2028x"}}},
      {u"f(ab, cd)",
       u"f(abc, d)",
       {{{0, 9}, {0, 9}, u"f(ab, cd)", u"f(abc, d)"}},
       {{{2, 2}, {2, 3}, u"ab", u"abc"}, {{6, 2}, {7, 1}, u"cd", u"d"}}},
      {u"\U0001F600",
       u"\U0001F601",
       {{{0, 2}, {0, 2}, u"\U0001F600", u"\U0001F601"}},
       {{{0, 2}, {0, 2}, u"\U0001F600", u"\U0001F601"}}},
      {u"same", u"same", {}, {}},
      {u"", u"x", {{{0, 0}, {0, 1}, u"", u"x"}}, {{{0, 0}, {0, 1}, u"", u"x"}}},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(diffContent(c.original, c.modified), c.lines);
    EXPECT_EQ(diffContent(c.original, c.modified, DiffOptions()), c.lines);
    EXPECT_EQ(diffContent(c.original, c.modified, smaller), c.words);
  }
}

/// Texts that a search for the fewest hunks would take hours over.
TEST(ContentDiff, FarApartTextsCostNoMoreThanTheirLength) {
  std::u16string numbers, others, ab, ba;
  for (int i = 0; i < 300'000; ++i) {
    const auto number = std::to_string(i);
    const std::u16string digits(number.begin(), number.end());
    numbers += digits + u"\n";
    others += u"x" + digits + (i % 7 == 0 ? u"\n" : u" ");
    ab += i % 3 == 0 ? u"a\n" : u"b\n";
    ba += i % 5 == 0 ? u"a\n" : u"b\n";
  }
  const auto start = std::chrono::steady_clock::now();
  for (const auto& [original, modified] : {std::pair(&numbers, &others), {&ab, &ba}, {&others, &ab}}) {
    expectLeads(*original, *modified, diffContent(*original, *modified, smaller));
  }
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(30));
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
