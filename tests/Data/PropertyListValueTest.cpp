#include "MarletFoundation/Data/PropertyListValue.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <map>

namespace MarletFoundation::test {
namespace {

using Array = PropertyListValue::Array;

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
}

TEST(PropertyListValue, NeedsNoStackForDepth) {
  PropertyListValue deep("end");
  for (int i = 0; i < 500000; ++i) {
    if (i % 2 == 0) {
      Array array(3);
      array[1] = std::move(deep);
      deep = PropertyListValue(std::move(array));
    } else {
      PropertyListDictionary dictionary;
      dictionary["k"] = std::move(deep);
      deep = PropertyListValue(std::move(dictionary));
    }
  }
  auto copy = deep;
  EXPECT_TRUE(copy == deep);
  EXPECT_GT(description(deep).size(), 5000000U);
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

}  // namespace
}  // namespace MarletFoundation::test
