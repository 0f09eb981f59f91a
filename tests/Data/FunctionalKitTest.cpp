#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include "MarletFoundation/Data/DataIterator.h"
#include "MarletFoundation/Data/JSON.h"
#include "MarletFoundation/Data/Monoid.h"
#include "MarletFoundation/Data/NonEmptyArray.h"
#include "MarletFoundation/Data/Result.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

using Array = std::vector<int>;

TEST(Either, WorksOnTheRightAndPassesTheLeftAlong) {
  using E = Either<std::string, int>;
  const auto left = E::left("l"), right = E::right(7);
  const auto half = [](int i) { return i % 2 ? E::left("odd") : E::right(i / 2); };
  const auto show = [](const E& e) {
    return e.cata([](const std::string& s) { return "L" + s; },
                  [](int i) { return "R" + std::to_string(i); });
  };
  EXPECT_EQ(left.left(), "l");
  EXPECT_EQ(left.right(), std::nullopt);
  EXPECT_EQ(right.left(), std::nullopt);
  EXPECT_EQ(right.toOptional(), 7);
  EXPECT_EQ(show(E::right(8).flatMap(half)), "R4");
  EXPECT_EQ(show(right.flatMap(half)), "Lodd");
  EXPECT_EQ(show(left.flatMap(half)), "Ll");
  EXPECT_EQ(right.map([](int i) { return i + 0.5; }).right(), 7.5);
  EXPECT_EQ(left.map([](int i) { return i + 0.5; }).left(), "l");
  using Same = Either<int, int>;
  EXPECT_FALSE(Same::left(1) == Same::right(1));
  EXPECT_EQ(left.cases().index(), 0u);
}

TEST(Result, CarriesAValueOrTheVeryError) {
  const auto failing = catchResult([]() -> int { throw ErrorObject("D", 3); });
  const auto succeeding = catchResult([] { return 7; });
  EXPECT_EQ(succeeding.get(), 7);
  EXPECT_EQ(succeeding.success(), 7);
  EXPECT_EQ(succeeding.failure(), nullptr);
  EXPECT_EQ(failing.success(), std::nullopt);
  EXPECT_EQ(failing.failure()->code(), 3);
  EXPECT_THROW(failing.get(), ErrorObject);
  EXPECT_THROW(failing.map([](int i) { return i + 1; }).get(), ErrorObject);
  EXPECT_EQ(succeeding.map([](int i) { return std::to_string(i); }).get(), "7");
  const auto refuse = [](int) { return Result<double>(ErrorObject("E", 4)); };
  EXPECT_EQ(succeeding.flatMap(refuse).failure()->domain(), "E");
  EXPECT_EQ(failing.flatMap(refuse).failure()->domain(), "D");
  EXPECT_TRUE(catchResult([] {}).success());

  const auto foreign = catchResult([]() -> int { throw std::out_of_range("far"); });
  EXPECT_EQ(foreign.failure()->description(), "far");
  EXPECT_EQ(foreign.failure()->code(), 0);
  EXPECT_THROW(foreign.get(), std::out_of_range);
  EXPECT_THROW(catchResult([] { throw 5; }).get(), int);
}

TEST(Maybe, GoesToTheOptionalAndBack) {
  const auto two = maybe(std::optional(2));
  const auto none = maybe(std::optional<int>());
  EXPECT_EQ(two.map([](int i) { return i * 1.5; }).optional(), 3.0);
  EXPECT_EQ(none.map([](int i) { return i * 1.5; }).optional(), std::nullopt);
  EXPECT_EQ(Unit().just().optional(), Unit());
  EXPECT_EQ(Unit().ignore("anything"), Unit());
}

TEST(NonEmptyArray, HoldsAtLeastOne) {
  EXPECT_FALSE(nonEmpty(Array()));
  EXPECT_EQ(NonEmptyArray<int>::from({5})->xs(), Array{5});
  Array seen;
  nonEmpty(Array{3, 1, 2})->mapM_([&](int i) { return seen.push_back(i), 0; });
  EXPECT_EQ(seen, (Array{3, 1, 2}));
}

TEST(DataIterator, GivesBytesUntilTheEnd) {
  DataIterator iterator{Data(std::string("abcd"))};
  EXPECT_EQ(iterator.peek(), 'a');
  EXPECT_EQ(iterator.pop(), 'a');
  EXPECT_EQ(iterator.peek(2)->view(), "bc");
  EXPECT_EQ(iterator.peek(0)->view(), "");
  EXPECT_EQ(iterator.pop(4), std::nullopt);
  EXPECT_EQ(iterator.pop(INT64_MAX), std::nullopt);
  EXPECT_EQ(iterator.currentIndex, 1);
  EXPECT_EQ(iterator.pop(2)->view(), "bc");
  EXPECT_EQ(iterator.next(), 'd');
  for (const std::int64_t index : {std::int64_t{4}, std::int64_t{5}, INT64_MAX}) {
    iterator.currentIndex = index;
    EXPECT_EQ(iterator.peek(0), std::nullopt);
    EXPECT_EQ(iterator.pop(), std::nullopt);
    EXPECT_EQ(iterator.currentIndex, index);
  }
  EXPECT_NE(fatalMessage([&] { iterator.peek(-1); }), "") << "at the end too";
  iterator.currentIndex = -1;
  EXPECT_NE(fatalMessage([&] { iterator.peek(); }), "");
}

struct Longest {
  using value_type = char;
  std::string text;
  friend Longest mappend(Longest self, const Longest& other) {
    return other.text.size() > self.text.size() ? other : self;
  }
};

static_assert(Monoid<Array> && Monoid<std::set<int>> && Monoid<std::map<int, int>> && Monoid<Longest>);
static_assert(Monoid<PropertyListDictionary> && Monoid<JSON::Dictionary> && Monoid<UserInfo>);
static_assert(!Monoid<int>);
static_assert(Pointed<Array> && Pointed<std::set<int>> && !Pointed<Longest> && !Pointed<int>);

template <class M>
void checkMonoidLaws(const M& a, const M& b, const M& c) {
  RC_ASSERT(mappend(a, empty<M>()) == a);
  RC_ASSERT(mappend(empty<M>(), a) == a);
  RC_ASSERT(mappend(mappend(a, b), c) == mappend(a, mappend(b, c)));
}

RC_GTEST_PROP(Monoid, Laws, (const Array& a, const Array& b, const Array& c)) {
  checkMonoidLaws(a, b, c);
  const auto set = [](const Array& array) { return std::set<int>(array.begin(), array.end()); };
  checkMonoidLaws(set(a), set(b), set(c));
  const auto dictionary = [](const Array& array) {
    std::map<int, int> made;
    for (std::size_t i = 0; i < array.size(); ++i) made[array[i] % 5] = static_cast<int>(i);
    return made;
  };
  checkMonoidLaws(dictionary(a), dictionary(b), dictionary(c));
  const auto propertyList = [&](const Array& array) {
    PropertyListDictionary made;
    for (const auto& [key, value] : dictionary(array)) made[std::to_string(key)] = value;
    return made;
  };
  checkMonoidLaws(propertyList(a), propertyList(b), propertyList(c));
}

TEST(Monoid, CombinesInOrderAndTheOtherWins) {
  EXPECT_EQ(mappend(Array{1, 2}, Array{2, 3}), (Array{1, 2, 2, 3}));
  using Dictionary = std::map<std::string, int>;
  EXPECT_EQ(mappend(Dictionary{{"a", 1}, {"b", 1}}, Dictionary{{"b", 2}, {"c", 2}}),
            (Dictionary{{"a", 1}, {"b", 2}, {"c", 2}}));
  EXPECT_EQ(mappend(PropertyListDictionary{{"a", 1}, {"b", 1}}, PropertyListDictionary{{"b", 2}}),
            (PropertyListDictionary{{"a", 1}, {"b", 2}}));
  EXPECT_EQ(mappend(JSON::Dictionary{{"a", JSON(1)}}, JSON::Dictionary{{"a", JSON(2)}}),
            (JSON::Dictionary{{"a", JSON(2)}}));
  EXPECT_EQ(mappend(std::unordered_map<int, int>{{1, 1}}, {{1, 2}}), (std::unordered_map<int, int>{{1, 2}}));
  EXPECT_EQ(mappend(Longest{"a"}, Longest{"bb"}).text, "bb");
  EXPECT_EQ(take(Array{3, 1, 2}, 2), (Array{3, 1}));
  EXPECT_EQ(take(Array{3, 1}, 5), (Array{3, 1}));
  EXPECT_EQ(take(Array{3, 1}, -1), Array());
  EXPECT_EQ(take(std::set<int>{3, 1, 2}, 2), (std::set<int>{1, 2}));
}

}  // namespace
}  // namespace MarletFoundation::test
