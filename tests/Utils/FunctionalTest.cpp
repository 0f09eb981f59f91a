#include "MarletFoundation/Utils/Functional.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <map>
#include <numeric>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Utils/FunctionalArray.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

using Array = std::vector<int>;
using Pairs = std::vector<std::pair<int, int>>;

/// Numbers with their places, so that a test sees which of two equal ones it has.
Pairs numbered(const Array& array) {
  Pairs pairs;
  for (const int i : array) pairs.emplace_back(i % 4, static_cast<int>(pairs.size()));
  return pairs;
}
const auto byFirst = [](const auto& a, const auto& b) { return a.first < b.first; };
const auto first = [](const auto& pair) { return pair.first; };

TEST(Functional, FailuresAreFatalWithTheStatedWords) {
  const auto half = [](int i) {
    if (i % 2) throw ErrorObject::withMessage("D", 1, "odd");
    return i / 2;
  };
  EXPECT_EQ(fatalOnError(half)(4), 2);
  EXPECT_EQ(fatalMessage([&] { fatalOnError(half)(3); }),
            R"(failure in ^!: Error(domain: D, code: 1, "odd"))");
  EXPECT_EQ(valueOrFatal([&] { return half(4); }, "never"), 2);
  EXPECT_EQ(fatalMessage([&] { valueOrFatal([&] { return half(3); }, "must be even"); }), "must be even");
  EXPECT_EQ(fatalMessage([] { NOOOOOOOOOOOOOOOOOO(); }), "NOOOOOOOOOOOOOOOOOO!!!");
}

TEST(Functional, CombinatorsApplyInTheStatedOrder) {
  const auto append = [](std::string s) { return [s](std::string other) { return s + other; }; };
  EXPECT_EQ(compose(append("outer"), append("inner"))("x"), "outerinnerx");
  EXPECT_EQ(flip(append)("second")("first"), "firstsecond");
  EXPECT_EQ(const_(7)("ignored"), 7);
  int calls = 0;
  const auto count = [&](auto&&...) { return ++calls; };
  static_assert(std::is_void_v<decltype(void_(count)())>);
  void_(count)();
  EXPECT_EQ(applyReturn(count, std::string("x")), "x");
  EXPECT_EQ(calls, 2);
  EXPECT_TRUE(not_(false) && invert(false) && !not_(true) && !invert(true));

  const auto half = [](int i) { return i % 2 ? std::nullopt : std::optional(i / 2); };
  EXPECT_EQ(flatMapOptional(std::optional(4), half), 2);
  EXPECT_EQ(flatMapOptional(std::optional(3), half), std::nullopt);
  EXPECT_EQ(flatMapOptional(std::optional<int>(), half), std::nullopt);
  const auto show = [](int i) { return std::to_string(i); };
  EXPECT_EQ(cata(std::optional(4), show, "none"), "4");
  EXPECT_EQ(cata(std::optional<int>(), show, "none"), "none");
}

TEST(Functional, CombiningHashIsFixed) {
  EXPECT_EQ(combiningHash(0, 0), 0u);
  EXPECT_EQ(combiningHash(1, 0), 0xb91445ce692f0ce5u);
  EXPECT_EQ(combiningHash(0, 1), 0xf4ff80ec63c103d4u);
  EXPECT_EQ(combiningHash(0xFFFFFFFFFFFFFFFF, 0x0123456789ABCDEF), 0x3bb3f2c6d6c1b8b9u);
}

RC_GTEST_PROP(FunctionalArray, LowerBoundFindsThePartition, (Array array, int pivot)) {
  const auto below = [&](int i) { return i < pivot; };
  const auto expected = std::partition(array.begin(), array.end(), below) - array.begin();
  RC_ASSERT(lowerBound(array, below) == static_cast<std::size_t>(expected));
}

TEST(FunctionalArray, LowerBoundLooksAtTheMiddles) {
  Array looked;
  lowerBound(Array{0, 1, 2, 3, 4, 5}, [&](int i) { return looked.push_back(i), i < 4; });
  EXPECT_EQ(looked, (Array{3, 5, 4}));
  EXPECT_EQ(lowerBound(Array{1, 2}, [](int) { return true; }), 2u);
  EXPECT_EQ(lowerBound(Array{}, [](int) { return true; }), 0u);
}

RC_GTEST_PROP(FunctionalArray, SortsAreStable, (const Array& array)) {
  const auto pairs = numbered(array);
  auto expected = pairs;
  std::stable_sort(expected.begin(), expected.end(), byFirst);
  RC_ASSERT(stableSort(pairs, byFirst) == expected);

  const auto end = pairs.size() - pairs.size() / 4, start = end / 3;
  auto part = pairs;
  expected = pairs;
  insertionSort(part, start, end, byFirst);
  std::stable_sort(expected.begin() + static_cast<std::ptrdiff_t>(start),
                   expected.begin() + static_cast<std::ptrdiff_t>(end), byFirst);
  RC_ASSERT(part == expected);
}

RC_GTEST_PROP(FunctionalArray, DedupKeepsTheFirstOfEachKey, (const Array& array)) {
  const auto pairs = numbered(array);
  Pairs expected;
  std::map<int, int> seen;
  for (const auto& pair : pairs)
    if (seen[pair.first]++ == 0) expected.push_back(pair);
  RC_ASSERT(dedup(pairs, first) == expected);
  for (auto& pair : expected) pair.second += 1000 * (seen[pair.first] - 1);
  const auto mark = [](auto pair) { return std::pair(pair.first, pair.second + 1000); };
  RC_ASSERT(dedupWithMark(pairs, first, mark) == expected);
}

RC_GTEST_PROP(FunctionalArray, RotateTurnsLeft, (const Array& array)) {
  const auto size = static_cast<int>(array.size());
  const auto count = *rc::gen::inRange(0, 3 * size + 1);
  const auto rotated = rotate(array, count);
  RC_ASSERT(rotated.size() == array.size());
  for (int i = 0; i < size; ++i)
    RC_ASSERT(rotated[static_cast<std::size_t>(i)] == array[static_cast<std::size_t>((i + count) % size)]);
}

TEST(FunctionalArray, OddCornersAreAsStated) {
  EXPECT_EQ(rotate(Array{}, -1), Array{});
  EXPECT_EQ(rotate(Array{1}, -1), Array{1});
  EXPECT_EQ(rotate(Array{1, 2}, -4), (Array{1, 2}));
  EXPECT_EQ(fatalMessage([] { rotate(Array{1, 2}, -1); }), "range out of bounds");
  Array array{2, 1};
  EXPECT_EQ(fatalMessage([&] { insertionSort(array, 0, 3, std::less()); }), "range out of bounds");
  EXPECT_EQ(fatalMessage([&] { insertionSort(array, 2, 1, std::less()); }), "range out of bounds");

  EXPECT_EQ(
      fold(Array{1, 2, 3}, std::string("0"), [](auto s, int i) { return "(" + s + std::to_string(i) + ")"; }),
      "(((01)2)3)");
  EXPECT_EQ(find(Array{1, 4, 6}, [](int i) { return i % 2 == 0; }), 4);
  EXPECT_EQ(find(Array{1, 3}, [](int i) { return i % 2 == 0; }), std::nullopt);
  EXPECT_EQ(without(Array{1, 2, 1, 3}, Array{1, 7}), (Array{2, 3}));
  EXPECT_EQ(without(Array{1, 2}, Array{}), (Array{1, 2}));
  EXPECT_EQ(singleton(std::string("x")), std::vector<std::string>{"x"});
  Array seen;
  each(std::map<int, int>{{2, 20}, {1, 10}},
       [&](int key, int value) { return seen.push_back(key + value), 0; });
  EXPECT_EQ(seen, (Array{11, 22}));
  EXPECT_EQ(toArray(std::map<int, int>{{1, 2}}), (std::vector<std::pair<const int, int>>{{1, 2}}));
}

}  // namespace
}  // namespace MarletFoundation::test
