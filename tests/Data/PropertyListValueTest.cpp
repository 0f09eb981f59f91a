#include "MarletFoundation/Data/PropertyListValue.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <map>

namespace MarletFoundation::test {
namespace {

using Array = PropertyListValue::Array;

// A look-up's pointer is no value, least of all `true`.
static_assert(std::is_convertible_v<bool, PropertyListValue> &&
              std::is_convertible_v<float, PropertyListValue>);
static_assert(!std::is_constructible_v<PropertyListValue, PropertyListValue*>);
static_assert(!std::is_constructible_v<PropertyListValue, const void*>);
static_assert(!std::is_constructible_v<PropertyListValue, std::nullptr_t>);

TEST(PropertyListValue, TellsCasesApart) {
  const PropertyListValue values[] = {1,
                                      1.0,
                                      true,
                                      "1",
                                      Data(std::string("1")),
                                      Date{1},
                                      Array{1},
                                      PropertyListDictionary{{"1", 1}},
                                      Array{},
                                      PropertyListDictionary{}};
  for (const auto& a : values) {
    for (const auto& b : values) EXPECT_EQ(a == b, &a == &b) << description(a) << description(b);
  }
  EXPECT_FALSE(PropertyListValue(Array{1, Array{2}}) == PropertyListValue(Array{1, Array{3}}));
  EXPECT_FALSE(PropertyListValue(PropertyListDictionary{{"a", 1}}) ==
               PropertyListValue(PropertyListDictionary{{"b", 1}}));
}

TEST(PropertyListValue, PrintsItsCases) {
  EXPECT_EQ(
      description(
          PropertyListDictionary{{"b", Array{7, -1.5, "x\"", false}}, {"a", PropertyListDictionary{}}}),
      "dictionary([\"a\": dictionary([:]), \"b\": array([integer(7), floatingPoint(-1.5), string(\"x\\\"\"), "
      "boolean(false)])])");
  const PropertyListValue value("X");
  EXPECT_EQ(optionalDescription(&value), "Optional(string(\"X\"))");
  EXPECT_EQ(optionalDescription(nullptr), "nil");
}

TEST(PropertyListValue, IsCopiedIndependently) {
  PropertyListValue value(PropertyListDictionary{{"list", Array{1, 2}}});
  const auto copy = value;
  *std::get<PropertyListDictionary>(value.payload).find("list") = 3;
  EXPECT_EQ(copy, PropertyListValue(PropertyListDictionary{{"list", Array{1, 2}}}));
  // A part of a value takes the place of the whole.
  PropertyListValue nested(Array(1, Array(1, Array{"inner"})));
  nested = std::move(std::get<Array>(std::get<Array>(nested.payload)[0].payload)[0]);
  EXPECT_EQ(nested, PropertyListValue(Array{"inner"}));
  nested = std::get<Array>(nested.payload)[0];
  EXPECT_EQ(nested, PropertyListValue("inner"));
  PropertyListDictionary outer{{"k", PropertyListDictionary{{"inner", 1}}}};
  outer = std::move(std::get<PropertyListDictionary>(outer.find("k")->payload));
  EXPECT_TRUE(outer == (PropertyListDictionary{{"inner", 1}}));
}

TEST(PropertyListValue, NeedsNoStackForDepth) {
  PropertyListValue deep("end");
  for (int i = 0; i < 200000; ++i) {
    if (i % 2 == 0) {
      Array array(3);
      array[1] = std::move(deep);
      deep = PropertyListValue(std::move(array));
    } else {
      PropertyListDictionary dictionary;
      dictionary["k"] = std::move(deep);
      // Every thousandth has grown to a tree.
      for (int k = 100; i % 1000 == 1 && k > 0; --k) dictionary[std::to_string(k)] = k;
      deep = PropertyListValue(std::move(dictionary));
    }
  }
  auto copy = deep;
  EXPECT_TRUE(copy == deep);
  EXPECT_GT(description(deep).size(), 2000000U);
  copy = 1;
  EXPECT_FALSE(copy == deep);
}

// A dictionary behaves as the library's ordered map.
TEST(PropertyListDictionary, IsAMap) {
  EXPECT_TRUE(rc::check([](const std::vector<std::pair<std::string, int>>& pairs, const std::string& gone) {
    std::map<std::string, int> model;
    PropertyListDictionary grown;
    PropertyListDictionary::Entries entries;
    for (const auto& [key, number] : pairs) {
      model[key] = number;
      grown[key] = number;
      entries.push_back({SharedString(key), number});
    }
    RC_ASSERT(grown == PropertyListDictionary(std::move(entries)));
    RC_ASSERT(grown.erase(gone) == (model.erase(gone) == 1));
    RC_ASSERT(grown.size() == model.size());
    auto place = model.begin();
    for (const auto& [key, value] : grown) {
      RC_ASSERT(key.view() == place->first);
      RC_ASSERT(value == PropertyListValue(place->second));
      RC_ASSERT(std::as_const(grown).find(key) == &value);
      ++place;
    }
  }));
}

// Each key comes in the midst of the others and goes from there, and they stay where they are.
TEST(PropertyListDictionary, MovesFewOthersWhenAKeyComesOrGoes) {
  constexpr int count = 1009;
  const auto keyAt = [](int i) { return std::to_string(i * 607 % count); };
  std::map<std::string, const PropertyListValue*, std::less<>> places;
  int moved = 0;
  const auto look = [&](const PropertyListDictionary& dictionary) {
    for (const auto& [key, value] : dictionary) {
      auto& place = places.find(key.view())->second;
      moved += place && place != &value;
      place = &value;
    }
  };
  PropertyListDictionary dictionary;
  PropertyListDictionary::Entries entries;
  for (int i = 0; i < count; ++i) {
    dictionary[keyAt(i)] = i;
    entries.push_back({SharedString(keyAt(i)), i});
    places[keyAt(i)] = nullptr;
    look(dictionary);
  }
  EXPECT_TRUE(dictionary == PropertyListDictionary(std::move(entries)));
  EXPECT_EQ(*std::as_const(dictionary).find(keyAt(5)), PropertyListValue(5));
  // The copy is an array again.
  auto copy = dictionary;
  for (auto* const emptied : {&dictionary, &copy}) {
    for (auto& [key, place] : places) place = nullptr;
    for (int i = 0; i < count; ++i) {
      EXPECT_TRUE(emptied->erase(keyAt(i)) && !emptied->erase(keyAt(i)));
      look(*emptied);
    }
    EXPECT_TRUE(emptied->empty() && *emptied == PropertyListDictionary());
  }
  EXPECT_LT(moved, 10 * count);
}

}  // namespace
}  // namespace MarletFoundation::test
