#include "MarletFoundation/SourceEditor/Issue.h"

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

/// The elements of an optional array, each read as an `Element`.
template <class Element>
std::vector<Element> readAll(const PropertyListDictionary& dictionary, std::string_view key,
                             Failure::Case invalid) {
  std::vector<Element> elements;
  const auto* value = dictionary.find(key);
  const auto* array = value ? value->array() : nullptr;
  if (!array) return elements;
  elements.reserve(array->size());
  for (const auto& element : *array) {
    try {
      elements.emplace_back(element);
    } catch (const typename Element::PropertyListSerializationError& error) {
      throw Failure(invalid, error);
    }
  }
  return elements;
}

template <class Element>
PropertyListValue written(const std::vector<Element>& elements) {
  PropertyListValue::Array array;
  for (const auto& element : elements) array.push_back(element.propertyListValue());
  return array;
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

Issue::Issue(const PropertyListValue& value) {
  using Case = Failure::Case;
  const auto& dictionary = root(value);
  if (const auto* name = stringAt(dictionary, "identifier")) identifier = *name;
  severity = readSeverity(dictionary);
  const auto* text = stringAt(dictionary, "message");
  if (!text) throw Failure(Case::MissingMessage);
  message = *text;
  if (const auto* place = dictionaryAt(dictionary, "location"))
    location = readLocation<Failure>(*place, {Case::LocationMissingFile, Case::LocationMissingLine,
                                              Case::LocationMissingColumn, Case::LocationMissingLength});
  childIssues = readAll<Issue>(dictionary, "children", Case::InvalidChildIssue);
  fixIts = readAll<FixIt>(dictionary, "fixIts", Case::InvalidFixIt);
}

PropertyListValue Issue::propertyListValue() const {
  PropertyListDictionary dictionary{{"severity", static_cast<std::int64_t>(severity)},
                                    {"message", message},
                                    {"children", written(childIssues)},
                                    {"fixIts", written(fixIts)}};
  if (identifier) dictionary["identifier"] = *identifier;
  if (location) dictionary["location"] = MarletFoundation::propertyListValue(*location);
  return dictionary;
}

std::string Issue::description() const {
  return "<Issue:" + std::string(MarletFoundation::description(severity)) + ":" + message + ">";
}

}  // namespace MarletFoundation
