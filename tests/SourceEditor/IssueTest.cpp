#include "MarletFoundation/SourceEditor/Issue.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include "MarletFoundation/SourceEditor/CodeTokenType.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

using Dictionary = PropertyListDictionary;
using FixIt = Issue::FixIt;

const Dictionary place{{"file", "a.swift"}, {"line", 3}, {"column", 4}, {"length", 5}};
const Dictionary goodFixIt{{"range", place}, {"replacementText", "let"}};
const Dictionary goodIssue{{"severity", 1}, {"message", "unused"}};

Dictionary with(Dictionary dictionary, std::string_view key, PropertyListValue value) {
  dictionary[key] = std::move(value);
  return dictionary;
}
Dictionary without(Dictionary dictionary, std::string_view key) {
  dictionary.erase(key);
  return dictionary;
}

/// What reading ends in, and its code.
template <class Value>
std::pair<std::string, int> outcome(const PropertyListValue& value) {
  const auto error = errorOf([&] { Value read(value); });
  return error ? std::pair(error->description(), error->code()) : std::pair(std::string("none"), -1);
}

TEST(Issue, ReadsInTheStatedOrder) {
  using Array = PropertyListValue::Array;
  const auto noFile = without(place, "file");
  const std::tuple<PropertyListValue, const char*, int> cases[] = {
      {"text", "RootNotADictionary", 0},
      {Dictionary{{"message", 1}}, "MissingSeverity", 1},
      {with(goodIssue, "severity", "1"), "MissingSeverity", 1},
      {with(without(goodIssue, "message"), "severity", 3), "InvalidSeverity(3)", 2},
      {with(with(goodIssue, "message", 1), "location", noFile), "MissingMessage", 3},
      {with(goodIssue, "location", without(noFile, "line")), "LocationMissingFile", 4},
      {with(goodIssue, "location", without(without(place, "line"), "column")), "LocationMissingLine", 5},
      {with(goodIssue, "location", with(without(place, "length"), "column", "4")), "LocationMissingColumn",
       6},
      {with(with(goodIssue, "location", without(place, "length")), "children", Array{1}),
       "LocationMissingLength", 7},
      {with(with(goodIssue, "fixIts", Array{1}), "children", Array{goodIssue, without(goodIssue, "message")}),
       "InvalidChildIssue(MissingMessage)", 8},
      {with(goodIssue, "children", Array(1, with(goodIssue, "children", Array{1}))),
       "InvalidChildIssue(InvalidChildIssue(RootNotADictionary))", 8},
      {with(goodIssue, "fixIts", Array(1, with(goodFixIt, "range", without(place, "length")))),
       "InvalidFixIt(RangeMissingLength)", 9},
      // An optional value of another kind is none.
      {with(with(with(goodIssue, "identifier", 1), "location", 1), "fixIts", "x"), "none", -1},
  };
  for (const auto& [value, description, code] : cases) {
    EXPECT_EQ(outcome<Issue>(value), (std::pair<std::string, int>(description, code)));
  }
}

TEST(FixIt, ReadsInTheStatedOrder) {
  const std::tuple<PropertyListValue, const char*, int> cases[] = {
      {1, "RootNotADictionary", 0},
      {without(without(goodFixIt, "range"), "replacementText"), "MissingRange", 1},
      {with(goodFixIt, "range", "x"), "MissingRange", 1},
      {with(goodFixIt, "range", Dictionary()), "RangeMissingFile", 2},
      {with(goodFixIt, "range", without(without(place, "line"), "column")), "RangeMissingLine", 3},
      {with(goodFixIt, "range", without(without(place, "column"), "length")), "RangeMissingColumn", 4},
      {with(with(goodFixIt, "range", with(place, "length", 1.0)), "replacementText", 1), "RangeMissingLength",
       5},
      {with(goodFixIt, "replacementText", 1), "MissingReplacementText", 6},
      {goodFixIt, "none", -1},
  };
  for (const auto& [value, description, code] : cases) {
    EXPECT_EQ(outcome<FixIt>(value), (std::pair<std::string, int>(description, code)));
  }
}

Issue anyIssue(int depth) {
  const auto location = [] {
    return Issue::Location{*rc::gen::element<std::string>("", "a.swift"), *rc::gen::arbitrary<std::int64_t>(),
                           *rc::gen::arbitrary<std::int64_t>(), *rc::gen::arbitrary<std::int64_t>()};
  };
  Issue issue(*rc::gen::element(Issue::Severity::Note, Issue::Severity::Warning, Issue::Severity::Error),
              std::nullopt, *rc::gen::element<std::string>("", "message"));
  if (*rc::gen::arbitrary<bool>()) issue.location = location();
  if (*rc::gen::arbitrary<bool>()) issue.identifier = "name";
  for (int i = *rc::gen::inRange(0, 3); i > 0; --i) issue.fixIts.emplace_back(location(), "text");
  for (int i = depth > 0 ? *rc::gen::inRange(0, 3) : 0; i > 0; --i)
    issue.childIssues.push_back(anyIssue(depth - 1));
  return issue;
}

TEST(Issue, ReadsWhatItWrote) {
  EXPECT_TRUE(rc::check([] {
    const auto issue = anyIssue(2);
    const auto value = issue.propertyListValue();
    RC_ASSERT(Issue(value) == issue);
    for (const auto* key : {"severity", "message", "children", "fixIts"})
      RC_ASSERT(value.dictionary()->contains(key));
    RC_ASSERT(value.dictionary()->contains("identifier") == issue.identifier.has_value());
    RC_ASSERT(value.dictionary()->contains("location") == issue.location.has_value());
  }));
  EXPECT_EQ(Issue(Issue::Severity::Warning, std::nullopt, "unused variable").description(),
            "<Issue:Warning:unused variable>");
}

TEST(Issue, NeedsNoStackHoweverDeepItLies) {
  constexpr int levels = 30000;
  Issue deep(Issue::Severity::Note, std::nullopt, "innermost");
  for (int level = 0; level < levels; ++level) {
    Issue around(Issue::Severity::Error, std::nullopt, "", {FixIt({"a", level, 1, 1}, "")});
    around.childIssues.emplace_back(Issue::Severity::Note, std::nullopt, "older");
    around.childIssues.push_back(std::move(deep));
    deep = std::move(around);
  }
  const auto copy = deep;
  EXPECT_TRUE(copy == deep);
  EXPECT_TRUE(Issue(deep.propertyListValue()) == deep);
  auto* innermost = &deep;
  while (!innermost->childIssues.empty()) innermost = &innermost->childIssues.back();
  innermost->message = "another";
  EXPECT_FALSE(copy == deep);

  auto bad = without(goodIssue, "message");
  for (int level = 0; level < levels; ++level) {
    auto around = goodIssue;
    PropertyListValue::Array children(1);
    children[0] = std::move(bad);
    around["children"] = std::move(children);
    bad = std::move(around);
  }
  const auto [description, code] = outcome<Issue>(bad);
  EXPECT_EQ(code, 8);
  EXPECT_TRUE(description.ends_with("InvalidChildIssue(MissingMessage" + std::string(levels, ')')));
}

TEST(FixIt, LaterLinesComeBeforeButEarlierColumns) {
  const auto at = [](std::int64_t line, std::int64_t column) { return FixIt({"a", line, column, 1}, ""); };
  EXPECT_TRUE(at(9, 5).isBefore(at(3, 1)));
  EXPECT_FALSE(at(3, 1).isBefore(at(9, 5)));
  EXPECT_TRUE(at(3, 1).isBefore(at(3, 2)));
  EXPECT_FALSE(at(3, 2).isBefore(at(3, 1)));
  EXPECT_FALSE(at(3, 2).isBefore(at(3, 2)));
}

TEST(CodeTokenType, ComparesWhatPlaceholdersHold) {
  using Kind = CodeTokenType::Kind;
  const CodeTokenType empty(Kind::Placeholder);
  const auto ofKeyword = CodeTokenType::placeholder(Kind::Keyword);
  const auto nested = CodeTokenType::placeholder(empty);
  EXPECT_EQ(ofKeyword, CodeTokenType::placeholder(Kind::Keyword));
  EXPECT_EQ(nested, CodeTokenType::placeholder(empty));
  EXPECT_NE(ofKeyword, empty);
  EXPECT_NE(ofKeyword, CodeTokenType::placeholder(Kind::Number));
  EXPECT_NE(ofKeyword, CodeTokenType(Kind::Keyword));
  EXPECT_NE(nested, empty);
  EXPECT_EQ(nested.description(), "Placeholder");
  EXPECT_EQ(CodeTokenType(Kind::AsConversionOperator).description(), "Conversion Operator");
  EXPECT_EQ(CodeTokenType(Kind::BinaryOperator).description(), "Binary Operator");
  EXPECT_EQ(CodeTokenType(Kind::Identifier).description(), "Identifier");
  auto deep = nested;
  for (int i = 0; i < 300000; ++i) deep = CodeTokenType::placeholder(deep);
  EXPECT_NE(deep, nested);
}

}  // namespace
}  // namespace MarletFoundation::test
