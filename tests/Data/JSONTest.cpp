#include "MarletFoundation/Data/JSON.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/JSONSerialization.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using Kind = JSON::Kind;

JSON parsed(std::string text) { return JSON(Data(std::move(text))); }

TEST(JSON, TellsItsKindsApart) {
  const std::pair<const char*, Kind> cases[] = {
      {"1", Kind::integer},
      {"-9223372036854775808", Kind::integer},
      {"9223372036854775808", Kind::double_},
      {"1.0", Kind::double_},
      {"1e2", Kind::double_},
      {"true", Kind::boolean},
      {"\"1\"", Kind::string},
      {"[]", Kind::array},
      {"{}", Kind::dictionary},
      {"null", Kind::null},
  };
  for (const auto& [text, kind] : cases) EXPECT_EQ(parsed(text).kind(), kind) << text;
  EXPECT_NE(parsed("1"), parsed("1.0"));
  EXPECT_NE(parsed("1"), parsed("true"));
  EXPECT_EQ(parsed("[]"), JSON(JSON::Array()));
  const auto dictionary = parsed(R"({"a": null, "b": 1, "b": 2})");
  EXPECT_EQ(dictionary, JSON(JSON::Dictionary{{"a", JSON()}, {"b", JSON(2)}}));
}

TEST(JSON, RefusesWhatIsNone) {
  for (const auto* text :
       {"", "{", "[1,]", "nul", "1 2", "'a'", "\"\xFF\"", "1e999", "{\"a\" 1}", "\xEF\xBB\xBF"})
    EXPECT_THROW(parsed(text), ErrorObject) << text;
  const auto nested = [](std::size_t depth) { return std::string(depth, '[') + std::string(depth, ']'); };
  EXPECT_NO_THROW(parsed(nested(512)));
  EXPECT_THROW(parsed(nested(513)), ErrorObject);
  EXPECT_THROW(parsed(std::string(1000000, '[')), ErrorObject);
}

TEST(JSON, RefusesObjectsOfOtherKinds) {
  const auto key = std::make_shared<StringObject>("key");
  const auto date = std::make_shared<DateObject>(Date{});
  const auto one = NumberObject::integer(1);
  const std::shared_ptr<PropertyListObject> refused[] = {
      date,
      std::make_shared<ArrayObject>(PropertyListObjects{date}),
      std::make_shared<PlainDictionary>(PropertyListObjects{date}, PropertyListObjects{key}),
      std::make_shared<PlainDictionary>(PropertyListObjects{key}, PropertyListObjects{one}),
  };
  for (const auto& object : refused) {
    EXPECT_THROW(JSON{*object}, JSONError);
    EXPECT_THROW(JSONSerialization::write(*object), ErrorObject);
  }
  EXPECT_THROW(JSONSerialization::write(*NumberObject::real(1.0 / 0.0)), ErrorObject);
  PropertyListObjectPointer nested =
      std::make_shared<ArrayObject>(PropertyListObjects{std::make_shared<NullObject>()});
  for (int i = 1; i < 512; ++i) nested = std::make_shared<ArrayObject>(PropertyListObjects{nested});
  EXPECT_NO_THROW(JSON{*JSONSerialization::read(Data(JSONSerialization::write(*nested)))});
  nested = std::make_shared<ArrayObject>(PropertyListObjects{nested});
  EXPECT_THROW(JSON{*nested}, JSONError);
  EXPECT_THROW(JSONSerialization::write(*nested), ErrorObject);
  EXPECT_EQ(JSON(NumberObject("i", std::int64_t{7})), JSON(7));
  EXPECT_EQ(JSON(NumberObject("B", std::int64_t{1})), JSON(true));
  EXPECT_EQ(JSONSerialization::write(NumberObject("B", std::int64_t{1})), "true");
}

struct Half {
  double value;
  explicit Half(const JSON& json) : value(decode<double>(json) / 2) {}
};

TEST(JSON, DecodesOrTellsWhatWasWanted) {
  EXPECT_EQ(decode<std::int64_t>(parsed("7")), 7);
  EXPECT_EQ(decode<JSON>(parsed("7")), JSON(7));
  EXPECT_EQ(decode<std::vector<std::string>>(parsed(R"(["a", "b"])")), (std::vector<std::string>{"a", "b"}));
  EXPECT_EQ((decode<std::map<std::string, bool>>(parsed(R"({"a": true})"))),
            (std::map<std::string, bool>{{"a", true}}));
  EXPECT_EQ(decode<Half>(parsed("1.5")).value, 0.75);

  EXPECT_EQ(failure([] { decode<std::int64_t>(parsed("7.0")); }), "DecodingTypeMismatch(integer)");
  EXPECT_EQ(failure([] { decode<double>(parsed("7")); }), "DecodingTypeMismatch(double)");
  EXPECT_EQ(failure([] { decode<bool>(parsed("1")); }), "DecodingTypeMismatch(boolean)");
  EXPECT_EQ(failure([] { decode<std::string>(JSON()); }), "DecodingTypeMismatch(string)");
  EXPECT_EQ(failure([] { decode<std::vector<bool>>(parsed("{}")); }), "DecodingTypeMismatch(array)");
  EXPECT_EQ(failure([] { decode<std::vector<bool>>(parsed("[true, 1]")); }), "DecodingTypeMismatch(boolean)");
  EXPECT_EQ(failure([] { decode<std::map<std::string, bool>>(parsed("[]")); }),
            "DecodingTypeMismatch(dictionary)");
  EXPECT_EQ(failure([] { decode<std::vector<bool>>(std::optional<JSON>()); }), "UnexpectedOptional");
  const auto mismatch = thrown<JSONError>([] { decode<double>(JSON()); });
  EXPECT_EQ(mismatch.expectedKind, JSON::Kind::double_);
  EXPECT_EQ(mismatch, JSONError(JSON::Kind::double_));
  EXPECT_FALSE(mismatch == JSONError(JSON::Kind::integer));
}

PropertyListObjectPointer anyObject(int depth) {
  switch (*rc::gen::inRange(0, depth > 0 ? 7 : 5)) {
    case 0:
      return std::make_shared<NullObject>();
    case 1:
      return NumberObject::boolean(*rc::gen::arbitrary<bool>());
    case 2:
      return NumberObject::integer(*rc::gen::arbitrary<std::int64_t>());
    case 3:
      return NumberObject::real(*rc::gen::arbitrary<double>());
    case 4:
      return std::make_shared<StringObject>(
          *rc::gen::container<std::string>(rc::gen::inRange<char>('\x01', '\x7f')));
    case 5: {
      PropertyListObjects objects(*rc::gen::inRange<std::size_t>(0, 4));
      for (auto& object : objects) object = anyObject(depth - 1);
      return std::make_shared<ArrayObject>(objects);
    }
    default:
      return std::make_shared<PlainDictionary>(PropertyListObjects{anyObject(depth - 1)},
                                               PropertyListObjects{std::make_shared<StringObject>(
                                                   *rc::gen::arbitrary<std::string>() == "" ? "" : "k")});
  }
}

TEST(JSON, ReadsWhatItWrote) {
  EXPECT_TRUE(rc::check([] {
    const auto object = anyObject(3);
    RC_ASSERT(JSON(Data(JSONSerialization::write(*object))) == JSON(*object));
  }));
}

}  // namespace
}  // namespace MarletFoundation::test
