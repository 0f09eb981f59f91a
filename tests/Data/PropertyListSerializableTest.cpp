#include "MarletFoundation/Data/PropertyListSerializable.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <cmath>
#include <filesystem>
#include <functional>
#include <limits>

#include "MarletFoundation/Platform/PropertyListWork.h"
#include "support/Failure.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using Array = PropertyListValue::Array;
using enum PropertyListFormat;
using PropertyListSerialization::read;
using PropertyListSerialization::write;
using namespace std::string_literals;

rc::Gen<std::string> anyText() {
  const auto piece =
      rc::gen::element<std::string>("a", "B", "<", "&", ">", "\r", "\r\n", "\n", "\t", " ", "\"", "\xC3\xA9",
                                    "\xE2\x80\xA8", "\xF0\x9F\x98\x80", "]]>");
  return rc::gen::map(rc::gen::container<std::vector<std::string>>(piece), [](const auto& pieces) {
    std::string text;
    for (const auto& part : pieces) text += part;
    return text;
  });
}

rc::Gen<PropertyListValue> anyValue(int depth = 0) {
  const auto children = depth < 3 ? 8 : 6;
  return rc::gen::mapcat(rc::gen::inRange(0, children), [depth](int kind) -> rc::Gen<PropertyListValue> {
    switch (kind) {
      case 0:
        return rc::gen::map(anyText(), [](std::string text) { return PropertyListValue(std::move(text)); });
      case 1:
        return rc::gen::map(rc::gen::arbitrary<std::int64_t>(),
                            [](std::int64_t n) { return PropertyListValue(n); });
      case 2:
        return rc::gen::map(rc::gen::arbitrary<double>(), [](double n) { return PropertyListValue(n); });
      case 3:
        return rc::gen::map(rc::gen::arbitrary<bool>(), [](bool b) { return PropertyListValue(b); });
      case 4:
        return rc::gen::map(rc::gen::arbitrary<std::int32_t>(),
                            [](std::int32_t n) { return PropertyListValue(Date{1.0 * n}); });
      case 5:
        return rc::gen::map(rc::gen::arbitrary<std::string>(),
                            [](std::string s) { return PropertyListValue(Data(std::move(s))); });
      case 6:
        return rc::gen::map(rc::gen::container<Array>(anyValue(depth + 1)),
                            [](Array a) { return PropertyListValue(std::move(a)); });
      default:
        return rc::gen::map(rc::gen::container<std::vector<std::pair<std::string, PropertyListValue>>>(
                                rc::gen::pair(anyText(), anyValue(depth + 1))),
                            [](const auto& pairs) {
                              PropertyListDictionary dictionary;
                              for (const auto& [key, value] : pairs) dictionary[key] = value;
                              return PropertyListValue(std::move(dictionary));
                            });
    }
  });
}

TEST(PropertyListSerialization, ReadsWhatItWrites) {
  EXPECT_TRUE(rc::check([] {
    const auto value = *anyValue();
    for (const auto format : {xml, binary}) {
      const auto written = write(value, format);
      RC_ASSERT(read(written) == value);
      RC_ASSERT(write(read(written), format) == written);
      RC_ASSERT(propertyListValue(readPropertyListObject(written)) == value);
    }
    RC_ASSERT(propertyListValue(propertyListObject(value)) == value);
  }));
}

TEST(PropertyListSerialization, WritesNumbersExactly) {
  const double reals[] = {0.0,
                          -0.0,
                          0.1,
                          1e-310,
                          std::numeric_limits<double>::max(),
                          std::numeric_limits<double>::infinity(),
                          -std::numeric_limits<double>::infinity(),
                          std::nan("")};
  for (const auto format : {xml, binary}) {
    for (const double real : reals) {
      const auto result = *read(write(real, format)).floatingPoint();
      EXPECT_TRUE((std::isnan(result) && std::isnan(real)) ||
                  (result == real && std::signbit(result) == std::signbit(real)));
    }
    for (const std::int64_t integer : {INT64_MIN, std::int64_t{-1}, std::int64_t{255}, std::int64_t{256},
                                       std::int64_t{65536}, std::int64_t{1} << 32, INT64_MAX})
      EXPECT_EQ(read(write(integer, format)), PropertyListValue(integer));
  }
  EXPECT_EQ(read(write(Date{-0.25}, xml)), PropertyListValue(Date{-1}));
  EXPECT_EQ(read(write(Date{-0.25}, binary)), PropertyListValue(Date{-0.25}));
}

TEST(PropertyListSerialization, WritesReadableXML) {
  const PropertyListValue value(
      PropertyListDictionary{{"b", "1 < 2\r"}, {"a", Array{true, Data("hi"s)}}, {"c", Array{}}});
  EXPECT_EQ(
      write(value, xml).view(),
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n<dict>\n\t<key>a</key>\n\t<array>\n"
      "\t\t<true/>\n\t\t<data>aGk=</data>\n\t</array>\n\t<key>b</key>\n\t<string>1 &lt; 2&#13;</string>\n"
      "\t<key>c</key>\n\t<array/>\n</dict>\n</plist>\n");
}

TEST(PropertyListSerialization, StoresEqualScalarsOnceInBinary) {
  const auto objects = [](const PropertyListValue& value) {
    const auto data = write(value, binary);
    const auto bytes = data.bytes();
    return bytes[bytes.size() - 17] + 256 * bytes[bytes.size() - 18];
  };
  EXPECT_EQ(objects(Array{"a", "a", PropertyListDictionary{{"a", "a"}}}), 3);
  EXPECT_EQ(objects(Array{1, 1.0, true, Date{1}, "1", Data("1"s), 1, 1.0, true, Date{1}, "1", Data("1"s)}),
            7);
  EXPECT_EQ(objects(Array{0.0, -0.0, 0, false}), 5);
  // A long text is stored again before a reader would take its repetition for an attack.
  const Array repeated(5000, PropertyListValue(std::string(10000, 'x')));
  const auto written = write(repeated, binary);
  EXPECT_LT(written.size(), 50000000U / 4);
  EXPECT_TRUE(read(written) == PropertyListValue(repeated));
}

PropertyListValue nested(int levels) {
  PropertyListValue value(Array{});
  for (; levels > 1; --levels) {
    Array array;
    array.push_back(std::move(value));
    value = PropertyListValue(std::move(array));
  }
  return value;
}

TEST(PropertyListSerialization, IndentsNoDeeperThan512) {
  const auto size = [](int levels) { return write(nested(levels), xml).size(); };
  const auto perLevel = 2 * 512 + "<array>\n</array>\n"s.size();
  EXPECT_EQ(size(1500) - size(1000), 500 * perLevel);
  EXPECT_LT(size(512) - size(511), perLevel);
}

// Numbers that the binary writer's hash takes to the same place: what it does to a number, backwards.
PropertyListValue alike(int size) {
  constexpr std::uint64_t multiplier = 0x9E3779B97F4A7C15;
  std::uint64_t inverse = multiplier;
  for (int i = 0; i < 6; ++i) inverse *= 2 - multiplier * inverse;
  Array numbers;
  for (std::uint64_t i = 0; i < static_cast<std::uint64_t>(size); ++i) {
    const auto mixed = (std::uint64_t{7} << 32 | i) * inverse;
    numbers.push_back(static_cast<std::int64_t>((mixed ^ mixed >> 32) * inverse - 1));
  }
  return PropertyListValue(std::move(numbers));
}

TEST(PropertyListSerialization, WorksInProportion) {
  const auto references = [](int size) {
    std::string text;
    for (int i = 0; i < size; ++i) text += "&amp;a,b;c:d_e-f+g*h=i!";
    return PropertyListValue(std::move(text));
  };
  const auto highBitsOnly = [](int size) {
    Array numbers;
    for (std::int64_t i = 1; i <= size; ++i) numbers.push_back(i << 48);
    return PropertyListValue(std::move(numbers));
  };
  const std::pair<PropertyListFormat, std::function<PropertyListValue(int)>> cases[] = {
      {xml, references}, {binary, highBitsOnly}, {binary, alike}};
  for (const auto& [format, valueOf] : cases) {
    const auto steps = [&format = format, &valueOf = valueOf](int size) {
      const auto value = valueOf(size);
      takePropertyListWork();
      EXPECT_TRUE(read(write(value, format)) == value);
      return takePropertyListWork();
    };
    const auto few = steps(5000);
    EXPECT_TRUE(few > 1000 && few < 60 * 5000) << few;
    EXPECT_LT(steps(20000), 6 * few);
  }
}

int writingError(const PropertyListValue& value, PropertyListFormat format) {
  const auto error = errorOf([&] { write(value, format); });
  EXPECT_TRUE(!error || error->domain() == PropertyListErrorDomain);
  return error ? error->code() : 0;
}

TEST(PropertyListSerialization, RefusesWhatAFormCannotCarry) {
  const auto text = static_cast<int>(PropertyListErrorCode::unwritableText);
  const auto date = static_cast<int>(PropertyListErrorCode::unwritableDate);
  const struct {
    PropertyListValue value;
    int inXML;
    int inBinary;
  } cases[] = {
      {"\x01", text, 0},
      {"a\0"s, text, 0},
      {"\xEF\xBF\xBF", text, 0},
      {"\x7F\xC2\x80", 0, 0},
      {"\xFF", text, text},
      {"\xED\xA0\x80", text, text},
      {PropertyListDictionary{{"\xC0\x80", 1}}, text, text},
      {PropertyListDictionary{{"\x02", 1}}, text, 0},
      {Date{std::nan("")}, date, date},
      {Date{std::numeric_limits<double>::infinity()}, date, date},
      {Date{1e15}, date, 0},
      {nested(60000), 0, 0},
      {PropertyListDictionary{{"k", nested(513)}}, 0, 0},
  };
  for (const auto& [value, inXML, inBinary] : cases) {
    EXPECT_EQ(writingError(value, xml), inXML) << description(value).substr(0, 80);
    EXPECT_EQ(writingError(value, binary), inBinary) << description(value).substr(0, 80);
    EXPECT_TRUE(inXML != 0 || read(write(value, xml)) == value);
    EXPECT_TRUE(inBinary != 0 || read(write(value, binary)) == value);
  }
}

TEST(PropertyListSerializable, StopsForProgrammingErrors) {
  EXPECT_NE(fatalMessage([] { propertyListData(PropertyListValue("\x01"), xml); }), "");
  const auto dictionary = std::make_shared<PlainDictionary>(PropertyListObjects{NumberObject::integer(1)},
                                                            PropertyListObjects{NumberObject::integer(1)});
  EXPECT_NE(fatalMessage([&] { fromPropertyListObject<PropertyListValue>(dictionary); }), "");
  EXPECT_EQ(fromPropertyListObject<PropertyListValue>(NumberObject::integer(1)), PropertyListValue(1));
}

TEST(PropertyListSerializable, ReadsAndWritesFiles) {
  const TemporaryDirectory directory;
  const PropertyListValue value(PropertyListDictionary{{"a", 1}});
  for (const auto format : {xml, binary}) {
    writePropertyList(value, directory.url("file.plist"), format);
    EXPECT_EQ(fromContentsOfPropertyListAtURL<PropertyListValue>(directory.url("file.plist")), value);
  }
  EXPECT_THROW(writePropertyList(value, directory.url("none/file.plist"), binary), ErrorObject);
  EXPECT_FALSE(std::filesystem::exists(directory.path() / "none"));
  EXPECT_THROW(fromContentsOfPropertyListAtURL<PropertyListValue>(directory.url("absent.plist")),
               ErrorObject);
}

}  // namespace
}  // namespace MarletFoundation::test
