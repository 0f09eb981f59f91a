#include "MarletFoundation/SourceEditor/SourceEditorRange.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <limits>
#include <unordered_set>

#include "MarletFoundation/Utils/Functional.h"
#include "support/Failure.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

using Position = SourceEditorPosition;
using Range = SourceEditorRange;

constexpr auto largest = std::numeric_limits<std::int64_t>::max();

TEST(SourceEditorPosition, movesWithEdits) {
  const struct {
    Position before;
    Range inserted;
    Position after;
  } insertions[] = {
      {{3, 5}, {{3, 5}, {3, 9}}, {3, 5}},  {{3, 6}, {{3, 5}, {3, 9}}, {3, 10}},
      {{3, 6}, {{3, 2}, {5, 4}}, {5, 10}}, {{4, 1}, {{3, 2}, {5, 4}}, {6, 1}},
      {{2, 9}, {{3, 2}, {5, 4}}, {2, 9}},  {{4, 1}, {{3, 2}, {3, 8}}, {4, 1}},
  };
  for (const auto& [before, inserted, after] : insertions)
    EXPECT_EQ(before.adjustedPositionByInsertingRange(inserted), after) << inserted.description();

  const struct {
    Position before;
    Range deleted;
    Position after;
  } deletions[] = {
      {{3, 6}, {{3, 2}, {3, 6}}, {3, 2}}, {{3, 7}, {{3, 2}, {3, 6}}, {3, 3}},
      {{7, 2}, {{3, 2}, {5, 0}}, {5, 2}}, {{5, 3}, {{3, 2}, {5, 1}}, {3, 4}},
      {{4, 9}, {{3, 2}, {5, 1}}, {3, 2}}, {{3, 2}, {{3, 2}, {5, 1}}, {3, 2}},
  };
  for (const auto& [before, deleted, after] : deletions)
    EXPECT_EQ(before.adjustedPositionByDeletingRange(deleted), after) << deleted.description();
}

RC_GTEST_PROP(SourceEditorPosition, deletingAnInsertionInOneLineMovesBack, ()) {
  const auto number = rc::gen::inRange<std::int64_t>(0, 6);
  const Position position(*number, *number), start(*number, *number);
  const Range range(start, {start.line, start.col + *number});
  RC_ASSERT(position.adjustedPositionByInsertingRange(range).adjustedPositionByDeletingRange(range) ==
            position);
}

RC_GTEST_PROP(SourceEditorPosition, deletingInsertedLinesMovesBackOtherLinesAndItsOwnByTheKeptColumn, ()) {
  const auto number = rc::gen::inRange<std::int64_t>(0, 6);
  const Position position(*number, *number), start(*number, *number);
  const Range range(start, {start.line + 1 + *number, *number});
  const auto back = position.adjustedPositionByInsertingRange(range).adjustedPositionByDeletingRange(range);
  const bool kept = position.line == start.line && position > start;
  RC_ASSERT(back == Position(position.line, position.col + (kept ? start.col : 0)));
}

TEST(SourceEditorPosition, overflowAndNegativeHashesAreFatal) {
  constexpr auto overflow = "arithmetic overflow";
  EXPECT_EQ(fatalMessage([] {
              Position(largest, 0).adjustedPositionByInsertingRange({{0, 0}, {1, 0}});
            }),
            overflow);
  EXPECT_EQ(fatalMessage([] {
              Position(0, largest).adjustedPositionByDeletingRange({{0, 9}, {0, 9}});
            }),
            overflow);
  EXPECT_EQ(fatalMessage([] { Range(0, -2, largest).columnDifferenceAsRange(); }), overflow);
  EXPECT_NE(fatalMessage([] { Position(0, -1).hashValue(); }), "");
  EXPECT_EQ(Position(3, 5).hashValue(), combiningHash(3, 5));
  EXPECT_TRUE((std::unordered_set<Position>{{3, 5}, {3, 6}, {3, 5}}).size() == 2);
}

TEST(SourceEditorRange, predicates) {
  const Range range({1, 2}, {3, 4}), empty(1, OffsetRange(2, 2));
  EXPECT_TRUE(empty.isEmptyRange() && !range.isEmptyRange());
  EXPECT_TRUE(empty.touchesPosition({1, 2}));
  EXPECT_FALSE(empty.enclosesPosition({1, 2}));
  EXPECT_TRUE(range.touchesPosition({3, 4}));
  EXPECT_FALSE(range.enclosesPosition({3, 4}));
  EXPECT_TRUE(range.containsRange(range));
  EXPECT_FALSE(range.enclosesRange(range));
  EXPECT_TRUE(range.enclosesRange({{1, 2}, {3, 3}}));
  EXPECT_FALSE(range.containsRange({{1, 1}, {3, 4}}));
  EXPECT_EQ(Range({5, 3}, {1, 1}).columnDifferenceAsRange(), (TextRange{3, -2}));
}

TEST(SourceEditorRange, overlappingRangesAreLessThanEachOther) {
  const Range wide(0, 0, 5), narrow(0, 3, 4), behind(0, 5, 6);
  EXPECT_TRUE(wide < narrow && narrow < wide && wide < wide);
  EXPECT_FALSE(wide <= narrow || narrow >= wide || wide <= wide);
  EXPECT_TRUE(wide < behind && wide <= behind && behind > wide);
  EXPECT_FALSE(behind < wide);
}

TEST(SourceEditorRange, growsAroundAnInsertionAndCollapsesInADeletion) {
  EXPECT_EQ(Range(0, 3, 5).adjustedRangeByInsertingRange(Range(0, 3, 6)), Range(0, 3, 8));
  EXPECT_EQ(Range(0, 3, 5).adjustedRangeByDeletingRange(Range(0, 1, 7)), Range(0, 1, 1));
}

TEST(SourceEditorRange, propertyLists) {
  using D = PropertyListDictionary;
  const Range range({1, 2}, {3, -4});
  EXPECT_EQ(range.propertyListValue(), PropertyListValue(D{{"start", D{{"line", 1}, {"column", 2}}},
                                                           {"end", D{{"line", 3}, {"column", -4}}}}));
  EXPECT_EQ(Range(range.propertyListValue()), range);
  EXPECT_EQ(range.description(), "SourceEditorRange: line: 1, col: 2 - line: 3, col: -4");
  EXPECT_EQ(range.start.description(), "SourceEditorPosition: line: 1, col: 2");

  const PropertyListValue good = D{{"line", 1}, {"column", 2}};
  const struct {
    PropertyListValue value;
    std::string description;
    int code;
  } cases[] = {
      {"x", "RootNotADictionary", 0},
      {D{{"end", good}}, "MissingStart", 1},
      {D{{"start", "broken"}}, "MissingEnd", 2},
      {D{{"start", "broken"}, {"end", "broken"}}, "StartInvalid(RootNotADictionary)", 3},
      {D{{"start", good}, {"end", D{{"line", 1.0}}}}, "EndInvalid(MissingLine)", 4},
      {D{{"start", good}, {"end", D{{"line", 1}, {"column", true}}}}, "EndInvalid(MissingColumn)", 4},
  };
  for (const auto& [value, description, code] : cases) {
    const auto error = thrown<Range::PropertyListSerializationError>([&v = value] { Range{v}; });
    EXPECT_EQ(error.description(), description);
    EXPECT_EQ(error.code(), code);
    EXPECT_EQ(ErrorObject(error).code(), code);
  }
}

}  // namespace
}  // namespace MarletFoundation::test
