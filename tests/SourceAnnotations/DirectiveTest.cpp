#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include "Dump.h"
#include "MarletFoundation/Platform/CharacterClass.h"
#include "MarletFoundation/Platform/RegularExpression.h"
#include "MarletFoundation/SourceAnnotations/EditorPlaceholder.h"
#include "MarletFoundation/Utils/Functional.h"

namespace MarletFoundation::test {
namespace {

/// The stated pattern; anchors match at line ends.
const RegularExpression codeCompletionDirectiveRegex(
    uR"((?m)\/\/#-code-completion\(([^,\W]+)((?:, [^,\s]+)+)\) *$)");

using Outcome = Either<std::string, std::vector<LexiportDirective>>;

std::optional<Outcome> statedOutcome(const std::u16string& line) {
  const auto match = codeCompletionDirectiveRegex.firstMatch(line);
  if (!match) return std::nullopt;
  const auto text = [&](const TextRange& range) {
    return utf8FromUTF16Lossy(
        line.substr(static_cast<std::size_t>(range.location), static_cast<std::size_t>(range.length)));
  };
  std::vector<std::string> arguments{text((*match)[1])};
  auto rest = text((*match)[2]).substr(2);
  for (auto comma = rest.find(", "); comma != rest.npos; comma = rest.find(", ")) {
    arguments.push_back(rest.substr(0, comma));
    rest.erase(0, comma + 2);
  }
  arguments.push_back(rest);
  return LexiportDirective::fromArray(arguments);
}

RC_GTEST_PROP(LexiportDirective, linesAreThoseOfThePattern, ()) {
  const auto piece = rc::gen::element<std::string>(
      "//#-code-completion(", "module, hide", "module", ", ", ", show", ",", "(", ")", " ", "a", "\u00E9",
      "\n", "\u2028", "\t", "\u0085", "\U0001F600", "\U00010400", ")\r\n");
  std::string text;
  for (const auto& next : *rc::gen::container<std::vector<std::string>>(piece)) text += next;
  for (const auto& line :
       {wide(text), wide("//#-code-completion(" + text), wide("//#-code-completion(module, hide" + text),
        wide("//#-code-completion(a, b" + text + ")")})
    RC_ASSERT(lexiportDirectivesFromLine(line) == statedOutcome(line));
}

TEST(CharacterClass, isThatOfRegularExpressions) {
  const RegularExpression word(u"\\w");
  const RegularExpression space(u"\\s");
  const RegularExpression lineEnd(u"(?m)a$");
  for (char32_t scalar = 0; scalar < 0x20000; ++scalar) {
    if (scalar >= 0x3400 && scalar < 0xD780 && scalar % 64 != 0) continue;
    std::u16string text = u"a";
    if (scalar >= 0x10000) text += static_cast<char16_t>(0xD7C0 + (scalar >> 10));
    text += static_cast<char16_t>(scalar < 0x10000 ? scalar : 0xDC00 | (scalar & 0x3FF));
    const auto itself = std::u16string_view(text).substr(1);
    ASSERT_EQ(isWordCharacter(scalar), word.firstMatch(itself).has_value()) << static_cast<unsigned>(scalar);
    if (scalar >= 0x10000) continue;
    ASSERT_EQ(isWhiteSpace(itself[0]), space.firstMatch(itself).has_value()) << static_cast<unsigned>(scalar);
    ASSERT_EQ(isLineTerminator(itself[0]), lineEnd.firstMatch(text + u"b").has_value())
        << static_cast<unsigned>(scalar);
  }
}

TEST(LexiportDirective, argumentsAreReadInOrder) {
  using Arguments = std::vector<std::string>;
  EXPECT_EQ(LexiportDirective::fromArray({"module"}).left(), "Requires 2 or more args");
  EXPECT_EQ(LexiportDirective::fromArray({"bogus", "maybe"}).left(), "Invalid namespace: bogus");
  EXPECT_EQ(LexiportDirective::fromArray({"module", "Show"}).left(), "Invalid hide or show: Show");
  const std::string keywords[] = {"everything",
                                  "module",
                                  "currentmodule",
                                  "pageauxiliarymodule",
                                  "chapterauxiliarymodule",
                                  "bookauxiliarymodule",
                                  "identifier",
                                  "snippet",
                                  "keyword",
                                  "literal"};
  for (std::int64_t raw = 0; raw < 10; ++raw) {
    const auto space = LexiportDirective::namespaceWithRawValue(raw).value();
    const LexiportDirective expected{"x", LexiportDirective::AddOrRemove::Remove, space};
    EXPECT_EQ(LexiportDirective::fromArray(Arguments{keywords[raw], "hide", "x"}).right(),
              std::vector<LexiportDirective>{expected});
    EXPECT_EQ(
        expected.hashValue(),
        combiningHash(combiningHash(std::hash<std::string>()("x"), static_cast<std::uint64_t>(raw)), 1));
  }
  EXPECT_EQ(LexiportDirective::namespaceWithRawValue(10), std::nullopt);
  EXPECT_EQ(LexiportDirective::namespaceWithRawValue(-1), std::nullopt);
  const LexiportDirective::LXKeyPair key(true, LexiportDirective::LexiportNamespace::Keyword);
  EXPECT_EQ(key.hashValue(), combiningHash(1, 8));
}

std::string dumpOf(const std::u16string& text) {
  std::string result;
  for (const auto& [range, metadata] : parseStringForPlaceholders(text)) {
    using Metadata = PlaceholderMetadata;
    result += (result.empty() ? "" : " ") + dump(range) + std::string(metadata.caseName());
    result += std::visit(
        overloaded{
            [](const Metadata::Unknown& token) { return "[" + token.tokenDescription + "]"; },
            [](const Metadata::TypedToken& token) {
              return "[" + token.tokenDescription + "|" + token.tokenType + "]";
            },
            [](const Metadata::TypedTokenExtra& token) {
              return "[" + token.tokenDescription + "|" + token.tokenType + "|" + token.extra + "]";
            },
            [](const Metadata::TypedTokenAlias& token) {
              return "[" + token.tokenDescription + "|" + token.tokenType + "|" + token.extra + "|" +
                     token.actualtype + "]";
            },
        },
        metadata.payload);
  }
  return result;
}

TEST(EditorPlaceholder, ofTexts) {
  const std::pair<std::string, std::string> rows[] = {
      {"<#<#<#", ""},
      {"#>#>", ""},
      {"#> <#a#>", "3+5Unknown[a]"},
      {"<#a#><#b#>", "0+5Unknown[a] 5+5Unknown[b]"},
      {"<# <#a#> #>", "3+5Unknown[a]"},
      {"<##>", "0+4Unknown[]"},
      {"<#>", "0+3Unknown[]"},
      {"<#a##b#>", "0+8TypedToken[a|b]"},
      {"<#T##name##Int#>", "0+16TypedTokenExtra[name|Int|T]"},
      {"\U0001F600<#T##name##Int##\u00E9#>", "2+19TypedTokenAlias[name|Int|T|\u00E9]"},
      {"<#a##b##c##d##e#>", "0+17Unknown[a##b##c##d##e]"},
      {"<#a###b#>", "0+9TypedToken[a|#b]"},
      {"<#a\n#>", "0+6Unknown[a\n]"},
  };
  for (const auto& [text, expected] : rows) EXPECT_EQ(dumpOf(wide(text)), expected) << text;
  EXPECT_EQ(rangesOfString(u"aa", u"aaaaa"), (std::vector<TextRange>{{0, 2}, {2, 2}}));
  EXPECT_EQ(rangesOfString(u"", u"a"), std::vector<TextRange>{});
}

}  // namespace
}  // namespace MarletFoundation::test
