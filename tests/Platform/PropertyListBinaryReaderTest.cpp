#include <gtest/gtest.h>

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation::test {
namespace {

using enum PropertyListErrorCode;
using namespace std::string_literals;

std::string bigEndian(std::uint64_t number, int width) {
  std::string bytes;
  while (width-- > 0) bytes += static_cast<char>(width < 8 ? number >> (8 * width) : 0);
  return bytes;
}

// A file as a literal: its objects' bytes, and what the trailer says unless a test says otherwise.
struct File {
  std::vector<std::string> objects;
  int offsetWidth = 1;
  int referenceWidth = 1;
  std::optional<std::uint64_t> count = {};
  std::uint64_t root = 0;
  std::optional<std::uint64_t> table = {};
  std::optional<std::uint64_t> firstOffset = {};

  std::string bytes() const {
    std::string file = "bplist00";
    std::vector<std::uint64_t> offsets;
    for (const auto& object : objects) {
      offsets.push_back(file.size());
      file += object;
    }
    if (firstOffset) offsets[0] = *firstOffset;
    const auto end = file.size();
    for (const auto offset : offsets) file += bigEndian(offset, offsetWidth);
    return file + bigEndian(0, 6) + bigEndian(static_cast<std::uint64_t>(offsetWidth), 1) +
           bigEndian(static_cast<std::uint64_t>(referenceWidth), 1) +
           bigEndian(count.value_or(objects.size()), 8) + bigEndian(root, 8) +
           bigEndian(table.value_or(end), 8);
  }
};

std::string outcome(const std::string& bytes) {
  try {
    return description(PropertyListSerialization::read(Data(bytes)));
  } catch (const ErrorObject& error) {
    EXPECT_EQ(error.domain(), PropertyListErrorDomain);
    EXPECT_LE(std::get<std::int64_t>(*error.value(ByteOffsetKey)), static_cast<std::int64_t>(bytes.size()));
    return "error " + std::to_string(error.code());
  }
}

std::string failure(PropertyListErrorCode code) { return "error " + std::to_string(static_cast<int>(code)); }

TEST(PropertyListBinaryReader, DecidesEveryObject) {
  const auto int16 = [](std::uint64_t high, std::uint64_t low) {
    return "\x14" + bigEndian(high, 8) + bigEndian(low, 8);
  };
  const struct {
    std::string object;
    std::string expected;
  } cases[] = {
      {"\x08", "boolean(false)"},
      {"\x09", "boolean(true)"},
      {"\x10\xFF", "integer(255)"},
      {"\x11\xFF\xFF", "integer(65535)"},
      {"\x12\xFF\xFF\xFF\xFF", "integer(4294967295)"},
      {"\x13\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFE", "integer(-2)"},
      {int16(0, 7), "integer(7)"},
      {int16(~0ULL, 1ULL << 63), "integer(-9223372036854775808)"},
      {int16(0, 1ULL << 63), failure(integerOutOfRange)},
      {int16(1, 0), failure(integerOutOfRange)},
      {int16(~0ULL, 0), failure(integerOutOfRange)},
      {"\x15" + std::string(32, '\0'), failure(invalidObject)},
      {"\x13\x01", failure(lengthOutOfRange)},
      {"\x22\x3F\xC0\0\0"s, "floatingPoint(1.5)"},
      {"\x23\x7F\xF0\0\0\0\0\0\0"s, "floatingPoint(inf)"},
      {"\x21\x3C\0"s, failure(invalidObject)},
      {"\x33\x3F\xF8\0\0\0\0\0\0"s, "date(1.5)"},
      {"\x33\x7F\xF0\0\0\0\0\0\0"s, failure(invalidDate)},
      {"\x32\0\0\0\0"s, failure(invalidObject)},
      {"\x42\x01\x02", "data(2 bytes)"},
      {"\x4F\x10\x02zz", "data(2 bytes)"},
      {"\x4F\x10\x03zz", failure(lengthOutOfRange)},
      {"\x4F\x13\xFF\xFF\xFF\xFF\xFF\xFF\xFF\xFFzz", failure(lengthOutOfRange)},
      {"\x4F\x14" + std::string(16, '\0'), failure(invalidObject)},
      {"\x4F", failure(lengthOutOfRange)},
      {"\x4F\x23", failure(invalidObject)},
      {"\x52"s + "ab", "string(\"ab\")"},
      {"\x52"s + "a\x80", failure(invalidString)},
      {"\x63\0\xE9\xD8\x3D\xDE\0"s, "string(\"\xC3\xA9\xF0\x9F\x98\x80\")"},
      {"\x61\xD8\x3D", failure(invalidString)},
      {"\x62\xDE\0\0a"s, failure(invalidString)},
      {"\x6F\x13\x80\0\0\0\0\0\0\x01zz"s, failure(lengthOutOfRange)},
      {"\xA0", "array([])"},
      {"\xD0", "dictionary([:])"},
      {"\xA1\x07", failure(invalidReference)},
      {"\xA1"s + '\0', failure(cycle)},
      {"\xAF\x13\x40\0\0\0\0\0\0\0"s, failure(lengthOutOfRange)},
      {"\xDF\x13\x80\0\0\0\0\0\0\0"s, failure(lengthOutOfRange)},
      {"\0"s, failure(unsupportedObject)},
      {"\x0F", failure(unsupportedObject)},
      {"\x80\x01", failure(unsupportedObject)},
      {"\xC0", failure(unsupportedObject)},
      {"\x0C", failure(invalidObject)},
      {"\x70", failure(invalidObject)},
      {"\xF0", failure(invalidObject)},
  };
  for (const auto& [object, expected] : cases)
    EXPECT_EQ(outcome(File{{object}}.bytes()), expected) << testing::PrintToString(object);
  const auto withNUL = PropertyListSerialization::read(Data(File{{"\x53"s + "a\0b"s}}.bytes()));
  EXPECT_EQ(withNUL, PropertyListValue("a\0b"s));
}

TEST(PropertyListBinaryReader, ChecksTheTrailer) {
  const auto good = File{{"\x09", "\x08"}};
  const auto with = [&good](auto change) {
    auto file = good;
    change(file);
    return outcome(file.bytes());
  };
  EXPECT_EQ(with([](File&) {}), "boolean(true)");
  EXPECT_EQ(with([](File& f) { f.offsetWidth = 0; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.offsetWidth = 9; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.referenceWidth = 0; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.referenceWidth = 9; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.count = 0; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.count = 3; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.offsetWidth = 8, f.count = (1ULL << 61) + 1; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.root = 2; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.table = 8; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.table = 12; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.table = ~0ULL; }), failure(invalidTrailer));
  EXPECT_EQ(with([](File& f) { f.firstOffset = 7; }), failure(invalidOffset));
  EXPECT_EQ(with([](File& f) { f.firstOffset = 10; }), failure(invalidOffset));
  EXPECT_EQ(outcome("bplist00"), failure(truncated));
  EXPECT_EQ(outcome("bplist01" + std::string(100, '\0')), failure(unknownFormat));
  for (const int width : {1, 2, 3, 4, 5, 6, 7, 8}) {
    const File list{{"\xA2" + bigEndian(1, width) + bigEndian(2, width), "\x10\x05", "\x51s"}, width, width};
    EXPECT_EQ(outcome(list.bytes()), "array([integer(5), string(\"s\")])") << width;
  }
}

TEST(PropertyListBinaryReader, DecidesKeys) {
  EXPECT_EQ(outcome(File{{"\xD1\x01\x01", "\x51k"}}.bytes()), "dictionary([\"k\": string(\"k\")])");
  EXPECT_EQ(outcome(File{{"\xD1\x01\x01", "\x10\x05"}}.bytes()), failure(keyNotString));
  EXPECT_EQ(outcome(File{{"\xD2\x01\x02\x03\x04", "\x51k", "\x61\0k"s, "\x10\x01", "\x10\x02"}}.bytes()),
            "dictionary([\"k\": integer(2)])");
}

TEST(PropertyListBinaryReader, BoundsCyclesAndSharingNotDepth) {
  EXPECT_EQ(outcome(File{{"\xA1\x01", "\xA1\x02", "\xA1\x01"}}.bytes()), failure(cycle));
  EXPECT_EQ(outcome(File{{"\xA2\x01\x01", "\xA1\x02", "\x09"}}.bytes()),
            "array([array([boolean(true)]), array([boolean(true)])])");
  const auto chain = [](std::uint64_t depth) {
    File file{{}, 4, 2};
    for (std::uint64_t i = 1; i < depth; ++i) file.objects.push_back("\xA1" + bigEndian(i, 2));
    file.objects.push_back("\xA0");
    return outcome(file.bytes());
  };
  EXPECT_EQ(chain(60000).find(']'), 60000 * std::string("array([").size());

  // Forty lists, each holding the next one twice, and one text, held by ten thousand references.
  File doubling;
  for (char i = 1; i < 40; ++i) doubling.objects.push_back("\xA2"s + i + i);
  doubling.objects.push_back("\xA0");
  EXPECT_EQ(outcome(doubling.bytes()), failure(tooMuchSharing));
  const File repeated{{"\xAF\x11" + bigEndian(10000, 2) + std::string(10000, '\x01'),
                       "\x5F\x11" + bigEndian(10000, 2) + std::string(10000, 'x')},
                      2};
  EXPECT_EQ(outcome(repeated.bytes()), failure(tooMuchSharing));
}

}  // namespace
}  // namespace MarletFoundation::test
