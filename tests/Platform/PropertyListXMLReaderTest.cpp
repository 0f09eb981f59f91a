#include <gtest/gtest.h>

#include <clocale>

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation::test {
namespace {

using enum PropertyListErrorCode;
using namespace std::string_literals;

// The printed value, or the error's code with its line and byte.
std::string outcome(std::string document) {
  try {
    return description(PropertyListSerialization::read(Data(std::move(document))));
  } catch (const ErrorObject& error) {
    EXPECT_EQ(error.domain(), PropertyListErrorDomain);
    return "error " + std::to_string(error.code()) + " line " +
           std::to_string(std::get<std::int64_t>(*error.value(LineKey))) + " byte " +
           std::to_string(std::get<std::int64_t>(*error.value(ByteOffsetKey)));
  }
}

std::string failure(PropertyListErrorCode code, int line, int byte) {
  return "error " + std::to_string(static_cast<int>(code)) + " line " + std::to_string(line) + " byte " +
         std::to_string(byte);
}

struct Case {
  std::string document;
  std::string expected;
};

void check(std::initializer_list<Case> cases) {
  for (const auto& [document, expected] : cases) EXPECT_EQ(outcome(document), expected) << document;
}

TEST(PropertyListXMLReader, DecidesEveryNumber) {
  const auto malformed = failure(invalidInteger, 1, 0);
  check({
      {"<integer>12abc</integer>", malformed},
      {"<integer/>", malformed},
      {"<integer> </integer>", malformed},
      {"<integer>+1</integer>", "integer(1)"},
      {"<integer>+-1</integer>", malformed},
      {"<integer>- 1</integer>", malformed},
      {"<integer>0x1F</integer>", "integer(31)"},
      {"<integer>-0x10</integer>", "integer(-16)"},
      {"<integer>0x</integer>", malformed},
      {"<integer>0x-1</integer>", malformed},
      {"<integer> \t\r\n7 \n</integer>", "integer(7)"},
      {"<integer>1 2</integer>", malformed},
      {"<integer>007</integer>", "integer(7)"},
      {"<integer>1.0</integer>", malformed},
      {"<integer>9223372036854775807</integer>", "integer(9223372036854775807)"},
      {"<integer>9223372036854775808</integer>", failure(integerOutOfRange, 1, 0)},
      {"<integer>-9223372036854775808</integer>", "integer(-9223372036854775808)"},
      {"<integer>18446744073709551616</integer>", failure(integerOutOfRange, 1, 0)},
      {"<real>1</real>", "floatingPoint(1)"},
      {"<real> -1.5e3 </real>", "floatingPoint(-1500)"},
      {"<real>.5</real>", "floatingPoint(0.5)"},
      {"<real>1,5</real>", failure(invalidReal, 1, 0)},
      {"<real>0x1p3</real>", failure(invalidReal, 1, 0)},
      {"<real>--1</real>", failure(invalidReal, 1, 0)},
      {"<real/>", failure(invalidReal, 1, 0)},
      {"<real>nan</real>", "floatingPoint(nan)"},
      {"<real>+Infinity</real>", "floatingPoint(inf)"},
      {"<real>-inf</real>", "floatingPoint(-inf)"},
      {"<real>infinite</real>", failure(invalidReal, 1, 0)},
      {"<real>1e-999</real>", "floatingPoint(0)"},
      {"<real>1e999</real>", failure(invalidReal, 1, 0)},
      {"<real>" + std::string(400, '9') + "</real>", failure(invalidReal, 1, 0)},
      {"<real>0." + std::string(400, '0') + "1</real>", "floatingPoint(0)"},
  });
}

TEST(PropertyListXMLReader, DecidesEveryDateAndData) {
  const auto malformed = failure(invalidDate, 1, 0);
  check({
      {"<date>2001-01-01T00:00:00Z</date>", "date(0)"},
      {"<date> 2000-02-29T23:59:59Z\n</date>", "date(-26438401)"},
      {"<date>2001-02-30T00:00:00Z</date>", malformed},
      {"<date>1900-02-29T00:00:00Z</date>", malformed},
      {"<date>2001-01-01T24:00:00Z</date>", malformed},
      {"<date>2001-01-01T00:00:60Z</date>", malformed},
      {"<date>2001-01-01T00:00:00.5Z</date>", malformed},
      {"<date>2001-01-01T00:00:00+01:00</date>", malformed},
      {"<date>2001-01-01T00:00:00</date>", malformed},
      {"<date>2001-01-01</date>", malformed},
      {"<date/>", malformed},
      {"<data>aGVs\n\t bG8=\r\n</data>", "data(5 bytes)"},
      {"<data/>", "data(0 bytes)"},
      {"<data>aGVsbG8</data>", failure(invalidData, 1, 0)},
      {"<data>aGVsbG8==</data>", failure(invalidData, 1, 0)},
      {"<data>aGVsb===</data>", failure(invalidData, 1, 0)},
      {"<data>aGVs=</data>", failure(invalidData, 1, 0)},
      {"<data>QQ==QQ==</data>", failure(invalidData, 1, 0)},
      {"<data>aG-s</data>", failure(invalidData, 1, 0)},
  });
  EXPECT_EQ(*PropertyListSerialization::read(Data("<data>AP+/\ngA==</data>"s)).data(),
            Data("\0\xFF\xBF\x80"s));
}

TEST(PropertyListXMLReader, DecidesEveryText) {
  check({
      {"<string/>", "string(\"\")"},
      {"<string > a b </string >", "string(\" a b \")"},
      {"<string>a\rb\r\nc\r\r\nd</string>", "string(\"a\\nb\\nc\\n\\nd\")"},
      {"<string>&#13;&#x0d;</string>", "string(\"\\r\\r\")"},
      {"<string>&lt;&gt;&amp;&apos;&quot;&#65;&#x1F600;</string>", "string(\"<>&'\\\"A\xF0\x9F\x98\x80\")"},
      {"<string>a<!-- <b> -->b<?p <c> ?><![CDATA[<&amp;]]]>d</string>", "string(\"ab<&amp;]d\")"},
      {"<string>\n&#xD800;</string>", failure(invalidCharacterReference, 2, 9)},
      {"<string>&#0;</string>", failure(invalidCharacterReference, 1, 8)},
      {"<string>&#x110000;</string>", failure(invalidCharacterReference, 1, 8)},
      {"<string>&#-65;</string>", failure(invalidCharacterReference, 1, 8)},
      {"<string>&#0x41;</string>", failure(invalidCharacterReference, 1, 8)},
      {"<string>&#X41;</string>", failure(invalidCharacterReference, 1, 8)},
      {"<string>&eacute;</string>", failure(unknownEntity, 1, 8)},
      {"<string>a & b</string>", failure(malformedMarkup, 1, 10)},
      {"<string>\x01</string>", failure(invalidCharacter, 1, 8)},
      {"<string>\0</string>"s, failure(invalidCharacter, 1, 8)},
      {"<string>\xEF\xBF\xBE</string>", failure(invalidCharacter, 1, 8)},
      {"<string>\xC3</string>", failure(invalidEncoding, 1, 8)},
      {"<string>\xED\xA0\x80</string>", failure(invalidEncoding, 1, 8)},
      {"<string>a<b/></string>", failure(misplacedElement, 1, 9)},
      {"<string>a", failure(unexpectedEnd, 1, 9)},
      {"<string>a<!-- ", failure(unexpectedEnd, 1, 9)},
      {"<string>a<!-- -- --></string>", failure(malformedMarkup, 1, 9)},
      {"<string>a</strings>", failure(mismatchedTag, 1, 9)},
      {"<true> <!-- --> </true>", "boolean(true)"},
      {"<false>no</false>", failure(misplacedText, 1, 0)},
  });
}

TEST(PropertyListXMLReader, DecidesEveryShape) {
  check({
      {"", failure(missingRoot, 1, 0)},
      {"<?xml version=\"1.0\"?>\n<!-- -->", failure(missingRoot, 2, 30)},
      {"<plist/>", failure(missingRoot, 1, 0)},
      {"<plist> </plist>", failure(missingRoot, 1, 8)},
      {"<true/>", "boolean(true)"},
      {"<plist a='>' b=\"'\"><true/></plist >\n<!-- --><?p?>", "boolean(true)"},
      {"<plist><true/><true/></plist>", failure(secondRoot, 1, 14)},
      {"<true/><true/>", failure(secondRoot, 1, 7)},
      {"<plist><true/></plist><plist/>", failure(secondRoot, 1, 22)},
      {"<array><plist><true/></plist></array>", failure(misplacedElement, 1, 7)},
      {"<array/>", "array([])"},
      {"<dict></dict>", "dictionary([:])"},
      {"<array>text</array>", failure(misplacedText, 1, 7)},
      {"<dict>text</dict>", failure(misplacedText, 1, 6)},
      {"<array><![CDATA[x]]></array>", failure(misplacedText, 1, 7)},
      {"<dict><key>b</key><true/><key>a</key><array/><key>b</key><dict/></dict>",
       "dictionary([\"a\": array([]), \"b\": dictionary([:])])"},
      {"<dict>\n<key>a</key></dict>", failure(missingValue, 2, 19)},
      {"<dict><key>a</key><key>b</key><true/></dict>", failure(missingValue, 1, 18)},
      {"<dict><true/></dict>", failure(missingKey, 1, 6)},
      {"<array><key>a</key></array>", failure(misplacedElement, 1, 7)},
      {"<array><true/></dict>", failure(mismatchedTag, 1, 14)},
      {"<array>", failure(unexpectedEnd, 1, 7)},
      {"<null/>", failure(unknownElement, 1, 0)},
      {"<String/>", failure(unknownElement, 1, 0)},
      {"<array a></array>", failure(malformedMarkup, 1, 0)},
      {"<array a='<'></array>", failure(malformedMarkup, 1, 0)},
      {"<array", failure(unexpectedEnd, 1, 6)},
      {"text", failure(misplacedText, 1, 0)},
      {"<?xml version='1.0'?><!DOCTYPE plist PUBLIC \"-//A//B\" 'c'><true/>", "boolean(true)"},
      {"<!DOCTYPE plist [<!ENTITY a \"b\">]><string>&a;</string>", failure(entityDeclaration, 1, 0)},
      {"<!DOCTYPE plist SYSTEM 'x' []><true/>", failure(entityDeclaration, 1, 0)},
      {"<plist><!DOCTYPE plist><true/></plist>", failure(malformedMarkup, 1, 7)},
      {"<?p<q> ?><true/>", failure(malformedMarkup, 1, 0)},
      {"<!-- --><?xml version='1.0'?><true/>", failure(malformedMarkup, 1, 8)},
  });
}

std::string utf16(std::u16string_view text, bool bigEndian) {
  std::string bytes;
  for (const auto unit : text) {
    const char pair[] = {static_cast<char>(unit >> 8), static_cast<char>(unit & 0xFF)};
    bytes += pair[bigEndian ? 0 : 1];
    bytes += pair[bigEndian ? 1 : 0];
  }
  return bytes;
}

TEST(PropertyListXMLReader, KnowsEncodings) {
  const auto accented = "string(\"\xC3\xA9\")"s;
  const auto declared = [](std::string encoding, std::string text) {
    return "<?xml version='1.0' encoding='" + std::move(encoding) + "'?><string>" + text + "</string>";
  };
  check({
      {"\xEF\xBB\xBF<string>\xC3\xA9</string>", accented},
      {"\xEF\xBB\xBF<string>&a;</string>", failure(unknownEntity, 1, 11)},
      {declared("Utf-8", "\xC3\xA9"), accented},
      {declared("ISO-8859-1", "\xE9"), accented},
      {declared("Shift_JIS", "\x82\xA0"), "string(\"\xE3\x81\x82\")"},
      {declared("us-ascii", "\xC3\xA9"), failure(invalidEncoding, 1, 49)},
      {declared("Shift_JIS", "\x82"), failure(invalidEncoding, 1, 51)},
      {declared("ebcdic-cp-us", "a"), failure(unsupportedEncoding, 1, 0)},
      {declared("UTF-16", "a"), failure(unsupportedEncoding, 1, 0)},
      {"\xEF\xBB\xBF" + declared("ISO-8859-1", "a"), failure(invalidEncoding, 1, 0)},
  });
  // Somewhere here a converter's buffer ends between the two units of the character.
  for (std::size_t length = 4000; length < 4096; ++length)
    check({{declared("gb18030", std::string(length, 'a') + "\x94\x39\xFC\x36"),
            "string(\"" + std::string(length, 'a') + "\xF0\x9F\x98\x80\")"}});
  for (const bool bigEndian : {false, true}) {
    check({
        {utf16(u"\uFEFF<string>\u00E9</string>", bigEndian), accented},
        {utf16(u"<?xml version='1.0' encoding='UTF-16'?><string>\u00E9</string>", bigEndian), accented},
        {utf16(u"\uFEFF<string>\U0001F600\n&a;</string>", bigEndian), failure(unknownEntity, 2, 24)},
        {utf16(u"\uFEFF<string>\xD83D</string>", bigEndian), failure(invalidEncoding, 1, 18)},
        {utf16(u"\uFEFF<string>\xDE00</string>", bigEndian), failure(invalidEncoding, 1, 18)},
        {utf16(u"\uFEFF<true/>", bigEndian) + "x", failure(invalidEncoding, 1, 16)},
        {utf16(u"<?xml version='1.0' encoding='UTF-8'?><true/>", bigEndian), failure(invalidEncoding, 1, 0)},
    });
  }
}

TEST(PropertyListXMLReader, ReadsAnyDepth) {
  const auto nested = [](int depth) {
    std::string text = "<plist>";
    for (int i = 0; i < depth; ++i) text += i % 2 ? "<array>" : "<dict><key>k</key>";
    text += "<true/>";
    for (int i = depth; i-- > 0;) text += i % 2 ? "</array>" : "</dict>";
    return text + "</plist>";
  };
  for (const int depth : {512, 513, 100000}) {
    const auto read = outcome(nested(depth));
    EXPECT_TRUE(read.starts_with("dictionary([\"k\": array([dict") && read.ends_with("])])")) << depth;
    EXPECT_EQ(std::count(read.begin(), read.end(), '['), depth);
  }
}

TEST(PropertyListXMLReader, IgnoresTheLocale) {
  const std::string before = std::setlocale(LC_NUMERIC, nullptr);
  if (!std::setlocale(LC_NUMERIC, "de_DE.UTF-8")) GTEST_SKIP() << "no locale with a decimal comma";
  EXPECT_EQ(outcome("<real>1.5</real>"), "floatingPoint(1.5)");
  EXPECT_EQ(PropertyListSerialization::write(1.5, PropertyListFormat::xml).view().find(','),
            std::string_view::npos);
  std::setlocale(LC_NUMERIC, before.c_str());
}

}  // namespace
}  // namespace MarletFoundation::test
