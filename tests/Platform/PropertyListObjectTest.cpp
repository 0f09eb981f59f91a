#include "MarletFoundation/Platform/PropertyListObject.h"

#include <gtest/gtest.h>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "support/FailingAllocation.h"

namespace MarletFoundation::test {
namespace {

PropertyListObjectPointer text(std::string value) { return std::make_shared<StringObject>(std::move(value)); }

std::string texts(const PropertyListObjects& objects) {
  std::string all;
  for (const auto& object : objects) all += dynamic_cast<const StringObject&>(*object).value;
  return all;
}

PropertyListObjectPointer array(PropertyListObjects objects) {
  return std::make_shared<ArrayObject>(std::move(objects));
}

struct HostObject : PropertyListObject {
  bool isEqual(const PropertyListObject& other) const override { return this == &other; }
  std::size_t hash() const override { return 0; }
};

TEST(PropertyListObject, SortsOnlyTheKeys) {
  const PlainDictionary plain({text("1"), text("2"), text("3"), text("4")},
                              {text("b"), text("a"), text("c"), text("a")});
  const MLFSortedDictionary sorted(plain);
  EXPECT_EQ(sorted.count(), 3U);
  EXPECT_EQ(texts(sorted.allKeys()), "abc");
  EXPECT_EQ(texts(sorted.allValues()), "143");
  EXPECT_EQ(texts({sorted.objectForKey(*text("a"))}), "4");
  EXPECT_EQ(sorted.objectForKey(*text("d")), nullptr);
  std::string walked;
  for (auto keys = sorted.keyEnumerator(); const auto key = keys.nextObject();) walked += texts({key});
  for (auto values = sorted.objectEnumerator(); const auto value = values.nextObject();)
    walked += texts({value});
  EXPECT_EQ(walked, "abc143");
  EXPECT_TRUE(sorted.isEqualToDictionary(plain) && plain.isEqual(sorted));
  EXPECT_FALSE(sorted.isEqual(MLFSortedDictionary({text("1")}, {text("a")})));
}

TEST(PropertyListObject, ConvertsNumbersByTypeCode) {
  const auto converted = [](std::string code, NumberObject::Value number) {
    const auto value = propertyListValue(std::make_shared<NumberObject>(std::move(code), number));
    return value ? description(*value) : "nothing";
  };
  for (const auto* code : {"c", "C", "B"})
    EXPECT_EQ(converted(code, std::int64_t{7}), "boolean(true)") << code;
  for (const auto* code : {"i", "s", "l", "q", "I", "S", "L", "Q"})
    EXPECT_EQ(converted(code, std::int64_t{-7}), "integer(-7)") << code;
  for (const auto* code : {"f", "d"}) EXPECT_EQ(converted(code, std::int64_t{7}), "floatingPoint(7)") << code;
  for (const auto* code : {"", "b", "cc", "qd", "D", "@"})
    EXPECT_EQ(converted(code, std::int64_t{7}), "nothing") << code;
  EXPECT_EQ(converted("Q", ~std::uint64_t{0}), "integer(-1)");
  EXPECT_EQ(converted("q", 1e300), "integer(9223372036854775807)");
}

TEST(PropertyListObject, AreEqualByKindAndContents) {
  const auto data = [](const char* bytes) { return std::make_shared<DataObject>(Data(std::string(bytes))); };
  const auto date = [](double seconds) { return std::make_shared<DateObject>(Date{seconds}); };
  const auto number = [](NumberObject::Value value) { return std::make_shared<NumberObject>("q", value); };
  // Objects of one row are equal, those of different rows aren't.
  const std::vector<PropertyListObjects> rows = {
      {text("1"), text("1")},
      {data("1"), data("1")},
      {date(1), date(1)},
      {number(std::int64_t{1}), number(std::uint64_t{1}), NumberObject::real(1), NumberObject::boolean(true)},
      {number(std::int64_t{-1})},
      {number(~std::uint64_t{0})},
      {number(std::int64_t{1} << 53)},
      {number((std::int64_t{1} << 53) + 1)},
      {array({text("1"), date(1)}), array({text("1"), date(1)})},
      {array({text("1")})},
      {array({})},
      {std::make_shared<PlainDictionary>(PropertyListObjects{date(1)}, PropertyListObjects{data("1")}),
       std::make_shared<MLFSortedDictionary>(PropertyListObjects{date(1)}, PropertyListObjects{data("1")})},
  };
  for (const auto& row : rows) {
    for (const auto& object : row) {
      for (const auto& others : rows) {
        for (const auto& other : others) {
          EXPECT_EQ(object->isEqual(*other), &row == &others) << &row - rows.data() << &others - rows.data();
          if (&row == &others) {
            EXPECT_EQ(object->hash(), other->hash());
          }
        }
      }
    }
  }
  const PropertyListObjects ascending = {number(std::int64_t{-1}), NumberObject::real(0.5), date(1), date(2),
                                         text("a")};
  const MLFSortedDictionary sorted({text("4"), text("3"), text("2"), text("1"), text("0")},
                                   PropertyListObjects(ascending.rbegin(), ascending.rend()));
  EXPECT_EQ(sorted.allKeys(), ascending);
}

TEST(PropertyListObject, GivesNothingForWhatNoCaseFits) {
  const auto host = std::make_shared<HostObject>();
  EXPECT_FALSE(propertyListValue(nullptr));
  EXPECT_FALSE(propertyListValue(host));
  EXPECT_FALSE(propertyListValue(array({text("a"), array({text("b"), host})})));
  EXPECT_FALSE(propertyListValue(std::make_shared<PlainDictionary>(
      PropertyListObjects{text("a")}, PropertyListObjects{NumberObject::integer(1)})));
  EXPECT_EQ(propertyListValue(array({})), PropertyListValue(PropertyListValue::Array{}));
  EXPECT_EQ(
      propertyListValue(std::make_shared<PlainDictionary>(PropertyListObjects{}, PropertyListObjects{})),
      PropertyListValue(PropertyListDictionary{}));
}

TEST(PropertyListObject, IsReadWithTypeCodes) {
  const auto object =
      readPropertyListObject(Data(std::string("<array><true/><integer>1</integer><real>1</real></array>")));
  std::string codes;
  for (const auto& child : dynamic_cast<const ArrayObject&>(*object).objects())
    codes += dynamic_cast<const NumberObject&>(*child).typeCode();
  EXPECT_EQ(codes, "cqd");
}

TEST(PropertyListObject, ComesOfDeepValuesWithSortedDictionaries) {
  PropertyListValue deep(true);
  for (int i = 0; i < 200000; ++i) {
    PropertyListValue::Array one;
    one.push_back(std::move(deep));
    deep = PropertyListValue(std::move(one));
  }
  const auto object = propertyListObject(deep);
  EXPECT_TRUE(propertyListValue(object) == deep);
  auto same = propertyListObject(deep);
  EXPECT_TRUE(same->isEqual(*object));
  EXPECT_FALSE(array({same})->isEqual(*object));
  {
    // It goes without asking for memory.
    const FailingAllocation failing(1, true);
    same.reset();
  }
  const auto sorted =
      propertyListObject(PropertyListDictionary{{"b", PropertyListDictionary{{"z", 1}, {"y", 2}}}});
  const auto inner = dynamic_cast<const MLFSortedDictionary&>(*sorted).objectForKey(*text("b"));
  EXPECT_EQ(texts(dynamic_cast<const MLFSortedDictionary&>(*inner).allKeys()), "yz");
}

}  // namespace
}  // namespace MarletFoundation::test
