#include "MarletFoundation/Platform/Text.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <cstdlib>
#include <limits>

#include "MarletFoundation/Platform/RegularExpression.h"

namespace MarletFoundation::test {
namespace {

std::string utf8(char32_t scalar) {
  std::u16string units;
  if (scalar < 0x10000) {
    units = {static_cast<char16_t>(scalar)};
  } else {
    units = {static_cast<char16_t>(0xD7C0 + (scalar >> 10)),
             static_cast<char16_t>(0xDC00 | (scalar & 0x3FF))};
  }
  return utf8FromUTF16(units).value();
}

/// Texts of few characters that combine with each other in every way.
rc::Gen<std::string> combiningText() {
  const auto scalar = rc::gen::element<char32_t>(U'a', U'#', U'\r', U'\n', 0x301, 0x200D, 0xFE0F, 0x20E3,
                                                 0x1F468, 0x1F3FD, 0x1F1E6, 0x600, 0xAC00, 0x1100, 0x1161);
  return rc::gen::map(rc::gen::container<std::vector<char32_t>>(scalar), [](const auto& scalars) {
    std::string text;
    for (const auto value : scalars) text += utf8(value);
    return text;
  });
}

TEST(Text, illFormedUTF8GivesNothing) {
  for (const std::string text :
       {"\x80", "\xC0\x80", "\xC1\xBF", "\xC3", "\xE0\x9F\xBF", "\xE2\x82", "\xED\xA0\x80", "\xED\xBF\xBF",
        "\xF0\x8F\xBF\xBF", "\xF0\x9F\x98", "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xFF", "\xE2\x28\xA1",
        "\xF0\x9F\x28\x80"}) {
    // In the last bytes of a text and far from them, at the seams of what is looked at together.
    for (const std::size_t before : {0, 7, 8, 31, 32, 33, 2047, 2048, 2049}) {
      const auto padded = std::string(before, 'x') + text + std::string(before % 2 ? 1 : 64, 'y');
      EXPECT_EQ(utf16FromUTF8(padded), std::nullopt) << testing::PrintToString(padded);
      EXPECT_EQ(utf8PrefixLength(padded), before) << testing::PrintToString(padded);
    }
  }
}

TEST(Text, unpairedSurrogatesAreReplacedForPrintingOnly) {
  for (const std::u16string text : {u"a\xD800", u"a\xDC00", u"a\xD800"}) {
    EXPECT_EQ(utf8FromUTF16(text), std::nullopt);
    EXPECT_EQ(utf8FromUTF16Lossy(text), "a\uFFFD");
  }
  EXPECT_EQ(utf8FromUTF16Lossy(u"\xDC00\xD800\xD83D\xDE00"), "\uFFFD\uFFFD\U0001F600");
}

TEST(Text, everyScalarValueBetweenRunsOfEveryLength) {
  std::string bytes;
  std::u16string units;
  for (char32_t value = 1; value < 0x110000; ++value) {
    if (value == 0xD800) value = 0xE000;
    const auto trail = [value](int shift) { return static_cast<char>(0x80 + (value >> shift) % 64); };
    if (value < 0x80) {
      bytes += static_cast<char>(value);
    } else if (value < 0x800) {
      bytes += {static_cast<char>(0xC0 + value / 64), trail(0)};
    } else if (value < 0x10000) {
      bytes += {static_cast<char>(0xE0 + value / 4096), trail(6), trail(0)};
    } else {
      bytes += {static_cast<char>(0xF0 + (value >> 18)), trail(12), trail(6), trail(0)};
    }
    if (value < 0x10000) {
      units += static_cast<char16_t>(value);
    } else {
      units += {static_cast<char16_t>(0xD800 + (value - 0x10000) / 1024),
                static_cast<char16_t>(0xDC00 + value % 1024)};
    }
    const auto run = value % 7 ? 0 : value / 7 % 80;
    bytes.append(run, 'r');
    units.append(run, u'r');
  }
  EXPECT_TRUE(utf16FromUTF8(bytes) == units);
  EXPECT_TRUE(utf8FromUTF16(units) == bytes);
  EXPECT_TRUE(isValidUTF8(bytes));
}

RC_GTEST_PROP(Text, conversionsAreInverse, ()) {
  const auto scalar = rc::gen::suchThat(
      rc::gen::oneOf(rc::gen::inRange<char32_t>(0, 0x80), rc::gen::inRange<char32_t>(0x80, 0x110000)),
      [](char32_t value) { return value < 0xD800 || value > 0xDFFF; });
  std::string text;
  std::size_t units = 0;
  for (const auto value : *rc::gen::container<std::vector<char32_t>>(scalar)) {
    text += utf8(value);
    units += value < 0x10000 ? 1 : 2;
  }
  RC_ASSERT(isValidUTF8(text));
  const auto wide = utf16FromUTF8(text);
  RC_ASSERT(wide.has_value());
  RC_ASSERT(wide->size() == units);
  RC_ASSERT(utf8FromUTF16(*wide) == text);
}

RC_GTEST_PROP(Text, charactersAreExtendedGraphemeClusters, ()) {
  const auto text = *combiningText();
  static const RegularExpression cluster(u"\\X");
  const auto clusters = cluster.matches(utf16FromUTF8(text).value());
  RC_ASSERT(graphemeCount(text) == static_cast<std::int64_t>(clusters.size()));
}

RC_GTEST_PROP(Text, runsJoinToTheText, ()) {
  const auto text = *combiningText();
  const auto count = *rc::gen::inRange<std::int64_t>(1, 5);
  std::int64_t total = 0;
  for (std::size_t at = 0; at < text.size();) {
    const auto end = graphemeRunEnd(text, at, count);
    const auto run = graphemeCount(std::string_view(text).substr(at, end - at));
    RC_ASSERT(run == count || end == text.size());
    total += run;
    at = end;
  }
  RC_ASSERT(total == graphemeCount(text));
}

TEST(Text, runAfterRunOfALongTextIsLinear) {
  // Looking back for the start of a character would take a quadratic number of steps through these flags.
  std::string flags;
  for (int i = 0; i < 400000; ++i) flags += "\U0001F1E6";
  std::size_t runs = 0;
  for (std::size_t at = 0; at < flags.size(); at = graphemeRunEnd(flags, at, 1)) ++runs;
  EXPECT_EQ(runs, 200000u);
  EXPECT_EQ(graphemeRunEnd("ab", 5, 1), 2u);
  EXPECT_EQ(graphemeRunEnd("ab", 0, 0), 0u);
}

TEST(Text, canonicalEquivalence) {
  EXPECT_TRUE(canonicallyEquivalent("K", "\u212A"));
  EXPECT_TRUE(canonicallyEquivalent("\u00E9", "e\u0301"));
  EXPECT_TRUE(canonicallyEquivalent("\u1F82", "\u03B1\u0313\u0300\u0345"));
  EXPECT_FALSE(canonicallyEquivalent("k", "K"));
  EXPECT_FALSE(canonicallyEquivalent("\uFB01", "fi"));
  EXPECT_FALSE(canonicallyEquivalent("\xFF", "\xFE"));
}

TEST(Text, decimalIntegers) {
  EXPECT_EQ(parseDecimalInteger("+007"), 7);
  EXPECT_EQ(parseDecimalInteger("-9223372036854775808"), std::numeric_limits<std::int64_t>::min());
  for (const auto* text :
       {"", "+", "-", "+-1", "-+1", " 1", "1 ", "0x1", "1.0", "9223372036854775808", "\u0661"})
    EXPECT_EQ(parseDecimalInteger(text), std::nullopt) << text;
}

TEST(Text, printedForms) {
  EXPECT_EQ(quoted("a\"\\\n\x01\x7F\u00E9"), "\"a\\\"\\\\\\n\\u{01}\\u{7F}\u00E9\"");
  EXPECT_EQ(optionalDescription(std::optional<std::string>("a \"b\"\n")), "Optional(\"a \\\"b\\\"\\n\")");
  EXPECT_EQ(shortestDecimal(5e8), "500000000.0");
  EXPECT_EQ(shortestDecimal(-0.1), "-0.1");
  EXPECT_EQ(std::strtod(shortestDecimal(-5e-324).c_str(), nullptr), -5e-324);
  EXPECT_EQ(std::strtod(shortestDecimal(1.7976931348623157e308).c_str(), nullptr), 1.7976931348623157e308);
  EXPECT_EQ(split("", '.'), std::vector<std::string_view>{""});
  EXPECT_EQ(split(".a.", '.'), (std::vector<std::string_view>{"", "a", ""}));
}

}  // namespace
}  // namespace MarletFoundation::test
