#include "MarletFoundation/SourceEditor/Issue.h"

#include <span>
#include <tuple>
#include <utility>

namespace MarletFoundation {
namespace {

using Failure = Issue::PropertyListSerializationError;
using FixItFailure = Issue::FixIt::PropertyListSerializationError;

const std::string* stringAt(const PropertyListDictionary& dictionary, std::string_view key) {
  const auto* value = dictionary.find(key);
  return value ? value->string() : nullptr;
}

const std::int64_t* integerAt(const PropertyListDictionary& dictionary, std::string_view key) {
  const auto* value = dictionary.find(key);
  return value ? value->integer() : nullptr;
}

const PropertyListDictionary* dictionaryAt(const PropertyListDictionary& dictionary, std::string_view key) {
  const auto* value = dictionary.find(key);
  return value ? value->dictionary() : nullptr;
}

/// The failures of a location, which depend on what it belongs to.
template <class Error>
struct LocationFailures {
  typename Error::Case missingFile, missingLine, missingColumn, missingLength;
};

template <class Error>
Issue::Location readLocation(const PropertyListDictionary& dictionary,
                             const LocationFailures<Error>& failures) {
  const auto* file = stringAt(dictionary, "file");
  if (!file) throw Error(failures.missingFile);
  const auto* line = integerAt(dictionary, "line");
  if (!line) throw Error(failures.missingLine);
  const auto* column = integerAt(dictionary, "column");
  if (!column) throw Error(failures.missingColumn);
  const auto* length = integerAt(dictionary, "length");
  if (!length) throw Error(failures.missingLength);
  return {*file, *line, *column, *length};
}

PropertyListValue propertyListValue(const Issue::Location& location) {
  return PropertyListDictionary{{"file", location.file},
                                {"line", location.line},
                                {"column", location.column},
                                {"length", location.length}};
}

/// The elements of an optional array.
std::span<const PropertyListValue> elementsAt(const PropertyListDictionary& dictionary,
                                              std::string_view key) {
  const auto* value = dictionary.find(key);
  const auto* array = value ? value->array() : nullptr;
  return array ? std::span(*array) : std::span<const PropertyListValue>();
}

void readFixIts(const PropertyListDictionary& dictionary, Issue& issue) {
  const auto elements = elementsAt(dictionary, "fixIts");
  issue.fixIts.reserve(elements.size());
  for (const auto& element : elements) {
    try {
      issue.fixIts.emplace_back(element);
    } catch (const FixItFailure& error) {
      throw Failure(Failure::Case::InvalidFixIt, error);
    }
  }
}

const PropertyListDictionary& root(const PropertyListValue& value) {
  const auto* dictionary = value.dictionary();
  if (!dictionary) throw Failure(Failure::Case::RootNotADictionary);
  return *dictionary;
}

Issue::Severity readSeverity(const PropertyListDictionary& dictionary) {
  const auto* rawValue = integerAt(dictionary, "severity");
  if (!rawValue) throw Failure(Failure::Case::MissingSeverity);
  const auto severity = severityFromRawValue(*rawValue);
  if (!severity) throw Failure(*rawValue);
  return *severity;
}

/// What of an issue stands in front of its children.
void readHead(const PropertyListDictionary& dictionary, Issue& issue) {
  using Case = Failure::Case;
  if (const auto* name = stringAt(dictionary, "identifier")) issue.identifier = *name;
  issue.severity = readSeverity(dictionary);
  const auto* text = stringAt(dictionary, "message");
  if (!text) throw Failure(Case::MissingMessage);
  issue.message = *text;
  if (const auto* place = dictionaryAt(dictionary, "location"))
    issue.location =
        readLocation<Failure>(*place, {Case::LocationMissingFile, Case::LocationMissingLine,
                                       Case::LocationMissingColumn, Case::LocationMissingLength});
}

/// Reads an issue and all below it. Those whose children are being read stand in a list, the innermost last.
class Reader {
 public:
  void read(const PropertyListValue& value, Issue& issue) {
    try {
      enter(value, issue);
      while (!open_.empty()) {
        const auto [dictionary, children, parent] = open_.back();
        const auto next = parent->childIssues.size();
        if (next < children.size()) {
          enter(children[next], parent->childIssues.emplace_back(Issue::Severity::Note, std::nullopt, ""));
        } else {
          open_.pop_back();
          readFixIts(*dictionary, *parent);
        }
      }
    } catch (const Failure& failure) {
      auto wrapped = failure;
      for (auto level = open_.size(); level > 0; --level)
        wrapped = Failure(Failure::Case::InvalidChildIssue, wrapped);
      throw wrapped;
    }
  }

 private:
  struct Open {
    const PropertyListDictionary* dictionary;
    std::span<const PropertyListValue> children;
    Issue* issue;
  };

  void enter(const PropertyListValue& value, Issue& issue) {
    const auto& dictionary = root(value);
    readHead(dictionary, issue);
    const auto children = elementsAt(dictionary, "children");
    // With room for all, children stay where they are while those behind them are read.
    issue.childIssues.reserve(children.size());
    open_.push_back({&dictionary, children, &issue});
  }

  std::vector<Open> open_;
};

/// The form of an issue, with places for its children that are still to be filled.
PropertyListDictionary writtenWithoutChildren(const Issue& issue) {
  PropertyListValue::Array fixIts;
  for (const auto& fixIt : issue.fixIts) fixIts.push_back(fixIt.propertyListValue());
  PropertyListDictionary dictionary{{"severity", static_cast<std::int64_t>(issue.severity)},
                                    {"message", issue.message},
                                    {"children", PropertyListValue::Array(issue.childIssues.size())},
                                    {"fixIts", std::move(fixIts)}};
  if (issue.identifier) dictionary["identifier"] = *issue.identifier;
  if (issue.location) dictionary["location"] = propertyListValue(*issue.location);
  return dictionary;
}

/// Walks an issue and all below it together with another tree of the same shape. `visit` is given one of each, says
/// where the children of the second stand, and answers whether to go on.
template <class Other, class Visit>
bool walkTogether(const Issue& issue, Other& other, Visit visit) {
  std::vector<std::pair<const Issue*, Other*>> open{{&issue, &other}};
  while (!open.empty()) {
    const auto [one, two] = open.back();
    open.pop_back();
    Other* children = nullptr;
    if (!visit(*one, *two, children)) return false;
    for (const auto& child : one->childIssues) open.emplace_back(&child, children++);
  }
  return true;
}

auto fieldsOf(const Issue& issue) {
  return std::tie(issue.severity, issue.identifier, issue.location, issue.message, issue.fixIts);
}

}  // namespace

const ErrorTable& errorTable(Issue::PropertyListSerializationErrorCase) {
  // Codes follow the order of the checks.
  static constexpr ErrorRow rows[] = {
      {.name = "InvalidSeverity", .code = 2},       {.name = "InvalidChildIssue", .code = 8},
      {.name = "InvalidFixIt", .code = 9},          {.name = "RootNotADictionary", .code = 0},
      {.name = "MissingSeverity", .code = 1},       {.name = "MissingMessage", .code = 3},
      {.name = "LocationMissingFile", .code = 4},   {.name = "LocationMissingLine", .code = 5},
      {.name = "LocationMissingColumn", .code = 6}, {.name = "LocationMissingLength", .code = 7},
  };
  static constexpr ErrorTable table{"MarletFoundation.Issue.PropertyListSerializationError", rows};
  return table;
}

const ErrorTable& errorTable(Issue::FixIt::PropertyListSerializationErrorCase) {
  static constexpr ErrorRow rows[] = {
      {"RootNotADictionary"}, {"MissingRange"},       {"RangeMissingFile"},       {"RangeMissingLine"},
      {"RangeMissingColumn"}, {"RangeMissingLength"}, {"MissingReplacementText"},
  };
  static constexpr ErrorTable table{"MarletFoundation.Issue.FixIt.PropertyListSerializationError", rows};
  return table;
}

std::optional<Issue::Severity> severityFromRawValue(std::int64_t rawValue) {
  if (rawValue < 0 || rawValue > 2) return std::nullopt;
  return static_cast<Issue::Severity>(rawValue);
}

std::string_view description(Issue::Severity severity) {
  switch (severity) {
    case Issue::Severity::Note:
      return "Note";
    case Issue::Severity::Warning:
      return "Warning";
    case Issue::Severity::Error:
      return "Error";
  }
  return {};
}

Issue::FixIt::FixIt(const PropertyListValue& value) {
  using Case = FixItFailure::Case;
  const auto* dictionary = value.dictionary();
  if (!dictionary) throw FixItFailure(Case::RootNotADictionary);
  const auto* place = dictionaryAt(*dictionary, "range");
  if (!place) throw FixItFailure(Case::MissingRange);
  range = readLocation<FixItFailure>(*place, {Case::RangeMissingFile, Case::RangeMissingLine,
                                              Case::RangeMissingColumn, Case::RangeMissingLength});
  const auto* text = stringAt(*dictionary, "replacementText");
  if (!text) throw FixItFailure(Case::MissingReplacementText);
  replacementText = *text;
}

PropertyListValue Issue::FixIt::propertyListValue() const {
  return PropertyListDictionary{{"range", MarletFoundation::propertyListValue(range)},
                                {"replacementText", replacementText}};
}

Issue::Issue(const PropertyListValue& value) : severity(Severity::Note) { Reader().read(value, *this); }

Issue::Issue(const Issue& other) : severity(other.severity) {
  walkTogether(other, *this, [](const Issue& from, Issue& to, Issue*& children) {
    std::tie(to.severity, to.identifier, to.location, to.message, to.fixIts) = fieldsOf(from);
    to.childIssues.reserve(from.childIssues.size());
    while (to.childIssues.size() < from.childIssues.size())
      to.childIssues.emplace_back(Severity::Note, std::nullopt, "");
    children = to.childIssues.data();
    return true;
  });
}

/// A destructor has no memory to ask for: the last of each list that was entered holds the list around it.
Issue::~Issue() {
  std::vector<Issue> list = std::move(childIssues), around;
  while (true) {
    while (!list.empty()) {
      auto below = std::exchange(list.back().childIssues, std::move(around));
      around = std::exchange(list, std::move(below));
    }
    if (around.empty()) return;
    auto next = std::exchange(around.back().childIssues, {});
    around.pop_back();
    list = std::exchange(around, std::move(next));
  }
}

bool Issue::operator==(const Issue& other) const {
  return walkTogether(*this, other, [](const Issue& a, const Issue& b, const Issue*& children) {
    children = b.childIssues.data();
    return a.childIssues.size() == b.childIssues.size() && fieldsOf(a) == fieldsOf(b);
  });
}

PropertyListValue Issue::propertyListValue() const {
  PropertyListValue value;
  walkTogether(*this, value, [](const Issue& issue, PropertyListValue& place, PropertyListValue*& children) {
    place = writtenWithoutChildren(issue);
    auto& dictionary = std::get<PropertyListDictionary>(place.payload);
    children = std::get<PropertyListValue::Array>(dictionary.find("children")->payload).data();
    return true;
  });
  return value;
}

std::string Issue::description() const {
  return "<Issue:" + std::string(MarletFoundation::description(severity)) + ":" + message + ">";
}

}  // namespace MarletFoundation
